# Writes the complete OpenCL text of SOURCE to OUTPUT; run as a script, with COMPILER and ROOT.
file(RELATIVE_PATH relative ${ROOT} ${SOURCE})
execute_process(
    COMMAND ${COMPILER} -E -fdirectives-only -undef -nostdinc -D__OPENCL_VERSION__=120 -IFoundation -I. -x c ${relative}
    WORKING_DIRECTORY ${ROOT}
    OUTPUT_VARIABLE text
    RESULT_VARIABLE result)
if(NOT result EQUAL 0)
    message(FATAL_ERROR "${relative} can't be made into OpenCL text")
endif()
# What the preprocessor says of itself comes first and isn't the platform's business.
string(FIND "${text}" "# 1 \"${relative}\"" start)
string(SUBSTRING "${text}" ${start} -1 text)
file(WRITE ${OUTPUT} "#ifndef OPENCL_LANES\n#define OPENCL_LANES 1\n#endif\n${text}")
