// URegex on Boost.Regex. The engine works on bytes, so that all instantiations share the one of its code; what is
// left for the template is to copy the subject.
#include <kvt/regex/uregex.h>

#include <boost/regex.hpp>

#include <cstddef>
#include <string_view>

namespace kvt::ex {
namespace detail {

template <std::uint32_t N>
class URegexImpl {
public:
    // The regex counts references to its compiled program, so that copies are cheap.
    boost::basic_regex<char> regex;
};

} // namespace detail

namespace {

using Groups = vector<std::pair<std::uint64_t, std::uint64_t>>;

bool isUsable(const boost::basic_regex<char>& regex) {
    // Without a program the status is an error, too.
    return regex.status() == 0;
}

// The difference of a group that took no part is -1, and wraps around when `start` is added.
Groups groupsOf(const boost::cmatch& result, std::uint64_t start) {
    Groups groups;
    groups.reserve(result.size());
    for (int i = 0; i < static_cast<int>(result.size()); ++i) {
        groups.emplace_back(static_cast<std::uint64_t>(result.position(static_cast<std::size_t>(i))) + start,
                            static_cast<std::uint64_t>(result.length(i)));
    }
    return groups;
}

Groups matchWhole(const boost::basic_regex<char>& regex, std::string_view subject) {
    boost::cmatch result;
    if (!isUsable(regex) ||
        !boost::regex_match(subject.data(), subject.data() + subject.size(), result, regex)) {
        return {};
    }
    return groupsOf(result, 0);
}

Groups searchFrom(const boost::basic_regex<char>& regex, std::string_view subject, std::uint64_t start) {
    boost::cmatch result;
    if (!isUsable(regex) ||
        !boost::regex_search(subject.data() + start, subject.data() + subject.size(), result, regex)) {
        return {};
    }
    return groupsOf(result, start);
}

} // namespace

template <std::uint32_t N>
URegex<N>::URegex() : impl_(std::make_unique<detail::URegexImpl<N>>()) {}

template <std::uint32_t N>
URegex<N>::URegex(const UString<N>& pattern) : URegex() {
    d().regex.assign(pattern.begin(), pattern.end(), boost::regex_constants::normal);
}

template <std::uint32_t N>
URegex<N>::URegex(const URegex& other)
    : impl_(other.impl_ ? std::make_unique<detail::URegexImpl<N>>(other.d()) : nullptr) {}

template <std::uint32_t N>
URegex<N>& URegex<N>::operator=(const URegex& other) {
    if (impl_ && other.impl_) {
        d().regex = other.d().regex;
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
    return !impl_ || isUsable(d().regex);
}

template <std::uint32_t N>
URegexMatch<N> URegex<N>::match(const UString<N>& subject) const {
    return {subject, matchWhole(d().regex, subject)};
}

template <std::uint32_t N>
URegexMatch<N> URegex<N>::search(const UString<N>& subject, std::uint64_t start) const {
    return {subject, searchFrom(d().regex, subject, start)};
}

template class URegex<0>;
template class URegex<1>;
template class URegex<28>;

} // namespace kvt::ex
