# kvt_test(NAME name SOURCES file... [PRIVATE | STANDALONE] [EACH_CASE] [LABEL label] [LIBRARIES library...])
#
# One GoogleTest program. It is linked against the shared library, as a user's program would be; PRIVATE takes the static
# one instead, for tests of parts that are not exported, and STANDALONE neither. Programs find helpers under tests/ by
# the include root "tests" (#include <support/...>).
#
# To ctest each suite is one test, run in a process of its own; a typed suite is one test with all its types. With
# EACH_CASE it is one for each case: for programs whose cases look at what a process does first, or are long.
#
# `./dev check` chooses tests by label: "library" (the default) for the library's unit tests, "smoke" for what looks at
# the product as a whole. Other labels are in no check.

# What all tests include, compiled once. Headers of the library are not in it, as a change of one would compile every
# test anew.
set(KVT_TEST_HEADERS
    <algorithm> <array> <cstdint> <cstdio> <filesystem> <functional> <memory> <optional> <ostream> <random> <string>
    <string_view> <type_traits> <utility> <vector> <gtest/gtest.h>)

# kvt_test_program(name): how the code of tests is compiled, in programs of all kinds.
function(kvt_test_program name)
    target_compile_features(${name} PRIVATE cxx_std_20)
    target_include_directories(${name} PRIVATE "${PROJECT_SOURCE_DIR}/tests")
    separate_arguments(flags NATIVE_COMMAND "${KVT_TEST_FLAGS}")
    target_compile_options(${name} PRIVATE ${flags})
    kvt_warnings(${name})
endfunction()

function(kvt_test)
    cmake_parse_arguments(PARSE_ARGV 0 arg "PRIVATE;STANDALONE;EACH_CASE" "NAME;LABEL" "SOURCES;LIBRARIES")
    if(NOT arg_LABEL)
        set(arg_LABEL library)
    endif()
    add_executable(${arg_NAME} ${arg_SOURCES})
    kvt_test_program(${arg_NAME})
    target_precompile_headers(${arg_NAME} REUSE_FROM kvt_test_kit)
    if(arg_LABEL MATCHES "^(library|smoke)$")
        add_dependencies(check_programs ${arg_NAME})
    endif()
    if(arg_PRIVATE)
        target_link_libraries(${arg_NAME} PRIVATE kvt_static)
    elseif(NOT arg_STANDALONE)
        target_link_libraries(${arg_NAME} PRIVATE kvt::kvt)
    endif()
    target_link_libraries(${arg_NAME} PRIVATE kvt_test_kit GTest::gtest GTest::gtest_main ${arg_LIBRARIES})

    # Which suites there are is asked of the program when ctest starts.
    set(script "${CMAKE_CURRENT_BINARY_DIR}/${arg_NAME}_suites.cmake")
    file(GENERATE OUTPUT "${script}" CONTENT "\
set(program [==[$<TARGET_FILE:${arg_NAME}>]==])
set(folder [==[${CMAKE_CURRENT_BINARY_DIR}]==])
set(label ${arg_LABEL})
set(each_case ${arg_EACH_CASE})
include([==[${PROJECT_SOURCE_DIR}/cmake/KvtTestSuites.cmake]==])
")
    set_property(DIRECTORY APPEND PROPERTY TEST_INCLUDE_FILES "${script}")
endfunction()
