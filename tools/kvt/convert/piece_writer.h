// Text into an encoding, a piece at a time, with what of it the encoding lacks known before anything is written. So what
// is lost can be written otherwise, or not at all.
#pragma once

#include "convert/text_reading.h"
#include "convert/unicode_forms.h"

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <cstddef>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

namespace host {

class PieceWriter {
public:
    enum class Lost { IsSubstituted, IsTransliterated };
    PieceWriter(kvt::ex::Encoding to, Lost lost);

    struct Change {
        kvt::ex::Loss loss;
        std::size_t source;                    ///< of the character, in the piece
        std::optional<std::u32string> written; ///< in its place; empty for a substitution
    };
    /// All that is lost, bad input with it, in order; replaces in the piece's text what is transliterated.
    std::vector<Change> changes(TextPiece& piece);

    void write(const std::u32string& text, std::string& out);
    /// The output ends here; another may follow.
    void finish(std::string& out);

private:
    std::vector<std::size_t> lostIn(const std::u32string& text);
    const std::optional<std::u32string>& replacementOf(char32_t character);

    kvt::ex::StreamTranscoder trial_;
    kvt::ex::StreamTranscoder encoder_;
    std::optional<Transliteration> transliteration_;
    std::unordered_map<char32_t, std::optional<std::u32string>> replacements_;
    std::string scratch_;
};

/// The bytes of a text in UTF-32LE.
std::string_view utf32Bytes(const std::u32string& text);

} // namespace host
