// Counts of nanoseconds. The nine thousand years of the library span about 2.9e20 of them, which 64 bits do not hold.
#pragma once

#include <boost/multiprecision/cpp_int.hpp>

#include <cstdint>

namespace kvt::ex::datetime::detail {

/// Nanoseconds since 1970-01-01T00:00:00, or a length of time in nanoseconds. Overflow is not noticed; with what the
/// library puts into it (seconds of 64 bits at most) there is none.
using NanoCount = boost::multiprecision::number<boost::multiprecision::cpp_int_backend<
    128, 128, boost::multiprecision::signed_magnitude, boost::multiprecision::unchecked, void>>;

inline constexpr std::int64_t nanosPerSecond = 1'000'000'000;
inline constexpr std::int64_t secondsPerMinute = 60;
inline constexpr std::int64_t secondsPerHour = 3'600;
inline constexpr std::int64_t secondsPerDay = 86'400;
inline constexpr std::int64_t nanosPerMinute = secondsPerMinute * nanosPerSecond;
inline constexpr std::int64_t nanosPerDay = secondsPerDay * nanosPerSecond;

/// The nearest double.
inline double toDouble(const NanoCount& count) {
    return count.convert_to<double>();
}

} // namespace kvt::ex::datetime::detail
