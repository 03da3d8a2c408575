// A second implementation of the functions on values, which knows nothing of the first: it counts days year by year, steps
// months one by one, and holds all nanoseconds in one number of 128 bits. Each function gives the whole answer: state, text
// or number, and message.
#pragma once

#include "value_reading.h"

#include <kvt/datetime/datetime.h>

#include <optional>
#include <string>

namespace kvt::test {

/// Nothing where naiveInterval() gives nothing.
std::optional<Answer> naiveAdd(const std::string& value, const std::string& interval);
std::optional<Answer> naiveNegate(const std::string& interval);

Answer naiveCast(const std::string& value, kvt::ex::datetime::CastToTemporalType target);
Answer naiveCreate(const NaiveDateTime& at, const std::string& offset);

struct NaiveDifference {
    Answer interval;
    Answer months;
    Answer seconds;
    int order = -3;

    /// The answer of diffAsNumber().
    Answer inUnit(kvt::ex::datetime::UnitType unit) const;
};
NaiveDifference naiveDiff(const std::string& first, const std::string& other);

/// There is no zone database, so that "local" fails.
Answer naiveTimezoneSet(const std::string& value, const std::string& zone,
                        kvt::ex::datetime::SetZoneMode mode);
Answer naiveTimezoneGet(const std::string& value, kvt::ex::datetime::UTCOffsetType type);
Answer naiveTimezoneRemove(const std::string& value);

/// Of parseZQTDateTime(): as text the fields that naiveFields() shows.
Answer naiveParts(const std::string& value, int precision);
std::string naiveFields(const NaiveDateTime& at, const std::string& offset,
                        kvt::ex::datetime::TemporalType kind);

} // namespace kvt::test
