# The warnings that all code of this project is held to. The list is also used by the checks that compile each
# public header alone.

set(KVT_WARNING_FLAGS -Wall -Wextra -Wpedantic -Wconversion -Wshadow)
if(KVT_WERROR)
    list(APPEND KVT_WARNING_FLAGS -Werror)
endif()

function(kvt_warnings target)
    target_compile_options(${target} PRIVATE ${KVT_WARNING_FLAGS})
endfunction()
