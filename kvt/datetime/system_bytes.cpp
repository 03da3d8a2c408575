// The way into the system's encoding and back. On most systems that encoding is UTF-8, and nearly all patterns and
// values are plain ASCII: there is nothing to do then.
#include <kvt/datetime/detail/system_bytes.h>

#include <kvt/foundation/detail/utf.h>
#include <kvt/foundation/throwable.h>

namespace kvt::ex::datetime::detail {

using ex::detail::isAscii;
using ex::detail::isContinuation;

bool isAsciiPartOfSystem() {
    static const bool holdsAscii = Encoding(Encoding::System).supports7BitASCII();
    return holdsAscii;
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
    if (isSystemUtf8() && length <= bytes.size() && !isAscii(bytes[length - 1])) {
        while (length < bytes.size() && isContinuation(bytes[length])) {
            ++length;
        }
    }
    return bytes.substr(0, length);
}

std::size_t placeBetweenCharacters(std::string_view bytes, std::size_t place) noexcept {
    // Nearly always there is nothing to do: the next byte begins a character.
    if (place < bytes.size() && isContinuation(bytes[place]) && isSystemUtf8()) {
        while (place > 0 && place < bytes.size() && isContinuation(bytes[place]) &&
               !isAscii(bytes[place - 1])) {
            --place;
        }
    }
    return place;
}

} // namespace kvt::ex::datetime::detail
