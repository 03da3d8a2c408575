// The names of types as a reader writes them.
#pragma once

#include <string>
#include <typeinfo>

namespace kvt::platform {

/// The qualified name of a type, as `kvt::ex::Exception`.
std::string typeName(const std::type_info& type);

} // namespace kvt::platform
