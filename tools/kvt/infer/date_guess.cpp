#include "infer/date_guess.h"

#include "base/text_units.h"
#include "infer/month_words.h"

#include <kvt/datetime/datetime.h>

#include <algorithm>
#include <array>
#include <iterator>
#include <optional>

namespace host {

namespace {

using kvt::ex::UString;

// The runs of a text: "2/Jan/2020 13:14:15.5" is "d/a/y d:d:d.f". A number of one or two digits is d, of four y, of
// others n; behind a point that follows seconds it is f, which no form names. Letters are a; T and Z alone stay.
std::string shapeOf(std::string_view text) {
    std::string shape;
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t begin = at;
        if (isDigit(text[at])) {
            while (at < text.size() && isDigit(text[at])) {
                ++at;
            }
            const std::size_t digits = at - begin;
            if (shape.ends_with("d.") && shape.size() > 3 && shape[shape.size() - 3] == ':') {
                shape.pop_back(); // seconds with a fraction are seconds
            } else {
                shape += digits <= 2 ? 'd' : digits == 4 ? 'y' : digits == 8 ? '8' : digits == 14 ? 'E' : 'n';
            }
        } else if (isLetter(text[at])) {
            while (at < text.size() && isLetter(text[at])) {
                ++at;
            }
            shape += at - begin == 1 ? text[begin] : 'a';
        } else {
            shape += text[at++];
        }
    }
    return shape;
}

struct Form {
    std::string format;
    std::string shape;
    std::size_t yearAt; ///< which run of digits is the year of two digits; npos for none

    bool hasMonthName() const {
        return format.find("%b") != std::string::npos || format.find("%B") != std::string::npos;
    }
};

constexpr std::size_t npos = std::string::npos;

// All the forms: dates alone, and dates with times of several lengths behind them. Day before month comes first, since
// most of the world writes so.
const std::vector<Form>& allForms() {
    static const std::vector<Form> forms = [] {
        struct Date {
            const char* format;
            const char* shape;
            std::size_t yearAt;
        };
        static constexpr Date dates[] = {
            {"%Y-%m-%d", "y-d-d", npos}, {"%d.%m.%Y", "d.d.y", npos},   {"%d/%m/%Y", "d/d/y", npos},
            {"%m/%d/%Y", "d/d/y", npos}, {"%d-%m-%Y", "d-d-y", npos},   {"%m-%d-%Y", "d-d-y", npos},
            {"%Y/%m/%d", "y/d/d", npos}, {"%Y.%m.%d", "y.d.d", npos},   {"%Y%m%d", "8", npos},
            {"%d %m %Y", "d d y", npos}, {"%d. %B %Y", "d. a y", npos}, {"%d de %B de %Y", "d a a a y", npos},
            {"%d %b %Y", "d a y", npos}, {"%d %B %Y", "d a y", npos},   {"%d-%b-%Y", "d-a-y", npos},
            {"%d/%b/%Y", "d/a/y", npos}, {"%b %d, %Y", "a d, y", npos}, {"%B %d, %Y", "a d, y", npos},
            {"%b %d %Y", "a d y", npos}, {"%B %d %Y", "a d y", npos},   {"%Y-%j", "y-n", npos},
            {"%d.%m.%y", "d.d.d", 2},    {"%d/%m/%y", "d/d/d", 2},      {"%m/%d/%y", "d/d/d", 2},
            {"%d-%m-%y", "d-d-d", 2},    {"%y-%m-%d", "d-d-d", 0},      {"%d %b %y", "d a d", 1},
            {"%d-%b-%y", "d-a-d", 1},
        };
        using Pair = std::array<const char*, 2>;
        static constexpr Pair times[] = {{"%H:%M:%S", "d:d:d"},
                                         {"%H:%M", "d:d"},
                                         {"%I:%M:%S %p", "d:d:d a"},
                                         {"%I:%M %p", "d:d a"},
                                         {"%I:%M%p", "d:da"}};
        static constexpr Pair offsets[] = {{"", ""},      {"%Ez", "Z"},  {"%Ez", "+d:d"}, {"%Ez", "-d:d"},
                                           {"%Ez", "+y"}, {"%Ez", "-y"}, {" %Ez", " +y"}, {" %Ez", " -y"}};
        std::vector<Form> all;
        const auto addTimes = [&](const std::string& format, const std::string& shape, std::size_t yearAt) {
            for (const auto& time : times) {
                for (const auto& offset : offsets) {
                    all.push_back({format + time[0] + offset[0], shape + time[1] + offset[1], yearAt});
                }
            }
        };
        for (const Date& date : dates) {
            all.push_back({date.format, date.shape, date.yearAt});
        }
        all.push_back({"%Y%m%d%H%M%S", "E", npos});
        for (const Date& date : dates) {
            addTimes(std::string(date.format) + " ", std::string(date.shape) + " ", date.yearAt);
            addTimes(std::string(date.format) + "T", std::string(date.shape) + "T", date.yearAt);
        }
        addTimes("", "", npos);
        return all;
    }();
    return forms;
}

// The forms of each shape, by their places in the list.
const std::vector<std::size_t>& formsOf(const std::string& shape) {
    static const std::map<std::string, std::vector<std::size_t>> byShape = [] {
        std::map<std::string, std::vector<std::size_t>> table;
        for (std::size_t i = 0; i < allForms().size(); ++i) {
            table[allForms()[i].shape].push_back(i);
        }
        return table;
    }();
    static const std::vector<std::size_t> none;
    const auto found = byShape.find(shape);
    return found == byShape.end() ? none : found->second;
}

// With "20" in front of the year of two digits, which is the given run of digits.
std::optional<std::string> withCentury(std::string_view cell, std::size_t yearAt) {
    std::size_t run = 0;
    for (std::size_t at = 0; at < cell.size(); ++at) {
        if (!isDigit(cell[at]) || (at > 0 && isDigit(cell[at - 1]))) {
            continue;
        }
        if (run++ == yearAt) {
            const bool isPair = at + 1 < cell.size() && isDigit(cell[at + 1]);
            return isPair ? std::optional(std::string(cell).insert(at, "20")) : std::nullopt;
        }
    }
    return std::nullopt;
}

bool reads(const Form& form, std::string_view cell) {
    std::string value(cell);
    std::string format = form.format + "$";
    if (form.yearAt != npos) {
        const std::optional<std::string> whole = withCentury(cell, form.yearAt);
        if (!whole) {
            return false;
        }
        value = *whole;
        format[format.find("%y") + 1] = 'Y';
    }
    using kvt::ex::datetime::ReturnState;
    return std::get<0>(kvt::ex::datetime::parse(UString<0>(value.data(), value.size()),
                                                UString<0>(format.data(), format.size()), false)) ==
           ReturnState::Success;
}

} // namespace

// The forms that read the cell with a month of another language in place of the given word. Short names and long ones are
// read by %B as well as by %b, of which one is enough.
void DateGuess::addReaders(std::string_view cell, std::size_t word, std::size_t length, Readers& readers) {
    for (const MonthMeaning& meaning : monthsOfWord(cell.substr(word, length))) {
        const auto inEnglish = [&](std::size_t letters) {
            return std::string(cell).replace(word, length, englishMonth(meaning.month).substr(0, letters));
        };
        const std::string whole = inEnglish(npos);
        const std::string brief = inEnglish(3);
        bool isRead = false;
        for (const std::size_t form : formsOf(shapeOf(whole))) {
            const bool takesWhole = allForms()[form].format.find("%B") != std::string::npos;
            if (!allForms()[form].hasMonthName() || isRead ||
                !reads(allForms()[form], takesWhole ? whole : brief)) {
                continue;
            }
            isRead = true;
            for (std::size_t language = 0; language < monthLanguages().size(); ++language) {
                if ((meaning.languages >> language & 1U) != 0) {
                    readers.push_back({form, language + 1});
                }
            }
        }
    }
}

bool DateGuess::add(std::string_view cell) {
    constexpr std::size_t longest = 48;
    if (cell.size() > longest) {
        return false;
    }
    Readers readers;
    for (const std::size_t form : formsOf(shapeOf(cell))) {
        if (reads(allForms()[form], cell)) {
            readers.push_back({form, 0});
        }
    }
    const auto isLetterByte = [](char byte) { return isLetter(byte) || !isAscii(byte); };
    const bool hasDigit = std::any_of(cell.begin(), cell.end(), isDigit);
    for (std::size_t at = 0; hasDigit && at < cell.size(); ++at) {
        const std::size_t begin = at;
        while (at < cell.size() && isLetterByte(cell[at])) {
            ++at;
        }
        if (at - begin < 3) {
            continue;
        }
        addReaders(cell, begin, at - begin, readers);
        if (at < cell.size() && cell[at] == '.') {
            addReaders(cell, begin, at + 1 - begin, readers);
        }
    }
    if (readers.empty()) {
        return false;
    }
    Seen& seen = seen_[readers];
    if (++seen.cells == 1) {
        seen.example = cell;
    }
    return true;
}

bool DateGuess::isIn(const Reader& reader, std::size_t language) {
    return reader.language == language || !allForms()[reader.form].hasMonthName();
}

bool DateGuess::isReadIn(const Readers& readers, std::size_t language) {
    return std::any_of(readers.begin(), readers.end(),
                       [&](const Reader& reader) { return isIn(reader, language); });
}

std::uint64_t DateGuess::cellsIn(std::size_t language) const {
    std::uint64_t count = 0;
    for (const auto& [readers, seen] : seen_) {
        count += isReadIn(readers, language) ? seen.cells : 0;
    }
    return count;
}

// That in which most cells are read, the first one of equals.
std::size_t DateGuess::language() const {
    std::size_t best = 0;
    std::uint64_t most = cellsIn(0);
    for (std::size_t language = 1; language <= monthLanguages().size(); ++language) {
        if (const std::uint64_t count = cellsIn(language); count > most) {
            most = count;
            best = language;
        }
    }
    return best;
}

std::vector<std::string> DateGuess::months() const {
    std::vector<std::string> found;
    const std::size_t best = language();
    for (std::size_t language = best; best != 0 && language <= monthLanguages().size(); ++language) {
        if (cellsIn(language) == cellsIn(best)) {
            found.push_back(monthLanguages()[language - 1]);
        }
    }
    return found;
}

std::string DateGuess::exampleOfOthers() const {
    for (const auto& [readers, seen] : seen_) {
        if (!isReadIn(readers, language())) {
            return seen.example;
        }
    }
    return {};
}

// The form that reads most of the cells, then the one that reads most of those that are left, and so on.
std::vector<DateForm> DateGuess::forms() const {
    std::vector<DateForm> found;
    std::map<Readers, Seen> left;
    for (const auto& [readers, seen] : seen_) {
        Readers those;
        std::copy_if(readers.begin(), readers.end(), std::back_inserter(those),
                     [best = language()](const Reader& reader) { return isIn(reader, best); });
        if (!those.empty()) {
            Seen& all = left[those];
            all.cells += seen.cells;
            all.example = all.example.empty() ? seen.example : all.example;
        }
    }
    while (!left.empty()) {
        std::map<std::size_t, std::uint64_t> counts;
        for (const auto& [readers, seen] : left) {
            for (const Reader& reader : readers) {
                counts[reader.form] += seen.cells;
            }
        }
        const auto best =
            *std::max_element(counts.begin(), counts.end(), [](const auto& one, const auto& other) {
                return one.second < other.second; // the first one of equals
            });
        DateForm form{allForms()[best.first].format, best.second, "", ""};
        for (const auto& [place, count] : counts) {
            const bool readsTheSame = place != best.first && count == best.second;
            if (readsTheSame && allForms()[place].shape == allForms()[best.first].shape) {
                form.alternative = allForms()[place].format;
                break;
            }
        }
        for (auto it = left.begin(); it != left.end();) {
            const bool isRead = std::any_of(it->first.begin(), it->first.end(),
                                            [&](const Reader& reader) { return reader.form == best.first; });
            form.example = isRead && form.example.empty() ? it->second.example : form.example;
            it = isRead ? left.erase(it) : std::next(it);
        }
        // One format stands in the list once for each shape of an offset.
        const auto same = std::find_if(found.begin(), found.end(),
                                       [&](const DateForm& other) { return other.format == form.format; });
        if (same == found.end()) {
            found.push_back(std::move(form));
        } else {
            same->cells += form.cells;
        }
    }
    return found;
}

} // namespace host
