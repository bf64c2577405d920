# Run by ctest; stops at the first step that fails.
cmake_minimum_required(VERSION 3.25)

function(run)
    execute_process(COMMAND ${ARGN} RESULT_VARIABLE result OUTPUT_VARIABLE output ERROR_VARIABLE output)
    if(NOT result EQUAL 0)
        list(JOIN ARGN " " command)
        message(FATAL_ERROR "${command}\n${output}")
    endif()
    set(output "${output}" PARENT_SCOPE)
endfunction()

file(REMOVE_RECURSE ${WORK})
run(${CMAKE_COMMAND} --install ${BUILD} --prefix ${WORK}/prefix)
# Where the engine looks for it.
if(NOT EXISTS ${WORK}/prefix/${LIBDIR}/vantrel/Stabilizer.tqx)
    message(FATAL_ERROR "The stabilizer plug-in isn't installed.")
endif()

set(flags "")
foreach(sanitizer IN LISTS SANITIZE)
    string(APPEND flags " -fsanitize=${sanitizer}")
endforeach()
run(${CMAKE_COMMAND} -S ${CONSUMER} -B ${WORK}/build -G Ninja -D CMAKE_PREFIX_PATH=${WORK}/prefix
    -D CMAKE_CXX_COMPILER=${COMPILER} "-D CMAKE_CXX_FLAGS=${flags}")
run(${CMAKE_COMMAND} --build ${WORK}/build)
run(${WORK}/build/consumer)

set(ENV{PKG_CONFIG_PATH} ${WORK}/prefix/${LIBDIR}/pkgconfig)
run(pkg-config --define-variable=prefix=${WORK}/prefix --cflags --libs vantrel)
string(STRIP "${output}" output)
separate_arguments(options UNIX_COMMAND "${flags} ${output}")
run(${COMPILER} -std=c++17 ${CONSUMER}/main.cpp -o ${WORK}/by-pkg-config ${options} -Wl,-rpath,${WORK}/prefix/${LIBDIR})
run(${WORK}/by-pkg-config)
