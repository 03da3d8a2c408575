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
        const std::size_t width = !isFlag ? 1 : widthOf(part);
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

// Whether it is a date in this form, and perhaps a time, that there is.
inline bool FixedDateForm::isValid(std::string_view text) const {
    if (text.size() != length_ || !fitsShape(text.data())) {
        return false;
    }
    const auto pairAt = [&](std::size_t at) {
        return static_cast<unsigned>(text[at] - '0') * 10 + static_cast<unsigned>(text[at + 1] - '0');
    };
    const auto number = [&](Part part) { return given_[part] ? pairAt(places_[part]) : 0; };
    static constexpr std::array<unsigned char, 12> days = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    const unsigned year = pairAt(places_[Year]) * 100 + pairAt(places_[Year] + std::size_t{2});
    const unsigned month = pairAt(places_[Month]);
    if (year < 1000 || month - 1 > 11 || number(Hour) > 23 || number(Minute) > 59 || number(Second) > 59) {
        return false;
    }
    const bool isLeap = year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
    const unsigned most = days[month - 1] + (isLeap && month == 2 ? 1U : 0U);
    return pairAt(places_[Day]) - 1 < most;
}

bool FixedDateForm::read(std::string_view text, std::string& out) const {
    if (!isValid(text)) {
        return false;
    }
    out.resize(given_[Hour] ? 14 : 8);
    std::memcpy(out.data(), text.data() + places_[Year], 4);
    std::memcpy(out.data() + 4, text.data() + places_[Month], 2);
    std::memcpy(out.data() + 6, text.data() + places_[Day], 2);
    for (std::size_t part = Hour; given_[Hour] && part <= Second; ++part) {
        std::memcpy(out.data() + 8 + 2 * (part - Hour), given_[part] ? text.data() + places_[part] : "00", 2);
    }
    return true;
}

bool FixedDateForm::write(std::string_view canonical, std::string& out) const {
    static const FixedDateForm date = *toRead("%Y%m%d");
    static const FixedDateForm dateTime = *toRead("%Y%m%d%H%M%S");
    const FixedDateForm& form = canonical.size() == date.length_ ? date : dateTime;
    const bool needsTime = given_[Hour] || given_[Minute] || given_[Second];
    if ((needsTime && &form == &date) || !form.isValid(canonical)) {
        return false;
    }
    out.assign(expected_.data(), length_);
    for (std::size_t part = Year; part < (needsTime ? partCount : std::size_t{Hour}); ++part) {
        if (given_[part]) {
            std::memcpy(out.data() + places_[part], canonical.data() + form.places_[part], widthOf(part));
        }
    }
    return true;
}

} // namespace host
