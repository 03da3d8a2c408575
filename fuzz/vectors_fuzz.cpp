// What runs in vector registers, on each instruction set that this processor has in turn: the same results as plain loops
// give, and as the case maps of ICU.
//
// Input: what to do, a byte for where the text stands, then the text. The text stands at the end of its memory, so that the
// address sanitizer sees what is read behind it.
#include <fuzzing.h>
#include <reference/plain_unicode.h>

#include <kvt/encoding/detail/byte_set.h>
#include <kvt/encoding/detail/unicode_vectors.h>
#include <kvt/platform/vector_targets.h>
#include <kvt/regex/detail/prefix_scan.h>
#include <kvt/string/detail/case_table.h>
#include <kvt/string/detail/hash_vectors.h>
#include <kvt/string/detail/unit_vectors.h>

#include <cstring>
#include <functional>
#include <memory>
#include <optional>

namespace {

namespace detail = kvt::ex::detail;
namespace vectors = kvt::ex::detail::vectors;
namespace platform = kvt::platform;
using namespace kvt::fuzz;
using kvt::test::Decoded;
using vectors::Extent;

/// Each alone, as Highway numbers them.
std::vector<std::int64_t> allTargets() {
    platform::forceProcessorTargets(0);
    std::vector<std::int64_t> targets;
    auto left = static_cast<std::uint64_t>(platform::processorTargets() & (HWY_TARGETS | HWY_STATIC_TARGET));
    for (; left != 0; left &= left - 1) {
        targets.push_back(static_cast<std::int64_t>(left & (0 - left)));
    }
    return targets;
}

/// A text at an address of any alignment, with nothing behind it.
class Placed {
public:
    Placed(std::string_view text, std::size_t shift)
        : bytes_(new char[shift + text.size()]), at_(bytes_.get() + shift) {
        std::copy(text.begin(), text.end(), at_);
    }
    const char* data() const { return at_; }

private:
    std::unique_ptr<char[]> bytes_;
    char* at_;
};

template <typename Unit>
std::string_view bytesOf(const std::basic_string<Unit>& units) {
    return {reinterpret_cast<const char*>(units.data()), units.size() * sizeof(Unit)};
}

template <typename Unit>
std::basic_string<Unit> unitsOf(std::string_view bytes) {
    std::basic_string<Unit> units(bytes.size() / sizeof(Unit), Unit{});
    std::memcpy(units.data(), bytes.data(), units.size() * sizeof(Unit));
    return units;
}

using Convert = std::size_t (*)(const char*, std::size_t, char*, std::size_t);
using ConvertShort = std::size_t (*)(const char*, std::size_t, char*);

template <typename Unit>
void checkConversion(Convert convert, const char* text, std::size_t units,
                     const std::basic_string<Unit>& expected) {
    const std::unique_ptr<char[]> out(new char[expected.size() * sizeof(Unit)]);
    const std::size_t written = convert(text, units, out.get(), expected.size());
    require(written == expected.size() &&
                std::memcmp(out.get(), expected.data(), written * sizeof(Unit)) == 0,
            "a conversion of ", Hex{{text, units}});
}

template <typename Unit>
void checkShort(ConvertShort convert, const char* text, std::size_t units,
                const std::optional<std::basic_string<Unit>>& expected) {
    if (units > vectors::shortText) {
        return;
    }
    const std::unique_ptr<char[]> out(new char[vectors::shortRoom * sizeof(Unit)]);
    const std::size_t written = convert(text, units, out.get());
    require(written == (expected ? expected->size() : vectors::notWhole) &&
                (!expected || std::memcmp(out.get(), expected->data(), written * sizeof(Unit)) == 0),
            "a short conversion");
}

void checkExtent(const Extent& extent, const Decoded& decoded) {
    require(extent.taken == decoded.taken && extent.utf8 == kvt::test::encodeUtf8(decoded.text).size() &&
                extent.utf16 == kvt::test::encodeUtf16(decoded.text).size() &&
                extent.utf32 == decoded.text.size(),
            "a measure");
}

template <typename Unit>
std::optional<std::basic_string<Unit>> when(bool isWhole, std::basic_string<Unit> text) {
    return isWhole ? std::optional(std::move(text)) : std::nullopt;
}

bool hasOnlyUnits(const std::u32string& text) {
    return std::all_of(text.begin(), text.end(), [](char32_t c) { return c < 0x10000; });
}

void checkUtf8(std::string_view text, std::size_t shift) {
    const Decoded decoded = kvt::test::decodeUtf8(text);
    const Placed placed(text, shift);
    checkExtent(vectors::measureUtf8(placed.data(), text.size()), decoded);
    const Placed good(text.substr(0, decoded.taken), shift);
    checkConversion(vectors::utf8ToUtf16, good.data(), decoded.taken, kvt::test::encodeUtf16(decoded.text));
    checkConversion(vectors::utf8ToUtf32, good.data(), decoded.taken, decoded.text);
    const bool isWhole = decoded.taken == text.size();
    checkShort(vectors::shortUtf8ToUtf16, placed.data(), text.size(),
               when(isWhole, kvt::test::encodeUtf16(decoded.text)));
    checkShort(vectors::shortUtf8ToUtf32, placed.data(), text.size(), when(isWhole, decoded.text));
}

void checkUtf16(std::string_view text, std::size_t shift) {
    const std::u16string units = unitsOf<char16_t>(text);
    const Decoded decoded = kvt::test::decodeUtf16(units);
    const Placed placed(bytesOf(units), shift);
    checkExtent(vectors::measureUtf16(placed.data(), units.size()), decoded);
    const Placed good(bytesOf(units).substr(0, decoded.taken * 2), shift);
    checkConversion(vectors::utf16ToUtf8, good.data(), decoded.taken, kvt::test::encodeUtf8(decoded.text));
    checkConversion(vectors::utf16ToUtf32, good.data(), decoded.taken, decoded.text);
    const bool isWhole = decoded.taken == units.size() && hasOnlyUnits(decoded.text);
    checkShort(vectors::shortUtf16ToUtf8, placed.data(), units.size(),
               when(isWhole, kvt::test::encodeUtf8(decoded.text)));
    checkShort(vectors::shortUtf16ToUtf32, placed.data(), units.size(), when(isWhole, decoded.text));
}

void checkUtf32(std::string_view text, std::size_t shift) {
    // Numbers that are code points for the most part.
    std::u32string units = unitsOf<char32_t>(text);
    for (char32_t& unit : units) {
        unit = unit % 7 == 0 ? unit : unit & 0x1FFFFF;
    }
    const Decoded decoded = kvt::test::decodeUtf32(units);
    const Placed placed(bytesOf(units), shift);
    checkExtent(vectors::measureUtf32(placed.data(), units.size()), decoded);
    const Placed good(bytesOf(units).substr(0, decoded.taken * 4), shift);
    checkConversion(vectors::utf32ToUtf8, good.data(), decoded.taken, kvt::test::encodeUtf8(decoded.text));
    checkConversion(vectors::utf32ToUtf16, good.data(), decoded.taken, kvt::test::encodeUtf16(decoded.text));
    checkShort(vectors::shortUtf32ToUtf16, placed.data(), units.size(),
               when(decoded.taken == units.size() && hasOnlyUnits(decoded.text),
                    kvt::test::encodeUtf16(decoded.text)));
}

void checkAscii(std::string_view text, std::size_t shift) {
    const Placed placed(text, shift);
    const auto isAscii = [](char byte) { return static_cast<unsigned char>(byte) < 0x80; };
    const auto ascii =
        static_cast<std::size_t>(std::find_if_not(text.begin(), text.end(), isAscii) - text.begin());
    require(vectors::asciiPrefix(placed.data(), text.size()) == ascii, "the ASCII before a text");
    std::u16string wide(text.size(), u'\0');
    require(vectors::widenAscii(placed.data(), text.size(), reinterpret_cast<char*>(wide.data())) == ascii,
            "ASCII that becomes UTF-16");
    require(std::equal(text.begin(), text.begin() + static_cast<std::ptrdiff_t>(ascii), wide.begin(),
                       [](char byte, char16_t unit) { return static_cast<unsigned char>(byte) == unit; }),
            "the UTF-16 of ASCII");
    std::copy_if(text.begin(), text.end(), wide.begin(), isAscii);
    std::string narrow(wide.size(), '\0');
    const std::size_t all = vectors::narrowAscii(bytesOf(wide).data(), wide.size(), narrow.data());
    const auto end = std::find_if(wide.begin(), wide.end(), [](char16_t unit) { return unit >= 0x80; });
    require(all == static_cast<std::size_t>(end - wide.begin()), "UTF-16 that becomes ASCII");
}

/// Case as ICU maps it, where the table does not leave the text to ICU.
void checkCase(std::string_view text, std::size_t shift) {
    UErrorCode error = U_ZERO_ERROR;
    static UCaseMap* const caseMap = ucasemap_open("", 0, &error);
    const Placed placed(text, shift);
    for (const auto mapping :
         {detail::CaseMapping::upper, detail::CaseMapping::lower, detail::CaseMapping::folded}) {
        std::string expected(4 * text.size() + 4, '\0');
        std::string out(expected.size(), '\0');
        error = U_ZERO_ERROR;
        const vectors::CaseProgress progress = vectors::mapCase(
            *detail::caseTable(mapping, caseMap), placed.data(), text.size(), 0, out.data(), out.size());
        const std::int32_t length = detail::caseFunction(mapping)(
            caseMap, expected.data(), static_cast<std::int32_t>(expected.size()), placed.data(),
            static_cast<std::int32_t>(text.size()), &error);
        const bool isAll = progress.taken == text.size();
        require(isAll || progress.isLeftToIcu, "case left without a reason");
        require(!isAll || progress.written == static_cast<std::size_t>(length), "the length of mapped text");
        // A sigma is mapped by what stands around it, and ICU has mapped it already.
        require(std::string_view(out).substr(0, progress.written) ==
                    std::string_view(expected).substr(0, progress.written),
                "case of ", Hex{text});
    }
}

template <typename Unit>
void checkSearch(std::string_view bytes, std::size_t shift) {
    const std::basic_string<Unit> text = unitsOf<Unit>(bytes);
    const std::size_t length = std::min<std::size_t>(1 + shift % 5, text.size());
    if (length == 0) {
        return;
    }
    const Placed placed(bytesOf(text), shift * sizeof(Unit));
    const auto* const units = reinterpret_cast<const Unit*>(placed.data());
    // The last units, so that the needle is there, if not before.
    const std::basic_string<Unit> needle = text.substr(text.size() - length);
    const std::size_t places = text.size() - length + 1;
    const vectors::Place place = vectors::findSequence(units, places, needle.data(), length);
    const std::size_t found = text.find(needle);
    require(place.isSettled ? place.at == found : place.at <= found, "a search");

    const Unit delimiter = text[shift % text.size()];
    std::vector<std::uint32_t> expected;
    std::size_t parts = 0;
    for (std::size_t begin = 0, i = 0; i <= text.size(); ++i) {
        if (i == text.size() || text[i] == delimiter) {
            parts += i > begin ? 1 : 0;
            begin = i + 1;
        }
        if (i < text.size() && text[i] == delimiter) {
            expected.push_back(static_cast<std::uint32_t>(i));
        }
    }
    require(vectors::countParts(units, text.size(), delimiter, true) == expected.size() + 1, "parts");
    require(vectors::countParts(units, text.size(), delimiter, false) == parts, "parts that are not empty");
    std::vector<std::uint32_t> at(text.size());
    at.resize(vectors::placesOf(units, static_cast<std::uint32_t>(text.size()), delimiter, at.data()));
    require(at == expected, "the places of a unit");
}

void checkHash(std::string_view text, std::size_t shift) {
    const Placed placed(text, shift);
    std::uint64_t expected = 0xCBF29CE484222325U;
    for (const char byte : text) {
        expected = (expected ^ static_cast<unsigned char>(byte)) * 0x100000001B3U;
    }
    require(vectors::fnv1a(0xCBF29CE484222325U, placed.data(), text.size()) == expected, "a hash");
}

void checkSets(std::string_view text, std::size_t shift) {
    vectors::ByteSet set;
    detail::ByteSet first;
    detail::ByteSet second;
    for (const char byte : text.substr(0, std::min<std::size_t>(text.size(), 1 + shift % 16))) {
        set.add(static_cast<std::uint8_t>(byte));
        first.add(static_cast<unsigned char>(byte));
        second.add(static_cast<unsigned char>(byte ^ 1));
    }
    const Placed placed(text, shift);
    for (std::size_t i = 0; i + vectors::ByteSet::block <= text.size(); i += 1 + shift) {
        const std::uint64_t bits = set.bitsOf(reinterpret_cast<const std::uint8_t*>(placed.data()) + i);
        for (std::size_t bit = 0; bit < vectors::ByteSet::block; ++bit) {
            require((bits >> bit & 1) == (first.contains(static_cast<unsigned char>(text[i + bit])) ? 1 : 0),
                    "a set of bytes");
        }
    }
    const detail::PrefixScan scan({first, second});
    std::size_t expected = text.size();
    for (std::size_t i = text.size(); i-- > 0;) {
        if (i + 1 < text.size() && first.contains(static_cast<unsigned char>(text[i])) &&
            second.contains(static_cast<unsigned char>(text[i + 1]))) {
            expected = i;
        }
    }
    require(scan.find(placed.data(), text.size(), 0) == expected, "a scan for a prefix");
}

using Check = void (*)(std::string_view, std::size_t);

// The order is part of the corpus: add at the end.
constexpr Check checks[] = {checkUtf8,
                            checkUtf16,
                            checkUtf32,
                            checkAscii,
                            checkCase,
                            checkSearch<char>,
                            checkSearch<char16_t>,
                            checkSearch<char32_t>,
                            checkHash,
                            checkSets};

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const std::vector<std::int64_t> targets = allTargets();
    Input input(data, size);
    const Check check = input.pick(checks);
    const std::size_t shift = input.byte() % 64;
    for (const std::int64_t target : targets) {
        platform::forceProcessorTargets(target);
        check(input.rest(), shift);
    }
    platform::forceProcessorTargets(0);
    return 0;
}
