#include <reference/conversion_reference.h>
#include <reference/wwjd_reference.h>

#include <kvt/encoding/encoding.h>

#include <array>
#include <cstring>
#include <vector>

namespace kvt::test::reference {

namespace {

using kvt::ex::Encoding;

constexpr char32_t replacement = 0xFFFD;

/// Code points, with U+FFFD for what could not be decoded.
struct Decoded {
    std::vector<char32_t> text;
    bool bad = false;

    void add(bool good, char32_t c) {
        text.push_back(good ? c : replacement);
        bad = bad || !good;
    }
};

constexpr bool isScalar(char32_t c) {
    return c < 0x110000 && (c < 0xD800 || c > 0xDFFF);
}

/// The number of bytes of the character at the start, or minus the length of the longest start of a character
/// that stands there (1 when nothing does): the unit of substitution.
int characterLength(std::string_view in, char32_t& c) {
    const auto byte = [&](std::size_t at) {
        return at < in.size() ? static_cast<unsigned char>(in[at]) : 0u;
    };
    const unsigned lead = byte(0);
    c = lead;
    if (lead < 0x80) {
        return 1;
    }
    if (lead < 0xC2 || lead > 0xF4) {
        return -1;
    }
    const int length = lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
    c = lead & (0xFFu >> (length + 1));
    for (int at = 1; at < length; ++at) {
        const unsigned low = at > 1 ? 0x80 : lead == 0xE0 ? 0xA0 : lead == 0xF0 ? 0x90 : 0x80;
        const unsigned high = at > 1 ? 0xBF : lead == 0xED ? 0x9F : lead == 0xF4 ? 0x8F : 0xBF;
        if (byte(static_cast<std::size_t>(at)) < low || byte(static_cast<std::size_t>(at)) > high) {
            return -at;
        }
        c = c << 6 | (byte(static_cast<std::size_t>(at)) & 0x3F);
    }
    return length;
}

Decoded decodedUtf8(std::string_view in) {
    Decoded result;
    while (!in.empty()) {
        char32_t c = 0;
        const int length = characterLength(in, c);
        result.add(length > 0, c);
        in.remove_prefix(static_cast<std::size_t>(length > 0 ? length : -length));
    }
    return result;
}

Decoded decodedAscii(std::string_view in) {
    Decoded result;
    for (const char byte : in) {
        result.add(static_cast<unsigned char>(byte) < 0x80, static_cast<unsigned char>(byte));
    }
    return result;
}

Decoded decodedUtf16(std::string_view in) {
    Decoded result;
    const std::u16string units = unitsOfBytes(in);
    for (std::size_t at = 0; at < units.size(); ++at) {
        const char32_t unit = units[at];
        const char32_t next = at + 1 < units.size() ? units[at + 1] : 0;
        if (unit >= 0xD800 && unit < 0xDC00 && next >= 0xDC00 && next < 0xE000) {
            result.add(true, 0x10000 + ((unit - 0xD800) << 10) + (next - 0xDC00));
            ++at;
        } else {
            result.add(isScalar(unit), unit);
        }
    }
    if (in.size() % 2 != 0) {
        result.add(false, 0);
    }
    return result;
}

Decoded decodedUtf32(std::string_view in) {
    Decoded result;
    for (; in.size() >= 4; in.remove_prefix(4)) {
        char32_t c = 0;
        std::memcpy(&c, in.data(), 4);
        result.add(isScalar(c), c);
    }
    if (!in.empty()) {
        result.add(false, 0);
    }
    return result;
}

Decoded decoded(std::uint32_t encoding, std::string_view in) {
    switch (encoding) {
    case Encoding::UsAscii:
        return decodedAscii(in);
    case Encoding::Utf16LE:
        return decodedUtf16(in);
    case Encoding::Utf32LE:
        return decodedUtf32(in);
    default:
        return decodedUtf8(in);
    }
}

void appendUtf8(std::string& out, char32_t c) {
    const auto add = [&](char32_t byte) { out += static_cast<char>(byte); };
    if (c < 0x80) {
        add(c);
    } else if (c < 0x800) {
        add(0xC0 | c >> 6);
        add(0x80 | (c & 63));
    } else if (c < 0x10000) {
        add(0xE0 | c >> 12);
        add(0x80 | (c >> 6 & 63));
        add(0x80 | (c & 63));
    } else {
        add(0xF0 | c >> 18);
        add(0x80 | (c >> 12 & 63));
        add(0x80 | (c >> 6 & 63));
        add(0x80 | (c & 63));
    }
}

/// Characters that show nothing (Unicode's Default_Ignorable_Code_Point, as far as ICU's converters take it):
/// where the target lacks one nothing stands in its place, though it counts as lost.
bool isIgnorable(char32_t c) {
    constexpr char32_t ranges[][2] = {
        {0x00AD, 0x00AD},   {0x034F, 0x034F},   {0x061C, 0x061C}, {0x115F, 0x1160}, {0x17B4, 0x17B5},
        {0x180B, 0x180E},   {0x200B, 0x200F},   {0x202A, 0x202E}, {0x2060, 0x206F}, {0x3164, 0x3164},
        {0xFE00, 0xFE0F},   {0xFEFF, 0xFEFF},   {0xFFA0, 0xFFA0}, {0xFFF0, 0xFFF8}, {0x1BCA0, 0x1BCA3},
        {0x1D173, 0x1D17A}, {0xE0000, 0xE0FFF},
    };
    for (const auto& [first, last] : ranges) {
        if (c >= first && c <= last) {
            return true;
        }
    }
    return false;
}

std::string encoded(std::uint32_t encoding, const std::vector<char32_t>& text) {
    std::string out;
    for (const char32_t c : text) {
        if (encoding == Encoding::UsAscii) {
            if (c < 0x80 || !isIgnorable(c)) {
                out += c < 0x80 ? static_cast<char>(c) : '?';
            }
        } else if (encoding == Encoding::Utf16LE) {
            std::u16string units(1, static_cast<char16_t>(c));
            if (c >= 0x10000) {
                units = {static_cast<char16_t>(0xD7C0 + (c >> 10)),
                         static_cast<char16_t>(0xDC00 + (c & 0x3FF))};
            }
            out += bytesOfUnits(units);
        } else if (encoding == Encoding::Utf32LE) {
            std::array<char, 4> unit{};
            std::memcpy(unit.data(), &c, 4);
            out.append(unit.data(), 4);
        } else {
            appendUtf8(out, c);
        }
    }
    return out;
}

std::uint32_t evaluated(std::uint32_t encoding) {
    return encoding == Encoding::System ? static_cast<std::uint32_t>(Encoding::Utf8) : encoding;
}

std::string substitution(std::uint32_t to) {
    return to == Encoding::UsAscii ? "?" : "\xEF\xBF\xBD";
}

} // namespace

std::string bytesOfUnits(std::u16string_view units) {
    std::string bytes(units.size() * 2, '\0');
    if (!units.empty()) {
        std::memcpy(bytes.data(), units.data(), bytes.size());
    }
    return bytes;
}

std::u16string unitsOfBytes(std::string_view bytes) {
    std::u16string units(bytes.size() / 2, u'\0');
    if (!units.empty()) {
        std::memcpy(units.data(), bytes.data(), units.size() * 2);
    }
    return units;
}

std::string encodingName(std::uint32_t encoding) {
    switch (evaluated(encoding)) {
    case Encoding::Utf8:
        return "UTF-8";
    case Encoding::UsAscii:
        return "US-ASCII";
    case Encoding::Utf16LE:
        return "UTF-16LE";
    case Encoding::Utf32LE:
        return "UTF-32LE";
    case Encoding::Binary:
        return "zqt-binary";
    case Encoding::Wwjd:
        return "zqt-wwjd";
    default:
        return "Unknown Encoding";
    }
}

Conversion transcoded(std::uint32_t from, std::uint32_t to, std::string_view bytes) {
    if (evaluated(from) == evaluated(to)) {
        return {std::string(bytes), {}};
    }
    if (from == Encoding::Unknown || to == Encoding::Unknown) {
        return {"", invalidEncodingFailure("unknown"), false};
    }
    const Decoded text = decoded(evaluated(from), bytes);
    const std::string out = encoded(evaluated(to), text.text);
    const std::string lossy = encoded(Encoding::Utf8, decoded(evaluated(to), out).text);
    if (text.bad) {
        return {out, badEncodingFailure(bytes, encodingName(from), lossy, substitution(evaluated(to)))};
    }
    bool lost = false;
    for (const char32_t c : text.text) {
        lost = lost || (evaluated(to) == Encoding::UsAscii && c >= 0x80 && c != replacement);
    }
    if (lost) {
        return {out, transcodingFailure(encoded(Encoding::Utf8, text.text), encodingName(from),
                                        encodingName(to), lossy, substitution(evaluated(to)))};
    }
    return {out, {}};
}

Conversion asciiChecked(std::string_view bytes) {
    std::string out;
    bool foreign = false;
    bool malformed = false;
    for (std::size_t at = 0; at < bytes.size();) {
        const auto lead = static_cast<unsigned char>(bytes[at++]);
        if (lead < 0x80) {
            out += static_cast<char>(lead);
            continue;
        }
        foreign = true;
        out += '\x1A';
        const int trailing = lead < 0xC0   ? 0
                             : lead < 0xE0 ? 1
                             : lead < 0xF0 ? 2
                             : lead < 0xF8 ? 3
                             : lead < 0xFC ? 4
                                           : 0;
        malformed = malformed || trailing == 0;
        for (int count = 0; count < trailing; ++count, ++at) {
            if (at >= bytes.size()) {
                malformed = true;
                break;
            }
            if ((static_cast<unsigned char>(bytes[at]) & 0xC0) != 0x80) {
                malformed = true;
                out += '\x1A';
            }
        }
    }
    if (malformed) {
        return {out, badEncodingFailure(bytes, "UTF-8", out, "\x1A")};
    }
    if (foreign) {
        return {out, transcodingFailure(bytes, "UTF-8", "US-ASCII", out, "\x1A")};
    }
    return {out, {}};
}

namespace {

Conversion fromWwjd(std::uint32_t to, std::string_view bytes) {
    const WwjdDecoded text = wwjdDecoded(bytes);
    if (text.bad) {
        const std::string lossy = encoded(Encoding::Utf8, decodedUtf16(bytesOfUnits(text.text)).text);
        return {"", badEncodingFailure(text.tail, "zqt-wwjd", lossy, "\xEF\xBF\xBD"), false};
    }
    return transcoded(Encoding::Utf16LE, to, bytesOfUnits(text.text));
}

Conversion toWwjd(std::uint32_t from, std::string_view bytes) {
    Conversion utf16 = transcoded(from, Encoding::Utf16LE, bytes);
    if (!utf16.failure.type.empty()) {
        utf16.stateIsKnown = false;
        return utf16;
    }
    return {wwjdEncoded(unitsOfBytes(utf16.bytes)), {}};
}

} // namespace

Conversion converted(std::uint32_t from, std::uint32_t to, std::string_view bytes) {
    const std::uint32_t source = evaluated(from);
    const std::uint32_t target = evaluated(to);
    if (source == target) {
        return {std::string(bytes), {}};
    }
    if (source == Encoding::Binary) {
        return {"", binaryFailure(bytes), false};
    }
    if (target == Encoding::Binary) {
        return {std::string(bytes), {}};
    }
    if (source == Encoding::Wwjd) {
        return fromWwjd(to, bytes);
    }
    if (target == Encoding::Wwjd) {
        return toWwjd(from, bytes);
    }
    if (source == Encoding::UsAscii && target == Encoding::Utf8) {
        return {std::string(bytes), {}};
    }
    if (source == Encoding::Utf8 && target == Encoding::UsAscii) {
        return asciiChecked(bytes);
    }
    return transcoded(from, to, bytes);
}

} // namespace kvt::test::reference
