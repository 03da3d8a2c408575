// Characters of UTF-8 one by one, between losses (see detail/shortcut.h).
#include <kvt/encoding/detail/shortcut.h>

#include <kvt/foundation/detail/utf.h>

#include <algorithm>
#include <bit>
#include <cstdint>
#include <cstring>

namespace kvt::ex::detail {
namespace {

char* putUnits(char32_t character, char* out) {
    return out + encodeUtf8(character, out);
}

char16_t* putUnits(char32_t character, char16_t* out) {
    if (character < firstSupplementary) {
        *out = static_cast<char16_t>(character);
        return out + 1;
    }
    out[0] = highSurrogate(character);
    out[1] = lowSurrogate(character);
    return out + 2;
}

char32_t* putUnits(char32_t character, char32_t* out) {
    *out = character;
    return out + 1;
}

/// Of a word of text, the bytes before the first one that is not ASCII.
std::size_t asciiBytes(std::uint64_t word) {
    const std::uint64_t others = word & 0x8080808080808080;
    return static_cast<std::size_t>(std::endian::native == std::endian::little ? std::countr_zero(others)
                                                                               : std::countl_zero(others)) /
           8;
}

/// The characters that begin in the first sixteen bytes of UTF-8, up to one that is not well-formed and complete. Returns
/// the bytes taken.
template <typename Unit>
std::size_t appendFew(std::string_view in, std::string& out) {
    constexpr std::size_t few = 16;
    std::uint64_t word = 0;
    Unit written[few + 2 * sizeof word];
    Unit* end = written;
    std::size_t taken = 0;
    while (taken < std::min(few, in.size())) {
        const std::string_view rest = in.substr(taken);
        std::size_t length = 0;
        if (rest.size() >= sizeof word) {
            std::memcpy(&word, rest.data(), sizeof word);
            length = asciiBytes(word);
            for (std::size_t i = 0; i < sizeof word; ++i) {
                end[i] = static_cast<Unit>(static_cast<unsigned char>(rest[i]));
            }
            end += length;
        }
        if (length == 0) {
            length = utf8Length(rest[0]);
            if (length > rest.size() || malformedLength({Form::utf8}, rest) != 0) {
                break;
            }
            char32_t character =
                static_cast<unsigned char>(rest[0]) & (length == 1 ? 0x7FU : 0x7FU >> length);
            for (std::size_t i = 1; i < length; ++i) {
                character = character << 6 | continuationBits(rest[i]);
            }
            end = putUnits(character, end);
        }
        taken += length;
    }
    out.append(reinterpret_cast<const char*>(written),
               static_cast<std::size_t>(end - written) * sizeof(Unit));
    return taken;
}

} // namespace

// A lead byte and those behind it that could go on with the same character, as far as they do: the "maximal subpart" of
// the Unicode Standard.
std::size_t malformedLength(Side from, std::string_view in) {
    if (from.form != Form::utf8 || in.empty()) {
        return 0;
    }
    const auto lead = static_cast<unsigned char>(in[0]);
    if (lead < 0x80 || lead > 0xF4 || lead < 0xC2) {
        return lead < 0x80 ? 0 : 1;
    }
    const std::size_t whole = utf8Length(in[0]);
    for (std::size_t length = 1; length < whole; ++length) {
        if (length == in.size()) {
            return 0;
        }
        const auto byte = static_cast<unsigned char>(in[length]);
        const bool isSecond = length == 1;
        const unsigned least = isSecond && lead == 0xE0 ? 0xA0 : isSecond && lead == 0xF0 ? 0x90 : 0x80;
        const unsigned most = isSecond && lead == 0xED ? 0x9F : isSecond && lead == 0xF4 ? 0x8F : 0xBF;
        if (byte < least || byte > most) {
            return length;
        }
    }
    return 0;
}

std::size_t convertFew(Side from, Side to, std::string_view in, std::string& out) {
    return from.form != Form::utf8  ? 0
           : to.form == Form::utf8  ? appendFew<char>(in, out)
           : to.form == nativeUtf16 ? appendFew<char16_t>(in, out)
           : to.form == nativeUtf32 ? appendFew<char32_t>(in, out)
                                    : 0;
}

} // namespace kvt::ex::detail
