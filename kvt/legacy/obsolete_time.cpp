// ObsoleteTime over boost::posix_time::ptime.
//
// Sums are made on the bare count of ticks as an unsigned number, so that one that leaves its 64 bits wraps, where the
// signed sum would be undefined. Within 64 bits they are those of Boost.
#include <kvt/legacy/detail/calendar.h>
#include <kvt/legacy/obsolete_time.h>

#include <cstdint>

using kvt::ex::detail::dateOf;
using kvt::ex::detail::localNow;
using kvt::ex::detail::ObsoleteTimeImpl;

namespace {

using boost::gregorian::date;
using boost::posix_time::ptime;
using boost::posix_time::time_duration;

constexpr std::uint64_t ticksPerSecond = 1'000'000;
constexpr std::uint64_t ticksPerDay = 86'400 * ticksPerSecond;

static_assert(time_duration::rep_type::ticks_per_second == std::int64_t{ticksPerSecond},
              "moments count microseconds: Boost.DateTime must not be set to count nanoseconds");

ptime atTick(std::uint64_t tick) {
    return ptime(ptime::time_rep_type(static_cast<std::int64_t>(tick)));
}

// `time` is not special.
std::uint64_t tickOf(const ptime& time) {
    return static_cast<std::uint64_t>((time - atTick(0)).ticks());
}

ptime moved(const ptime& time, std::int64_t seconds) {
    if (time.is_special()) {
        return time;
    }
    return atTick(tickOf(time) + static_cast<std::uint64_t>(seconds) * ticksPerSecond);
}

std::int64_t asSigned(unsigned long seconds) {
    return static_cast<std::int32_t>(static_cast<std::uint32_t>(seconds));
}

ObsoleteTimeImpl* implOf(const ptime& time) {
    return new ObsoleteTimeImpl{time, {}};
}

ObsoleteTimeImpl* implOf(const date& day, unsigned int hours, unsigned int minutes, unsigned int seconds) {
    const std::uint64_t ofDay = std::uint64_t{hours} * 3600 + std::uint64_t{minutes} * 60 + seconds;
    return implOf(atTick(day.day_number() * ticksPerDay + ofDay * ticksPerSecond));
}

ObsoleteTimeImpl* implOf(const std::tm& time) {
    return implOf(ptime(dateOf(time), time_duration(time.tm_hour, time.tm_min, time.tm_sec)));
}

} // namespace

ObsoleteTime::ObsoleteTime() : impl_(implOf(localNow())) {}

ObsoleteTime::ObsoleteTime(std::tm* t) : impl_(implOf(*t)) {}

ObsoleteTime::ObsoleteTime(unsigned int hours, unsigned int minutes, unsigned int seconds)
    : impl_(implOf(dateOf(localNow()), hours, minutes, seconds)) {}

ObsoleteTime::ObsoleteTime(const ObsoleteDate& date, unsigned int hours, unsigned int minutes,
                           unsigned int seconds)
    : impl_(implOf(dateOf(date.dayOfMonth(), date.month(), date.year()), hours, minutes, seconds)) {}

ObsoleteTime::ObsoleteTime(const ObsoleteTime& other) : impl_(new ObsoleteTimeImpl(*other.impl_)) {}

ObsoleteTime& ObsoleteTime::operator=(const ObsoleteTime& other) {
    impl_->text = other.impl_->text; // first, as it alone may throw
    impl_->time = other.impl_->time;
    return *this;
}

ObsoleteTime::~ObsoleteTime() = default;

unsigned int ObsoleteTime::hour() const {
    return static_cast<unsigned int>(impl_->time.time_of_day().hours());
}

unsigned int ObsoleteTime::minute() const {
    return static_cast<unsigned int>(impl_->time.time_of_day().minutes());
}

unsigned int ObsoleteTime::second() const {
    return static_cast<unsigned int>(impl_->time.time_of_day().seconds());
}

void ObsoleteTime::extract(std::tm* t) const {
    *t = boost::posix_time::to_tm(impl_->time);
}

bool ObsoleteTime::isValid() const {
    return !impl_->time.is_not_a_date_time();
}

ObsoleteTime ObsoleteTime::operator+(unsigned long seconds) const {
    ObsoleteTime sum(*this);
    sum.impl_->text.clear();
    sum.impl_->time = moved(impl_->time, asSigned(seconds));
    return sum;
}

ObsoleteTime ObsoleteTime::operator-(unsigned long seconds) const {
    ObsoleteTime difference(*this);
    difference.impl_->text.clear();
    difference.impl_->time = moved(impl_->time, -asSigned(seconds));
    return difference;
}

bool ObsoleteTime::operator<(const ObsoleteTime& other) {
    return impl_->time < other.impl_->time;
}

bool ObsoleteTime::operator>(const ObsoleteTime& other) {
    return impl_->time > other.impl_->time;
}

void ObsoleteTime::asString(const char* format, const char*& out, unsigned long long& length) const {
    impl_->text = kvt::ex::detail::written<boost::posix_time::time_facet>(impl_->time, format);
    out = impl_->text.c_str();
    length = impl_->text.size();
}
