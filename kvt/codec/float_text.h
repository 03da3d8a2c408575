// The shortest decimal text that reads back to the same floating-point value.
//
// The digits are the fewest that identify the value, and of those the closest to it. They are laid out in one of
// three forms: integer ("1500"), fixed ("0.0015") or scientific ("1.5e+20", "1e-5"), by the place of the decimal
// point: whole numbers up to 17 digits (9 for `float`) and fractions down to 0.0001 need no exponent.
//
// The functions take a plain buffer, know no locale, allocate nothing and never fail.
#pragma once

#include <kvt/foundation/export.h>

#include <cstdint>

namespace kvt::ex {

/// The chars that a buffer must have room for. The longest text of a finite value has 24, without its zero.
inline constexpr int floatTextBuffer = 100;

/// Writes the text and a zero to `buffer`, and returns the number of chars before the zero. Special values read
/// "0", "-0", "inf", "-inf", "nan" and "-nan".
KVT_EXPORT std::uint64_t double_to_string(double value, char* const buffer);

/// The same, with the special values as XML Schema spells them: "INF", "-INF", and "NaN" whatever its sign.
KVT_EXPORT std::uint64_t double_to_string_xml(double value, char* const buffer);

/// The same as double_to_string() with the digits that identify a `float`.
KVT_EXPORT std::uint64_t float_to_string(float value, char* const buffer);

} // namespace kvt::ex
