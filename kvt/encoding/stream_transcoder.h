// Conversion of a stream of any length, in bounded memory, with the place of every loss.
//
// ICUTranscoder converts a text that is held whole and reports losses at the end. A host that reads files wants
// to know where in the input each loss stands and what it was, and to decide for itself whether to go on:
//
//     StreamTranscoder stream(Encoding("Shift_JIS"), Encoding::Utf8);
//     while (read(block)) stream.convert(block, out, [&](const Loss& loss) { ... });
//     stream.finish(out, onLoss);
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/export.h>
#include <kvt/foundation/string_view.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

namespace kvt::ex {

/// One place where the converted text does not hold what the input said.
struct Loss {
    enum Kind {
        BadInput = 0,         ///< bytes that are not text in the source encoding
        NotRepresentable = 1, ///< a character without a form in the target encoding
    };

    Kind kind;
    /// Bytes from the start of the stream to the first byte of the loss.
    std::uint64_t offset;
    /// The bytes of the input that were lost. None where the stream ends and something that had to follow is missing.
    std::string bytes;
    /// The character that was lost; U+FFFD for bad input.
    char32_t codePoint;
};

/// Converts a stream block by block. Characters may be split across blocks at any byte. Unlike ICUTranscoder, which
/// passes over substitutions that were made earlier, it reports every loss: also a U+FFFD of the input that the
/// target cannot hold.
///
/// The object owns its converters; it may move to another thread between calls.
class KVT_EXPORT StreamTranscoder {
public:
    /// Called for each loss in the order of the input. It may throw: the exception leaves convert(), and the
    /// transcoder can then only be destroyed.
    using LossHandler = std::function<void(const Loss&)>;

    /// Throws InvalidEncodingException (910005, %0 = "unknown") for `Unknown`, `Binary` and `Wwjd`, and when ICU
    /// cannot open one of the two (%0 = its name). `from` and `to` may be equal: the text is validated then.
    StreamTranscoder(Encoding from, Encoding to);
    StreamTranscoder(StreamTranscoder&&) noexcept;
    StreamTranscoder& operator=(StreamTranscoder&&) noexcept;
    ~StreamTranscoder();

    /// Converts `block` and appends what is ready to `out`. Losses are substituted in `out`. An empty `onLoss` is
    /// allowed. Throws std::bad_alloc, and UStringException "conversion failed: " with ICU's name of the error when
    /// ICU gives up for another reason than the text.
    void convert(kvt::future::string_view block, std::string& out, const LossHandler& onLoss);

    /// Ends the stream: an unfinished character at its end is a loss, and a stateful encoding returns to its
    /// initial state. The object is then ready for a new stream that begins at offset 0.
    void finish(std::string& out, const LossHandler& onLoss);

    /// Called for each character of the input in its order, with the bytes from the start of the stream to where it
    /// begins; U+FFFD for bad input.
    using CharacterHandler = std::function<void(char32_t character, std::uint64_t offset)>;

    /// From now on, convert() and finish() call `handler` for each character when it is complete, also one that began
    /// before; an empty handler ends that. Text is taken character by character meanwhile, which is many times slower.
    /// The handler may throw as a LossHandler may.
    void watch(CharacterHandler handler);

    /// Bytes taken since the start of the stream.
    std::uint64_t position() const noexcept;

    /// The bytes that stand in the output for each loss.
    kvt::future::string_view substitution() const noexcept;

private:
    class KVT_HIDDEN Impl;
    std::unique_ptr<Impl> impl_;
};

} // namespace kvt::ex
