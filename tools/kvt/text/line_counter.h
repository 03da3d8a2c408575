// Where in a text a byte stands, as a person counts: lines and characters.
//
// Only losses need a place, and most text has none, so nothing is decoded until a place is asked for. What is done
// for every block is to look for line ends, which in most encodings are bytes (or units of two or four bytes) that
// mean nothing else. Only the rest of the last line is kept. In the other encodings (EBCDIC, those with shifts and
// escapes) a line end is known by decoding only, and every block is decoded.
//
// What stands before a place may turn out to be two characters, or three, by what comes behind it. So the decoder goes on
// until a character has come out that begins at the place; those before it are counted.
//
// Lines end with LF, CR or CRLF. Columns count code points from 1; a byte sequence that is not text counts as the
// one U+FFFD that stands for it. A byte order mark at the start is not counted.
#pragma once

#include "text/place.h"

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <deque>
#include <string>
#include <string_view>

namespace host {

/// The ends of lines in a piece of text.
struct LineEnds {
    std::uint64_t count = 0;
    std::size_t lastEnd = 0;  ///< bytes up to and with the last one; 0 when there is none
    bool afterReturn = false; ///< the piece ends with a CR
};

class LineCounter {
public:
    explicit LineCounter(kvt::ex::Encoding encoding);

    /// Forgets everything: the next block is the first of a file. `skipped` bytes of the file precede it.
    void restart(std::uint64_t skipped);
    /// `block` follows what was there before, and must stay in place until endBlock(). Where a position is asked for
    /// outside of a block, or in an empty one, the text ends there.
    void beginBlock(std::string_view block);
    void endBlock();

    struct Position {
        std::uint64_t line;
        std::uint64_t column;
    };
    /// The position of the character that begins at `offset`, which must not lie before one that was asked for
    /// earlier, nor behind the block.
    Position at(std::uint64_t offset);

    /// The end of the line as it reads before the place that was asked for last; at most contextLength characters.
    std::u32string textBefore() const;
    /// What of the block is not decoded yet.
    std::string_view rest();
    /// How the line goes on from that place when `rest` is what is not decoded yet, and more: at most contextLength
    /// characters, without the line end. No other position can be asked for after that.
    std::u32string textAfter(std::string_view rest);
    static constexpr std::size_t contextLength = 40;

private:
    enum class Units { Bytes, Little16, Big16, Little32, Big32, Unclear };
    struct Character {
        char32_t character;
        std::uint64_t begin;
    };

    static Units unitsOf(kvt::ex::Encoding encoding);
    std::size_t unitWidth() const;
    std::string_view pendingUpTo(std::uint64_t offset);
    LineEnds findLineEnds(std::string_view bytes, bool afterReturn) const;
    void skipLinesUpTo(std::uint64_t offset);
    void decodeUpTo(std::uint64_t offset);
    void lookAhead(std::uint64_t offset);
    void passAhead(std::uint64_t offset);
    void count(char32_t character);
    void endDecoding();

    kvt::ex::StreamTranscoder decoder_;
    std::uint64_t decoderBegin_ = 0; ///< offset of the first byte that the decoder was given
    Units units_;
    std::string_view block_;
    bool inBlock_ = false;
    std::uint64_t blockOffset_ = 0; ///< of the first byte of block_
    std::string carry_;             ///< bytes before block_ that are not taken yet
    std::uint64_t taken_ = 0;       ///< up to here, bytes were decoded or lines skipped
    std::deque<Character> ahead_;   ///< decoded, but not counted
    TextPosition position_;         ///< behind the last character that was counted
    std::string decoded_;
    std::u32string before_;
};

} // namespace host
