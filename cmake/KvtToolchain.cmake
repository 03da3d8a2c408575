# How every target of this project is compiled: ccache where there is one, no compiler extensions, and one switch
# for the sanitizers, which have to be the same in the library and in all that links it.

if(PROJECT_IS_TOP_LEVEL AND NOT DEFINED CMAKE_CXX_COMPILER_LAUNCHER)
    find_program(KVT_CCACHE ccache)
    mark_as_advanced(KVT_CCACHE)
    if(KVT_CCACHE)
        set(CMAKE_CXX_COMPILER_LAUNCHER "${KVT_CCACHE}")
    endif()
endif()

set(CMAKE_CXX_EXTENSIONS OFF)

if(KVT_SANITIZE)
    add_compile_options(-fsanitize=${KVT_SANITIZE} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${KVT_SANITIZE})
endif()
