# What compilers and linkers offer against the usual attacks, for the library and the command: checked sizes in calls of
# the C library (where there is optimisation), canaries on the stack and probes of it, programs at a random address, no
# writable tables of addresses once a program runs, no stack that can be executed. tests/house/hardening.sh looks at what
# was built. Sanitizers do better, and the two do not go together.

option(KVT_HARDENING "Build with what protects against the usual attacks" ON)

include(CheckCXXCompilerFlag)
include(CheckPIESupported)
check_pie_supported(LANGUAGES CXX)
set(KVT_HARDENING_FLAGS)
foreach(flag IN ITEMS -fstack-protector-strong -fstack-clash-protection)
    string(MAKE_C_IDENTIFIER "KVT_HAS${flag}" has)
    check_cxx_compiler_flag(${flag} ${has})
    if(${has})
        list(APPEND KVT_HARDENING_FLAGS ${flag})
    endif()
endforeach()

function(kvt_harden target)
    if(NOT KVT_HARDENING OR KVT_SANITIZE)
        return()
    endif()
    set(optimised $<CONFIG:Release,RelWithDebInfo,MinSizeRel>)
    target_compile_options(${target} PRIVATE ${KVT_HARDENING_FLAGS}
        $<${optimised}:-U_FORTIFY_SOURCE> $<${optimised}:-D_FORTIFY_SOURCE=2>)
    get_target_property(type ${target} TYPE)
    if(NOT type STREQUAL "OBJECT_LIBRARY")
        target_link_options(${target} PRIVATE LINKER:-z,relro,-z,now,-z,noexecstack)
    endif()
    set_target_properties(${target} PROPERTIES POSITION_INDEPENDENT_CODE ON)
endfunction()
