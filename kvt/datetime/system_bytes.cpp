// The way into the system's encoding and back. On most systems that encoding is UTF-8, and nearly all patterns and
// values are plain ASCII: there is nothing to do then.
#include <kvt/datetime/detail/system_bytes.h>

#include <kvt/foundation/throwable.h>

#include <algorithm>

namespace kvt::ex::datetime::detail {

bool isAscii(std::string_view text) noexcept {
    return std::all_of(text.begin(), text.end(), [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

namespace {

// The system's encoding does not change while the program runs.
bool isSystemUtf8() {
    static const bool isUtf8 = Encoding(Encoding::System).evaluate() == Encoding::Utf8;
    return isUtf8;
}

// Of UTF-8: a byte within a character, behind its first.
bool isContinuation(char c) {
    return (static_cast<unsigned char>(c) & 0xC0) == 0x80;
}

} // namespace

bool isSystemText(std::string_view utf8) {
    if (isSystemUtf8()) {
        return true;
    }
    static const bool holdsAscii = Encoding(Encoding::System).supports7BitASCII();
    return holdsAscii && isAscii(utf8);
}

void SystemBytes::convert(std::string_view text) {
    converted_.emplace(UString<0>(UStringView<0>(text)));
    view_ = {converted_->rawData(), converted_->size()};
}

UString<0> textOfSystemBytes(std::string_view bytes) {
    return isSystemText(bytes) ? UString<0>(UStringView<0>(bytes))
                               : UString<0>(UString<27>(UStringView<27>(bytes)));
}

UString<0> readableSystemBytes(std::string_view bytes) {
    try {
        return textOfSystemBytes(bytes);
    } catch (const UStringBadEncodingException& failure) {
        return failure.getLossyConversion();
    }
}

void appendReadable(UStringArray<0>& parameters, std::string_view bytes) {
    if (isSystemText(bytes)) {
        parameters.emplace_back(UStringView<0>(bytes));
    } else {
        parameters.push_back(readableSystemBytes(bytes));
    }
}

std::string_view wholeCharacters(std::string_view bytes, std::size_t length) {
    if (isSystemUtf8() && length <= bytes.size() && !isAscii(bytes.substr(length - 1, 1))) {
        while (length < bytes.size() && isContinuation(bytes[length])) {
            ++length;
        }
    }
    return bytes.substr(0, length);
}

std::size_t placeBetweenCharacters(std::string_view bytes, std::size_t place) noexcept {
    if (isSystemUtf8()) {
        while (place > 0 && place < bytes.size() && isContinuation(bytes[place]) &&
               !isAscii(bytes.substr(place - 1, 1))) {
            --place;
        }
    }
    return place;
}

} // namespace kvt::ex::datetime::detail
