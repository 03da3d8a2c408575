// What ICU maps each character of UTF-8 to, gathered once, and the mapping of text by it.
//
// It holds for the mappings that know no language: those of a case map without a locale. The one character whose lower
// case depends on what stands around it, capital sigma, is left to ICU.
#pragma once

#include <unicode/ucasemap.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace kvt::ex::detail {

enum class CaseMapping { upper, lower, folded };

struct CaseTable {
    CaseMapping mapping{};
    /// By the lower and the upper half of a byte: where both have a bit in common, the byte begins characters that
    /// change. Letters of Latin-1 beside ASCII begin with C3, which is left out when their mappings are the usual ones:
    /// of one length, at a distance of 32, with ß, and ÿ in upper case, for exceptions.
    alignas(16) std::array<std::uint8_t, 16> leadsLow{};
    alignas(16) std::array<std::uint8_t, 16> leadsHigh{};
    /// By code point: the number of its block of 64 in `characters`; 0 when none in the block changes.
    std::vector<std::uint16_t> blocks;
    /// The mapped character in UTF-8, the first byte lowest, with its length in the highest byte; 0 for what is left to
    /// ICU.
    std::vector<std::uint64_t> characters;
};

/// The table of a mapping, made of what `caseMap` gives at the first call; any thread. Null where ICU has no memory for
/// what it is made of, which may be so for good: it can map text all the same. Throws std::bad_alloc.
const CaseTable* caseTable(CaseMapping mapping, const UCaseMap* caseMap);

/// ICU's function for a mapping.
using CaseFunction = std::int32_t (*)(const UCaseMap*, char*, std::int32_t, const char*, std::int32_t,
                                      UErrorCode*);
CaseFunction caseFunction(CaseMapping mapping) noexcept;

namespace vectors {

/// How far a mapping came.
struct CaseProgress {
    std::size_t taken = 0;    ///< bytes of the text, its beginning included
    std::size_t written = 0;  ///< bytes
    bool isLeftToIcu = false; ///< it stopped before a character that the table does not know
};

/// Maps the text from `from` on, as far as the table knows and as there is room for. Bytes that are not UTF-8 stay as
/// they are.
CaseProgress mapCase(const CaseTable& table, const char* text, std::size_t size, std::size_t from, char* out,
                     std::size_t room);

} // namespace vectors
} // namespace kvt::ex::detail
