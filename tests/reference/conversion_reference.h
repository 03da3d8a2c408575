// The rules of conversion between strings, worked out with plain decoders for the few encodings that have a
// string type of their own. It uses neither ICU nor the library.
//
// It expects the system encoding to be UTF-8, as it is in the plain "C" locale.
#pragma once

#include <support/failure_record.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace kvt::test::reference {

/// What a conversion leaves in its target, as bytes, and what it throws.
struct Conversion {
    std::string bytes;
    FailureRecord failure;
    /// Whether `bytes` is what the target of a failed conversion holds; else nothing is promised.
    bool stateIsKnown = true;
};

/// The canonical name of an encoding below 4 or from 27 on.
std::string encodingName(std::uint32_t encoding);

/// By decoding to code points and encoding again. Both below 4, or 27 or 30.
Conversion transcoded(std::uint32_t from, std::uint32_t to, std::string_view bytes);
/// UTF-8 to ASCII with the control character 26 for each character that is not ASCII.
Conversion asciiChecked(std::string_view bytes);
/// The rules for encodings that are known at run time only.
Conversion converted(std::uint32_t from, std::uint32_t to, std::string_view bytes);

std::string bytesOfUnits(std::u16string_view units);
std::u16string unitsOfBytes(std::string_view bytes);

} // namespace kvt::test::reference
