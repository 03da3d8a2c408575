// What searching with a URegex must reach beside the engine itself: boost::regex with a match that is used again,
// without the copy of the subject that a URegexMatch holds. std::regex is shown.
#include "limits.h"
#include "texts.h"

#include <kvt/regex/uregex.h>

#include <boost/regex.hpp>

#include <memory>
#include <regex>
#include <string>

namespace {

using namespace kvt::ex;
using kvt::bench::Bound;
using kvt::bench::Limits;
using kvt::bench::logText;
using kvt::bench::prose;
using kvt::bench::way;
using kvt::bench::Way;

UString<0> string(const std::string& text) {
    return UString<0>(UStringView<0>(text));
}

Way kvtWay(const std::string& pattern, const std::string& text) {
    return way([regex = URegex<0>(string(pattern)), subject = string(text)] {
        return regex.search(subject).groupCount();
    });
}

Way boostWay(const std::string& pattern, const std::string& text) {
    return way([regex = boost::regex(pattern), text, match = std::make_shared<boost::cmatch>()] {
        return boost::regex_search(text.data(), text.data() + text.size(), *match, regex);
    });
}

Way stdWay(const std::string& pattern, const std::string& text) {
    return way([regex = std::regex(pattern), text, match = std::make_shared<std::cmatch>()] {
        return std::regex_search(text.data(), text.data() + text.size(), *match, regex);
    });
}

void hold(Limits& limits, const std::string& name, const std::string& pattern, const std::string& text,
          Bound bound, double limit) {
    limits.add(name, kvtWay(pattern, text));
    limits.add(name + ": boost::regex", boostWay(pattern, text));
    limits.hold({name, name + ": boost::regex", bound, limit});
    if (text.size() < 10000) {
        limits.add(name + ": std::regex", stdWay(pattern, text));
        limits.hold({name, name + ": std::regex"});
    }
}

} // namespace

int main(int argc, char** argv) {
    Limits large(9, 8);
    const std::string log = logText(1 << 20);
    hold(large, "1 MiB, a date", "\\d{4}-\\d\\d-\\d\\d \\d\\d:\\d\\d", log, Bound::atLeast, 30);
    hold(large, "1 MiB, a date in groups", "(\\d{4})-(\\d\\d)-(\\d\\d)", log, Bound::atLeast, 30);
    hold(large, "1 MiB, a literal", "ERROR \\[(\\w+)\\] (.*)", log, Bound::atLeast, 5);
    hold(large, "1 MiB, no prefix", "\\w+ \\[main\\] disk", log, Bound::shown, 0);
    hold(large, "words in 4 KB", "[a-z]+ [a-z]+ zebra", prose(4000), Bound::shown, 0);
    hold(large, "1 MiB, a run of digits first", "(\\d+)-(\\d+)-(\\d+)", log, Bound::shown, 0);
    Limits small(101, 500);
    hold(small, "no match in 90 bytes, a literal", "zebra", prose(90), Bound::atMost, 0.3);
    hold(small, "no match in 90 bytes, a date", "(\\d{4})-(\\d\\d)-(\\d\\d)", prose(90), Bound::atMost, 0.3);
    hold(small, "no match in 90 bytes, a run of digits first", "(\\d+)-(\\d+)-(\\d+)", prose(90),
         Bound::shown, 0);
    hold(small, "a match in 90 bytes", "(\\d+)-(\\d+)-(\\d+)", prose(80) + "2020-01-31", Bound::shown, 0);
    hold(small, "a match in 10 bytes", "(\\d+)-(\\d+)", "in 2020-01", Bound::shown, 0);
    const std::string compiled = "(\\d{4})-(\\d\\d)-(\\d\\d)";
    small.add("compile", way([pattern = string(compiled)] { return URegex<0>(pattern); }));
    small.add("compile: boost::regex", way([compiled] { return boost::regex(compiled); }));
    small.hold({"compile", "compile: boost::regex"});
    const bool isLargeWithin = large.run(argc, argv) == 0;
    return small.run(argc, argv) == 0 && isLargeWithin ? 0 : 1;
}
