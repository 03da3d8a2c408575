// The old calendar on decisions from the input: a date is built and moved, beside a plain count of days, and written by
// a format of any bytes, beside what the streams of the standard library make of it. Nothing but the failures of the
// calendar may come out.
#include <fuzzing.h>

#include <kvt/legacy/obsolete_date.h>
#include <kvt/legacy/obsolete_time.h>

#include <ctime>
#include <iomanip>
#include <sstream>
#include <stdexcept>

namespace {

using kvt::fuzz::Input;
using kvt::fuzz::require;
using kvt::fuzz::requireEqual;

constexpr std::uint32_t numberOf2000 = 2451545;
constexpr std::uint32_t firstNumber = 2232400; // 1400-01-01
constexpr std::uint32_t lastNumber = 5373484;  // 9999-12-31

std::uint32_t number(Input& input) {
    std::uint32_t value = 0;
    for (int i = 0; i < 4; ++i) {
        value = value << 8 | input.byte();
    }
    return value;
}

bool isSpecial(std::uint32_t day) {
    return day == 0 || day >= 0xFFFFFFFE;
}

// The calendar by walking through its cycles of 400, 100, 4 years and one year.
std::tm fieldsOf(std::uint32_t day) {
    std::uint32_t rest =
        day - firstNumber + 365 * 200 + 49; // from 1200-01-01, where a cycle of 400 years begins
    std::tm fields{};
    fields.tm_wday = static_cast<int>((day + 1) % 7);
    int year = 1200;
    const auto isLeap = [](int y) { return y % 4 == 0 && (y % 100 != 0 || y % 400 == 0); };
    year += static_cast<int>(rest / 146097) * 400;
    rest %= 146097;
    for (std::uint32_t length = 366; rest >= length; length = isLeap(year) ? 366 : 365) {
        rest -= length;
        ++year;
    }
    fields.tm_year = year - 1900;
    fields.tm_yday = static_cast<int>(rest);
    const std::uint32_t lengths[] = {31, isLeap(year) ? 29U : 28U, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    while (rest >= lengths[fields.tm_mon]) {
        rest -= lengths[fields.tm_mon++];
    }
    fields.tm_mday = static_cast<int>(rest) + 1;
    fields.tm_isdst = -1;
    return fields;
}

std::string textOf(std::uint32_t day, const char* format) {
    if (isSpecial(day)) {
        return day == 0 ? "-infinity" : day == 0xFFFFFFFE ? "not-a-date-time" : "+infinity";
    }
    const std::tm fields = fieldsOf(day);
    std::ostringstream stream;
    stream << std::put_time(&fields, format);
    return stream.str();
}

void checkDate(const ObsoleteDate& date, std::uint32_t day, const char* format) {
    requireEqual(date.isValid(), day != 0xFFFFFFFE, "isValid of " + std::to_string(day));
    if (!isSpecial(day) && (day < firstNumber || day > lastNumber)) {
        try {
            date.asString(format);
        } catch (const std::out_of_range&) {
        }
        return;
    }
    requireEqual(date.asString(format), textOf(day, format), "the text of " + std::to_string(day));
    if (!isSpecial(day)) {
        const std::tm fields = fieldsOf(day);
        requireEqual(date.year(), static_cast<unsigned int>(fields.tm_year + 1900), "year");
        requireEqual(date.month(), static_cast<unsigned int>(fields.tm_mon + 1), "month");
        requireEqual(date.dayOfMonth(), static_cast<unsigned int>(fields.tm_mday), "day of the month");
        requireEqual(date.day(), static_cast<unsigned int>(fields.tm_yday + 1), "day of the year");
        require(ObsoleteDate(date.day(), date.year()) == date, "the day of the year leads back");
    }
}

void moveDate(Input& input, const char* format) {
    ObsoleteDate date(1, 1, 2000);
    std::uint32_t day = numberOf2000;
    for (unsigned steps = input.byte() % 8; steps > 0; --steps) {
        std::uint32_t by = 0;
        switch (input.byte() % 5) {
        case 0:
            by = number(input);
            date = date + by;
            break;
        case 1:
            by = 1;
            ++date;
            break;
        case 2:
            by = 0xFFFFFFFF;
            date--;
            break;
        case 3: // to or next to a special value
            by = isSpecial(day) ? 0 : input.byte() % 6 - 4 - day;
            date = date + by;
            break;
        default: // somewhere in the calendar
            by = isSpecial(day) ? 0 : firstNumber + number(input) % (lastNumber - firstNumber + 1) - day;
            date = date + by;
            break;
        }
        day = isSpecial(day) ? day : day + by;
        checkDate(date, day, format);
    }
}

void buildAndWriteMoment(Input& input, const char* format) {
    try {
        const unsigned int day = 1 + input.byte() % 33;
        const unsigned int month = 1 + input.byte() % 13;
        const ObsoleteDate date(day, month, 1390 + number(input) % 8620);
        // Not as far as a moment of tens of thousands of years later, of which Boost sees the low 16 bits of the year.
        const unsigned int hours = number(input) % (1U << 24);
        const unsigned int minutes = number(input);
        const ObsoleteTime start(date, hours, minutes, number(input));
        ObsoleteTime time = start + number(input);
        time.asString(format);
        std::tm fields{};
        time.extract(&fields);
        const ObsoleteTime again(&fields);
        require(!(time < again) && !(time > again), "the fields lead back");
    } catch (const std::out_of_range&) {
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const bool isDate = input.byte() % 2 == 0;
    // The decisions stand behind the format, which ends with the first zero.
    const std::string format(input.rest().substr(0, input.rest().find('\0')));
    for (std::size_t i = 0; i <= format.size() && !input.rest().empty(); ++i) {
        input.byte();
    }
    if (isDate) {
        moveDate(input, format.c_str());
    } else {
        buildAndWriteMoment(input, format.c_str());
    }
    return 0;
}
