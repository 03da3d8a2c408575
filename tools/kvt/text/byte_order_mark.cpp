#include "text/byte_order_mark.h"

#include <array>

namespace host {

namespace {

struct Mark {
    std::string_view encoding;
    std::string_view bytes;
};

// From the Unicode Standard, section 23.8, with the encodings of U+FEFF in GB 18030 and SCSU (UTS #6).
constexpr std::array<Mark, 8> marks = {{
    {"UTF-8", "\xEF\xBB\xBF"},
    {"CESU-8", "\xEF\xBB\xBF"},
    {"UTF-16LE", "\xFF\xFE"},
    {"UTF-16BE", "\xFE\xFF"},
    {"UTF-32LE", {"\xFF\xFE\0\0", 4}},
    {"UTF-32BE", {"\0\0\xFE\xFF", 4}},
    {"GB18030", "\x84\x31\x95\x33"},
    {"SCSU", "\x0E\xFE\xFF"},
}};

// Base64 groups and differences between neighbours.
constexpr std::array<std::string_view, 3> inseparable = {"UTF-7", "IMAP-mailbox-name", "BOCU-1"};

bool isNamed(kvt::ex::Encoding encoding, std::string_view name) {
    return encoding == kvt::ex::Encoding(name, kvt::ex::nothrow);
}

} // namespace

std::string_view byteOrderMark(kvt::ex::Encoding encoding) {
    for (const Mark& mark : marks) {
        if (isNamed(encoding, mark.encoding)) {
            return mark.bytes;
        }
    }
    return {};
}

bool hasInseparableMark(kvt::ex::Encoding encoding) {
    for (const std::string_view name : inseparable) {
        if (isNamed(encoding, name)) {
            return true;
        }
    }
    return false;
}

} // namespace host
