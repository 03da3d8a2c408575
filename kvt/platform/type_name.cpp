// Demangling by the C++ run-time of the Itanium ABI.
#include <kvt/platform/type_name.h>

#include <cxxabi.h>

#include <cstdlib>
#include <memory>

namespace kvt::platform {

std::string typeName(const std::type_info& type) {
    int status = 0;
    const std::unique_ptr<char, decltype(&std::free)> name(
        abi::__cxa_demangle(type.name(), nullptr, nullptr, &status), &std::free);
    return name != nullptr ? name.get() : type.name();
}

} // namespace kvt::platform
