// What the two classes of the old calendar share: what they hold, how a checked date is made of parts, and how a
// value is written by a facet of Boost's.
#pragma once

#include <boost/date_time/gregorian/gregorian.hpp>
#include <boost/date_time/posix_time/posix_time.hpp>

#include <ctime>
#include <locale>
#include <sstream>
#include <string>

namespace kvt::ex::detail {

struct ObsoleteDateImpl {
    boost::gregorian::date date;
    std::string text; // of the last asString()
};

struct ObsoleteTimeImpl {
    boost::posix_time::ptime time;
    std::string text; // of the last asString()
};

/// The calendar time of now in the zone of the machine. Throws std::runtime_error when the system does not know it.
std::tm localNow();

/// A date of parts, each narrowed to 16 bits first. Throws as ObsoleteDate(day, month, year).
boost::gregorian::date dateOf(unsigned int day, unsigned int month, unsigned int year);

/// The date in `time`, as dateOf() takes it.
boost::gregorian::date dateOf(const std::tm& time);

/// `value` by `format`, written by a `Facet` of Boost's for such values.
template <typename Facet, typename Value>
std::string written(const Value& value, const char* format) {
    static constexpr const char* specialNames[] = {"not-a-date-time", "-infinity", "+infinity"};
    using Specials = typename Facet::special_values_formatter_type;
    std::stringstream stream;
    // The locale owns the facet.
    auto* facet = new Facet(format, typename Facet::period_formatter_type(),
                            Specials(std::begin(specialNames), std::end(specialNames)),
                            typename Facet::date_gen_formatter_type());
    stream.imbue(std::locale(stream.getloc(), facet));
    stream << value;
    return stream.str();
}

} // namespace kvt::ex::detail
