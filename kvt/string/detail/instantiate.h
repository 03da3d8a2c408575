// The list of the eight string types. Each source that defines members of UString ends with it, so that each
// exports the members that it defines.
#pragma once

#include <kvt/string/ustring.h>

/// Calls `X(N)`, or `X(argument, N)`, for each instantiation.
#define KVT_FOR_EACH_USTRING(X) X(0) X(1) X(2) X(3) X(27) X(28) X(29) X(30)
#define KVT_FOR_EACH_USTRING_WITH(X, argument)                                                               \
    X(argument, 0)                                                                                           \
    X(argument, 1)                                                                                           \
    X(argument, 2) X(argument, 3) X(argument, 27) X(argument, 28) X(argument, 29) X(argument, 30)

/// Instantiates the members of the class that are defined so far.
#define KVT_INSTANTIATE_USTRING(N) template class UString<N>;
