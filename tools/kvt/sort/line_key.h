// By what lines are put in order, or held to be equal: all of a line or one of its fields; as bytes, without regard to
// case, as numbers or as dates.
//
// A key is bytes whose order is that of the lines. It is made once for each line, however often lines are compared.
#pragma once

#include "sort/growing_text.h"
#include "sort/workspace.h"

#include <kvt/string/ustring.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

struct KeyRule {
    enum class By { Bytes, FoldedText, Number, Date };
    By by = By::Bytes;
    std::uint64_t field = 0;      ///< which one, from 1; 0 is the whole line
    std::string delimiter = "\t"; ///< between fields
    std::string dateFormat;       ///< as for the library's parse()
    bool missingFirst =
        false; ///< lines without a number or a date come before all others, and not behind them

    /// Whether each line is its own key.
    bool takesLines() const { return by == By::Bytes && field == 0; }
};

class LineKeys {
public:
    /// Up to `memory` bytes of a key are in memory.
    LineKeys(const KeyRule& rule, Workspace& workspace, std::uint64_t memory);

    /// The key of a line, valid until the next call. Where keys are folded, the line is UTF-8.
    std::string_view of(std::string_view line);
    /// Whether the last line had the number or the date that it was asked for.
    bool wasFound() const { return wasFound_; }

private:
    std::string_view fieldOf(std::string_view line) const;
    std::size_t findDelimiter(std::string_view text) const;
    std::string_view folded(std::string_view text);

    KeyRule rule_;
    kvt::ex::UString<0> dateFormat_;
    Workspace& workspace_;
    GrowingText key_;
    std::string piece_;
    bool wasFound_ = true;
};

/// Appends the key of a decimal number, which may have a sign, a fraction, an exponent and blanks around it, or be
/// "inf" or "infinity". Numbers compare exactly, however many digits they have. False, and nothing appended, for what
/// is none and for exponents of more than 17 digits.
bool appendNumberKey(std::string_view text, std::string& key);

/// Appends the key of a date, a time or both, as text in `format`. What has an offset stands where it is in UTC, what
/// has none as if it were UTC; times of day come before dates. False, and nothing appended, for what does not fit.
bool appendDateKey(std::string_view text, const kvt::ex::UString<0>& format, std::string& key);

} // namespace host
