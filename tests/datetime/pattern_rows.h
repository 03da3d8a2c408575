// Tables of patterns: a value, a format, and the whole answer.
#pragma once

#include "answer.h"

#include <kvt/datetime/datetime.h>

#include <string>
#include <utility>
#include <vector>

namespace kvt::test {

struct PatternRow {
    std::string value;
    std::string format;
    Answer answer;
    bool lenient = false;
};

inline void expectParsed(const std::vector<PatternRow>& rows) {
    for (const PatternRow& row : rows) {
        EXPECT_EQ(answerOf(kvt::ex::datetime::parse(ustring(row.value), ustring(row.format), row.lenient)),
                  row.answer)
            << "[" << row.value << "] by [" << row.format << "]" << (row.lenient ? " lenient" : "");
    }
}

inline void expectFormatted(const std::vector<PatternRow>& rows) {
    for (const PatternRow& row : rows) {
        EXPECT_EQ(answerOf(kvt::ex::datetime::format(ustring(row.value), ustring(row.format))), row.answer)
            << "[" << row.value << "] as [" << row.format << "]";
    }
}

/// The value does not fit; the format in two.
inline Answer mismatch(std::string matched, std::string rest) {
    return failure(933067, {std::move(matched), std::move(rest)});
}

} // namespace kvt::test
