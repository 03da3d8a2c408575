// URegex on the compiled pattern. It works on bytes, so that all instantiations share the one of its code; what is left for
// the template is to copy the subject.
#include <kvt/regex/uregex.h>

#include <kvt/regex/detail/compiled_pattern.h>

#include <cstddef>
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
Groups groupsOf(const boost::cmatch& result, std::string_view subject, std::uint64_t start) {
    Groups groups;
    groups.reserve(result.size());
    for (const auto& group : result) {
        groups.emplace_back(group.matched ? static_cast<std::uint64_t>(group.first - subject.data())
                                          : start - 1,
                            static_cast<std::uint64_t>(group.length()));
    }
    return groups;
}

Groups matchWhole(const detail::CompiledPattern* pattern, std::string_view subject) {
    boost::cmatch result;
    return pattern != nullptr && pattern->match(subject, result) ? groupsOf(result, subject, 0) : Groups();
}

Groups searchFrom(const detail::CompiledPattern* pattern, std::string_view subject, std::uint64_t start) {
    boost::cmatch result;
    return pattern != nullptr && pattern->search(subject, start, result) ? groupsOf(result, subject, start)
                                                                         : Groups();
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
    return {subject, matchWhole(d().pattern.get(), subject)};
}

template <std::uint32_t N>
URegexMatch<N> URegex<N>::search(const UString<N>& subject, std::uint64_t start) const {
    return {subject, searchFrom(d().pattern.get(), subject, start)};
}

template class URegex<0>;
template class URegex<1>;
template class URegex<28>;

} // namespace kvt::ex
