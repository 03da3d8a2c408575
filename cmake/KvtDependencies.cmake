# Everything that kvt needs from outside. Nothing is fetched: each package is found on the machine, and where it is
# not, the message says which Debian or Ubuntu package brings it.

# kvt_find(NAME what INSTALL package PACKAGE arguments-of-find_package...)
macro(kvt_find)
    cmake_parse_arguments(KVT_FIND "" "NAME;INSTALL" "PACKAGE" ${ARGN})
    find_package(${KVT_FIND_PACKAGE} QUIET)
    list(GET KVT_FIND_PACKAGE 0 KVT_FIND_ID)
    if(NOT ${KVT_FIND_ID}_FOUND)
        message(FATAL_ERROR
            "kvt needs ${KVT_FIND_NAME}, which was not found.\n"
            "On Debian or Ubuntu: apt-get install ${KVT_FIND_INSTALL}\n"
            "or './dev setup', which installs everything that is missing.")
    endif()
endmacro()

kvt_find(NAME "POSIX threads" INSTALL "libc6-dev" PACKAGE Threads)
kvt_find(NAME "ICU 58 or later (its uc library)" INSTALL "libicu-dev" PACKAGE ICU 58 COMPONENTS uc)
# From 1.76 on, Boost.Regex is headers only, so that nothing of Boost is linked against. The users of an installed
# kvt need the same (kvtConfig.cmake.in).
set(KVT_BOOST_VERSION 1.76)
kvt_find(NAME "the Boost headers, ${KVT_BOOST_VERSION} or later" INSTALL "libboost1.81-dev (or libboost-dev)"
    PACKAGE Boost ${KVT_BOOST_VERSION} CONFIG)
kvt_find(NAME "double-conversion" INSTALL "libdouble-conversion-dev" PACKAGE double-conversion CONFIG)
kvt_find(NAME "Highway" INSTALL "libhwy-dev" PACKAGE hwy CONFIG)
kvt_find(NAME "the headers of the date library" INSTALL "libhowardhinnant-date-dev" PACKAGE date CONFIG)

if(KVT_BUILD_TOOLS OR KVT_BUILD_TESTS OR KVT_BUILD_FUZZERS)
    kvt_find(NAME "ICU's i18n library, for the kvt command" INSTALL "libicu-dev" PACKAGE ICU 58 COMPONENTS uc i18n)
    kvt_find(NAME "CLI11, for the kvt command" INSTALL "libcli11-dev" PACKAGE CLI11 CONFIG)
    kvt_find(NAME "nlohmann-json, for the kvt command" INSTALL "nlohmann-json3-dev" PACKAGE nlohmann_json CONFIG)
    # Of its headers alone: the library that the package has, too, is not linked.
    kvt_find(NAME "toml++, for the kvt command" INSTALL "libtomlplusplus-dev" PACKAGE tomlplusplus CONFIG)
endif()
if(KVT_BUILD_TESTS)
    kvt_find(NAME "GoogleTest, for the tests" INSTALL "libgtest-dev" PACKAGE GTest CONFIG)
    kvt_find(NAME "{fmt}, for the tests of its formatter" INSTALL "libfmt-dev" PACKAGE fmt CONFIG)
endif()
if(KVT_BUILD_BENCH)
    kvt_find(NAME "Google Benchmark, for the benchmarks" INSTALL "libbenchmark-dev" PACKAGE benchmark CONFIG)
    kvt_find(NAME "Abseil, for the benchmarks" INSTALL "libabsl-dev" PACKAGE absl CONFIG)
endif()
