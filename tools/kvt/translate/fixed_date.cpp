#include "translate/fixed_date.h"

#include <algorithm>
#include <cstring>

namespace host {

std::string_view elementOf(std::string_view pattern) {
    const std::size_t length = pattern.front() != '%' ? 1 : pattern.size() > 2 && pattern[1] == 'E' ? 3 : 2;
    return pattern.substr(0, length);
}

std::optional<FixedDateForm> FixedDateForm::of(std::string_view pattern) {
    static constexpr std::array<std::string_view, partCount> flags = {"%Y", "%m", "%d", "%H", "%M", "%S"};
    constexpr char anyDigit = 0x7F - 9;
    constexpr char itself = 0x7F;
    FixedDateForm form;
    bool isBehindSeconds = false;
    while (!pattern.empty()) {
        const std::string_view element = elementOf(pattern);
        pattern.remove_prefix(element.size());
        const auto part =
            static_cast<std::size_t>(std::find(flags.begin(), flags.end(), element) - flags.begin());
        const bool isFlag = part != partCount;
        // "." behind seconds is the beginning of a fraction.
        const bool isPlain = element.size() == 1 && element[0] >= ' ' && element[0] < 127 &&
                             element.find_first_of("$*?%") != 0 && !(element == "." && isBehindSeconds);
        const std::size_t width = !isFlag ? 1 : part == Year ? 4 : 2;
        if ((isFlag ? form.given_[part] : !isPlain) || form.length_ + width > longest) {
            return std::nullopt;
        }
        if (isFlag) {
            form.given_[part] = true;
            form.places_[part] = static_cast<std::uint8_t>(form.length_);
        }
        isBehindSeconds = isFlag && part == Second;
        for (std::size_t count = 0; count < width; ++count, ++form.length_) {
            form.expected_[form.length_] = isFlag ? '0' : element[0];
            form.room_[form.length_] = isFlag ? anyDigit : itself;
        }
    }
    return form;
}

const FixedDateForm& FixedDateForm::canonicalDate() {
    static const FixedDateForm form = *of("%Y%m%d");
    return form;
}

const FixedDateForm& FixedDateForm::canonicalDateTime() {
    static const FixedDateForm form = *of("%Y%m%d%H%M%S");
    return form;
}

std::optional<FixedDateForm> FixedDateForm::toRead(std::string_view pattern) {
    const auto form = of(pattern);
    if (!form) {
        return std::nullopt;
    }
    const auto& given = form->given_;
    const bool hasDate = given[Year] && given[Month] && given[Day];
    const bool hasTimeInOrder = given[Hour] >= given[Minute] && given[Minute] >= given[Second];
    return hasDate && hasTimeInOrder ? form : std::nullopt;
}

std::optional<FixedDateForm> FixedDateForm::toWrite(std::string_view pattern) {
    if (pattern.starts_with(' ') || pattern.ends_with(' ')) {
        return std::nullopt; // are no part of it
    }
    const auto form = of(pattern);
    const bool hasPart = form && std::count(form->given_.begin(), form->given_.end(), true) != 0;
    return hasPart ? form : std::nullopt;
}

// Eight bytes at a time: the distance of each from what is expected, and more than what there is room for sets the
// highest bit. A carry into the next byte comes from a byte that has that bit already.
inline bool FixedDateForm::fitsShape(const char* text) const {
    const auto excess = [&](std::size_t at) {
        std::uint64_t found = 0;
        std::uint64_t expected = 0;
        std::uint64_t room = 0;
        std::memcpy(&found, text + at, sizeof found);
        std::memcpy(&expected, expected_.data() + at, sizeof expected);
        std::memcpy(&room, room_.data() + at, sizeof room);
        const std::uint64_t distance = found ^ expected;
        return (distance | (distance + room)) & 0x8080808080808080U;
    };
    // A date has eight digits at least.
    std::uint64_t wrong = excess(length_ - 8);
    for (std::size_t at = 0; at + 8 < length_; at += 8) {
        wrong |= excess(at);
    }
    return wrong == 0;
}

static unsigned daysOf(unsigned year, unsigned month) {
    static constexpr std::array<unsigned char, 12> days = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    const bool isLeap = year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
    return days[month - 1] + (isLeap && month == 2 ? 1U : 0U);
}

// Whether it is a date in this form, and perhaps a time, that there is.
inline bool FixedDateForm::isValid(std::string_view text) const {
    if (text.size() != length_ || !fitsShape(text.data())) {
        return false;
    }
    const auto pairAt = [&](std::size_t at) {
        return static_cast<unsigned>(text[at] - '0') * 10 + static_cast<unsigned>(text[at + 1] - '0');
    };
    const auto number = [&](Part part) { return given_[part] ? pairAt(places_[part]) : 0; };
    if (given_[Hour] && (number(Hour) > 23 || number(Minute) > 59 || number(Second) > 59)) {
        return false;
    }
    const std::size_t year = places_[Year]; // from 1000
    const unsigned month = pairAt(places_[Month]);
    const unsigned day = pairAt(places_[Day]);
    if (text[year] == '0' || month - 1 > 11 || day - 1 > 30) {
        return false;
    }
    return day <= 28 || day <= daysOf(pairAt(year) * 100 + pairAt(year + 2), month);
}

bool FixedDateText::take(std::string_view text, const FixedDateForm& from) {
    using Form = FixedDateForm;
    if ((form_.hasTime() && !from.given_[Form::Hour]) || !from.isValid(text)) {
        return false;
    }
    if (form_.given_[Form::Year]) {
        std::memcpy(text_.data() + form_.places_[Form::Year], text.data() + from.places_[Form::Year], 4);
    }
    const std::size_t end = form_.hasTime() ? Form::partCount : std::size_t{Form::Hour};
    for (std::size_t part = Form::Month; part < end; ++part) {
        if (form_.given_[part]) {
            // What is not said of a time is zero.
            std::memcpy(text_.data() + form_.places_[part],
                        from.given_[part] ? text.data() + from.places_[part] : "00", 2);
        }
    }
    return true;
}

} // namespace host
