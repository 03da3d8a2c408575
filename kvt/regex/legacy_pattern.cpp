// One pass from left to right: what was put in is behind and never looked at again.
#include <kvt/regex/detail/legacy_pattern.h>

#include <cstddef>

namespace kvt::ex::detail {
namespace {

bool isOrdinaryText(char unit) {
    return std::string_view("{}()|$").find(unit) != std::string_view::npos;
}

} // namespace

// A backslash is taken for an escape whatever stands before it, be it one that escapes the backslash itself: patterns
// that were written for this dialect rely on being read so.
std::string perlPattern(std::string_view legacyPattern) {
    std::string perl;
    perl.reserve(legacyPattern.size() + 8);
    for (std::size_t i = 0; i < legacyPattern.size(); ++i) {
        const char unit = legacyPattern[i];
        const bool isAnchor = unit == '$' && i + 1 == legacyPattern.size();
        const bool isEscaped = i > 0 && legacyPattern[i - 1] == '\\';
        if (isOrdinaryText(unit) && !isAnchor && !isEscaped) {
            perl += '\\';
        }
        perl += unit;
    }
    return perl;
}

} // namespace kvt::ex::detail
