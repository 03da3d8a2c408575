// From an encoding of one byte a character straight to UTF-8, by a table that StreamTranscoder was asked for: ASCII in
// pieces of 64 bytes, and each other byte by its row.
#pragma once

#include <kvt/encoding/encoding.h>

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace host {

class ByteDecoder {
public:
    /// Nothing for an encoding that is not of this kind, or does not have ASCII as its own bytes.
    static std::optional<ByteDecoder> of(kvt::ex::Encoding encoding);

    /// The text, in `room`, which is made as large as it has to be. Nothing where some byte is not a character; the
    /// transcoder knows what that is.
    std::optional<std::string_view> decode(std::string_view bytes, std::string& room) const;

private:
    struct Row {
        std::array<char, 3> utf8;
        std::uint8_t size; ///< 0 for what is not a character
    };

    std::array<Row, 128> rows_{}; ///< from 0x80
};

} // namespace host
