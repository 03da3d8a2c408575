// What a code page makes of its bytes and of the characters, as tables, so that its text can be converted without ICU.
//
// The tables hold what ICU itself says of each character alone, and only what it converts without an objection: from
// one byte or two to one unit of UTF-16, and back. From and to UTF-8 there is a way of its own, since most text comes
// and goes that way. For all else they say "ask ICU": for what is not text, for a
// character that only resembles one of the encoding's own, for longer characters, and for whatever could be joined with
// the next. They are for encodings without a state, do not change once they are made, and can be read by any number of
// threads.
#pragma once

#include <kvt/encoding/detail/byte_set.h>
#include <kvt/encoding/detail/unicode_vectors.h>
#include <kvt/encoding/encoding.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

namespace kvt::ex::detail {

/// From bytes to UTF-16 and UTF-8.
class DecodingTable {
public:
    /// Asks ICU for each byte and each pair of bytes: some microseconds for an encoding of single bytes, about a
    /// millisecond for others. Empty when ICU cannot open the encoding.
    explicit DecodingTable(Encoding encoding);

    /// Reads characters and takes them from `in`, until there are `room` units, or the table does not know the next
    /// one. Returns the units written; none is a surrogate.
    std::size_t read(std::string_view& in, char16_t* out, std::size_t room) const;

    /// The same as bytes of UTF-8, until there is no room for a whole cell. Returns the bytes written; what lies behind
    /// them may be overwritten.
    std::size_t readUtf8(std::string_view& in, char* out, std::size_t room) const;

    /// The room that suffices for a text of single bytes as UTF-8.
    std::size_t roomForUtf8(std::string_view text) const;

    /// A character as UTF-8.
    struct Utf8Cell {
        char bytes[3];
        std::uint8_t length; // 0: ask ICU
    };
    bool hasPairs() const { return utf8_.size() != pageSize; }
    /// Whether ASCII, and what Latin-1 has from A0 on, are the bytes of their numbers, and all else is single bytes.
    bool keepsLatin() const { return !hasPairs() && keepsAscii_ && keepsLatin_; }
    struct Found {
        std::size_t characters;
        std::size_t bytes; ///< of UTF-8; `vectors::notWhole` where the table does not know one of them
    };
    /// Looks up all characters of a text: as many cells as it has bytes, or fewer.
    Found find(std::string_view text, Utf8Cell* cells) const;
    /// Writes so many of them behind each other, and no byte more.
    static void join(const Utf8Cell* cells, std::size_t count, char* out);

    /// The bytes of the first `units` characters of `in`, which the table knows.
    std::size_t bytesOf(std::string_view in, std::size_t units) const;

private:
    static constexpr char16_t noUnit = 0xFFFF; // ask ICU
    static constexpr std::size_t pageSize = 256;

    static Utf8Cell cellOf(char16_t unit);
    static bool isKnown(char16_t unit) { return unit != noUnit; }
    static bool isKnown(const Utf8Cell& cell) { return cell.length != 0; }
    static void put(char16_t unit, char16_t*& out);
    static void put(const Utf8Cell& cell, char*& out);

    bool isPair(std::size_t first) const { return (pairs_[first / 64] >> first % 64 & 1) != 0; }
    template <typename Cell, typename Unit>
    std::size_t readAny(const std::vector<Cell>& cells, std::string_view& in, Unit* out,
                        std::size_t room) const;
    template <typename Cell, typename Unit>
    const unsigned char* readSingles(const Cell* cells, const unsigned char* p, const unsigned char* end,
                                     Unit*& q, const Unit* outEnd) const;
    template <typename Cell, typename Unit>
    const unsigned char* readPairs(const Cell* cells, const unsigned char* p, const unsigned char* end,
                                   Unit*& q, const Unit* outEnd) const;

    // Without pairs the unit of each byte, else that of each byte and the next, which for a single byte is any one.
    std::vector<char16_t> units_;
    std::vector<Utf8Cell> utf8_;           // the same
    std::array<std::uint64_t, 4> pairs_{}; // a bit for each byte that begins one
    vectors::ByteSet leads_;               // the same bytes
    bool keepsAscii_ = true;
    bool keepsLatin_ = true; // what Latin-1 has from A0 on
};

/// From UTF-16 to bytes.
class EncodingTable {
public:
    /// Asks ICU for each character of the encoding; about as long as a DecodingTable.
    explicit EncodingTable(Encoding encoding);

    /// The bytes that suffice for a text.
    std::size_t roomFor(const vectors::Extent& text) const;

    /// Whether a unit alone is a character that the table knows.
    bool has(char16_t unit) const { return codeOf(unit) != noCode; }

    struct Written {
        std::size_t units; ///< taken
        std::size_t bytes;
    };
    /// Writes characters until the table does not know one. `room` is that of the text.
    Written write(const char16_t* units, std::size_t count, char* out, std::size_t room) const;

    /// Writes characters of UTF-8 and takes them from `in`, until there is no `room`, or the next one is not well-formed and
    /// complete, or the table does not know it. Returns the bytes written.
    std::size_t writeUtf8(std::string_view& in, char* out, std::size_t room) const;

private:
    static constexpr std::uint16_t noCode = 0xFFFF; // ask ICU

    void add(char16_t unit, std::string_view bytes);
    std::uint16_t codeOf(char16_t unit) const { return codes_[unit]; }
    Written writeSingles(const char16_t* units, std::size_t count, char* out) const;
    Written writePairs(const char16_t* units, std::size_t count, char* out) const;

    // For each unit one byte as its number, two with the second one above. Most of the 128 KiB are never looked at.
    std::vector<std::uint16_t> codes_;
    std::size_t longest_ = 1;  // bytes of a character
    bool isWithinUtf8_ = true; // no character is longer than in UTF-8
    bool keepsAscii_ = true;
    bool keepsLatin_ = true; // what Latin-1 has from A0 on
};

} // namespace kvt::ex::detail
