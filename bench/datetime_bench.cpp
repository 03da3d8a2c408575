// What one value costs: reading, casting and the arithmetic of the date and time functions. Each is meant to stay well
// below a microsecond. The `fail` rows show what a bad value costs, where a message has to be made.

#include <kvt/datetime/datetime.h>

#include <benchmark/benchmark.h>

namespace {

using namespace kvt::ex::datetime;
using kvt::ex::UString;

const UString<0> date("20200131");
const UString<0> time("120000.25");
const UString<0> datetime("20200131123456.123456789");
const UString<0> withOffset("20200131123456.5+01:00");
const UString<0> other("19991231235959.5+05:30");
const UString<0> badDate("20210229");

template <typename Function>
void measure(const char* name, Function function) {
    benchmark::RegisterBenchmark(name, [function](benchmark::State& state) {
        for (auto _ : state) {
            auto result = function();
            benchmark::DoNotOptimize(&result);
        }
    });
}

void registerAll() {
    measure("parseZQTDateTime/date", [] { return parseZQTDateTime(date, 9); });
    measure("parseZQTDateTime/fraction_rounded", [] { return parseZQTDateTime(datetime, 3); });
    measure("parseZQTDateTime/offset_carried", [] { return parseZQTDateTime(withOffset, 0); });
    measure("parseZQTDateTime/fail", [] { return parseZQTDateTime(badDate, 9); });

    measure("cast/date_to_datetime", [] { return cast(date, CastToTemporalType::Datetime); });
    measure("cast/datetime_to_date", [] { return cast(datetime, CastToTemporalType::Date); });
    measure("cast/offset_to_itself", [] { return cast(withOffset, CastToTemporalType::Datetime); });
    measure("cast/fail", [] { return cast(time, CastToTemporalType::Date); });

    measure("add/month_to_date", [] { return add(date, UString<0>("P1M")); });
    measure("add/hours_to_time", [] { return add(time, UString<0>("PT13H")); });
    measure("add/all_to_offset", [] { return add(withOffset, UString<0>("P1Y2M3DT4H5M6.5S")); });
    measure("add/fail", [] { return add(time, UString<0>("P1D")); });

    measure("diff/dates", [] { return diff(date, UString<0>("20190201")); });
    measure("diff/offsets", [] { return diff(withOffset, other); });
    measure("diffAsNumber/seconds", [] { return diffAsNumber(withOffset, other, UnitType::Seconds); });
    measure("diffAsNumber/years", [] { return diffAsNumber(withOffset, other, UnitType::Years); });
    measure("compare/offsets", [] { return compare(withOffset, other); });

    measure("create/datetime", [] { return create(DateTimeParts(2020, 1, 31, 12, 34, 56.5, "")); });
    measure("intervalNegate", [] { return intervalNegate(UString<0>("P1Y2M3DT4H5M6.5S")); });
}

const bool registered = (registerAll(), true);

} // namespace
