// ObsoleteDate over boost::gregorian::date.
#include <kvt/legacy/detail/calendar.h>
#include <kvt/legacy/obsolete_date.h>

#include <cstdint>

using kvt::ex::detail::dateOf;
using kvt::ex::detail::ObsoleteDateImpl;

namespace {

using boost::gregorian::date;

date dateOfYear(unsigned int dayOfYear, unsigned int year) {
    const boost::gregorian::greg_year checked(static_cast<unsigned short>(year));
    for (unsigned short month = 1;; ++month) {
        // Past December this is what fails.
        const boost::gregorian::greg_month current(month);
        const unsigned int length = boost::gregorian::gregorian_calendar::end_of_month_day(checked, current);
        if (dayOfYear <= length) {
            return {checked, current, static_cast<unsigned short>(dayOfYear)};
        }
        dayOfYear -= length;
    }
}

date moved(const date& from, int days) {
    return from + boost::gregorian::days(days);
}

std::uint32_t dayNumber(const ObsoleteDateImpl& impl) {
    return impl.date.day_number();
}

ObsoleteDateImpl* implOf(const date& value) {
    return new ObsoleteDateImpl{value, {}};
}

} // namespace

ObsoleteDate::ObsoleteDate() : impl_(implOf(dateOf(kvt::ex::detail::localNow()))) {}

ObsoleteDate::ObsoleteDate(std::tm* t) : impl_(implOf(dateOf(*t))) {}

ObsoleteDate::ObsoleteDate(unsigned int dayOfYear, unsigned int year)
    : impl_(implOf(dateOfYear(dayOfYear, year))) {}

ObsoleteDate::ObsoleteDate(unsigned int day, unsigned int month, unsigned int year)
    : impl_(implOf(dateOf(day, month, year))) {}

ObsoleteDate::ObsoleteDate(const ObsoleteDate& other) : impl_(new ObsoleteDateImpl(*other.impl_)) {}

ObsoleteDate& ObsoleteDate::operator=(const ObsoleteDate& other) {
    impl_->text = other.impl_->text; // first, as it alone may throw
    impl_->date = other.impl_->date;
    return *this;
}

ObsoleteDate::~ObsoleteDate() = default;

unsigned int ObsoleteDate::year() const {
    return impl_->date.year();
}

unsigned int ObsoleteDate::month() const {
    return impl_->date.month();
}

unsigned int ObsoleteDate::dayOfMonth() const {
    return impl_->date.day();
}

unsigned int ObsoleteDate::day() const {
    return impl_->date.day_of_year();
}

bool ObsoleteDate::isValid() const {
    return !impl_->date.is_not_a_date();
}

ObsoleteDate ObsoleteDate::operator+(unsigned long days) const {
    ObsoleteDate sum(*this);
    sum.impl_->text.clear();
    sum.impl_->date = moved(impl_->date, static_cast<std::int32_t>(static_cast<std::uint32_t>(days)));
    return sum;
}

unsigned long ObsoleteDate::operator-(const ObsoleteDate& other) const {
    return static_cast<std::uint32_t>((impl_->date - other.impl_->date).days());
}

ObsoleteDate& ObsoleteDate::operator++() {
    impl_->date = moved(impl_->date, 1);
    return *this;
}

ObsoleteDate& ObsoleteDate::operator--() {
    impl_->date = moved(impl_->date, -1);
    return *this;
}

ObsoleteDate ObsoleteDate::operator++(int) {
    ObsoleteDate before(*this);
    ++*this;
    return before;
}

ObsoleteDate ObsoleteDate::operator--(int) {
    ObsoleteDate before(*this);
    --*this;
    return before;
}

bool ObsoleteDate::operator==(const ObsoleteDate& other) const {
    return dayNumber(*impl_) == dayNumber(*other.impl_);
}

bool ObsoleteDate::operator<(const ObsoleteDate& other) const {
    return dayNumber(*impl_) < dayNumber(*other.impl_);
}

bool ObsoleteDate::operator<=(const ObsoleteDate& other) const {
    return dayNumber(*impl_) <= dayNumber(*other.impl_);
}

bool ObsoleteDate::operator>(const ObsoleteDate& other) const {
    return dayNumber(*impl_) > dayNumber(*other.impl_);
}

bool ObsoleteDate::operator>=(const ObsoleteDate& other) const {
    return dayNumber(*impl_) >= dayNumber(*other.impl_);
}

void ObsoleteDate::asString(const char*& out, unsigned long long& length) const {
    asString("%x", out, length);
}

void ObsoleteDate::asString(const char* format, const char*& out, unsigned long long& length) const {
    impl_->text = kvt::ex::detail::written<boost::gregorian::date_facet>(impl_->date, format);
    out = impl_->text.c_str();
    length = impl_->text.size();
}
