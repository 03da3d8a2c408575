// The proof that nothing was lost: the input and the output, both decoded, are the same text.
//
// The two streams are decoded side by side as they pass and compared as far as both have come, so that only what
// one is ahead of the other is kept.
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace host {

class RoundTrip {
public:
    RoundTrip(kvt::ex::Encoding from, kvt::ex::Encoding to);

    /// The next input is in another encoding. Not within a text.
    void readIn(kvt::ex::Encoding from);
    void addInput(std::string_view bytes);
    void addOutput(std::string_view bytes);
    /// Both texts end here; others may follow.
    void finish();

    struct Difference {
        std::uint64_t character; ///< how many characters of all texts came before it
        std::optional<char32_t> before;
        std::optional<char32_t> after;
    };
    /// The first one.
    const std::optional<Difference>& difference() const { return difference_; }

private:
    void compare();

    kvt::ex::StreamTranscoder decodeInput_;
    kvt::ex::StreamTranscoder decodeOutput_;
    std::string input_;
    std::string output_;
    std::uint64_t same_ = 0;
    std::optional<Difference> difference_;
};

/// "the output does not convert back to the same text: at character 3, U+0141 comes back as U+003F".
std::string describe(const RoundTrip::Difference& difference);

} // namespace host
