# Device files: compiled for every target and embedded in the library that owns them.
#
#   vantrel_device_modules(<target> <key> <file> [<key> <file> ...])
#
# A key is what Kiln's FindModule takes: a path with back-slashes and without an extension, or a bare name. A file is
# relative to the calling directory. For each one there will be
#   - a shared object for the CPU driver, with the code for x86-64-v2, v3 and v4,
#   - the complete text for OpenCL,
#   - a fat binary for CUDA if nvcc is found, or PTX if clang can write it, else nothing.
# The target gets a table of them that is entered in Kiln's list when its library is loaded.

option(VANTREL_CUDA_MODULES "Compile device files for NVIDIA devices when a compiler for them is found" ON)

set(_device_modules_dir ${CMAKE_CURRENT_LIST_DIR})
set(_device_cuda "")
if(VANTREL_CUDA_MODULES)
    find_program(VANTREL_NVCC nvcc PATHS /usr/local/cuda/bin DOC "CUDA compiler for device files")
    if(VANTREL_NVCC)
        set(_device_cuda nvcc)
        message(STATUS "Device modules: images for NVIDIA devices by ${VANTREL_NVCC}")
    else()
        find_program(VANTREL_CUDA_CLANG clang++ DOC "Compiler that writes PTX of device files when there is no nvcc")
        if(VANTREL_CUDA_CLANG)
            execute_process(COMMAND ${VANTREL_CUDA_CLANG} --print-targets
                OUTPUT_VARIABLE targets ERROR_QUIET RESULT_VARIABLE result)
            if(targets MATCHES "nvptx64")
                set(_device_cuda clang)
                message(STATUS "Device modules: no nvcc; PTX for NVIDIA devices by ${VANTREL_CUDA_CLANG}")
            endif()
        endif()
    endif()
    if(NOT _device_cuda)
        message(STATUS "Device modules: no images for NVIDIA devices, neither nvcc nor a clang that writes PTX was found")
    endif()
else()
    message(STATUS "Device modules: no images for NVIDIA devices (VANTREL_CUDA_MODULES is off)")
endif()

# Contraction, errno and traps as everywhere; loop distribution is off because g++ 12.2 makes wrong code of copies of
# private arrays of structs with it; the two parameters let it move a choice between many modes out of a loop.
set(_device_cpu_flags -std=c++17 -O3 -fPIC -fvisibility=hidden -fno-exceptions -fno-rtti -ffp-contract=fast
    -fno-math-errno -fno-trapping-math -Wall -Wextra -fno-gnu-unique -Wno-unused-function
    -Wno-unused-parameter -Wno-psabi)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    list(APPEND _device_cpu_flags -fno-tree-loop-distribution --param=max-unswitch-level=8
        --param=max-unswitch-insns=500)
endif()
if(VANTREL_WERROR)
    list(APPEND _device_cpu_flags -Werror)
endif()

# Release builds carry machine code for the devices in use and PTX for later ones, the others PTX alone: it is what
# takes the time.
set(_device_nvcc_flags -std=c++17 -O3 --fmad=true -Wno-deprecated-gpu-targets -gencode=arch=compute_75,code=compute_75)
if(CMAKE_BUILD_TYPE STREQUAL "Release")
    foreach(arch 75 80 86 89 90)
        list(APPEND _device_nvcc_flags -gencode=arch=compute_${arch},code=sm_${arch})
    endforeach()
endif()

function(_device_module_cpu source output)
    set(objects "")
    foreach(level v2 v3 v4)
        set(object ${output}.${level}.o)
        add_custom_command(OUTPUT ${object}
            COMMAND ${CMAKE_CXX_COMPILER_LAUNCHER} ${CMAKE_CXX_COMPILER} ${_device_cpu_flags} -march=x86-64-${level}
                -mtune=generic -DDIALECT_LEVEL=${level} -I${PROJECT_SOURCE_DIR}/Foundation -I${PROJECT_SOURCE_DIR}
                -MD -MF ${object}.d -MT ${object} -x c++ -c ${source} -o ${object}
            DEPENDS ${source} DEPFILE ${object}.d
            COMMENT "Device module ${source} for x86-64-${level}" VERBATIM)
        list(APPEND objects ${object})
    endforeach()
    add_custom_command(OUTPUT ${output}.so
        COMMAND ${CMAKE_C_COMPILER} -shared -Wl,-s -Wl,-z,noexecstack -o ${output}.so ${objects} -lm
        DEPENDS ${objects} COMMENT "" VERBATIM)
endfunction()

# Directives are carried out and macros kept, so that the text stays legible and the platform's own macros decide. The
# lanes are set by whoever builds the program. Headers are followed through the CPU object's dependencies, which know
# nothing of the other targets' dialects.
set(_device_dialects ${PROJECT_SOURCE_DIR}/Foundation/Kiln/Device/DialectOpenCL.h
    ${PROJECT_SOURCE_DIR}/Foundation/Kiln/Device/DialectCuda.h
    ${PROJECT_SOURCE_DIR}/Foundation/Kiln/Device/LanePixels.h
    ${PROJECT_SOURCE_DIR}/Foundation/Kiln/Device/ThreadPixels.h)
function(_device_module_opencl source output)
    add_custom_command(OUTPUT ${output}.cl
        COMMAND ${CMAKE_COMMAND} -DCOMPILER=${CMAKE_CXX_COMPILER} -DSOURCE=${source} -DOUTPUT=${output}.cl
            -DROOT=${PROJECT_SOURCE_DIR} -P ${_device_modules_dir}/DeviceModuleOpenCL.cmake
        DEPENDS ${source} ${output}.v2.o ${_device_dialects} ${_device_modules_dir}/DeviceModuleOpenCL.cmake
        COMMENT "" VERBATIM)
endfunction()

function(_device_module_cuda source output)
    set(includes -I${PROJECT_SOURCE_DIR}/Foundation -I${PROJECT_SOURCE_DIR})
    if(_device_cuda STREQUAL "nvcc")
        add_custom_command(OUTPUT ${output}.cuda
            COMMAND ${VANTREL_NVCC} ${_device_nvcc_flags} ${includes} -x cu -fatbin ${source} -o ${output}.cuda
            DEPENDS ${source} ${output}.v2.o ${_device_dialects} COMMENT "Device module ${source} for CUDA" VERBATIM)
    else()
        # A driver takes PTX as text with a zero behind it, which the embedding adds.
        add_custom_command(OUTPUT ${output}.cuda
            COMMAND ${VANTREL_CUDA_CLANG} -x cuda -std=c++17 -O3 -ffp-contract=fast --cuda-device-only -nocudainc
                -nocudalib --cuda-gpu-arch=sm_75 -Wno-unknown-cuda-version -Wno-unused-command-line-argument ${includes}
                -S ${source} -o ${output}.cuda
            DEPENDS ${source} ${output}.v2.o ${_device_dialects} COMMENT "Device module ${source} for CUDA" VERBATIM)
    endif()
endfunction()

function(vantrel_device_modules target)
    get_target_property(count ${target} VANTREL_DEVICE_TABLES)
    if(NOT count)
        set(count 0)
    endif()
    math(EXPR count "${count} + 1")
    set_target_properties(${target} PROPERTIES VANTREL_DEVICE_TABLES ${count})
    set(table vantrel_modules_${target}_${count})
    set(directory ${CMAKE_CURRENT_BINARY_DIR}/${table})
    file(MAKE_DIRECTORY ${directory})

    set(assembly "    .section .rodata\n")
    set(declarations "")
    set(rows "")
    set(outputs "")
    set(number 0)
    list(LENGTH ARGN length)
    math(EXPR last "${length} - 1")
    foreach(index RANGE 0 ${last} 2)
        list(GET ARGN ${index} key)
        math(EXPR next "${index} + 1")
        list(GET ARGN ${next} source)
        get_filename_component(source ${source} ABSOLUTE)
        get_filename_component(stem ${source} NAME_WE)
        set(output ${directory}/${number}_${stem})
        _device_module_cpu(${source} ${output})
        _device_module_opencl(${source} ${output})
        list(APPEND outputs ${output}.so ${output}.cl)
        set(forms "so" "cl")
        if(_device_cuda)
            _device_module_cuda(${source} ${output})
            list(APPEND outputs ${output}.cuda)
            list(APPEND forms "cuda")
        endif()
        foreach(form IN LISTS forms)
            set(name ${table}_${number}_${form})
            string(APPEND assembly
                "    .balign 64\n    .globl ${name}\n    .hidden ${name}\n${name}:\n    .incbin \"${output}.${form}\"\n"
                "    .globl ${name}_end\n    .hidden ${name}_end\n${name}_end:\n    .byte 0\n")
            string(APPEND declarations "extern const char ${name}[], ${name}_end[];\n")
        endforeach()
        set(name ${table}_${number})
        string(REPLACE "\\" "\\\\" escaped "${key}")
        set(cuda "nullptr, 0")
        if(_device_cuda)
            set(cuda "${name}_cuda, Size(${name}_cuda, ${name}_cuda_end)")
        endif()
        string(APPEND rows "    {\"${escaped}\", ${name}_cl, Size(${name}_cl, ${name}_cl_end), ${name}_so,\n"
            "     Size(${name}_so, ${name}_so_end), ${cuda}},\n")
        math(EXPR number "${number} + 1")
    endforeach()
    string(APPEND assembly "    .section .note.GNU-stack,\"\",@progbits\n")

    file(CONFIGURE OUTPUT ${directory}/images.S CONTENT "${assembly}" @ONLY)
    set_source_files_properties(${directory}/images.S PROPERTIES OBJECT_DEPENDS "${outputs}")
    # Written by string, because configuring would take the keys' back-slashes away.
    set(text "// Made by cmake/DeviceModules.cmake.
#include <cstddef>

#include \"Kiln/Modules.h\"

extern \"C\" {
${declarations}// A static library's users refer to it, so that the linker keeps this table.
extern const int ${table};
const int ${table} = ${number};
}

namespace {
std::size_t Size(const char* begin, const char* end) { return static_cast<std::size_t>(end - begin); }
const Kiln::ModuleImage kImages[] = {
${rows}};
const Kiln::ModuleLibrary kLibrary(kImages, ${number});
}  // namespace
")
    set(previous "")
    if(EXISTS ${directory}/images.cpp)
        file(READ ${directory}/images.cpp previous)
    endif()
    if(NOT previous STREQUAL text)
        file(WRITE ${directory}/images.cpp "${text}")
    endif()
    target_sources(${target} PRIVATE ${directory}/images.S ${directory}/images.cpp)
    get_target_property(type ${target} TYPE)
    if(type STREQUAL "STATIC_LIBRARY")
        target_link_options(${target} INTERFACE "LINKER:--undefined=${table}")
    endif()
endfunction()
