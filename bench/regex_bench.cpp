// Regular expressions by the library and by what one would use instead, on the same patterns and texts:
//
//     kvt       URegex<0>, on a string that is there
//     boost     boost::regex with a match that is used again: the engine itself, without the copy of the subject
//     std       std::regex, likewise
//     obsolete  ObsoleteRegexp, for patterns that both dialects read alike
//
// A benchmark is called WAY/CASE. Each iteration is one search, or one compilation; bytes per second are those of the
// subject that were gone over.
#include <kvt/regex/obsolete_regexp.h>
#include <kvt/regex/uregex.h>

#include <benchmark/benchmark.h>
#include <boost/regex.hpp>

#include <cstddef>
#include <cstdint>
#include <regex>
#include <string>

namespace {

using kvt::ex::URegex;
using kvt::ex::UString;
using kvt::ex::UStringView;

/// Sentences without digits, and a date at the end.
std::string prose(std::size_t size) {
    const std::string sentence = "the lazy dog and the other animals looked on, as the fox came; ";
    std::string text;
    while (text.size() < size) {
        text += sentence;
    }
    text.resize(size);
    return text + "2020-01-31";
}

struct Case {
    const char* name;
    const char* pattern;
    std::string subject;
};

const Case cases[] = {
    {"short_match", "(\\d+)-(\\d+)", "in 2020-01"},    {"short_miss", "(\\d+)-(\\d+)", "in the year"},
    {"line_match", "(\\d+)-(\\d+)-(\\d+)", prose(80)}, {"line_miss", "zebra", prose(80)},
    {"page_digits", "[0-9]+-", prose(4000)},           {"page_words", "[a-z]+ [a-z]+ zebra", prose(4000)},
};

UString<0> string(const std::string& text) {
    return UString<0>(UStringView<0>(text));
}

template <typename Action>
void measure(const std::string& name, std::size_t bytes, Action action) {
    benchmark::RegisterBenchmark(name.c_str(), [bytes, action](benchmark::State& state) mutable {
        for (auto _ : state) {
            action();
        }
        state.SetBytesProcessed(static_cast<std::int64_t>(bytes) * state.iterations());
    });
}

void searches(const Case& row) {
    const std::string& text = row.subject;
    measure(std::string("kvt/") + row.name, text.size(),
            [regex = URegex<0>(row.pattern), subject = string(text)] {
                benchmark::DoNotOptimize(regex.search(subject).groupCount());
            });
    measure(std::string("boost/") + row.name, text.size(),
            [regex = boost::regex(row.pattern), &text, match = boost::cmatch()]() mutable {
                benchmark::DoNotOptimize(
                    boost::regex_search(text.data(), text.data() + text.size(), match, regex));
            });
    measure(std::string("std/") + row.name, text.size(),
            [regex = std::regex(row.pattern), &text, match = std::cmatch()]() mutable {
                benchmark::DoNotOptimize(
                    std::regex_search(text.data(), text.data() + text.size(), match, regex));
            });
}

void registerAll() {
    for (const Case& row : cases) {
        searches(row);
    }
    const Case& miss = cases[3];
    measure("obsolete/line_miss", miss.subject.size(), [regexp = ObsoleteRegexp(miss.pattern)] {
        std::uint64_t length = 0;
        benchmark::DoNotOptimize(regexp.index(miss.subject.data(), miss.subject.size(), &length, 0));
    });
    const UString<0> pattern(cases[2].pattern);
    measure("kvt/compile", pattern.size(), [pattern] { benchmark::DoNotOptimize(URegex<0>(pattern)); });
    measure("boost/compile", pattern.size(),
            [] { benchmark::DoNotOptimize(boost::regex(cases[2].pattern)); });
    measure("std/compile", pattern.size(), [] { benchmark::DoNotOptimize(std::regex(cases[2].pattern)); });
    measure("kvt/copy", 0, [regex = URegex<0>(pattern)] { benchmark::DoNotOptimize(URegex<0>(regex)); });
}

const bool registered = (registerAll(), true);

} // namespace
