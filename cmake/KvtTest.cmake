# kvt_test(NAME name SOURCES file... [PRIVATE | STANDALONE] [LABEL label] [LIBRARIES library...])
#
# One GoogleTest program, its cases registered one by one. It is linked against the shared library, as a user's
# program would be; PRIVATE takes the static one instead, for tests of parts that are not exported, and STANDALONE
# neither. Programs find helpers under tests/ by the include root "tests" (#include <support/...>).
#
# `./dev check` chooses tests by label: "library" (the default) for the library's unit tests, "smoke" for what looks at
# the product as a whole. Other labels are in no check.

include(GoogleTest)

function(kvt_test)
    cmake_parse_arguments(PARSE_ARGV 0 arg "PRIVATE;STANDALONE" "NAME;LABEL" "SOURCES;LIBRARIES")
    if(NOT arg_LABEL)
        set(arg_LABEL library)
    endif()
    add_executable(${arg_NAME} ${arg_SOURCES})
    target_compile_features(${arg_NAME} PRIVATE cxx_std_20)
    target_include_directories(${arg_NAME} PRIVATE "${PROJECT_SOURCE_DIR}/tests")
    if(arg_PRIVATE)
        target_link_libraries(${arg_NAME} PRIVATE kvt_static)
    elseif(NOT arg_STANDALONE)
        target_link_libraries(${arg_NAME} PRIVATE kvt::kvt)
    endif()
    target_link_libraries(${arg_NAME} PRIVATE GTest::gmock GTest::gtest GTest::gtest_main ${arg_LIBRARIES})
    kvt_warnings(${arg_NAME})
    gtest_discover_tests(${arg_NAME} DISCOVERY_MODE PRE_TEST PROPERTIES LABELS ${arg_LABEL})
endfunction()
