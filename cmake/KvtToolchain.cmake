# How every target of this project is compiled: ccache where there is one, no compiler extensions, and one switch
# for the sanitizers, which have to be the same in the library and in all that links it.
#
# ccache looks at precompiled headers only when it is told to trust that they say what the compiler read, and clang puts
# the time into them, which would make each another.

if(PROJECT_IS_TOP_LEVEL AND NOT DEFINED CMAKE_CXX_COMPILER_LAUNCHER)
    find_program(KVT_CCACHE ccache)
    mark_as_advanced(KVT_CCACHE)
    if(KVT_CCACHE)
        set(CMAKE_CXX_COMPILER_LAUNCHER
            env CCACHE_SLOPPINESS=pch_defines,time_macros "${KVT_CCACHE}")
        if(CMAKE_CXX_COMPILER_ID MATCHES "Clang")
            add_compile_options("$<$<COMPILE_LANGUAGE:CXX>:SHELL:-Xclang -fno-pch-timestamp>")
        endif()
    endif()
endif()

set(CMAKE_CXX_EXTENSIONS OFF)

# Counts, in what is compiled of a target, how often each line is run. It is not optimised, since then branches would not be
# those of the source; all else is compiled as in preset dev, so that ccache has it.
function(kvt_count_lines target)
    if(KVT_COVERAGE)
        target_compile_options(${target} PRIVATE -O0 -g1 --coverage -fprofile-update=atomic)
    endif()
endfunction()
if(KVT_COVERAGE)
    add_link_options(--coverage)
endif()

if(KVT_SANITIZE)
    add_compile_options(-fsanitize=${KVT_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${KVT_SANITIZE})
endif()
