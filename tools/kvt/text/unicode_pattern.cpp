// Patterns in ICU's dialect: the one place of the program where its regular expressions are called. They work on
// UTF-16, so that a line is converted before it is searched, and places are counted back to UTF-8 where there is a
// match.
#include "text/line_pattern.h"

#include "base/failure.h"
#include "base/text.h"

#include <unicode/uregex.h>
#include <unicode/ustring.h>
#include <unicode/utf16.h>
#include <unicode/utf8.h>

#include <algorithm>
#include <memory>
#include <stdexcept>
#include <utility>

namespace host {

namespace {

// What is wrong with a pattern, in words.
const char* wordsFor(UErrorCode status) {
    switch (status) {
    case U_REGEX_BAD_ESCAPE_SEQUENCE:
        return "a backslash stands before what has no meaning behind it";
    case U_REGEX_PROPERTY_SYNTAX:
        return "there is no such property of characters";
    case U_REGEX_MISMATCHED_PAREN:
        return "parentheses do not go in pairs";
    case U_REGEX_NUMBER_TOO_BIG:
        return "a number is too large";
    case U_REGEX_BAD_INTERVAL:
        return "'{' begins no number of repetitions";
    case U_REGEX_MAX_LT_MIN:
        return "the most repetitions are fewer than the least";
    case U_REGEX_INVALID_BACK_REF:
        return "a reference names a group that there is not";
    case U_REGEX_INVALID_FLAG:
        return "there is no such flag behind '(?'";
    case U_REGEX_LOOK_BEHIND_LIMIT:
        return "a look behind has no bound to its length";
    case U_REGEX_MISSING_CLOSE_BRACKET:
        return "']' is missing";
    case U_REGEX_INVALID_RANGE:
        return "a range between brackets ends before it begins";
    case U_REGEX_PATTERN_TOO_BIG:
        return "it is too long";
    case U_REGEX_INVALID_CAPTURE_GROUP_NAME:
        return "the name of a group is not one";
    default:
        return "it is not a regular expression";
    }
}

std::u16string toUtf16(std::string_view text) {
    UErrorCode status = U_ZERO_ERROR;
    std::u16string out(text.size(), u'\0'); // never more units than bytes
    int32_t length = 0;
    u_strFromUTF8(out.data(), static_cast<int32_t>(out.size()), &length, text.data(),
                  static_cast<int32_t>(text.size()), &status);
    out.resize(static_cast<std::size_t>(length));
    return out;
}

// Goes along a line in both forms at once, for places that mostly ascend.
class PlaceCounter {
public:
    explicit PlaceCounter(std::string_view line) : line_(line) {}

    std::size_t bytesAt(int32_t unit) {
        if (unit < units_) {
            units_ = 0;
            bytes_ = 0;
        }
        while (units_ < unit) {
            const int32_t length = U8_COUNT_TRAIL_BYTES(line_[bytes_]) + 1;
            bytes_ += static_cast<std::size_t>(length);
            units_ += length == 4 ? 2 : 1;
        }
        return bytes_;
    }

private:
    std::string_view line_;
    int32_t units_ = 0;
    std::size_t bytes_ = 0;
};

struct Close {
    void operator()(URegularExpression* regex) const { uregex_close(regex); }
};
using Regex = std::unique_ptr<URegularExpression, Close>;

Regex open(const std::string& pattern, LetterCase letterCase) {
    const std::u16string units = toUtf16(pattern);
    // Lines have no ends, and what Unicode takes for one is a character like any other.
    uint32_t flags = UREGEX_UNIX_LINES | UREGEX_ERROR_ON_UNKNOWN_ESCAPES;
    if (letterCase == LetterCase::Ignore) {
        flags |= UREGEX_CASE_INSENSITIVE;
    }
    UParseError place{};
    UErrorCode status = U_ZERO_ERROR;
    Regex regex;
    // ICU opens no empty pattern.
    regex.reset(units.empty()
                    ? uregex_open(u"(?:)", -1, flags, &place, &status)
                    : uregex_open(units.data(), static_cast<int32_t>(units.size()), flags, &place, &status));
    if (U_SUCCESS(status)) {
        return regex;
    }
    std::string text = std::string("REGEX cannot be compiled: ") + wordsFor(status);
    if (place.preContext[0] != 0) {
        std::u32string before;
        for (int32_t at = 0; place.preContext[at] != 0;) {
            UChar32 character = 0;
            U16_NEXT(place.preContext, at, -1, character);
            before += static_cast<char32_t>(character);
        }
        text += ", behind '" + printable(before) + "'";
    }
    throw Failure(text);
}

class UnicodePattern : public LinePattern {
public:
    explicit UnicodePattern(Regex regex) : regex_(std::move(regex)) {
        UErrorCode status = U_ZERO_ERROR;
        groupCount_ = static_cast<std::size_t>(uregex_groupCount(regex_.get(), &status));
    }

    bool find(std::string_view line) override {
        setText(line);
        return findNext();
    }

    void findAll(std::string_view line, const TakeMatch& take) override {
        setText(line);
        PlaceCounter places(line);
        while (findNext()) {
            places_.clear();
            for (std::size_t group = 0; group <= groupCount_; ++group) {
                UErrorCode status = U_ZERO_ERROR;
                const int32_t start = uregex_start(regex_.get(), static_cast<int32_t>(group), &status);
                const int32_t end = uregex_end(regex_.get(), static_cast<int32_t>(group), &status);
                if (start < 0) {
                    places_.push_back(std::nullopt);
                } else {
                    const std::size_t position = places.bytesAt(start);
                    places_.push_back(GroupPlace{position, places.bytesAt(end) - position});
                }
            }
            if (!take(places_)) {
                return;
            }
        }
    }

    std::size_t groupCount() const override { return groupCount_; }

private:
    void setText(std::string_view line) {
        units_ = toUtf16(line);
        UErrorCode status = U_ZERO_ERROR;
        uregex_setText(regex_.get(), units_.data(), static_cast<int32_t>(units_.size()), &status);
        // One of these is some thousand steps. A line that is read once takes far less than one for each character.
        constexpr int32_t leastLimit = 2000;
        uregex_setTimeLimit(regex_.get(), leastLimit + static_cast<int32_t>(units_.size() / 1000), &status);
    }

    bool findNext() {
        UErrorCode status = U_ZERO_ERROR;
        const bool found = uregex_findNext(regex_.get(), &status) != 0;
        if (U_FAILURE(status)) {
            throw std::runtime_error(status == U_REGEX_TIME_OUT ? "The line takes too many steps."
                                                                : "The line takes too much memory.");
        }
        return found;
    }

    Regex regex_;
    std::size_t groupCount_ = 0;
    std::u16string units_;
    GroupPlaces places_;
};

} // namespace

std::unique_ptr<LinePattern> compileUnicodePattern(const std::string& pattern, LetterCase letterCase) {
    return std::make_unique<UnicodePattern>(open(pattern, letterCase));
}

} // namespace host
