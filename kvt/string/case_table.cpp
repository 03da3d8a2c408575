// The tables are asked of ICU, character by character, for those that ICU says to have a case at all.
#include <kvt/string/detail/case_table.h>

#include <kvt/foundation/detail/utf.h>

#include <unicode/uchar.h>
#include <unicode/uset.h>

#include <cstring>
#include <new>
#include <utility>

namespace kvt::ex::detail {
namespace {

constexpr std::uint32_t capitalSigma = 0x3A3;

struct LacksMemory {}; // ICU does

void check(UErrorCode status) {
    if (U_FAILURE(status)) {
        throw LacksMemory(); // the one reason
    }
}

class TableMaker {
public:
    TableMaker(CaseMapping mapping, const UCaseMap* caseMap) : caseMap_(caseMap) {
        table_.mapping = mapping;
        table_.characters.resize(64); // of a block that is not there
        for (std::size_t half = 0xC; half <= 0xF; ++half) {
            table_.leadsHigh[half] = static_cast<std::uint8_t>(1U << (half - 0xC));
        }
    }

    CaseTable make() {
        UErrorCode status = U_ZERO_ERROR;
        const USet* const cased = u_getBinaryPropertySet(UCHAR_CASE_SENSITIVE, &status);
        check(status);
        for (std::int32_t i = 0; i < uset_getRangeCount(cased); ++i) {
            UChar32 first = 0;
            UChar32 last = 0;
            uset_getItem(cased, i, &first, &last, nullptr, 0, &status);
            check(status);
            for (UChar32 c = first; c <= last; ++c) {
                add(static_cast<std::uint32_t>(c));
            }
        }
        leaveOutLatin1();
        return std::move(table_);
    }

private:
    struct Bytes {
        char bytes[8] = {};
        std::int32_t size = 0;
        bool operator==(const Bytes& other) const {
            return size == other.size && std::memcmp(bytes, other.bytes, sizeof bytes) == 0;
        }
    };

    static Bytes utf8(std::uint32_t c) {
        Bytes result;
        result.size = static_cast<std::int32_t>(encodeUtf8(c, result.bytes));
        return result;
    }

    static std::uint64_t entry(const Bytes& character) {
        std::uint64_t number = 0;
        for (std::int32_t i = character.size; i-- > 0;) {
            number = number << 8 | static_cast<std::uint8_t>(character.bytes[i]);
        }
        return number | static_cast<std::uint64_t>(character.size) << 56;
    }

    // Nothing, with the length 0, for what a place in the table does not hold.
    Bytes mapped(const Bytes& character) const {
        Bytes result;
        UErrorCode status = U_ZERO_ERROR;
        result.size = caseFunction(table_.mapping)(caseMap_, result.bytes, sizeof result.bytes,
                                                   character.bytes, character.size, &status);
        if (status == U_BUFFER_OVERFLOW_ERROR ||
            result.size >= static_cast<std::int32_t>(sizeof result.bytes)) {
            return {};
        }
        check(status);
        return result;
    }

    void add(std::uint32_t c) {
        if (c < 0x80) {
            return;
        }
        const Bytes character = utf8(c);
        const bool isLeftToIcu = c == capitalSigma && table_.mapping == CaseMapping::lower;
        const Bytes result = isLeftToIcu ? Bytes() : mapped(character);
        if (result == character) {
            return;
        }
        const std::size_t block = c / 64;
        if (table_.blocks.size() <= block) {
            table_.blocks.resize(block + 1);
        }
        if (table_.blocks[block] == 0) {
            table_.blocks[block] = static_cast<std::uint16_t>(table_.characters.size() / 64);
            for (std::uint32_t i = 0; i < 64; ++i) {
                table_.characters.push_back(entry(utf8(c / 64 * 64 + i)));
            }
        }
        at(c) = entry(result);
        const auto lead = static_cast<std::uint8_t>(character.bytes[0]);
        table_.leadsLow[lead & 0xFU] |= table_.leadsHigh[lead >> 4U];
    }

    std::uint64_t& at(std::uint32_t c) { return table_.characters[table_.blocks[c / 64] * 64UL + c % 64]; }

    // What the vectors do with characters that begin with C3; the exceptions are those of the header.
    Bytes usual(std::uint32_t c) const {
        if (table_.mapping == CaseMapping::upper) {
            if (c == 0xDF) {
                return {{'S', 'S'}, 2};
            }
            return utf8(c >= 0xE0 && c != 0xF7 ? c - 0x20 : c);
        }
        if (c == 0xDF && table_.mapping == CaseMapping::folded) {
            return {{'s', 's'}, 2};
        }
        return utf8(c < 0xDF && c != 0xD7 ? c + 0x20 : c);
    }

    void leaveOutLatin1() {
        for (std::uint32_t c = 0xC0; c < 0x100; ++c) {
            const bool isException = c == 0xFF && table_.mapping == CaseMapping::upper;
            if (table_.blocks[c / 64] == 0 || (at(c) != entry(usual(c)) && !isException)) {
                return;
            }
        }
        table_.leadsLow[0xC3 & 0xF] &= static_cast<std::uint8_t>(~table_.leadsHigh[0xC]);
    }

    const UCaseMap* caseMap_;
    CaseTable table_;
};

} // namespace

CaseFunction caseFunction(CaseMapping mapping) noexcept {
    switch (mapping) {
    case CaseMapping::upper:
        return ucasemap_utf8ToUpper;
    case CaseMapping::lower:
        return ucasemap_utf8ToLower;
    default:
        return ucasemap_utf8FoldCase;
    }
}

namespace {

// Never destroyed, so that destructors of static objects can map text.
const CaseTable& madeTable(CaseMapping mapping, const UCaseMap* caseMap) {
    const auto make = [=] { return new CaseTable(TableMaker(mapping, caseMap).make()); };
    switch (mapping) {
    case CaseMapping::upper: {
        static const CaseTable& upper = *make();
        return upper;
    }
    case CaseMapping::lower: {
        static const CaseTable& lower = *make();
        return lower;
    }
    default: {
        static const CaseTable& folded = *make();
        return folded;
    }
    }
}

} // namespace

const CaseTable* caseTable(CaseMapping mapping, const UCaseMap* caseMap) {
    try {
        return &madeTable(mapping, caseMap);
    } catch (const LacksMemory&) {
        return nullptr;
    }
}

} // namespace kvt::ex::detail
