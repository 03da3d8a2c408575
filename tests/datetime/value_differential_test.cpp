// Whole values against the second implementation of tests/reference, on random values of all kinds, most of which are
// right: what is compared is the whole answer.
#include <reference/value_reference.h>

#include <gtest/gtest.h>

#include <random>
#include <string>

namespace {

using namespace kvt::ex::datetime;
using namespace kvt::test;

class Inputs {
public:
    int below(int bound) { return static_cast<int>(random_() % static_cast<unsigned>(bound)); }
    bool once(int in) { return below(in) == 0; }
    std::string pad(int number, int width) {
        char text[16];
        std::snprintf(text, sizeof text, "%0*d", width, number);
        return text;
    }

    // Years at both ends and leap years often; now and then a number that is none.
    std::string date() {
        static const int years[] = {1000, 1001, 1600, 1900, 1969, 1970, 2000, 2020, 9998, 9999};
        const int year = once(3) ? years[below(10)] : once(40) ? below(1000) : 1000 + below(9000);
        int month = once(4) ? 1 + 11 * below(2) : once(4) ? 2 : 1 + below(12);
        int dayOfMonth = once(3) ? 28 + below(4) : 1 + below(28);
        if (!once(12)) {
            dayOfMonth = std::min(dayOfMonth, daysInMonth(year, month));
        }
        month = once(60) ? below(100) : month;
        return pad(year, 4) + pad(month, 2) + pad(once(80) ? below(100) : dayOfMonth, 2);
    }
    std::string time() {
        static const char* const edges[] = {
            "000000",  "235959",    "000000.000000001", "235959.999999999", "235959.9999999999",
            "120000.", "120000.500"};
        if (once(4)) {
            return edges[below(7)];
        }
        std::string text = once(40) ? pad(below(100), 2) + pad(below(100), 2) + pad(below(100), 2)
                                    : pad(below(24), 2) + pad(below(60), 2) + pad(below(60), 2);
        if (once(2)) {
            text += ".";
            for (int digits = below(10); digits > 0; --digits) {
                text += static_cast<char>('0' + below(10));
            }
        }
        return text;
    }
    std::string offset() {
        static const char* const edges[] = {"+00:00", "-00:00", "+99:59", "-99:59", "+1075",
                                            "-98:99", "+05",    "-0330",  "+9960",  "+1"};
        return once(3) ? edges[below(once(4) ? 10 : 8)]
                       : (once(2) ? "+" : "-") + pad(below(15), 2) + ":" + pad(below(60), 2);
    }
    std::string value(int kind) {
        std::string text = kind == 0 ? date() : kind <= 2 ? time() : date() + time();
        text += kind == 2 || kind == 4 ? offset() : "";
        if (once(100)) {
            text[static_cast<std::size_t>(below(static_cast<int>(text.size())))] = "x.+- 0"[below(6)];
        }
        return once(30) ? " \t" + text + " " : text;
    }
    NaiveInterval interval(bool withDate) {
        NaiveInterval made;
        made.isNegative = once(2);
        const bool isLong = once(8);
        if (withDate && !once(4)) {
            made.years = once(2) ? below(isLong ? 9999 : 40) : 0;
            made.months = once(2) ? below(isLong ? 2000 : 30) : 0;
            made.days = once(2) ? below(isLong ? 4'000'000 : 800) : 0;
        }
        if (once(2)) {
            made.hours = once(2) ? below(isLong ? 2'000'000 : 100) : 0;
            made.minutes = once(2) ? below(isLong ? 2'000'000'000 : 2000) : 0;
            made.seconds = once(2) ? below(isLong ? 2'000'000'000 : 100'000) : 0;
            // Seconds with a fraction are read as one double, which holds both exactly up to here.
            made.nanoseconds = made.seconds < 100'000 && once(2) ? below(1'000'000'000) : 0;
        }
        return made;
    }

private:
    std::mt19937_64 random_{20260607};
};

constexpr int rounds = 20'000;

TEST(ValuesAgainstNaiveOnes, AreAddedAndCastAlike) {
    Inputs inputs;
    for (int i = 0; i < rounds; ++i) {
        const int kind = i % 5;
        const std::string value = inputs.value(kind);
        const NaiveInterval interval = inputs.interval(kind == 0 || kind > 2 || inputs.once(20));
        ASSERT_EQ(answerOf(add(ustring(value), ustring(interval.text()))), naiveAdd(value, interval.text()))
            << "[" << value << "] " << interval.text();
        const auto target = static_cast<CastToTemporalType>(inputs.below(3));
        ASSERT_EQ(answerOf(cast(ustring(value), target)), naiveCast(value, target))
            << "[" << value << "] " << static_cast<int>(target);
    }
}

TEST(ValuesAgainstNaiveOnes, AreComparedAlike) {
    Inputs inputs;
    for (int i = 0; i < rounds; ++i) {
        const int kind = i % 5;
        const int other = inputs.once(10) ? inputs.below(5) : kind;
        const std::string a = inputs.value(kind);
        const std::string b = inputs.once(20) ? a : inputs.value(other);
        const NaiveDifference naive = naiveDiff(a, b);
        const auto where = "[" + a + "] [" + b + "]";
        ASSERT_EQ(answerOf(diff(ustring(a), ustring(b))), naive.interval) << where;
        ASSERT_EQ(answerOf(diffAsNumber(ustring(a), ustring(b), UnitType::Months)), naive.months) << where;
        ASSERT_EQ(answerOf(diffAsNumber(ustring(a), ustring(b), UnitType::Seconds)), naive.seconds) << where;
        ASSERT_EQ(compare(ustring(a), ustring(b)), naive.order) << where;
    }
}

TEST(ValuesAgainstNaiveOnes, GetZonesAlike) {
    Inputs inputs;
    for (int i = 0; i < rounds; ++i) {
        const std::string value = inputs.value(i % 5);
        const std::string zone = inputs.once(20)   ? "utc"
                                 : inputs.once(40) ? "x"
                                 : inputs.once(40) ? ""
                                                   : inputs.offset();
        const auto mode = static_cast<SetZoneMode>(inputs.below(3));
        ASSERT_EQ(answerOf(timezoneSet(ustring(value), ustring(zone), mode)),
                  naiveTimezoneSet(value, zone, mode))
            << "[" << value << "] [" << zone << "] " << static_cast<int>(mode);
    }
}

TEST(ValuesAgainstNaiveOnes, AreCreatedAlike) {
    Inputs inputs;
    const auto number = [&](int bound) { return inputs.once(30) ? inputs.below(120) : inputs.below(bound); };
    for (int i = 0; i < rounds; ++i) {
        NaiveDateTime at{
            1000 + inputs.below(9000), number(12) + 1, number(28) + 1, number(24), number(60), number(60)};
        at.year = inputs.once(40) ? inputs.below(12'000) : at.year;
        at.nanoseconds = inputs.once(50) ? 1'000'000'000 : inputs.once(2) ? inputs.below(1'000'000'000) : 0;
        const std::string offset = inputs.once(2) ? inputs.offset() : "";
        DateTimeParts parts(at.year, static_cast<std::uint64_t>(at.month), static_cast<std::uint64_t>(at.day),
                            static_cast<std::uint64_t>(at.hours), static_cast<std::uint64_t>(at.minutes), 0.0,
                            ustring(offset));
        parts.setSeconds(static_cast<std::uint64_t>(at.seconds));
        parts.setNanoseconds(static_cast<std::uint64_t>(at.nanoseconds));
        ASSERT_EQ(answerOf(create(parts)), naiveCreate(at, offset)) << naiveText(at) << offset;
    }
}

} // namespace
