// Numbers and sizes as they are typed.
#pragma once

#include <cstdint>
#include <string>

namespace host {

/// "128M" and the like in bytes: a whole number, and K, M, G or T for powers of 1024. Throws Failure, which names
/// `option`.
std::uint64_t parseSize(const std::string& option, const std::string& typed);

/// A whole number from 0 in plain decimal digits. Throws Failure, which names `option`.
std::uint64_t parseNumber(const std::string& option, const std::string& typed);

/// The same with a fraction behind a point, perhaps.
double parseDecimal(const std::string& option, const std::string& typed);

} // namespace host
