// The converters of each thread.
#include <kvt/encoding/detail/transcoder_helper.h>

#include <kvt/encoding/detail/encoding_profile.h>
#include <kvt/foundation/throwable.h>
#include <kvt/platform/thread_end.h>

#include <array>
#include <map>

namespace kvt::ex::detail {
namespace {

/// The converters that one thread has opened.
struct ThreadConverters {
    // The encodings of the string types are met all the time and need no search.
    std::array<TranscoderHelper, 5> common;
    std::map<std::uint32_t, TranscoderHelper> others;
};

} // namespace

void TranscoderHelper::open(Encoding encoding) {
    encoding_ = encoding;
    converter_ = icu::Converter(encoding);
    if (isOpen()) {
        substitutionChars_ = converter_.substitution();
        side_ = sideOf(encoding);
        converter_.setListener(*this);
    }
}

bool TranscoderHelper::takeLoss() {
    if (lastError_ == 0) {
        return false;
    }
    lastError_ = 0;
    converter_.reset();
    return true;
}

// Input that is this converter's own substitution was lost earlier, and is not a new loss.
void TranscoderHelper::onBadInput(std::string_view bytes, const char16_t*, int error) noexcept {
    if (bytes != substitutionChars_) {
        lastError_ = error;
    }
}

// The same goes for the replacement character.
void TranscoderHelper::onNotRepresentable(char32_t codePoint, int error) noexcept {
    if (lastError_ == 0 && codePoint != U'\uFFFD') {
        lastError_ = error;
    }
}

TranscoderHelper& helperFor(Encoding encoding) {
    const std::uint32_t id = encoding.evaluate();
    if (id == Encoding::Unknown || id == Encoding::Binary || id == Encoding::Wwjd) {
        throw InvalidEncodingException("unknown");
    }
    auto& [common, others] = platform::ofThisThread<ThreadConverters>();
    TranscoderHelper& helper = id <= Encoding::Utf32LE  ? common[id]
                               : id == Encoding::System ? common.back()
                                                        : others[id];
    if (!helper.isOpen()) {
        helper.open(encoding);
    }
    return helper;
}

} // namespace kvt::ex::detail
