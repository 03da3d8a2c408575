// format() against the second writer of tests/reference. Patterns are flags and characters in random order, right ones and
// wrong ones; what is compared is the whole answer.
#include <reference/format_reference.h>
#include <reference/value_reference.h>

#include <kvt/datetime/datetime.h>

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

namespace {

using namespace kvt::ex::datetime;
using namespace kvt::test;

std::string textOf(const NaiveMoment& value) {
    return (value.hasDate() ? naiveDateText(value.at) : "") +
           (value.hasTime() ? naiveTimeText(value.at) : "") +
           (value.hasOffset() ? naiveOffsetText(value.offsetMinutes) : "");
}

class RandomPatterns {
public:
    explicit RandomPatterns(std::uint64_t seed) : random_(seed) {}

    NaiveMoment value() {
        NaiveMoment value{static_cast<TemporalType>(below(5)), {1970, 1, 1}, 0};
        NaiveDateTime& at = value.at;
        if (value.hasDate()) {
            at.year = 1000 + below(9000);
            at.month = 1 + below(12);
            at.day = 1 + below(daysInMonth(at.year, at.month));
        }
        if (value.hasTime()) {
            at.hours = below(24);
            at.minutes = below(60);
            at.seconds = below(60);
            static constexpr int units[] = {1, 1000, 1000000, 100000000, 1000000000};
            const int unit = units[below(5)];
            at.nanoseconds = below(1000000000 / unit) * unit;
        }
        if (value.hasOffset()) {
            value.offsetMinutes = below(4) == 0 ? 0 : below(2 * 1439 + 1) - 1439;
        }
        return value;
    }

    // With a flag in front, so that it is not taken for keywords; a wrong one is rare.
    std::vector<std::string> pattern() {
        std::vector<std::string> elements = {flag()};
        for (int count = below(8); count > 0; --count) {
            static const char* const literals[] = {"-", ":", "T", "x", "*", "?", "$", "E", "\xC3\xA4", " "};
            elements.emplace_back(below(2) == 0 ? flag() : literals[below(10)]);
        }
        while (elements.back() == " ") {
            elements.pop_back(); // white space at the end does not count
        }
        if (below(100) == 0) {
            elements.emplace_back("%");
        }
        return elements;
    }

private:
    int below(int bound) { return static_cast<int>(random_() % static_cast<unsigned>(bound)); }

    std::string flag() {
        if (below(50) == 0) {
            static const char* const wrong[] = {"%x", "%$", "%EY", "%q", "%\xC3\xA4", "%E\xE2\x82\xAC",
                                                "%EE"};
            return wrong[below(7)];
        }
        static const std::vector<std::string> flags = naiveFlags();
        return flags[static_cast<std::size_t>(below(static_cast<int>(flags.size())))];
    }

    std::mt19937_64 random_;
};

TEST(FormatDifferential, AnswersAsTheNaiveWriter) {
    RandomPatterns random(20261122);
    int written = 0;
    for (int round = 0; round < 60'000; ++round) {
        const NaiveMoment value = random.value();
        const std::vector<std::string> elements = random.pattern();
        std::string pattern;
        for (const std::string& element : elements) {
            pattern += element;
        }
        const Answer expected = naiveFormat(value, elements);
        ASSERT_EQ(answerOf(format(kvt::ex::UString<0>(textOf(value).c_str()),
                                  kvt::ex::UString<0>(pattern.c_str()))),
                  expected)
            << textOf(value) << " by " << pattern;
        written += expected.message == 0 ? 1 : 0;
    }
    EXPECT_GT(written, 10'000); // the patterns are not mostly wrong ones
}

} // namespace
