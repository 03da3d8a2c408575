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
#include <limits>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
namespace message_number = datetime::message_number;

constexpr std::array<const char*, 12> englishMonths = {"January",   "February", "March",    "April",
                                                       "May",       "June",     "July",     "August",
                                                       "September", "October",  "November", "December"};

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
        form.fixed = FixedDateForm::toRead(hasEnd ? std::string_view(pattern).substr(0, pattern.size() - 1)
                                                  : std::string_view(pattern));
    }
    if (form.fixed) {
        form.canonical.emplace(form.fixed->canonical());
    }
    return form;
}

bool DateReader::read(std::string_view text, std::string_view& out, Problem& problem) {
    const bool isOnly = forms_.size() == 1;
    Misfit best;
    for (Form& form : forms_) {
        if (readBy(form, text, out, isOnly ? &best : nullptr)) {
            return true;
        }
    }
    // Why is asked when nothing fits.
    for (auto form = forms_.begin(); !isOnly && form != forms_.end(); ++form) {
        Misfit misfit;
        readByLibrary(*form, text, out, &misfit);
        if (misfit.fit > best.fit || form == forms_.begin()) {
            best = std::move(misfit);
        }
    }
    problem = std::move(best.problem);
    return false;
}

bool DateReader::readBy(Form& form, std::string_view text, std::string_view& out, Misfit* misfit) {
    if (form.fixed && form.canonical->take(text, *form.fixed)) {
        out = form.canonical->view();
        return true;
    }
    return readByLibrary(form, text, out, misfit);
}

bool DateReader::readByLibrary(const Form& form, std::string_view text, std::string_view& out,
                               Misfit* misfit) {
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
    out = canonical_.assign(canonical.rawData(), canonical.size());
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
