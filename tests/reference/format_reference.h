// A second writer of values by formats, which knows nothing of the first: it counts days year by year, holds a value in one
// number of 128 bits, and has a sentence of its own for every flag.
#pragma once

#include <datetime/answer.h>
#include <datetime/naive_calendar.h>

#include <string>
#include <vector>

namespace kvt::test {

struct NaiveMoment {
    kvt::ex::datetime::TemporalType kind;
    NaiveDateTime at; ///< as it is written
    int offsetMinutes = 0;

    bool hasDate() const;
    bool hasTime() const { return kind != kvt::ex::datetime::TemporalType::Date; }
    bool hasOffset() const;
};

/// What format() has to answer by a pattern in its pieces: flags, and characters.
Answer naiveFormat(const NaiveMoment& value, const std::vector<std::string>& elements);

/// What format() has to answer. Both of ASCII.
Answer naiveFormat(const std::string& value, const std::string& format);

/// All that there are, "%%" included.
std::vector<std::string> naiveFlags();

} // namespace kvt::test
