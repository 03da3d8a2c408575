// The way back from a text in UTF-8 to the bytes of the file that it was decoded from: where a character begins there.
//
// The bytes are decoded once more, behind the reader, and only as far as a place is asked for: in bulk up to the line,
// and then character by character.
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <cstddef>
#include <cstdint>
#include <deque>
#include <string>
#include <string_view>

namespace host {

class TextOffsets {
public:
    explicit TextOffsets(kvt::ex::Encoding encoding);

    /// The next bytes of the file; none at its end.
    void add(std::string_view block);
    /// Goes on to the character that has `position` bytes of UTF-8 before it, and forgets those before. Not backwards.
    void passTo(std::uint64_t position);
    /// The byte of the file with which the character begins that comes `characters` behind that place; the end of the file
    /// where there is none.
    std::uint64_t offsetOf(std::size_t characters);

private:
    struct Character {
        std::uint64_t begin;
        unsigned char length; ///< as UTF-8
    };

    void decodeSome();
    void forgetTaken();

    kvt::ex::StreamTranscoder decoder_;
    std::string bytes_;           ///< of the file that are not forgotten
    std::size_t taken_ = 0;       ///< how many of them are decoded
    std::uint64_t end_ = 0;       ///< of the bytes in the file
    std::uint64_t passed_ = 0;    ///< as UTF-8
    std::deque<Character> ahead_; ///< the characters from there on that are decoded
    std::string decoded_;
    bool ended_ = false;
};

} // namespace host
