// What a single-byte encoding makes of each byte, as tables, so that its text can be converted without ICU.
//
// The tables hold what ICU itself says of each byte alone, and only what it converts without an objection. They know
// the characters that some byte is read as. For all else, as for a byte without a character, for a character that only
// resembles one of the encoding's own and for whatever could be joined with the next, they say "ask ICU".
#pragma once

#include <kvt/encoding/encoding.h>

#include <array>
#include <cstdint>
#include <memory>
#include <vector>

namespace kvt::ex::detail {

/// Costs next to nothing until it is built, which takes ICU some microseconds. For one thread.
class SingleByteTable {
public:
    static constexpr char16_t noUnit = 0xFFFF;
    /// More than any number of lengths of UTF-8 that are added up.
    static constexpr std::uint32_t noCharacter = 0x10000;
    /// Units of one page: as many as the last byte of UTF-8 tells apart.
    static constexpr std::size_t pageSize = 64;

    struct Tables {
        /// The UTF-16 of each byte; `noUnit` for "ask ICU".
        std::array<char16_t, 256> units;
        /// The bytes of its UTF-8; `noCharacter` for "ask ICU".
        std::array<std::uint32_t, 256> weights;
        /// For a UTF-16 unit without its last six bits the place where its page begins. The first page is empty.
        std::array<std::uint16_t, 0x10000 / pageSize> pageOf{};
        /// The pages. An entry is the byte with 0x100 added, or 0 for "ask ICU".
        std::vector<std::uint16_t> pages;
    };

    SingleByteTable() = default;
    /// For a stateless encoding of which ICU says that no character has more than one byte.
    explicit SingleByteTable(Encoding encoding) : encoding_(encoding) {}

    bool isBuilt() const { return tables_ != nullptr; }
    /// Built when it is asked for the first time.
    const Tables& tables();

private:
    Encoding encoding_ = Encoding::Unknown;
    std::unique_ptr<const Tables> tables_;
};

} // namespace kvt::ex::detail
