# The project's targets share their flags here; nothing is set for a directory.

add_library(vantrel_flags INTERFACE)
target_compile_features(vantrel_flags INTERFACE cxx_std_17)
target_compile_options(vantrel_flags INTERFACE
    $<$<COMPILE_LANGUAGE:C,CXX>:-Wall -Wextra -Wshadow -Wnon-virtual-dtor -Woverloaded-virtual -Wcast-align -Wconversion
        -Wno-sign-conversion -fno-math-errno>
    $<$<AND:$<COMPILE_LANGUAGE:C,CXX>,$<BOOL:${VANTREL_WERROR}>>:-Werror>)
foreach(sanitizer IN LISTS VANTREL_SANITIZE)
    target_compile_options(vantrel_flags INTERFACE
        -fsanitize=${sanitizer} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    target_link_options(vantrel_flags INTERFACE -fsanitize=${sanitizer})
endforeach()

# vantrel_foundation_library(<Name> SOURCES ... [LINK ...] [PRIVATE_LINK ...])
# A foundation library: a shared library whose undefined symbols are link errors, so that the linker keeps the layers.
function(vantrel_foundation_library name)
    cmake_parse_arguments(ARG "" "" "SOURCES;LINK;PRIVATE_LINK" ${ARGN})
    string(TOLOWER "${name}" lower)
    add_library(${lower} SHARED ${ARG_SOURCES})
    add_library(Vantrel::${name} ALIAS ${lower})
    target_include_directories(${lower} PUBLIC
        $<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/Foundation>
        $<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}/vantrel>)
    target_link_libraries(${lower} PUBLIC ${ARG_LINK} PRIVATE ${ARG_PRIVATE_LINK} $<BUILD_INTERFACE:vantrel_flags>)
    if(NOT VANTREL_SANITIZE)
        target_link_options(${lower} PRIVATE -Wl,--no-undefined)
    endif()
    set_target_properties(${lower} PROPERTIES
        OUTPUT_NAME vantrel-${lower}
        EXPORT_NAME ${name}
        VERSION ${PROJECT_VERSION} SOVERSION ${PROJECT_VERSION_MAJOR}
        INSTALL_RPATH "$ORIGIN"
        LIBRARY_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/lib)
    install(TARGETS ${lower} EXPORT VantrelTargets LIBRARY DESTINATION ${CMAKE_INSTALL_LIBDIR})
endfunction()

# vantrel_engine_objects(<Name> SOURCES ... [LINK ...])
# One layer of the engine: objects with hidden symbols, from which the engine's library and its inner tests are linked.
function(vantrel_engine_objects name)
    cmake_parse_arguments(ARG "" "" "SOURCES;LINK" ${ARGN})
    string(TOLOWER "engine_${name}" target)
    add_library(${target} OBJECT ${ARG_SOURCES})
    add_library(Vantrel::${name} ALIAS ${target})
    target_include_directories(${target} PUBLIC ${PROJECT_SOURCE_DIR} ${PROJECT_SOURCE_DIR}/Include)
    target_link_libraries(${target} PUBLIC ${ARG_LINK} Vantrel::Kiln Vantrel::Tarn Vantrel::Brae PRIVATE vantrel_flags)
    set_target_properties(${target} PROPERTIES
        POSITION_INDEPENDENT_CODE ON CXX_VISIBILITY_PRESET hidden VISIBILITY_INLINES_HIDDEN ON)
endfunction()

# vantrel_test(<name> SOURCES ... [LINK ...] [LABELS ...] [TIMEOUT seconds])
# A test program; ctest runs it as one test.
function(vantrel_test name)
    cmake_parse_arguments(ARG "" "TIMEOUT" "SOURCES;LINK;LABELS" ${ARGN})
    if(NOT ARG_TIMEOUT)
        set(ARG_TIMEOUT 300)
    endif()
    add_executable(${name} ${ARG_SOURCES})
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR} ${PROJECT_SOURCE_DIR}/Include)
    target_link_libraries(${name} PRIVATE ${ARG_LINK} GTest::gmock GTest::gtest_main vantrel_flags)
    set_target_properties(${name} PROPERTIES RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/tests)
    add_test(NAME ${name} COMMAND ${name})
    set_tests_properties(${name} PROPERTIES
        LABELS "${ARG_LABELS}" TIMEOUT ${ARG_TIMEOUT}
        ENVIRONMENT "POCL_CACHE_DIR=${PROJECT_BINARY_DIR}/opencl-cache;KILN_CACHE_DIR=${PROJECT_BINARY_DIR}/kiln-cache;LSAN_OPTIONS=suppressions=${PROJECT_SOURCE_DIR}/cmake/lsan.supp:print_suppressions=0;TSAN_OPTIONS=suppressions=${PROJECT_SOURCE_DIR}/cmake/tsan.supp:second_deadlock_stack=1")
endfunction()
