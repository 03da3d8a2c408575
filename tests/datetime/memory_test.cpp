// Lack of memory is a failure like any other: no function throws, and what it answers is good or says so.

#include "answer.h"
#include <support/allocations.h>

#include <kvt/datetime/datetime.h>

#include <functional>

namespace {

using namespace kvt::ex::datetime;
using kvt::ex::UString;
using kvt::test::answerOf;
using kvt::test::FailingAllocations;

// `run` gets a fresh buffer for its outcome, since turning a result into an Answer needs memory, too.
template <typename Result>
void expectNoThrow(const char* name, const std::function<Result()>& run) {
    const Result whole = run();
    for (std::size_t succeeding = 0; succeeding < 100; ++succeeding) {
        std::optional<Result> result;
        bool thrown = false;
        {
            const FailingAllocations failing(succeeding);
            try {
                // Made in place: moving a message needs memory.
                struct InPlace {
                    const std::function<Result()>& made;
                    operator Result() const { return made(); }
                };
                result.emplace(InPlace{run});
            } catch (...) {
                thrown = true;
            }
        }
        ASSERT_FALSE(thrown) << name << " with " << succeeding << " allocations";
        if (std::get<0>(*result) == std::get<0>(whole) &&
            std::get<2>(*result).has_value() == std::get<2>(whole).has_value()) {
            continue;
        }
        EXPECT_EQ(std::get<0>(*result), ReturnState::Failure)
            << name << " with " << succeeding << " allocations";
    }
}

TEST(LackOfMemory, IsNeverThrownAtTheHost) {
    const UString<0> value("20200102120000.5+0100");
    const UString<0> longFraction("20200102120000.12345678901234567890+0100");
    const UString<0> other("20200103120000+0000");
    const UString<0> interval("P1Y2M3DT4H5M6.5S");
    const UString<0> bad("a text that is no value and does not fit into a small string");
    const UString<0> outOfRange("20210229");
    using Text = std::function<TextResult()>;
    using Number = std::function<NumberResult()>;
    using Parts = std::function<PartsResult()>;
    for (const UString<0>& text : {value, longFraction, bad, outOfRange}) {
        expectNoThrow("cast", Text([&] { return cast(text, CastToTemporalType::Datetime); }));
        expectNoThrow("cast to nothing", Text([&] { return cast(text, CastToTemporalType::Unknown); }));
        expectNoThrow("add", Text([&] { return add(text, interval); }));
        expectNoThrow("add bad", Text([&] { return add(text, bad); }));
        expectNoThrow("diff", Text([&] { return diff(text, other); }));
        expectNoThrow("diffAsNumber", Number([&] { return diffAsNumber(text, other, UnitType::Years); }));
        expectNoThrow("parseZQTDateTime", Parts([&] { return parseZQTDateTime(text, 0); }));
        expectNoThrow("intervalNegate", Text([&] { return intervalNegate(text); }));
    }
    expectNoThrow("intervalNegate", Text([&] { return intervalNegate(interval); }));
    expectNoThrow("create", Text([&] { return create(DateTimeParts(2020, 1, 2, 3, 4, 5.5, "+01")); }));
    expectNoThrow("create bad", Text([&] { return create(DateTimeParts(2020, 1, 2, 3, 4, 1e18, "+01")); }));
    expectNoThrow("intervalCreate",
                  Text([&] { return intervalCreate(IntervalParts(1, 2, 3, 4, 5, 6.123456789, true)); }));
}

// Where only the result finds no memory, the last resorts differ: create() alone has no message.
TEST(LackOfMemory, ForTheResultAloneGetsTheFunctionsLastResort) {
    const DateTimeParts parts(2020, 1, 2, 3, 4, 5.5, "+01"); // a result of 24 chars
    const IntervalParts interval(1, 2, 3, 4, 5, 6.123456789, true);
    const UString<0> value("20200102120000.5+0100");
    const UString<0> later("20211231235959.123456789");
    const UString<0> date("20200101");
    const UString<0> text("P1Y2M3DT4H5M6.5S");
    std::optional<TextResult> result;
    const auto withOneFailure = [&](const auto& call) {
        const FailingAllocations failing(0, 1);
        result.emplace(call());
    };
    withOneFailure([&] { return create(parts); });
    EXPECT_EQ(answerOf(*result), kvt::test::silentFailure());
    withOneFailure([&] { return cast(value, CastToTemporalType::Datetime); });
    EXPECT_EQ(answerOf(*result), kvt::test::genericFailure());
    withOneFailure([&] { return add(value, text); });
    EXPECT_EQ(answerOf(*result), kvt::test::genericFailure());
    withOneFailure([&] { return intervalCreate(interval); });
    EXPECT_EQ(answerOf(*result), kvt::test::genericFailure());
    withOneFailure([&] { return intervalNegate(text); });
    EXPECT_EQ(answerOf(*result), kvt::test::genericFailure());
    withOneFailure([&] { return diff(later, date); });
    EXPECT_EQ(answerOf(*result), kvt::test::genericFailure());
}

TEST(LackOfMemory, DoesNotHinderAComparison) {
    const UString<0> longFraction("20200102120000.12345678901234567890");
    const UString<0> later("20200102120000.12345678991234567890");
    const FailingAllocations failing(0);
    EXPECT_EQ(compare(longFraction, longFraction), 0);
    EXPECT_EQ(compare(longFraction, later), -1);
}

// A value within the small buffer of a string is worked on without any.
TEST(Allocation, IsMadeForTheResultOnly) {
    const UString<0> date("20200131");
    const UString<0> value("20200102120000.5+01:00");
    const UString<0> month("P1M");
    std::optional<TextResult> text;
    std::optional<NumberResult> number;
    std::optional<PartsResult> parts;
    int order = 9;
    {
        const FailingAllocations failing(0);
        text.emplace(add(date, month));
        number.emplace(diffAsNumber(value, value, UnitType::Years));
        parts.emplace(parseZQTDateTime(value, 3));
        order = compare(value, value);
    }
    EXPECT_EQ(answerOf(*text), kvt::test::success("20200229"));
    EXPECT_EQ(answerOf(*number), kvt::test::success(0.0));
    EXPECT_EQ(std::get<0>(*parts), ReturnState::Success);
    EXPECT_EQ(order, 0);
    {
        const FailingAllocations failing(1);
        text.emplace(cast(value, CastToTemporalType::Datetime));
    }
    EXPECT_EQ(answerOf(*text), kvt::test::success("20200102120000.5+01:00"));
}

} // namespace
