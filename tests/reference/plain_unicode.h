// The Unicode forms by plain loops over characters.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>

namespace kvt::test {

/// What is well-formed at the beginning of a text.
struct Decoded {
    std::u32string text;
    std::size_t taken = 0; ///< units
};

Decoded decodeUtf8(std::string_view bytes);
Decoded decodeUtf16(std::u16string_view units);
Decoded decodeUtf32(std::u32string_view units);

std::string encodeUtf8(std::u32string_view text);
std::u16string encodeUtf16(std::u32string_view text);

} // namespace kvt::test
