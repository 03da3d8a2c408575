// Characters that the target of a conversion lacks, and what is written for them: found out once, since losses are of few
// characters and many places.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace kvt::ex::detail {

/// A table of bounded size, in which a new character takes the place of another one.
class KnownLosses {
public:
    struct Row {
        std::uint64_t key = 0;
        char32_t codePoint = 0;
        std::string written;
    };
    /// Bytes; longer ones are not remembered.
    static constexpr std::size_t longestCharacter = 4;

    bool isEmpty() const noexcept { return rows_.empty(); }

    /// Null for a character that is not there, and for no bytes.
    const Row* find(std::string_view character) const noexcept {
        const std::uint64_t key = keyOf(character);
        const Row& row = rows_[slotOf(key)];
        return key != 0 && row.key == key ? &row : nullptr;
    }

    /// Throws std::bad_alloc.
    void add(std::string_view character, char32_t codePoint, std::string_view written) {
        if (character.size() > longestCharacter) {
            return;
        }
        const std::uint64_t key = keyOf(character);
        if (rows_.empty()) {
            rows_.resize(fewestRows);
        } else if (rows_[slotOf(key)].key != 0 && rows_.size() < mostRows) {
            grow();
        }
        rows_[slotOf(key)] = {key, codePoint, std::string(written)};
    }

private:
    static constexpr std::size_t fewestRows = 64;
    static constexpr std::size_t mostRows = 16384;

    void grow() {
        std::vector<Row> rows(4 * rows_.size());
        rows_.swap(rows);
        for (Row& row : rows) {
            if (row.key != 0) {
                rows_[slotOf(row.key)] = std::move(row);
            }
        }
    }

    static std::uint64_t keyOf(std::string_view character) noexcept {
        std::uint64_t key = character.size();
        for (const char byte : character) {
            key = key << 8 | static_cast<unsigned char>(byte);
        }
        return key;
    }
    // By the golden ratio, which spreads numbers that are close.
    std::size_t slotOf(std::uint64_t key) const noexcept {
        return (key * 0x9E3779B97F4A7C15U >> 32) & (rows_.size() - 1);
    }

    std::vector<Row> rows_; ///< none until there is a loss
};

} // namespace kvt::ex::detail
