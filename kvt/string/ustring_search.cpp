// Search: the members over the unit-level algorithms. Case-insensitive forms fold both sides and search the folded
// text, so that their positions are positions in the folded text.
#include <kvt/string/detail/instantiate.h>
#include <kvt/string/detail/unit_search.h>
#include <kvt/string/ustring_array.h>

#include <algorithm>

namespace kvt::ex {
namespace {

template <std::uint32_t N>
using UnitsOf = detail::Units<detail::CodeUnit<N>>;

template <std::uint32_t N>
UnitsOf<N> unitsOf(UStringView<N> view) {
    return {view.data(), view.size()};
}

// Whether any string of the array stands at `pos`.
template <std::uint32_t N>
bool anyStandsAt(UnitsOf<N> text, std::size_t pos, const UStringArray<N>& needles) {
    return std::any_of(needles.begin(), needles.end(), [&](const UString<N>& needle) {
        return detail::sameUnits(text.substr(pos, needle.size()), unitsOf<N>(needle));
    });
}

} // namespace

template <std::uint32_t N>
int UString<N>::compare(UStringView<N> other, detail::case_insensitive_t) const {
    const UString folded = getAsFoldedCase(other);
    return getAsFoldedCase().compare(folded);
}

template <std::uint32_t N>
bool UString<N>::beginsWith(UStringView<N> needle, detail::case_sensitive_t) const noexcept {
    return detail::sameUnits(unitsOf<N>(*this).substr(0, needle.size()), unitsOf(needle));
}

template <std::uint32_t N>
bool UString<N>::beginsWith(UStringView<N> needle, detail::case_insensitive_t) const {
    const UString folded = getAsFoldedCase(needle);
    return getAsFoldedCase().beginsWith(folded);
}

template <std::uint32_t N>
bool UString<N>::endsWith(UStringView<N> needle, detail::case_sensitive_t) const noexcept {
    return needle.size() <= size() &&
           detail::sameUnits(unitsOf<N>(*this).substr(size() - needle.size()), unitsOf(needle));
}

template <std::uint32_t N>
bool UString<N>::endsWith(UStringView<N> needle, detail::case_insensitive_t) const {
    const UString folded = getAsFoldedCase(needle);
    return getAsFoldedCase().endsWith(folded);
}

template <std::uint32_t N>
std::uint64_t UString<N>::find(UStringView<N> needle, std::uint64_t pos,
                               detail::case_sensitive_t) const noexcept {
    return detail::findUnits(unitsOf<N>(*this), unitsOf(needle), pos);
}

template <std::uint32_t N>
std::uint64_t UString<N>::find(UStringView<N> needle, std::uint64_t pos, detail::case_insensitive_t) const {
    const UString folded = getAsFoldedCase(needle);
    return getAsFoldedCase().find(folded, pos);
}

template <std::uint32_t N>
std::uint64_t UString<N>::rfind(UStringView<N> needle, std::uint64_t pos,
                                detail::case_sensitive_t) const noexcept {
    return detail::rfindUnits(unitsOf<N>(*this), unitsOf(needle), pos);
}

template <std::uint32_t N>
std::uint64_t UString<N>::rfind(UStringView<N> needle, std::uint64_t pos, detail::case_insensitive_t) const {
    const UString folded = getAsFoldedCase(needle);
    return getAsFoldedCase().rfind(folded, pos);
}

template <std::uint32_t N>
std::uint64_t UString<N>::find(value_type unit, std::uint64_t pos) const noexcept {
    return detail::findUnit(unitsOf<N>(*this), unit, pos);
}

template <std::uint32_t N>
std::uint64_t UString<N>::rfind(value_type unit, std::uint64_t pos) const noexcept {
    return detail::rfindUnit(unitsOf<N>(*this), unit, pos);
}

template <std::uint32_t N>
std::uint64_t UString<N>::findFirstOf(const vector<value_type>& set, std::uint64_t pos) const noexcept {
    return detail::UnitSet<value_type>(set.data(), set.size()).findFirst(unitsOf<N>(*this), pos);
}

template <std::uint32_t N>
std::uint64_t UString<N>::findLastOf(const vector<value_type>& set, std::uint64_t pos) const noexcept {
    return detail::UnitSet<value_type>(set.data(), set.size()).findLast(unitsOf<N>(*this), pos);
}

template <std::uint32_t N>
std::uint64_t UString<N>::findFirstOf(const UStringArray<N>& needles, std::uint64_t pos) const noexcept {
    for (; pos < size(); ++pos) {
        if (anyStandsAt(unitsOf<N>(*this), pos, needles)) {
            return pos;
        }
    }
    return npos;
}

template <std::uint32_t N>
std::uint64_t UString<N>::findLastOf(const UStringArray<N>& needles, std::uint64_t pos) const noexcept {
    for (std::uint64_t i = std::min<std::uint64_t>(size(), pos); i > 0; --i) {
        if (anyStandsAt(unitsOf<N>(*this), i - 1, needles)) {
            return i - 1;
        }
    }
    return npos;
}

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_USTRING)

} // namespace kvt::ex
