// Editing. Every operation leaves the string as it was when it fails.
//
// The standard string does the work at positions, also with views into the string itself. Its own exceptions are
// worded differently by different run-times, so what would make it throw is checked here first.
#include <kvt/string/detail/instantiate.h>
#include <kvt/string/detail/unit_search.h>

#include <kvt/foundation/vector.h>

#include <algorithm>
#include <functional>
#include <stdexcept>

namespace kvt::ex {
namespace {

template <typename Unit>
void requirePosition(const std::basic_string<Unit>& text, std::size_t pos) {
    if (pos > text.size()) {
        throw std::out_of_range("invalid string position");
    }
}

// `removed` units go and `added` units come.
template <typename Unit>
void requireRoom(const std::basic_string<Unit>& text, std::size_t removed, std::size_t added) {
    if (added > text.max_size() - (text.size() - removed)) {
        throw std::length_error("string too long");
    }
}

template <typename Unit>
void replaceUnits(std::basic_string<Unit>& text, std::size_t pos, std::size_t count,
                  detail::Units<Unit> with) {
    requirePosition(text, pos);
    count = std::min(count, text.size() - pos);
    requireRoom(text, count, with.size());
    text.replace(pos, count, with.data(), with.size());
}

// `text` with each `from` replaced by `to`, in one pass; the first one stands at `found`. What was put in is not
// searched. Each replacement has to leave room for the text that follows, as if it were done in place.
template <typename Unit>
std::basic_string<Unit> allReplaced(detail::Units<Unit> text, detail::Units<Unit> from,
                                    detail::Units<Unit> to, std::size_t found) {
    std::basic_string<Unit> result;
    result.reserve(text.size());
    std::size_t done = 0;
    do {
        result.append(text.substr(done, found - done));
        done = found + from.size();
        const std::size_t rest = text.size() - done;
        if (to.size() > result.max_size() - result.size() - rest) {
            throw std::length_error("string too long");
        }
        result.append(to);
        found = done < text.size() ? detail::findUnits(text, from, done) : detail::notFound;
    } while (found != detail::notFound);
    return result.append(text.substr(done));
}

template <std::uint32_t N>
detail::Units<detail::CodeUnit<N>> unitsOf(UStringView<N> view) {
    return {view.data(), view.size()};
}

} // namespace

template <std::uint32_t N>
UString<N>& UString<N>::append(UStringView<N> text) {
    return insert(size(), text);
}

template <std::uint32_t N>
UString<N>& UString<N>::insert(std::uint64_t pos, UStringView<N> text) {
    replaceUnits(this->storage_, pos, 0, unitsOf(text));
    return *this;
}

template <std::uint32_t N>
UString<N>& UString<N>::insert(std::uint64_t pos, value_type unit) {
    return insert(pos, UStringView<N>(&unit, 1));
}

template <std::uint32_t N>
UString<N>& UString<N>::erase(std::uint64_t pos, std::uint64_t count) {
    requirePosition(this->storage_, pos);
    this->storage_.erase(pos, count);
    return *this;
}

template <std::uint32_t N>
UString<N>& UString<N>::replace(std::uint64_t pos, std::uint64_t count, UStringView<N> text) {
    replaceUnits(this->storage_, pos, count, unitsOf(text));
    return *this;
}

template <std::uint32_t N>
void UString<N>::push_back(value_type unit) {
    requireRoom(this->storage_, 0, 1);
    this->storage_.push_back(unit);
}

template <std::uint32_t N>
void UString<N>::resize(std::uint64_t size, value_type unit) {
    requireRoom(this->storage_, this->storage_.size(), size);
    this->storage_.resize(size, unit);
}

template <std::uint32_t N>
UString<N> UString<N>::operator+(const UString& other) const {
    requireRoom(this->storage_, 0, other.size());
    UString result;
    result.storage_.reserve(size() + other.size());
    result.storage_.append(this->storage_).append(other.storage_);
    if constexpr (N == Encoding::Unknown) {
        result.encoding_ = this->encoding_;
    }
    return result;
}

template <std::uint32_t N>
UString<N>& UString<N>::replaceAll(UStringView<N> from, UStringView<N> to, detail::case_sensitive_t) {
    const std::uint64_t found = isEmpty() ? npos : find(from);
    if (found != npos) {
        this->storage_ = allReplaced<value_type>(this->storage_, unitsOf(from), unitsOf(to), found);
    }
    return *this;
}

// Each round folds both sides again; the positions found are those of the folded text, and they are applied to the
// stored text with the length of `from` as it was passed.
template <std::uint32_t N>
UString<N>& UString<N>::replaceAll(UStringView<N> from, UStringView<N> to, detail::case_insensitive_t tag) {
    if constexpr (N == Encoding::Binary) {
        return replaceAll(from, to, case_sensitive);
    } else {
        std::uint64_t found = isEmpty() ? npos : find(from, 0, tag);
        if (found == npos) {
            return *this;
        }
        UString result(*this);
        do {
            result.replace(found, from.size(), to);
            const std::uint64_t behind = found + to.size();
            found = behind < result.size() ? result.find(from, behind, tag) : npos;
        } while (found != npos);
        this->storage_.swap(result.storage_);
        return *this;
    }
}

template <std::uint32_t N>
UString<N>& UString<N>::replaceFirst(UStringView<N> from, UStringView<N> to, detail::case_sensitive_t tag) {
    return replace(find(from, 0, tag), from.size(), to);
}

template <std::uint32_t N>
UString<N>& UString<N>::replaceFirst(UStringView<N> from, UStringView<N> to, detail::case_insensitive_t tag) {
    if constexpr (N == Encoding::Binary) {
        return replaceFirst(from, to, case_sensitive);
    } else {
        return replace(find(from, 0, tag), from.size(), to);
    }
}

template <std::uint32_t N>
UString<N>& UString<N>::replaceLast(UStringView<N> from, UStringView<N> to, detail::case_sensitive_t tag) {
    return replace(rfind(from, npos, tag), from.size(), to);
}

template <std::uint32_t N>
UString<N>& UString<N>::replaceLast(UStringView<N> from, UStringView<N> to, detail::case_insensitive_t tag) {
    if constexpr (N == Encoding::Binary) {
        return replaceLast(from, to, case_sensitive);
    } else {
        return replace(rfind(from, npos, tag), from.size(), to);
    }
}

template <std::uint32_t N>
UString<N>& UString<N>::replaceAll(value_type from, value_type to) noexcept {
    std::replace(this->storage_.begin(), this->storage_.end(), from, to);
    return *this;
}

template <std::uint32_t N>
UString<N>& UString<N>::replaceAll(const vector<value_type>& set, value_type to) noexcept {
    const detail::UnitSet<value_type> units(set.data(), set.size());
    std::replace_if(
        this->storage_.begin(), this->storage_.end(), [&](value_type unit) { return units.contains(unit); },
        to);
    return *this;
}

template <std::uint32_t N>
UString<N>& UString<N>::removeAll(value_type unit) noexcept {
    this->storage_.erase(std::remove(this->storage_.begin(), this->storage_.end(), unit),
                         this->storage_.end());
    return *this;
}

template <std::uint32_t N>
UString<N>& UString<N>::strip(const vector<value_type>& set) noexcept {
    // "Not found" is the largest count: everything goes.
    this->storage_.erase(
        0, detail::UnitSet<value_type>(set.data(), set.size()).findFirst(this->storage_, 0, false));
    return *this;
}

template <std::uint32_t N>
UString<N>& UString<N>::rstrip(const vector<value_type>& set) noexcept {
    // One behind "not found" is 0: everything goes.
    this->storage_.erase(
        detail::UnitSet<value_type>(set.data(), set.size()).findLast(this->storage_, npos, false) + 1);
    return *this;
}

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_USTRING)

} // namespace kvt::ex
