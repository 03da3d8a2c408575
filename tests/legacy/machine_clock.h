// The clock of the machine, as a test wants it.
//
// The program that holds machine_clock.cpp answers the system's questions for the time and for the calendar time
// itself, for the library as well, as long as a test has set them.
#pragma once

#include <ctime>
#include <optional>

namespace kvt::test {

/// While it lives, local time is `now`, or is unknown.
class LocalTime {
public:
    explicit LocalTime(std::optional<std::tm> now);
    ~LocalTime();
    LocalTime(const LocalTime&) = delete;
    LocalTime& operator=(const LocalTime&) = delete;
};

/// A calendar time of numbers as people write them.
inline std::tm calendarTime(int year, int month, int day, int hour = 0, int minute = 0, int second = 0) {
    std::tm time{};
    time.tm_year = year - 1900;
    time.tm_mon = month - 1;
    time.tm_mday = day;
    time.tm_hour = hour;
    time.tm_min = minute;
    time.tm_sec = second;
    return time;
}

} // namespace kvt::test
