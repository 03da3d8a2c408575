// Split: one loop for all kinds of delimiters, and the same loop by blocks for a single unit, the places of which are
// found for a block at once. There the pieces are counted first, so that the array is made once.
#include <kvt/string/detail/instantiate.h>
#include <kvt/string/detail/unit_search.h>
#include <kvt/string/detail/unit_vectors.h>
#include <kvt/string/ustring_array.h>

#include <kvt/foundation/detail/append_in_place.h>
#include <kvt/platform/new_pages.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <type_traits>

namespace kvt::ex {
namespace {

// Cuts `text` where `findNext(start)` says, and calls `add(start, end)` for each piece. Of a delimiter just the first
// unit is passed over, however long it is; what is left when `maxCount` pieces are cut off is one more piece, whatever
// it holds.
template <typename Unit, typename FindNext, typename Add>
void cutAt(detail::Units<Unit> text, bool keepEmptyParts, std::uint64_t maxCount, FindNext findNext,
           Add add) {
    std::size_t start = 0;
    while (maxCount != 0) {
        const std::size_t end = std::min<std::size_t>(findNext(start), text.size());
        if (keepEmptyParts || end > start) {
            add(start, end);
            --maxCount;
        }
        start = end + 1;
        if (start > text.size()) {
            return;
        }
    }
    add(start, text.size());
}

// The pieces of a UString<30> have no encoding.
template <std::uint32_t N, typename FindNext>
UStringArray<N> splitAt(const UString<N>& text, bool keepEmptyParts, std::uint64_t maxCount,
                        FindNext findNext) {
    using Unit = detail::CodeUnit<N>;
    UStringArray<N> pieces;
    cutAt<Unit>(text, keepEmptyParts, maxCount, findNext, [&](std::size_t start, std::size_t end) {
        pieces.emplace_back().append(UStringView<N>(text.rawData() + start, end - start));
    });
    return pieces;
}

/// Where a piece begins and ends.
struct Span {
    std::size_t start;
    std::size_t end;
};

/// cutAt() at each `delimiter`, the places of which are found for a block of units at once: `add` gets an array of spans
/// and their number.
template <typename Unit, typename Add>
void cutAtUnit(detail::Units<Unit> text, Unit delimiter, bool keepEmptyParts, std::uint64_t maxCount,
               Add add) {
    std::array<std::uint32_t, 1024> places;
    std::array<Span, 1024> spans;
    std::size_t start = 0;
    for (std::size_t begin = 0; begin < text.size() && maxCount != 0; begin += places.size()) {
        const std::size_t size = std::min(places.size(), text.size() - begin);
        const std::size_t found = detail::vectors::placesOf(
            text.data() + begin, static_cast<std::uint32_t>(size), delimiter, places.data());
        std::size_t count = 0;
        for (std::size_t i = 0; i < found; ++i) {
            const std::size_t end = begin + places[i];
            spans[count] = {start, end};
            count += keepEmptyParts || end > start ? 1 : 0;
            start = end + 1;
        }
        if (count >= maxCount) {
            count = static_cast<std::size_t>(maxCount);
            start = spans[count - 1].end + 1;
        }
        add(spans.data(), count);
        maxCount -= count;
    }
    if (maxCount == 0 || keepEmptyParts || start < text.size()) {
        spans[0] = {start, text.size()};
        add(spans.data(), 1);
    }
}

// Sets `out`, which is empty, to the `size` units at `units`, of which `readable` can be read. Short pieces are copied
// by as many bytes as a string holds in place, and by as many as the smallest piece of memory takes, whatever the size.
template <typename Unit>
[[gnu::always_inline]] inline void fill(std::basic_string<Unit>& out, const Unit* units, std::size_t size,
                                        std::size_t readable) {
    constexpr std::size_t inPlace = 15 / sizeof(Unit);
    constexpr std::size_t smallest = 32 / sizeof(Unit);
    const auto copy = [&](auto room) {
        detail::appendInPlace(out, room, [=](Unit* to) {
            std::memcpy(to, units, room * sizeof(Unit));
            return size;
        });
    };
    if (size <= inPlace && inPlace <= readable) {
        copy(std::integral_constant<std::size_t, inPlace>());
    } else if (size > inPlace && size <= smallest && smallest <= readable) {
        copy(std::integral_constant<std::size_t, smallest>());
    } else {
        out.assign(units, size);
    }
}

} // namespace

template <std::uint32_t N>
UStringArray<N> UString<N>::split(value_type delimiter, SplitBehaviour behaviour,
                                  std::uint64_t maxCount) const {
    const detail::Units<value_type> text(*this);
    const bool keepEmptyParts = behaviour == KeepEmptyParts;
    const std::size_t parts =
        detail::vectors::countParts(text.data(), text.size(), delimiter, keepEmptyParts);
    UStringArray<N> pieces;
    pieces.reserve(std::min<std::uint64_t>(parts, maxCount) + 1);
    platform::fetchPages(pieces.data(), static_cast<std::size_t>(pieces.capacity()) * sizeof(UString<N>));
    cutAtUnit<value_type>(text, delimiter, keepEmptyParts, maxCount,
                          [&pieces, text](const Span* spans, std::size_t count) {
                              UString<N>* piece = pieces.end();
                              pieces.resize(pieces.size() + count);
                              for (const Span* const end = spans + count; spans != end; ++spans, ++piece) {
                                  fill(piece->storage_, text.data() + spans->start, spans->end - spans->start,
                                       text.size() - spans->start);
                              }
                          });
    return pieces;
}

template <std::uint32_t N>
UStringArray<N> UString<N>::split(const vector<value_type>& delimiters, SplitBehaviour behaviour,
                                  std::uint64_t maxCount) const {
    const detail::UnitSet<value_type> set(delimiters.data(), delimiters.size());
    return splitAt(*this, behaviour == KeepEmptyParts, maxCount,
                   [&](std::size_t start) { return set.findFirst(*this, start); });
}

template <std::uint32_t N>
UStringArray<N> UString<N>::split(UStringView<N> delimiter, SplitBehaviour behaviour,
                                  std::uint64_t maxCount) const {
    if (delimiter.size() == 1) {
        return split(delimiter[0], behaviour, maxCount);
    }
    return splitAt(*this, behaviour == KeepEmptyParts, maxCount,
                   [&](std::size_t start) { return find(delimiter, start); });
}

template <std::uint32_t N>
UStringArray<N> UString<N>::split(const UStringArray<N>& delimiters, SplitBehaviour behaviour,
                                  std::uint64_t maxCount) const {
    return splitAt(*this, behaviour == KeepEmptyParts, maxCount,
                   [&](std::size_t start) { return findFirstOf(delimiters, start); });
}

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_USTRING)

} // namespace kvt::ex
