#include "text/byte_order_mark.h"

#include "base/failure.h"

#include <algorithm>
#include <array>
#include <utility>
#include <vector>

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

// The mark of one in the bytes of the other. FF FE 00 00 is not among them for 16 bits: it may be a text in UTF-16LE.
constexpr std::array<std::pair<kvt::ex::Encoding::Type, kvt::ex::Encoding::Type>, 4> swappedMarks = {{
    {kvt::ex::Encoding::Utf16LE, kvt::ex::Encoding::Utf16BE},
    {kvt::ex::Encoding::Utf16BE, kvt::ex::Encoding::Utf16LE},
    {kvt::ex::Encoding::Utf32LE, kvt::ex::Encoding::Utf32BE},
    {kvt::ex::Encoding::Utf32BE, kvt::ex::Encoding::Utf32LE},
}};

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

std::string_view TextEncoding::firstBlock(Input& input) const {
    std::vector<std::string_view> possible = {byteOrderMark(encoding)};
    for (const auto& [named, other] : swappedMarks) {
        if (encoding.evaluate() == named) {
            possible.push_back(byteOrderMark(other));
        }
    }
    // Somebody may be typing: a line is not to wait for the next one.
    return input.readWhile([&](std::string_view start) {
        return start.empty() || std::any_of(possible.begin(), possible.end(), [&](std::string_view mark) {
                   return start.size() < mark.size() && mark.starts_with(start);
               });
    });
}

kvt::ex::Encoding TextEncoding::of(std::string_view start, const std::string& file) const {
    const auto swapped = std::find_if(swappedMarks.begin(), swappedMarks.end(), [&](const auto& row) {
        return encoding.evaluate() == row.first && start.starts_with(byteOrderMark(row.second));
    });
    if (swapped == swappedMarks.end()) {
        return encoding;
    }
    const kvt::ex::Encoding fitting(swapped->second);
    if (!markDecides) {
        const std::string name(fitting.getName());
        throw Failure(file + " begins with the byte order mark of " + name + ", which is not " +
                      std::string(encoding.getName()) + "; " + name + " or " +
                      name.substr(0, name.size() - 2) + " would fit");
    }
    return fitting;
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
