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

bool isSameInBoth(std::string_view text) {
    // The system's encoding does not change while the program runs.
    static const Encoding system(Encoding::System);
    static const bool isUtf8 = system.evaluate() == Encoding::Utf8;
    static const bool holdsAscii = system.supports7BitASCII();
    return isUtf8 || (holdsAscii && isAscii(text));
}

} // namespace

SystemBytes::SystemBytes(std::string_view text) : view_(text) {
    if (!isSameInBoth(text)) {
        converted_ = UString<27>(UString<0>(UStringView<0>(text)));
        view_ = {converted_.rawData(), converted_.size()};
    }
}

UString<0> textOfSystemBytes(std::string_view bytes) {
    return isSameInBoth(bytes) ? UString<0>(UStringView<0>(bytes))
                               : UString<0>(UString<27>(UStringView<27>(bytes)));
}

UString<0> readableSystemBytes(std::string_view bytes) {
    try {
        return textOfSystemBytes(bytes);
    } catch (const UStringBadEncodingException& failure) {
        return failure.getLossyConversion();
    }
}

} // namespace kvt::ex::datetime::detail
