// The input as blocks of whole rows, file after file. Where the bytes that separate rows and cells mean themselves
// wherever they stand, blocks are bytes as they were read, and whoever works on a block decodes it; of other encodings,
// blocks are decoded here, one after the other.
#pragma once

#include "base/output.h"
#include "text/source.h"
#include "translate/plan.h"
#include "translate/row_borders.h"

#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// One of several parts of a file, cut at row borders.
struct Part {
    std::uint64_t number = 1; ///< from 1
    std::uint64_t count = 1;
};

/// What could not be decoded, and where the U+FFFD stands that is there for it.
struct PlacedLoss {
    kvt::ex::Loss loss;
    std::uint64_t place; ///< in the text, in bytes of UTF-8
};

struct SourceBlock {
    std::string name;         ///< of the file, for people
    std::string bytes;        ///< whole rows
    std::uint64_t offset = 0; ///< of the first byte: in the file, or in its decoded text
    bool isDecoded = false;   ///< `bytes` are UTF-8 and `source` what was read for them
    std::string source;
    std::uint64_t markSize = 0;     ///< bytes of the file before its text
    std::vector<PlacedLoss> losses; ///< of decoding it here; places are in `bytes`
    bool beginsFile = false;
    bool isOfFirstFile = false;
    kvt::ex::Encoding encoding = kvt::ex::Encoding::Utf8; ///< of the file
    bool isMoreToCome = false;                            ///< there is another file
    bool isOutside = false;  ///< belongs to another part, and only its rows count
    std::uint64_t taken = 0; ///< bytes of the file that were read for it
};

/// Whether blocks of a text in that encoding are bytes as they were read.
bool isCutUndecoded(kvt::ex::Encoding encoding, const RowForm& form);

/// The units of an encoding, as far as ASCII goes: of one byte, but for the forms of Unicode that have wider ones.
struct Units {
    std::size_t width;  ///< bytes
    std::size_t lowest; ///< which of them has the lowest bits
};
Units unitsOf(kvt::ex::Encoding encoding);

class SourceBlocks {
public:
    /// A part is that of the one input. No file is read that `output`, if there is one, writes to in place. Throws Failure.
    SourceBlocks(const Plan& plan, std::vector<std::string> paths, const std::optional<Part>& part,
                 const Output* output);

    /// The next block in the place of `block`, whose memory is used again; false behind the last one. Throws Failure
    /// for what cannot be read, for a row longer than longestRow, and for a part of a text in an encoding that cannot be
    /// begun in the middle.
    bool next(SourceBlock& block);

    /// A block that gets more than so many bytes has a row longer than that.
    static constexpr std::size_t blockSize = 256 * 1024;
    static constexpr std::size_t longestRow = 64 * 1024 * 1024;

private:
    bool open();
    void fill();
    void take(std::string_view bytes);
    void seekBorders(std::string_view bytes);
    /// In bytes.
    std::uint64_t border() const { return borders_->border() * units_.width; }
    std::uint64_t borderBehind(std::uint64_t limit) const;
    void decode(std::string_view bytes);
    void give(SourceBlock& block, std::uint64_t end);
    [[noreturn]] void refuseLongRow() const;

    const Plan& plan_;
    std::vector<std::string> paths_;
    std::string name_; ///< of the file that is being read
    std::optional<Part> part_;
    const Output* output_;
    std::size_t opened_ = 0;
    kvt::ex::Encoding encoding_;

    std::optional<Source> source_;
    Units units_{1, 0};
    std::optional<RowBorders> borders_; ///< counted in units
    std::string unitBytes_;             ///< the lowest bytes of units
    std::string partOfUnit_;            ///< with which the text ends so far
    std::optional<kvt::ex::StreamTranscoder> decoder_;
    std::uint64_t skipped_ = 0; ///< bytes of the mark
    std::string text_;          ///< that was read and not given out
    std::string undecoded_;
    std::vector<PlacedLoss> losses_;
    std::uint64_t begin_ = 0; ///< of text_, behind the mark
    std::uint64_t taken_ = 0;
    bool isAtEnd_ = false;
    std::uint64_t partBegin_ = 0; ///< bytes at which the part begins and ends, or soon behind
    std::uint64_t partEnd_ = 0;
};

} // namespace host
