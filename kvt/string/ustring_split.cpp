// Split: one loop for all kinds of delimiters. Where they are single units their places are found for a block of units
// at once and the pieces are counted first, so that the array is made once.
#include <kvt/string/detail/instantiate.h>
#include <kvt/string/detail/unit_search.h>
#include <kvt/string/detail/unit_vectors.h>
#include <kvt/string/ustring_array.h>

#include <kvt/foundation/detail/append_in_place.h>

#include <algorithm>
#include <array>
#include <cstring>

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

/// The places of one unit in a text, found for a block of units at once.
template <typename Unit>
class Delimiters {
public:
    Delimiters(detail::Units<Unit> text, Unit unit) : text_(text), unit_(unit) {}

    /// The next place; the text's size when there is none.
    std::size_t next() {
        while (next_ == end_) {
            if (searched_ == text_.size()) {
                return text_.size();
            }
            search();
        }
        return begin_ + *next_++;
    }

private:
    void search() {
        begin_ = searched_;
        const std::size_t size = std::min(places_.size(), text_.size() - begin_);
        next_ = places_.data();
        end_ = next_ + detail::vectors::placesOf(text_.data() + begin_, static_cast<std::uint32_t>(size),
                                                 unit_, places_.data());
        searched_ += size;
    }

    const detail::Units<Unit> text_;
    const Unit unit_;
    std::size_t searched_ = 0;
    std::size_t begin_ = 0; // of the block
    const std::uint32_t* next_ = nullptr;
    const std::uint32_t* end_ = nullptr;
    std::array<std::uint32_t, 2048> places_;
};

/// Strings at the end of an array, made some at a time, for pieces whose number is known but for one.
template <std::uint32_t N>
class Pieces {
public:
    Pieces(UStringArray<N>& array, std::size_t most) : array_(array) { array_.reserve(most); }

    /// The next string, which is empty.
    UString<N>& next() {
        if (next_ == end_) {
            makeSome();
        }
        return *next_++;
    }
    /// Drops the strings that were not asked for.
    void finish() { array_.resize(array_.size() - static_cast<std::size_t>(end_ - next_)); }

private:
    void makeSome() {
        const std::size_t made = array_.size();
        array_.resize(made + std::min<std::size_t>(64, array_.capacity() - made));
        next_ = array_.data() + made;
        end_ = array_.end();
    }

    UStringArray<N>& array_;
    UString<N>* next_ = nullptr;
    UString<N>* end_ = nullptr;
};

// Sets `out`, which is empty, to the `size` units at `units`, of which `readable` can be read.
template <typename Unit>
void fill(std::basic_string<Unit>& out, const Unit* units, std::size_t size, std::size_t readable) {
    constexpr std::size_t inPlace = 15 / sizeof(Unit); // units that a string holds without memory of its own
    detail::appendInPlace(out, std::max(size, inPlace), [=](Unit* to) {
        if (size <= inPlace && inPlace <= readable) {
            std::memcpy(to, units, inPlace * sizeof(Unit)); // one step, whatever the size
        } else {
            std::memcpy(to, units, size * sizeof(Unit));
        }
        return size;
    });
}

} // namespace

template <std::uint32_t N>
UStringArray<N> UString<N>::split(value_type delimiter, SplitBehaviour behaviour,
                                  std::uint64_t maxCount) const {
    const detail::Units<value_type> text(*this);
    const bool keepEmptyParts = behaviour == KeepEmptyParts;
    const std::size_t parts =
        detail::vectors::countParts(text.data(), text.size(), delimiter, keepEmptyParts);
    UStringArray<N> array;
    Pieces<N> pieces(array, std::min<std::uint64_t>(parts, maxCount) + 1);
    Delimiters<value_type> delimiters(text, delimiter);
    cutAt<value_type>(
        text, keepEmptyParts, maxCount, [&](std::size_t) { return delimiters.next(); },
        [&pieces, text](std::size_t start, std::size_t end) {
            fill(pieces.next().storage_, text.data() + start, end - start, text.size() - start);
        });
    pieces.finish();
    return array;
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
