// A thread's converter for one encoding, and the losses that it met.
#pragma once

#include <kvt/encoding/detail/icu.h>
#include <kvt/encoding/detail/shortcut.h>
#include <kvt/encoding/encoding.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace kvt::ex::detail {

/// ICU calls back into it with its address, so it stays where it is.
class TranscoderHelper final : private icu::LossListener {
public:
    TranscoderHelper() = default;
    TranscoderHelper(const TranscoderHelper&) = delete;
    TranscoderHelper& operator=(const TranscoderHelper&) = delete;

    /// Opens the converter of `encoding`. When ICU cannot, isOpen() stays false.
    void open(Encoding encoding);
    bool isOpen() const { return converter_.isOpen(); }

    icu::Converter& converter() { return converter_; }
    Encoding encoding() const { return encoding_; }
    /// What this encoding is in a conversion without ICU.
    Side side() const { return side_; }
    /// The bytes that the converter writes for a lost character.
    const std::string& substitutionChars() const { return substitutionChars_; }

    /// Whether a loss was recorded. The record is cleared, and the converter reset if there was one.
    bool takeLoss();

private:
    void onBadInput(std::string_view bytes, const char16_t* target, int error) noexcept override;
    void onNotRepresentable(char32_t codePoint, int error) noexcept override;

    icu::Converter converter_;
    std::int32_t lastError_ = 0;
    Encoding encoding_ = Encoding::Unknown;
    std::string substitutionChars_;
    Side side_;
};

/// The calling thread's helper for an encoding, opened when this is its first use. It lives as long as the thread.
/// Throws InvalidEncodingException (910005, %0 = "unknown") for `Unknown`, `Binary` and `Wwjd`.
TranscoderHelper& helperFor(Encoding encoding);

} // namespace kvt::ex::detail
