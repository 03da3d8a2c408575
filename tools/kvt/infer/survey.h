// All that is found out about a file before anybody translates it. It is read whole, twice: once for its encoding, and
// then, in that, for its rows.
#pragma once

#include "infer/column_guess.h"
#include "infer/double_encoding.h"
#include "infer/encoding_guess.h"
#include "infer/table_guess.h"

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace host {

struct SurveyedColumn {
    std::string name; ///< of the header; empty where there is none
    ColumnGuess guess;
    DoubleEncoding doubled;
};

struct Survey {
    std::string file; ///< for people
    std::uint64_t bytes = 0;

    std::vector<EncodingOpinion> encodings; ///< the first one is used
    bool isEncodingGiven = false;
    bool isMarked = false;
    bool isAscii = false;

    TableGuess table;
    bool hasHeader = false;
    std::string aboutHeader; ///< why it is one, or why not
    std::vector<SurveyedColumn> columns;

    std::uint64_t rows = 0;      ///< without the header
    std::uint64_t emptyRows = 0; ///< without anything in them
    std::uint64_t oddRows = 0;   ///< with more or fewer cells than columns
    std::uint64_t firstOddRow = 0;
    std::uint64_t brokenRows = 0; ///< with a quote that is not closed rightly, or a NUL
    std::uint64_t firstBrokenRow = 0;
};

/// Looks the file over. `encoding` is that of the user, or empty. `onBytes` is called with each number of bytes read,
/// twice in all for each byte. Throws Failure.
Survey surveyFile(const std::string& path, const std::string& encoding,
                  const std::function<void(std::uint64_t)>& onBytes);

} // namespace host
