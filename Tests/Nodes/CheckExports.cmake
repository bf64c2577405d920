# Fails unless the engine's library exports exactly its three functions.
# cmake -D NM=<nm> -D LIBRARY=<file> -P CheckExports.cmake
execute_process(COMMAND ${NM} -D --defined-only -C ${LIBRARY} OUTPUT_VARIABLE symbols COMMAND_ERROR_IS_FATAL ANY)
string(REGEX REPLACE "[0-9a-f]+ (.) ([A-Za-z0-9_:]+)[^\n]*" "\\1 \\2" symbols "${symbols}")
string(STRIP "${symbols}" symbols)
string(REPLACE "\n" ";" symbols "${symbols}")
list(SORT symbols)
if(NOT symbols STREQUAL "T Vantrel::CreateRenderSystem;T Vantrel::Initialize;T Vantrel::Terminate")
    message(FATAL_ERROR "${LIBRARY} exports: ${symbols}")
endif()
