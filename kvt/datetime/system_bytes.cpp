// The way into the system's encoding and back. On most systems that encoding is UTF-8, and there is nothing to do.
#include <kvt/datetime/detail/system_bytes.h>

#include <kvt/foundation/throwable.h>

#include <algorithm>

namespace kvt::ex::datetime::detail {

namespace {

bool isAscii(std::string_view text) {
    return std::all_of(text.begin(), text.end(), [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

bool needsConversion(std::string_view text) {
    const Encoding system(Encoding::System);
    return system.evaluate() != Encoding::Utf8 && !(system.supports7BitASCII() && isAscii(text));
}

} // namespace

SystemBytes::SystemBytes(std::string_view text) : view_(text) {
    if (needsConversion(text)) {
        converted_ = UString<27>(text.data(), text.size(), Encoding::Utf8);
        view_ = {converted_.rawData(), converted_.size()};
    }
}

UString<0> textOfSystemBytes(std::string_view bytes) {
    try {
        return UString<0>(bytes.data(), bytes.size(), Encoding::System);
    } catch (const UStringBadEncodingException& failure) {
        return failure.getLossyConversion();
    }
}

} // namespace kvt::ex::datetime::detail
