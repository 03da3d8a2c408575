// The wwjd codec once more, slow and plain: one character at a time, tokens found by trying every name. It
// shares nothing with the library and serves as its oracle.
#pragma once

#include <cstddef>
#include <cstdio>
#include <stdexcept>
#include <string>
#include <string_view>

namespace kvt::test::reference {

struct WwjdName {
    const char* name;
    char16_t unit;
};

/// The named tokens.
inline constexpr WwjdName wwjdNames[] = {
    {"lt", u'<'},         {"space", u' '},        {"semicolon", u';'},
    {"gt", u'>'},         {"comma", u','},        {"lf", 10},
    {"quote", u'"'},      {"openparen", u'('},    {"cr", 13},
    {"amp", u'&'},        {"closeparen", u')'},   {"tab", 9},
    {"backslash", u'\\'}, {"openbracket", u'['},  {"bell", 7},
    {"solidus", u'/'},    {"closebracket", u']'}, {"backspace", 8},
    {"apos", u'\''},      {"opencurly", u'{'},    {"verttab", 11},
    {"dollar", u'$'},     {"closecurly", u'}'},   {"formfeed", 12},
    {"at", u'@'},
};

inline std::string wwjdEncoded(std::u16string_view text) {
    std::string encoded;
    for (const char16_t unit : text) {
        const char* name = nullptr;
        for (const WwjdName& candidate : wwjdNames) {
            name = candidate.unit == unit ? candidate.name : name;
        }
        if (name != nullptr) {
            encoded += '<' + std::string(name) + '>';
        } else if (unit > 127) {
            char token[16];
            std::snprintf(token, sizeof token, "<u%04x>", static_cast<unsigned>(unit));
            encoded += token;
        } else {
            encoded += static_cast<char>(unit);
        }
    }
    return encoded;
}

/// The hexadecimal number at the start of `text`, cut to 16 bits: white space, a sign and "0x" may stand
/// before it.
inline char16_t leadingHex(std::string_view text) {
    const auto digit = [&](std::size_t at) -> int {
        constexpr std::string_view digits = "0123456789abcdef0123456789ABCDEF";
        const std::size_t found = at < text.size() ? digits.find(text[at]) : std::string_view::npos;
        return found == std::string_view::npos ? -1 : static_cast<int>(found % 16);
    };
    std::size_t at = 0;
    while (at < text.size() && std::string_view(" \t\n\v\f\r").find(text[at]) != std::string_view::npos) {
        ++at;
    }
    const bool negative = at < text.size() && text[at] == '-';
    if (at < text.size() && (text[at] == '-' || text[at] == '+')) {
        ++at;
    }
    if (at + 1 < text.size() && text[at] == '0' && (text[at + 1] == 'x' || text[at + 1] == 'X') &&
        digit(at + 2) >= 0) {
        at += 2;
    }
    if (digit(at) < 0) {
        throw std::invalid_argument("invalid stoi argument");
    }
    int value = 0;
    for (; digit(at) >= 0; ++at) {
        value = value * 16 + digit(at);
    }
    return static_cast<char16_t>(negative ? -value : value);
}

struct WwjdDecoded {
    std::u16string text;
    bool bad = false; ///< a byte above 127 stood outside of the tokens
    std::string tail; ///< what stands behind the last token or literal bracket
};

/// Throws std::invalid_argument where a `<uXXXX>` holds no number.
inline WwjdDecoded wwjdDecoded(std::string_view in) {
    WwjdDecoded result;
    std::size_t tail = 0;
    for (std::size_t at = 0; at < in.size();) {
        const std::size_t close = in[at] == '<' ? in.find('>', at) : std::string_view::npos;
        if (close == std::string_view::npos) {
            const auto byte = static_cast<unsigned char>(in[at++]);
            result.bad = result.bad || byte > 127;
            result.text += byte > 127 ? char16_t{0xFFFD} : static_cast<char16_t>(byte);
            continue;
        }
        const std::string_view token = in.substr(at + 1, close - at - 1);
        bool known = token == "u";
        if (token.size() == 5 && token[0] == 'u') {
            result.text += leadingHex(token.substr(1));
            known = true;
        }
        for (const WwjdName& candidate : wwjdNames) {
            if (token == candidate.name) {
                result.text += candidate.unit;
                known = true;
            }
        }
        if (!known) {
            result.text += u'<';
        }
        at = known ? close + 1 : at + 1;
        tail = at;
    }
    result.tail = in.substr(tail);
    return result;
}

/// Only the named tokens; everything else is copied.
inline std::string wwjdDecodedBytes(std::string_view in) {
    std::string result;
    for (std::size_t at = 0; at < in.size();) {
        std::size_t taken = 1;
        char byte = in[at];
        for (const WwjdName& candidate : wwjdNames) {
            const std::string token = '<' + std::string(candidate.name) + '>';
            if (in.substr(at, token.size()) == token) {
                byte = static_cast<char>(candidate.unit);
                taken = token.size();
            }
        }
        result += byte;
        at += taken;
    }
    return result;
}

} // namespace kvt::test::reference
