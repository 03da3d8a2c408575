// URegex on the compiled pattern. It works on bytes, so that all instantiations share the one of its code; what is left
// for the template is to copy the subject.
#include <kvt/regex/uregex.h>

#include <kvt/regex/detail/compiled_pattern.h>

#include <cstddef>
#include <functional>
#include <string_view>

namespace kvt::ex {
namespace detail {

template <std::uint32_t N>
class URegexImpl {
public:
    std::shared_ptr<const CompiledPattern> pattern; ///< null without one; copies share it
};

} // namespace detail

namespace {

using Groups = vector<std::pair<std::uint64_t, std::uint64_t>>;

// The position of a group that took no part is one before `start`, modulo 2 to the 64th.
void fill(Groups& groups, const boost::cmatch& result, std::string_view subject, std::uint64_t start) {
    groups.reserve(result.size());
    for (const auto& group : result) {
        groups.emplace_back(group.matched ? static_cast<std::uint64_t>(group.first - subject.data())
                                          : start - 1,
                            static_cast<std::uint64_t>(group.length()));
    }
}

void matchWhole(const detail::CompiledPattern* pattern, std::string_view subject, Groups& groups) {
    boost::cmatch result;
    if (pattern != nullptr && pattern->match(subject, result)) {
        fill(groups, result, subject, 0);
    }
}

void searchFrom(const detail::CompiledPattern* pattern, std::string_view subject, std::uint64_t start,
                Groups& groups) {
    boost::cmatch result;
    if (pattern != nullptr && pattern->search(subject, start, result)) {
        fill(groups, result, subject, start);
    }
}

void searchAllOf(const detail::CompiledPattern* pattern, std::string_view subject, Groups& groups,
                 const std::function<bool()>& use) {
    boost::cmatch result;
    bool mayBeEmpty = true;
    for (std::uint64_t start = 0;
         pattern != nullptr && pattern->searchOn(subject, start, mayBeEmpty, result);) {
        groups.clear();
        fill(groups, result, subject, 0);
        if (!use()) {
            return;
        }
        // With \K in a look ahead, a match may end before it begins. The search goes on behind its start all the same.
        const auto end = static_cast<std::uint64_t>(result[0].second - subject.data());
        mayBeEmpty = end > start && groups[0].second != 0;
        start = end;
    }
}

} // namespace

template <std::uint32_t N>
URegex<N>::URegex() : impl_(std::make_unique<detail::URegexImpl<N>>()) {}

template <std::uint32_t N>
URegex<N>::URegex(const UString<N>& pattern) : URegex() {
    d().pattern =
        std::make_shared<const detail::CompiledPattern>(std::string_view(pattern.rawData(), pattern.size()));
}

template <std::uint32_t N>
URegex<N>::URegex(const URegex& other)
    : impl_(other.impl_ ? std::make_unique<detail::URegexImpl<N>>(other.d()) : nullptr) {}

template <std::uint32_t N>
URegex<N>& URegex<N>::operator=(const URegex& other) {
    if (impl_ && other.impl_) {
        d().pattern = other.d().pattern;
    } else {
        *this = URegex(other);
    }
    return *this;
}

template <std::uint32_t N>
URegex<N>::URegex(URegex&& other) noexcept = default;

template <std::uint32_t N>
URegex<N>& URegex<N>::operator=(URegex&& other) noexcept = default;

template <std::uint32_t N>
URegex<N>::~URegex() = default;

template <std::uint32_t N>
URegex<N>::operator bool() const noexcept {
    return !impl_ || d().pattern != nullptr;
}

template <std::uint32_t N>
URegexMatch<N> URegex<N>::match(const UString<N>& subject) const {
    URegexMatch<N> match(subject);
    matchWhole(d().pattern.get(), subject, match.groups_);
    return match;
}

template <std::uint32_t N>
URegexMatch<N> URegex<N>::search(const UString<N>& subject, std::uint64_t start) const {
    URegexMatch<N> match(subject);
    searchFrom(d().pattern.get(), subject, start, match.groups_);
    return match;
}

template <std::uint32_t N>
void URegex<N>::searchAll(const UString<N>& subject,
                          const std::function<bool(const URegexMatch<N>&)>& use) const {
    URegexMatch<N> match(subject);
    searchAllOf(d().pattern.get(), match.subject_, match.groups_, [&] { return use(match); });
}

template <std::uint32_t N>
bool URegex<N>::matchesIn(UStringView<N> text) const {
    return d().pattern != nullptr && d().pattern->matchesIn({text.data(), text.size()});
}

template <std::uint32_t N>
std::uint64_t URegex<N>::passOver(UStringView<N> text, std::uint64_t start) const noexcept {
    const detail::CompiledPattern* const pattern = d().pattern.get();
    return pattern == nullptr ? text.size() : pattern->passOver({text.data(), text.size()}, start);
}

template class URegex<0>;
template class URegex<1>;
template class URegex<28>;

} // namespace kvt::ex
