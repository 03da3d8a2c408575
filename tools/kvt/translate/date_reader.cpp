#include "translate/date_reader.h"

#include "base/failure.h"
#include "base/text.h"
#include "base/text_units.h"
#include "date/function.h"
#include "date/outcome.h"
#include "translate/icu_data.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/message_numbers.h>

#include <algorithm>
#include <cstring>
#include <limits>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
namespace message_number = datetime::message_number;

constexpr std::array<const char*, 12> englishMonths = {"January",   "February", "March",    "April",
                                                       "May",       "June",     "July",     "August",
                                                       "September", "October",  "November", "December"};

// The first element of a pattern: a flag, or a character.
std::string_view elementOf(std::string_view pattern) {
    const std::size_t length = pattern.front() != '%' ? 1 : pattern.size() > 2 && pattern[1] == 'E' ? 3 : 2;
    return pattern.substr(0, length);
}

bool hasElement(std::string_view pattern, std::string_view element) {
    for (; !pattern.empty(); pattern.remove_prefix(std::min(elementOf(pattern).size(), pattern.size()))) {
        if (elementOf(pattern) == element) {
            return true;
        }
    }
    return false;
}

// "a|b||c" as "a" and "b|c".
std::vector<std::string> splitFormats(const std::string& formats) {
    std::vector<std::string> list(1);
    for (std::size_t at = 0; at < formats.size(); ++at) {
        if (formats[at] != '|') {
            list.back() += formats[at];
        } else if (formats.compare(at, 2, "||") == 0) {
            list.back() += '|';
            ++at;
        } else {
            list.emplace_back();
        }
    }
    return list;
}

// With "%Y" for each "%y".
std::string withWholeYears(std::string_view pattern) {
    std::string out;
    while (!pattern.empty()) {
        const std::string_view element = elementOf(pattern);
        out += element == "%y" ? "%Y" : element;
        pattern.remove_prefix(element.size());
    }
    return out;
}

// Where the library's reader is behind an element that it reads by itself; nothing where the text does not fit.
std::optional<std::size_t> behind(std::string_view element, std::string_view text, std::size_t at) {
    const auto digits = [&](std::size_t most) {
        std::size_t count = 0;
        while (count < most && at + count < text.size() && isDigit(text[at + count])) {
            ++count;
        }
        at += count;
        return count != 0;
    };
    const auto character = [&](char wanted) {
        const bool isThere = at < text.size() && text[at] == wanted;
        at += isThere ? 1 : 0;
        return isThere;
    };
    const auto seconds = [&] { return digits(2) && (!character('.') || digits(text.size())); };
    bool fits = true;
    if (element.size() == 1) {
        if (element == "*") {
            at = std::min(text.find_first_of(" \t", at), text.size());
        } else {
            fits = element == "?" ? at++ < text.size() : character(element[0]);
        }
    } else if (element == "%Y") {
        fits = digits(4);
    } else if (element == "%j") {
        fits = digits(3);
    } else if (element == "%S") {
        fits = seconds();
    } else if (element == "%T") {
        fits = digits(2) && character(':') && digits(2) && character(':') && seconds();
    } else if (element == "%p") {
        at += 2;
    } else if (element == "%b") {
        at += 3;
    } else if (element == "%B") {
        while (at < text.size() && isLetter(text[at])) {
            ++at;
        }
    } else {
        fits = isLetter(element[1]) ? digits(2) : character(element[1]);
    }
    return fits && at <= text.size() ? std::optional(at) : std::nullopt;
}

Problem problemOf(const datetime::TextResult& result, std::size_t& fit) {
    const DateOutcome outcome = outcomeOf(result);
    fit = !outcome.message || outcome.message->number == message_number::noKeywordMatched ? 0
          : outcome.message->number == message_number::formatMismatch
              ? outcome.message->parameters.front().size()
              : std::numeric_limits<std::size_t>::max();
    return {outcome.message ? outcome.message->number : 0, failureSentence(outcome)};
}

} // namespace

// ---- Texts of a fixed length

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
    const auto& given = form.given_;
    form.hasTime_ = given[Hour];
    const bool hasDate = given[Year] && given[Month] && given[Day];
    const bool hasTimeInOrder = given[Hour] >= given[Minute] && given[Minute] >= given[Second];
    return hasDate && hasTimeInOrder ? std::optional(form) : std::nullopt;
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

bool FixedDateForm::read(std::string_view text, std::string& out) const {
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
    if (pairAt(places_[Day]) - 1 >= most) {
        return false;
    }
    out.resize(hasTime_ ? 14 : 8);
    std::memcpy(out.data(), text.data() + places_[Year], 4);
    std::memcpy(out.data() + 4, text.data() + places_[Month], 2);
    std::memcpy(out.data() + 6, text.data() + places_[Day], 2);
    for (std::size_t part = Hour; hasTime_ && part <= Second; ++part) {
        std::memcpy(out.data() + 8 + 2 * (part - Hour), given_[part] ? text.data() + places_[part] : "00", 2);
    }
    return true;
}

// ---- Names of months

MonthNames::MonthNames(const std::string& language) {
    const auto all = monthNames(language);
    if (!all) {
        throw Failure("ICU knows no language '" + printable(language) + "'");
    }
    for (std::size_t month = 0; month < all->size(); ++month) {
        for (const std::string& name : (*all)[month]) {
            names_.push_back({foldedName(name), name.size(), month});
            longest_ = std::max(longest_, name.size());
        }
    }
    std::stable_sort(names_.begin(), names_.end(),
                     [](const Name& left, const Name& right) { return left.size > right.size; });
}

std::optional<std::pair<std::size_t, std::size_t>> MonthNames::find(std::string_view text) const {
    const std::string folded = foldedName(text.substr(0, longest_));
    for (const Name& name : names_) {
        if (folded.starts_with(name.folded) && foldedName(text.substr(0, name.size)) == name.folded) {
            return std::pair(name.month, name.size);
        }
    }
    return std::nullopt;
}

// ---- All forms

DateReader::DateReader(const std::string& formats, const std::string& pivot, const std::string& language) {
    if (!pivot.empty()) {
        if (pivot.size() != 2 || !isDigit(pivot[0]) || !isDigit(pivot[1])) {
            throw Failure("the pivot is two digits, not '" + printable(pivot) + "'");
        }
        pivot_ = (pivot[0] - '0') * 10 + (pivot[1] - '0');
    }
    if (!language.empty()) {
        months_.emplace(language);
    }
    for (const std::string& typed : splitFormats(formats)) {
        forms_.push_back(makeForm(withoutBlanks(typed)));
    }
}

DateReader::Form DateReader::makeForm(const std::string& typed) const {
    Form form;
    form.typed = typed;
    const std::string pattern = withWholeYears(typed);
    if (const std::string wrong = wrongInReadFormat(pattern); !wrong.empty()) {
        throw Failure(wrong);
    }
    if (pattern.find('%') == std::string::npos) {
        form.format = toUString(typed);
        return form;
    }
    const bool hasShortYear = hasElement(typed, "%y");
    if (hasShortYear && !pivot_) {
        throw Failure("'%y' needs a pivot, which says where the century ends");
    }
    form.isRewritten = hasShortYear || (months_ && (hasElement(typed, "%b") || hasElement(typed, "%B")));
    for (const char* open : {"%s", "%Es", "%z", "%Ez"}) {
        if (form.isRewritten && hasElement(typed, open)) {
            throw Failure("'" + std::string(open) +
                          "' does not go together with '%y' or months of another language");
        }
    }
    // The whole text has to fit.
    const bool hasEnd = pattern.ends_with('$') && !pattern.ends_with("%$");
    form.format = toUString(hasEnd ? pattern : pattern + "$");
    if (!form.isRewritten) {
        form.fixed = FixedDateForm::of(hasEnd ? std::string_view(pattern).substr(0, pattern.size() - 1)
                                              : std::string_view(pattern));
    }
    return form;
}

bool DateReader::read(std::string_view text, std::string& out, Problem& problem) {
    const bool isOnly = forms_.size() == 1;
    Misfit best;
    for (const Form& form : forms_) {
        if ((form.fixed && form.fixed->read(text, out)) ||
            readBy(form, text, out, isOnly ? &best : nullptr)) {
            return true;
        }
    }
    // Why is asked when nothing fits.
    for (auto form = forms_.begin(); !isOnly && form != forms_.end(); ++form) {
        Misfit misfit;
        readBy(*form, text, out, &misfit);
        if (misfit.fit > best.fit || form == forms_.begin()) {
            best = std::move(misfit);
        }
    }
    problem = std::move(best.problem);
    return false;
}

bool DateReader::readBy(const Form& form, std::string_view text, std::string& out, Misfit* misfit) {
    if (form.isRewritten) {
        const std::string trimmed = withoutBlanks(text);
        if (const auto place = rewrite(form.typed, trimmed)) {
            if (misfit != nullptr) {
                *misfit = {*place, makeProblem(message_number::formatMismatch,
                                               {form.typed.substr(0, *place), form.typed.substr(*place)})};
            }
            return false;
        }
        text = rewritten_;
    }
    value_.clear();
    value_.append(kvt::ex::UStringView<0>(text));
    const datetime::TextResult result = datetime::parse(value_, form.format, false);
    const kvt::ex::UString<0>& canonical = std::get<1>(result);
    if (canonical.isEmpty()) {
        if (misfit != nullptr) {
            misfit->problem = problemOf(result, misfit->fit);
        }
        return false;
    }
    out.assign(canonical.rawData(), canonical.size());
    return true;
}

// Makes rewritten_; gives the place in the pattern whose element does not fit, if there is one.
std::optional<std::size_t> DateReader::rewrite(std::string_view pattern, std::string_view text) {
    rewritten_.clear();
    std::size_t at = 0;
    for (std::size_t place = 0; place < pattern.size();) {
        const std::string_view element = elementOf(pattern.substr(place));
        const std::string_view rest = text.substr(at);
        const bool isMonth = months_ && (element == "%b" || element == "%B");
        if (element == "$") {
            break;
        }
        if (element == "%y") {
            if (rest.size() < 2 || !isDigit(rest[0]) || !isDigit(rest[1])) {
                return place;
            }
            rewritten_.append((rest[0] - '0') * 10 + (rest[1] - '0') >= *pivot_ ? "19" : "20")
                .append(rest, 0, 2);
            at += 2;
        } else if (isMonth) {
            const auto month = months_->find(rest);
            if (!month) {
                return place;
            }
            rewritten_.append(englishMonths[month->first], 0, element == "%b" ? 3 : std::string::npos);
            at += month->second;
        } else {
            const auto next = behind(element, text, at);
            if (!next) {
                return place;
            }
            rewritten_.append(text.substr(at, *next - at));
            at = *next;
        }
        place += element.size();
    }
    rewritten_.append(text.substr(at));
    return std::nullopt;
}

} // namespace host
