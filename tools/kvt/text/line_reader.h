// Input files as decoded lines: whatever encoding a file is in, its lines come out as UTF-8, one after the
// other.
//
// A line ends with LF, CR or CRLF, as places are counted elsewhere in the program. The end is kept apart from the
// text, so that it can be written again as it was. Bytes that are not text in the encoding end the reading with
// their place. One block and the line that runs over its end are held, no more.
#pragma once

#include "base/failure.h"
#include "base/input.h"
#include "text/byte_order_mark.h"
#include "text/line_counter.h"
#include "text/place.h"
#include "text/text_offsets.h"

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace host {

class LineReader;

/// A line in UTF-8. The views are valid until the reader reads its next block.
struct TextLine {
    std::string_view file; ///< its name for people
    std::uint64_t number;  ///< from 1, in its file
    std::string_view text; ///< without the end
    std::string_view end;  ///< "\n", "\r", "\r\n", or nothing behind the last line
    LineReader* reader = nullptr;

    /// Where the character at `position`, in bytes of the text, stands in the file, whatever its encoding is. The reader
    /// was asked to keepPlaces().
    Place placeOf(std::size_t position) const;
};

/// The failure of a loss in `file` when bytes that are not text must not be replaced: the place, and which bytes.
Failure badTextFailure(const std::string& file, const kvt::ex::Loss& loss, LineCounter& places,
                       const std::string& encodingName);

class LineReader {
public:
    /// Reads the beginning. Throws Failure when the file cannot be read, or its mark is not one of the encoding.
    /// UTF-8 may pass unchecked, where each line is looked at anyway.
    enum class BadText { EndsIt, Passes };
    LineReader(const std::string& path, const TextEncoding& encoding, BadText badText = BadText::EndsIt);

    /// Reads a block, of which next() then gives the lines; false behind the end of the file. Throws Failure,
    /// with the place of bytes that are not text.
    bool readBlock();
    /// The next line that is complete; false when there is none before the next block. Throws Failure when a
    /// line is longer than longestLine.
    bool next(TextLine& line);

    /// What next() gives before the next block, lines with their ends.
    std::string_view wholeLines() const { return std::string_view(decoded_).substr(taken_, whole_ - taken_); }
    /// Passes over the lines that end, without their ends, in the first `length` bytes of wholeLines().
    void passOver(std::size_t length);

    /// The byte order mark at the start of the file, as UTF-8, for the first call. It does not belong to the
    /// first line.
    std::string_view takeMark();

    /// Before the first block: places in lines are going to be asked for, which costs time and memory.
    void keepPlaces();

    const Input& input() const { return input_; }
    /// In which order of bytes, too.
    kvt::ex::Encoding encoding() const { return encoding_; }
    /// Bytes of the file in the last block.
    std::size_t lastBlock() const { return lastBlock_; }

    /// Bytes of UTF-8.
    static constexpr std::size_t longestLine = 64 * 1024 * 1024;

private:
    [[noreturn]] void refuse(const kvt::ex::Loss& loss);
    void decode(std::string_view block);
    std::size_t nextOf(char byte, std::optional<std::size_t>& known) const;
    void findMark();
    void findLastEnd(std::size_t fresh);
    Place placeOf(const TextLine& line, std::size_t position);
    friend TextLine;

    Input input_;
    std::string_view first_; ///< the first block, until readBlock() takes it
    kvt::ex::Encoding encoding_;
    std::string encodingName_;
    bool started_ = false;
    bool isDecoded_;
    kvt::ex::StreamTranscoder decoder_;
    kvt::ex::StreamTranscoder::LossHandler onLoss_;
    LineCounter places_;
    std::optional<TextOffsets> offsets_; ///< where they are other ones in the file
    std::string decoded_;
    std::uint64_t decodedBegin_ = 0; ///< what came before decoded_
    std::size_t taken_ = 0;          ///< up to here, decoded_ was given out
    std::size_t whole_ = 0;          ///< behind the last end of a line
    std::size_t searched_ = 0;       ///< up to here, decoded_ holds no end of the line that begins at taken_
    std::optional<std::size_t>
        feed_; ///< in decoded_, the first LF behind what was searched, if that is known
    std::optional<std::size_t> return_; ///< the same for CR
    std::uint64_t number_ = 0;
    std::size_t lastBlock_ = 0;
    bool markSought_ = false;
    bool marked_ = false;
    bool ended_ = false;
};

} // namespace host
