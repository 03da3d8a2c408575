# Read by ctest when it starts, once for each test program: registers its suites, or its cases where `each_case` says so.
#
#   program     the program
#   folder      where it is run
#   label       the label of its tests
#   each_case   whether each case is a test to ctest

if(NOT EXISTS "${program}")
    add_test("${program}.is_not_built" false)
    set_tests_properties("${program}.is_not_built" PROPERTIES LABELS "${label}")
    return()
endif()
execute_process(COMMAND "${program}" --gtest_list_tests
    WORKING_DIRECTORY "${folder}" OUTPUT_VARIABLE listing RESULT_VARIABLE failed)
if(failed)
    message(FATAL_ERROR "${program} --gtest_list_tests: ${failed}")
endif()

# A line that is not indented is a suite, with a dot at its end; the indented ones below are its cases. The instances of
# a typed suite differ in what follows the last slash, and behind "#" stands the type.
set(tests)
string(REPLACE ";" "," listing "${listing}")
string(REPLACE "\n" ";" lines "${listing}")
foreach(line IN LISTS lines)
    string(REGEX REPLACE " +#.*" "" name "${line}")
    if(line MATCHES "^[^ ].*\\.( |$)" AND NOT line MATCHES "^Running main")
        set(suite "${name}")
        string(REGEX REPLACE "\\.$" "" test "${name}")
        if(line MATCHES "# TypeParam")
            string(REGEX REPLACE "/[^/]*$" "" test "${test}")
        endif()
        if(NOT each_case)
            list(APPEND tests "${test}")
            list(APPEND "filter_${test}" "${suite}*")
        endif()
    elseif(each_case AND line MATCHES "^  ")
        string(STRIP "${name}" case)
        list(APPEND tests "${suite}${case}")
        set("filter_${suite}${case}" "${suite}${case}")
    endif()
endforeach()
list(REMOVE_DUPLICATES tests)
if(NOT tests)
    message(FATAL_ERROR "${program} has no tests")
endif()

# A test with cases that were skipped, and none that failed, is shown as skipped.
set(skipped "\\[  PASSED  \\] [0-9]+ tests?\\.\n(\\[  SKIPPED \\][^\n]*\n)+$")
foreach(test IN LISTS tests)
    list(JOIN "filter_${test}" ":" filter)
    add_test("${test}" "${program}" "--gtest_filter=${filter}")
    set_tests_properties("${test}" PROPERTIES
        WORKING_DIRECTORY "${folder}"
        LABELS "${label}"
        SKIP_REGULAR_EXPRESSION "${skipped}")
    unset("filter_${test}")
endforeach()
