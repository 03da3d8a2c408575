// What reading and writing one value by a pattern costs, beside what else there is for it: strptime and strftime of the
// C library, std::get_time and std::put_time, and the streams of the `date` library. The others do less (no fraction,
// no offset, no check of the pattern), so that the figures say "not slower", and no more.

#include <kvt/datetime/datetime.h>

#include <benchmark/benchmark.h>
#include <date/date.h>

#include <ctime>
#include <iomanip>
#include <sstream>
#include <string>

namespace {

using namespace kvt::ex::datetime;
using kvt::ex::UString;

const UString<0> datetime("20200131123456.125");
const UString<0> withOffset("20200131123456.5+01:00");

template <typename Function>
void measure(const char* name, Function function) {
    benchmark::RegisterBenchmark(name, [function](benchmark::State& state) {
        for (auto _ : state) {
            auto result = function();
            benchmark::DoNotOptimize(&result);
        }
    });
}

// The strings of a row live as long as the program, so that only the function is measured.
void measureParse(const char* name, const char* value, const char* pattern) {
    measure(name, [value = UString<0>(value), pattern = UString<0>(pattern)] {
        return parse(value, pattern, false);
    });
}

void measureFormat(const char* name, const UString<0>& value, const char* pattern) {
    measure(name, [&value, pattern = UString<0>(pattern)] { return format(value, pattern); });
}

void registerKvt() {
    measureParse("parse/date", "2020-01-31", "%Y-%m-%d$");
    measureParse("parse/datetime", "2020-01-31T12:34:56.125", "%Y-%m-%dT%H:%M:%S$");
    measureParse("parse/offset", "2020-01-31T12:34:56.125+01:00", "%Y-%m-%dT%H:%M:%S%Ez$");
    measureParse("parse/names", "31 January 2020, 11:34:56 pm", "%d %B %Y, %I:%M:%S %p");
    measureParse("parse/fuzzy", "on the 31st of 1/2020", "* * %dst * %m/%Y");
    measureParse("parse/epoch", "1580474096.125", "%s");
    measureParse("parse/keyword_zqt", "20200131123456.125", "ZQT");
    measureParse("parse/keyword_iso_first", "2020-01-31", "ISO");
    measureParse("parse/keyword_iso_last", "12:34:56.125+01:00", "ISO");
    measureParse("parse/fail_mismatch", "2020-01-31x", "%Y-%m-%d$");
    measureParse("parse/fail_keywords", "31.1.2020", "ZQT|ISO");

    measureFormat("format/date", datetime, "%Y-%m-%d");
    measureFormat("format/datetime", datetime, "%Y-%m-%dT%H:%M:%S");
    measureFormat("format/offset", withOffset, "%Y-%m-%dT%H:%M:%S%Ez");
    measureFormat("format/names", datetime, "%A, %e %B %Y, %l:%M %p, week %U");
    measureFormat("format/epoch", withOffset, "%s");
    measureFormat("format/keyword_zqt", withOffset, "ZQT");
    measureFormat("format/keyword_iso", withOffset, "ISO");
    measureFormat("format/fail_flag", datetime, "%Y-%m-%d %z");
}

void registerOthers() {
    measure("others/strptime", [] {
        std::tm time{};
        return ::strptime("2020-01-31T12:34:56", "%Y-%m-%dT%H:%M:%S", &time) != nullptr ? time.tm_sec : 0;
    });
    measure("others/get_time", [] {
        std::istringstream stream("2020-01-31T12:34:56");
        std::tm time{};
        stream >> std::get_time(&time, "%Y-%m-%dT%H:%M:%S");
        return time.tm_sec;
    });
    measure("others/date_parse", [] {
        std::istringstream stream("2020-01-31T12:34:56");
        date::local_seconds time;
        stream >> date::parse("%Y-%m-%dT%H:%M:%S", time);
        return time;
    });
    static const std::tm time = [] {
        std::tm made{};
        made.tm_year = 120;
        made.tm_mday = 31;
        made.tm_hour = 12;
        return made;
    }();
    measure("others/strftime", [] {
        char text[64];
        return std::string(text, std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S", &time));
    });
    measure("others/put_time", [] {
        std::ostringstream stream;
        stream << std::put_time(&time, "%Y-%m-%dT%H:%M:%S");
        return stream.str();
    });
    measure("others/date_format", [] {
        const date::local_time<std::chrono::milliseconds> moment{std::chrono::milliseconds(1580474096125)};
        return date::format("%Y-%m-%dT%H:%M:%S", moment);
    });
}

const bool registered = (registerKvt(), registerOthers(), true);

} // namespace
