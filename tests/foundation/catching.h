// Which of the library's classes a failure can be caught as, by handlers compiled where this header is included.
#pragma once

#include <kvt/foundation/throwable.h>

#include <functional>
#include <string>

namespace kvt::test {

template <typename Class>
bool isCaughtAs(const std::function<void()>& operation) {
    try {
        operation();
    } catch (const Class&) {
        return true;
    } catch (...) {
    }
    return false;
}

/// The names of the classes that match, each followed by a blank, from the root of the tree on.
inline std::string caughtAs(const std::function<void()>& operation) {
    using namespace kvt::ex;
    std::string names;
    const auto add = [&names](bool matches, const char* name) {
        if (matches) {
            names.append(name).append(" ");
        }
    };
    add(isCaughtAs<std::exception>(operation), "std::exception");
    add(isCaughtAs<Throwable>(operation), "Throwable");
    add(isCaughtAs<Exception>(operation), "Exception");
    add(isCaughtAs<FatalError>(operation), "FatalError");
    add(isCaughtAs<UStringException>(operation), "UStringException");
    add(isCaughtAs<UStringBadEncodingException>(operation), "UStringBadEncodingException");
    add(isCaughtAs<UStringTranscodingException>(operation), "UStringTranscodingException");
    add(isCaughtAs<UStringBinaryTranscodingException>(operation), "UStringBinaryTranscodingException");
    add(isCaughtAs<UStringNotImplementedException>(operation), "UStringNotImplementedException");
    add(isCaughtAs<InvalidEncodingException>(operation), "InvalidEncodingException");
    add(isCaughtAs<PythonVersionError>(operation), "PythonVersionError");
    return names;
}

} // namespace kvt::test
