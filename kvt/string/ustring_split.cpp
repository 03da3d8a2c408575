// Split: one loop for all kinds of delimiters.
#include <kvt/string/detail/instantiate.h>
#include <kvt/string/ustring_array.h>

namespace kvt::ex {
namespace {

// Cuts `text` where `findNext(start)` says. Of a delimiter just the first unit is passed over, however long it is;
// what is left when `maxCount` pieces are cut off is one more piece, whatever it holds. The pieces of a UString<30>
// have no encoding.
template <std::uint32_t N, typename FindNext>
UStringArray<N> splitAt(const UString<N>& text, bool keepEmptyParts, std::uint64_t maxCount,
                        FindNext findNext) {
    UStringArray<N> pieces;
    const auto add = [&](std::size_t start, std::size_t end) {
        UString<N>& piece = pieces.emplace_back();
        piece.append(UStringView<N>(text.rawData() + start, end - start));
    };
    std::size_t start = 0;
    while (maxCount != 0) {
        const std::uint64_t found = findNext(start);
        const std::size_t end = found != UString<N>::npos ? found : text.size();
        if (keepEmptyParts || end > start) {
            add(start, end);
            --maxCount;
        }
        start = end + 1;
        if (start > text.size()) {
            return pieces;
        }
    }
    add(start, text.size());
    return pieces;
}

} // namespace

template <std::uint32_t N>
UStringArray<N> UString<N>::split(value_type delimiter, SplitBehaviour behaviour,
                                  std::uint64_t maxCount) const {
    return splitAt(*this, behaviour == KeepEmptyParts, maxCount,
                   [&](std::size_t start) { return find(delimiter, start); });
}

template <std::uint32_t N>
UStringArray<N> UString<N>::split(const vector<value_type>& delimiters, SplitBehaviour behaviour,
                                  std::uint64_t maxCount) const {
    return splitAt(*this, behaviour == KeepEmptyParts, maxCount,
                   [&](std::size_t start) { return findFirstOf(delimiters, start); });
}

template <std::uint32_t N>
UStringArray<N> UString<N>::split(UStringView<N> delimiter, SplitBehaviour behaviour,
                                  std::uint64_t maxCount) const {
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
