// ObsoleteRegexp on Boost.Regex; the dialect itself is in legacy_pattern.cpp.
#include <kvt/regex/obsolete_regexp.h>

#include <kvt/regex/detail/legacy_pattern.h>

#include <boost/regex.hpp>

#include <cstring>

class ObsoleteRegexpImpl {
public:
    boost::basic_regex<char> regex;
};

namespace kvt::ex::detail {

template class PimplBase<ObsoleteRegexpImpl>;

} // namespace kvt::ex::detail

ObsoleteRegexp::ObsoleteRegexp(const char* pattern) : ObsoleteRegexp(pattern, std::strlen(pattern)) {}

ObsoleteRegexp::ObsoleteRegexp(const char* pattern, std::uint64_t length) {
    d().regex.assign(kvt::ex::detail::perlPattern({pattern, length}), boost::regex_constants::normal);
}

ObsoleteRegexp::ObsoleteRegexp(const ObsoleteRegexp& other) = default;

ObsoleteRegexp::ObsoleteRegexp(ObsoleteRegexp&& other) noexcept = default;

ObsoleteRegexp& ObsoleteRegexp::operator=(const ObsoleteRegexp& other) = default;

ObsoleteRegexp& ObsoleteRegexp::operator=(ObsoleteRegexp&& other) noexcept = default;

ObsoleteRegexp::~ObsoleteRegexp() = default;

std::uint64_t ObsoleteRegexp::index(const char* text, std::uint64_t length, std::uint64_t* matchLength,
                                    std::uint64_t start) const {
    boost::cmatch result;
    if (start >= length || !boost::regex_search(text + start, text + length, result, d().regex)) {
        *matchLength = 0;
        return npos;
    }
    *matchLength = static_cast<std::uint64_t>(result.length());
    return start + static_cast<std::uint64_t>(result.position());
}
