// Regular expressions against the engine used directly, in Perl's syntax and in the old dialect: the same failures to
// compile, the same groups, the same failures to match.
//
// Input: the length of the pattern, where the search starts, then the pattern and the subject.
//
// The engine gives up, with a failure, on what takes too long; how long it tries grows with the square of the pattern
// and of the subject, so that both are kept short here.
#include <fuzzing.h>
#include <regex/regex_support.h>

#include <optional>

using namespace kvt::ex;
using namespace kvt::fuzz;
using namespace kvt::test;

namespace {

constexpr std::size_t longestPattern = 48;
constexpr std::size_t longestSubject = 64;

struct Where {
    const char* kind;
    std::string_view pattern;
    std::string_view subject;

    friend std::ostream& operator<<(std::ostream& stream, const Where& where) {
        return stream << where.kind << Hex{where.pattern} << " on " << Hex{where.subject};
    }
};

void checkPerl(const std::string& pattern, std::string_view subject, std::uint64_t start) {
    boost::regex engine;
    URegex<28> regex;
    const EngineError error = errorOf([&] { engine = boost::regex(pattern); });
    const Where what{"pattern ", pattern, subject};
    requireEqual(errorOf([&] { regex = URegex<28>(units<28>(pattern)); }), error, what);
    requireEqual(static_cast<bool>(regex), error.code == -1, what);
    if (error.code != -1) {
        return;
    }
    const Found whole = matchedByEngine(engine, subject);
    requireEqual(matchedBy(regex, subject), whole, "match, ", what);
    const UStringView<28> view(subject.data(), subject.size());
    const Found first = searchedByEngine(engine, subject, 0);
    bool matches = false;
    requireEqual(errorOf([&] { matches = regex.matchesIn(view); }), first.error, "matchesIn, ", what);
    requireEqual(matches, !first.groups.empty(), "matchesIn, ", what);
    const std::uint64_t place = regex.passOver(view, start);
    require(place >= start && place <= subject.size(), "a place to pass over outside of the subject, ", what);
    require(place == start || searchedByEngine(engine, subject.substr(0, place), start) == Found(),
            "what matches is passed over, ", what);
    const Found found = searchedByEngine(engine, subject, start);
    requireEqual(searchedBy(URegex<0>(units<0>(pattern)), subject, start), found, "search, ", what);
    for (const Span& group : found.groups) {
        require(group.second == 0 || (group.first >= start && group.first + group.second <= subject.size()),
                "a group outside of the subject, ", what);
    }
}

void checkLegacy(const std::string& pattern, std::string_view text, std::uint64_t start) {
    boost::regex engine;
    std::optional<ObsoleteRegexp> regexp;
    const EngineError error = errorOf([&] { engine = boost::regex(perlByHand(pattern)); });
    const Where what{"legacy pattern ", pattern, text};
    requireEqual(errorOf([&] { regexp.emplace(pattern.data(), pattern.size()); }), error, what);
    if (!regexp) {
        return;
    }
    const Found found = start < text.size() ? searchedByEngine(engine, text, start) : Found{};
    const Span expected = found.groups.empty() ? Span{none, 0} : found.groups[0];
    Span indexed{none, 0};
    requireEqual(errorOf([&] { indexed = indexedBy(*regexp, text, start); }), found.error, what);
    require(indexed == expected, what);
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const std::size_t patternLength = input.byte() % (longestPattern + 1);
    const unsigned startByte = input.byte();
    const std::string pattern(input.rest().substr(0, patternLength));
    const std::string_view subject =
        input.rest().substr(std::min(patternLength, input.rest().size())).substr(0, longestSubject);
    checkPerl(pattern, subject, startByte % (subject.size() + 1));
    checkLegacy(pattern, subject, startByte % (subject.size() + 2));
    return 0;
}
