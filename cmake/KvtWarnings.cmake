# The warnings that all code of this project is held to. They are errors in the builds of `./dev check` alone, since a
# newer compiler or library warns of more, which must not stop who only builds. The tests that compile each public
# header alone use the list, too.

set(KVT_WARNING_FLAGS -Wall -Wextra -Wpedantic -Wconversion -Wshadow)
if(KVT_WERROR)
    list(APPEND KVT_WARNING_FLAGS -Werror)
endif()

function(kvt_warnings target)
    target_compile_options(${target} PRIVATE ${KVT_WARNING_FLAGS})
endfunction()
