// ObsoleteRegexp on the compiled pattern; the dialect itself is in legacy_pattern.cpp.
#include <kvt/regex/obsolete_regexp.h>

#include <kvt/regex/detail/compiled_pattern.h>
#include <kvt/regex/detail/legacy_pattern.h>

#include <cstring>
#include <memory>

class ObsoleteRegexpImpl {
public:
    std::shared_ptr<const kvt::ex::detail::CompiledPattern> pattern; ///< copies share it
};

namespace kvt::ex::detail {

template class PimplBase<ObsoleteRegexpImpl>;

} // namespace kvt::ex::detail

ObsoleteRegexp::ObsoleteRegexp(const char* pattern) : ObsoleteRegexp(pattern, std::strlen(pattern)) {}

ObsoleteRegexp::ObsoleteRegexp(const char* pattern, std::uint64_t length) {
    d().pattern = std::make_shared<const kvt::ex::detail::CompiledPattern>(
        kvt::ex::detail::perlPattern({pattern, length}));
}

ObsoleteRegexp::ObsoleteRegexp(const ObsoleteRegexp& other) = default;

ObsoleteRegexp::ObsoleteRegexp(ObsoleteRegexp&& other) noexcept = default;

ObsoleteRegexp& ObsoleteRegexp::operator=(const ObsoleteRegexp& other) = default;

ObsoleteRegexp& ObsoleteRegexp::operator=(ObsoleteRegexp&& other) noexcept = default;

ObsoleteRegexp::~ObsoleteRegexp() = default;

std::uint64_t ObsoleteRegexp::index(const char* text, std::uint64_t length, std::uint64_t* matchLength,
                                    std::uint64_t start) const {
    boost::cmatch result;
    if (start >= length || !d().pattern->search({text, length}, start, result)) {
        *matchLength = 0;
        return npos;
    }
    *matchLength = static_cast<std::uint64_t>(result.length());
    return static_cast<std::uint64_t>(result[0].first - text);
}
