// Where in a text a byte stands, as a person counts: lines and characters.
//
// Only losses need a place, and most text has none, so nothing is decoded until a place is asked for. What is done
// for every block is to look for line ends, which in most encodings are bytes (or units of two or four bytes) that
// mean nothing else. Only the rest of the last line is kept. In the other encodings (EBCDIC, those with shifts and
// escapes) a line end is known by decoding only, and every block is decoded.
//
// Lines end with LF, CR or CRLF. Columns count code points from 1; a byte sequence that is not text counts as the
// one U+FFFD that stands for it. A byte order mark at the start is not counted.
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

struct Place {
    std::string file;
    std::uint64_t offset = 0; ///< in bytes from the start of the file
    std::uint64_t line = 1;
    std::uint64_t column = 1;
};

/// "FILE: line 2, column 5, byte 17".
std::string describe(const Place& place);

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
    /// `block` follows what was there before, and must stay in place until endBlock().
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
    /// What of the block lies behind that place.
    std::string_view rest();
    /// How the line goes on from that place when `bytes` follow it: at most contextLength characters, without the
    /// line end. No other position can be asked for after that.
    std::u32string textAfter(std::string_view bytes);
    static constexpr std::size_t contextLength = 40;

private:
    enum class Units { Bytes, Little16, Big16, Little32, Big32, Unclear };

    static Units unitsOf(kvt::ex::Encoding encoding);
    std::size_t unitWidth() const;
    std::string_view pendingUpTo(std::uint64_t offset);
    LineEnds findLineEnds(std::string_view bytes, bool afterReturn) const;
    void skipLinesUpTo(std::uint64_t offset);
    void decode(std::string_view bytes, bool toTheEnd);
    void countDecoded();

    kvt::ex::StreamTranscoder decoder_;
    Units units_;
    std::string_view block_;
    std::uint64_t blockOffset_ = 0; ///< of the first byte of block_
    std::string carry_;             ///< bytes before block_ that are not counted yet
    std::uint64_t counted_ = 0;     ///< offset up to which line_ and column_ are true
    std::uint64_t line_ = 1;
    std::uint64_t column_ = 1;
    bool afterReturn_ = false; ///< the last character was a CR: a LF now belongs to it
    bool decoderUsed_ = false; ///< the decoder has seen the beginning of this line
    std::string decoded_;
    std::u32string before_;
};

} // namespace host
