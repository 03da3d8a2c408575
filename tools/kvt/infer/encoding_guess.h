// Which encoding a text is in. A mark at its beginning decides. Else there are a few candidates: UTF-8, what the
// pattern of zero bytes says, what ICU's detector says of the beginning, and windows-1252. Each of them decodes all of
// the text, so that an answer is not a guess about bytes that nobody has looked at.
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace host {

struct EncodingOpinion {
    EncodingOpinion(kvt::ex::Encoding known, std::string called) : encoding(known), name(std::move(called)) {}

    kvt::ex::Encoding encoding;
    std::string name;
    int confidence = 0;                     ///< of the detector, 0 to 100; 0 where it was not asked
    std::uint64_t losses = 0;               ///< places that are not text in this encoding
    std::optional<std::uint64_t> firstLoss; ///< in bytes
    std::uint64_t controls = 0;             ///< characters U+0080 to U+009F, which no text has
    std::uint64_t beyondAscii = 0;          ///< characters
};

class EncodingGuess {
public:
    /// `beginning` is not read; it comes again in add().
    explicit EncodingGuess(std::string_view beginning);

    void add(std::string_view bytes);
    /// The best opinion of what there was so far.
    const EncodingOpinion& likeliest() const;
    /// All opinions, the best one first; there is at least one.
    const std::vector<EncodingOpinion>& finish();

    bool isMarked() const { return isMarked_; }
    bool isAscii() const { return isAscii_; }

private:
    struct Candidate {
        EncodingOpinion opinion;
        kvt::ex::StreamTranscoder decoder;
    };

    void consider(const std::string& name, int confidence);
    void take(Candidate& candidate, std::string_view bytes, bool isEnd);

    std::vector<Candidate> candidates_;
    std::vector<EncodingOpinion> opinions_;
    std::string decoded_;
    bool isMarked_ = false;
    bool isAscii_ = true;
};

} // namespace host
