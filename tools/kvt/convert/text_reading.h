// Text that does not go straight from bytes to bytes: lines that are not valid in its encoding are read in another one,
// or it is normalized. Block by block, what is settled comes out as characters, each with where it came from.
//
// What the next block may still change is kept: the line under way, where it may have to be read again, and what may be
// normalized with what follows. Both are bounded.
#pragma once

#include "convert/unicode_forms.h"
#include "text/place.h"

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace host {

struct ReadingRule {
    std::optional<kvt::ex::Encoding> fallback;
    Normalization normalization = Normalization::None;
};

/// Characters, and where in the file each begins.
struct ReadCharacters {
    std::u32string text;
    std::vector<std::uint64_t> begins;

    void append(const ReadCharacters& other, std::size_t first, std::size_t last);
    void dropFront(std::size_t count);
};

struct TextPiece {
    std::u32string text;
    std::vector<std::size_t>
        origins; ///< for each character of text, the one of source; empty where they are the same
    ReadCharacters source;
    std::uint64_t end = 0;          ///< of source, in the file
    std::string bytes;              ///< of source
    std::vector<kvt::ex::Loss> bad; ///< U+FFFD in source; with the offset in the file
    TextPosition start;             ///< of source
    std::uint64_t fallbackLines = 0;
    std::optional<Place> firstFallback; ///< without the file

    std::size_t originOf(std::size_t index) const { return origins.empty() ? index : origins[index]; }
    std::string bytesOf(std::size_t sourceIndex) const;
};

class TextReading {
public:
    TextReading(kvt::ex::Encoding from, const ReadingRule& rule);
    TextReading(const TextReading&) = delete;
    TextReading& operator=(const TextReading&) = delete;

    /// A file begins, `skipped` bytes of it were dropped.
    void begin(kvt::ex::Encoding from, std::uint64_t skipped);
    /// What is settled when `block` follows; it may be nothing.
    TextPiece take(std::string_view block);
    /// The rest of the file.
    TextPiece finish();

    /// Lines with more bytes are not read again.
    static constexpr std::size_t longestLine = 4 * 1024 * 1024;
    /// Characters that are normalized together.
    static constexpr std::size_t longestSequence = 64 * 1024;

private:
    void open(kvt::ex::Encoding from);
    TextPiece settle(bool isLast);
    void decideLines(bool isLast, TextPiece& piece);
    void decideLine(std::size_t first, std::size_t last, std::uint64_t end, TextPiece& piece);
    bool isRead(std::size_t first, std::uint64_t end, TextPiece& piece);
    std::size_t settledCount(bool isLast) const;
    void normalize(TextPiece& piece) const;

    ReadingRule rule_;
    kvt::ex::Encoding from_;
    std::optional<kvt::ex::StreamTranscoder> decoder_;
    std::optional<kvt::ex::StreamTranscoder> fallback_;
    std::optional<Normalizer> normalizer_;
    std::uint64_t skipped_ = 0;
    std::string bytes_; ///< from bytesBegin_ on: of what is undecided or undelivered
    std::uint64_t bytesBegin_ = 0;
    ReadCharacters undecided_; ///< from the beginning of a line on
    std::size_t searched_ = 0; ///< how many of them are known not to end a line
    bool isLong_ = false;      ///< the line under way is not read again
    ReadCharacters decided_;
    std::vector<kvt::ex::Loss> undecidedBad_;
    std::vector<kvt::ex::Loss> bad_;
    ReadCharacters reread_;
    TextPosition position_; ///< of the first character of decided_
    TextPosition lines_;    ///< of the first one of undecided_
    std::string scratch_;
};

} // namespace host
