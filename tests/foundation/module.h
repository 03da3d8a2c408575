// A module of its own, as a host's plug-in would be: compiled with hidden visibility, it shares nothing with the test
// program but the library.
#pragma once

#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring_array.h>

#include <functional>
#include <memory>
#include <string>

#define KVT_MODULE_API __attribute__((visibility("default")))

namespace plugin {

/// Declared in the module's header with hidden visibility, as most classes of hosts are.
class HiddenFailure : public kvt::ex::Exception {
public:
    using Exception::Exception;
};

/// `count` texts, long and short ones in turn, in an array that the module allocates.
KVT_MODULE_API kvt::ex::UStringArray<0> makeArray(int count);
/// Destroys an array inside the module.
KVT_MODULE_API void dropArray(std::unique_ptr<kvt::ex::vector<kvt::ex::UString<0>>> array);
/// Adds one text; the array may grow.
KVT_MODULE_API void addTo(kvt::ex::UStringArray<0>& array);

/// Throws a failure of the named class, made in the module.
KVT_MODULE_API void throwFailure(const std::string& className);
/// Runs `operation` and gives the names of the classes, among the library's, as which the module could catch it.
KVT_MODULE_API std::string caughtAs(const std::function<void()>& operation);
/// Adds a stack frame to whatever passes through.
KVT_MODULE_API void passThrough(const std::function<void()>& operation);

} // namespace plugin
