// parse() against the slow second reading in tests/reference, on a million generated pairs of value and format: formats
// of all flags, fuzzy parts and literals, complete and not; values that are written by the format and then, half of
// them, damaged.

#include "pattern_rows.h"

#include <reference/pattern_reference.h>

#include <map>
#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::PatternAnswer;
using kvt::test::ustring;

class Generator {
public:
    explicit Generator(unsigned seed) : random_(seed) {}

    std::size_t below(std::size_t bound) { return random_() % bound; }
    bool chance(std::size_t in) { return below(in) == 0; }

    template <typename T, std::size_t N>
    const T& pick(const T (&table)[N]) {
        return table[below(N)];
    }

    /// A format in elements, so that a value can be written by it.
    std::vector<std::string> format() {
        std::vector<std::string> elements;
        if (!chance(4)) {
            elements = complete();
            for (std::size_t changes = below(3); changes > 0; --changes) {
                const auto at = elements.begin() + static_cast<std::ptrdiff_t>(below(elements.size() + 1));
                if (chance(2) || at == elements.end()) {
                    elements.insert(at, element());
                } else {
                    elements.erase(at);
                }
            }
        } else {
            for (std::size_t count = 1 + below(6); count > 0; --count) {
                elements.push_back(element());
            }
        }
        if (chance(3)) {
            elements.push_back("$");
        }
        return elements;
    }

    /// What an element could have been read from.
    std::string rendered(const std::string& element) {
        if (element.front() == '*') {
            return word() + (element.size() > 2 && element[1] == '%' ? element.substr(2) : element.substr(1));
        }
        if (element == "?") {
            return std::string(1, static_cast<char>('!' + below(90)));
        }
        if (element == "$") {
            return "";
        }
        if (element.front() != '%' || element.size() == 1) {
            return element;
        }
        switch (element[1]) {
        case 'Y':
            return chance(20) ? number(below(12000), 1) : chance(6) ? "9999" : number(1000 + below(9000), 4);
        case 'm':
        case 'N':
            return padded(chance(20) ? below(100) : 1 + below(12), 2);
        case 'd':
        case 'e':
            return padded(chance(20) ? below(100) : 1 + below(31), 2);
        case 'j':
            return padded(chance(20) ? below(1000) : chance(4) ? 364 + below(4) : 1 + below(366), 3);
        case 'H':
        case 'k':
            return padded(chance(20) ? below(100) : below(24), 2);
        case 'I':
        case 'l':
            return padded(chance(20) ? below(100) : 1 + below(12), 2);
        case 'M':
            return padded(chance(20) ? below(100) : below(60), 2);
        case 'S':
            return padded(chance(20) ? below(100) : below(60), 2) + fraction();
        case 'T':
            return rendered("%H") + ":" + rendered("%M") + ":" + rendered("%S");
        case 'b':
            return monthName().substr(0, 3);
        case 'B':
            return monthName();
        case 'p':
            return pick({"am", "pm", "AM", "Pm", "aM"});
        case 's':
            return epoch();
        case 'z':
            return offset();
        case 'E':
            return element == "%Es" ? epoch() : element == "%Ez" ? offset() : "1";
        default:
            return element.substr(1);
        }
    }

    std::string damaged(std::string value) {
        constexpr std::string_view characters = "0123456789019+-:.Z %$*?TaAmMpPjJxyz\t/";
        for (std::size_t changes = 1 + below(3); changes > 0; --changes) {
            const std::size_t at = below(value.size() + 1);
            if (chance(3)) {
                value.insert(at, 1, characters[below(characters.size())]);
            } else if (at < value.size() && chance(2)) {
                value[at] = characters[below(characters.size())];
            } else {
                value.erase(at, 1 + below(2));
            }
        }
        return value;
    }

private:
    template <std::size_t N>
    std::string pick(const char* const (&table)[N]) {
        return table[below(N)];
    }

    std::vector<std::string> complete() {
        static const std::vector<std::vector<std::string>> formats = {
            {"%Y", "-", "%m", "-", "%d"},
            {"%Y", "%m", "%d"},
            {"%Y", "%m", "%d", "%H", "%M", "%S"},
            {"%Y", "-", "%m", "-", "%d", "T", "%H", ":", "%M", ":", "%S", "%Ez"},
            {"%Y", "-", "%N", "-", "%e", " ", "%T"},
            {"%d", " ", "%b", " ", "%Y", " ", "%T", " ", "%z"},
            {"%d", " ", "%B", " ", "%Y"},
            {"%b", "%d", "%Y", " ", "%I", ":", "%M", " ", "%p"},
            {"%Y", "-", "%j"},
            {"%Y", "%j", " ", "%k", ":", "%M"},
            {"%T"},
            {"%H", ":", "%M"},
            {"%l", " ", "%p"},
            {"%T", "%z"},
            {"%s"},
            {"%Es"},
            {"%s", ",", "%Ez"},
            {"*", " ", "%Y", "?", "%m", "?", "%d"},
            {"*, ", "%d", "*th ", "%B", " ", "%Y"},
            {"%H", "*%%", " ", "%M"},
            {"%Y", "%m", "%d", " ", "%k"},
            {"%H", "%%", "z"},
            {"%T", " ", "%T"},
        };
        return formats[below(formats.size())];
    }

    std::string element() {
        if (chance(30)) {
            return pick({"%q", "%E", "%Ex", "%", "%y", "%a", "%U", "%Ed"});
        }
        return pick({"%Y", "%m", "%N",  "%d", "%e", "%j",   "%H",   "%k",  "%I",  "%l", "%M",
                     "%S", "%T", "%b",  "%B", "%p", "%s",   "%Es",  "%z",  "%Ez", "%%", "%$",
                     "%*", "%?", "*",   "?",  "$",  "-",    ":",    ".",   "T",   " ",  "/",
                     "z",  "E",  "*T ", "* ", "**", "*%% ", "*%*x", "*x",  "*%H", "5",  " ",
                     "-",  "%m", "%d",  "%Y", "%H", "%M",   "%S",   "%%H", "%%Ez"});
    }

    std::string word() {
        std::string text;
        for (std::size_t count = below(4); count > 0; --count) {
            text += static_cast<char>('a' + below(26));
        }
        return text;
    }
    static std::string number(std::size_t value, std::size_t width) {
        std::string text = std::to_string(value);
        return text.size() < width ? std::string(width - text.size(), '0') + text : text;
    }
    std::string padded(std::size_t value, std::size_t width) { return number(value, chance(4) ? 1 : width); }
    std::string fraction() {
        if (!chance(3)) {
            return "";
        }
        if (chance(10)) {
            return "." + std::string(below(14), '9');
        }
        return "." + number(below(1000000000), 9).substr(0, below(10)) + std::string(below(3), '0');
    }
    std::string epoch() {
        const std::string sign = chance(3) ? "-" : "";
        if (chance(8)) {
            return sign +
                   pick({"30610224000", "30610224001", "253402300799", "253402300800", "0", "1234567890123",
                         "30610223999"}) +
                   fraction();
        }
        return sign + std::to_string(random_() % (chance(2) ? 30610224000 : 100000)) + fraction();
    }
    std::string offset() {
        if (chance(3)) {
            return "Z";
        }
        const std::string hours = number(chance(10) ? below(100) : below(15), 2);
        const std::string minutes = number(chance(10) ? below(100) : below(60), 2);
        return pick({"+", "-"}) + hours + pick({"", ":", ":"}) + (chance(5) ? "" : minutes);
    }
    std::string monthName() {
        return pick({"January", "FEBRUARY", "march", "April", "May", "June", "July", "August", "sEPTEMBER",
                     "October", "November", "December", "Septembre"});
    }

    std::mt19937_64 random_;
};

PatternAnswer answerOfEngine(const std::string& value, const std::string& format, bool lenient) {
    const TextResult result = parse(ustring(value), ustring(format), lenient);
    PatternAnswer answer;
    answer.success = std::get<0>(result) == ReturnState::Success;
    answer.text = std::get<1>(result).toStdString();
    if (const auto& message = std::get<2>(result)) {
        answer.message = message->messageNumber;
        for (const auto& parameter : message->parameters) {
            answer.parameters.push_back(parameter.toStdString());
        }
    }
    return answer;
}

std::string lineOf(const PatternAnswer& answer) {
    std::string line = (answer.success ? "[" : "no [") + answer.text + "] " + std::to_string(answer.message);
    for (const std::string& parameter : answer.parameters) {
        line += " {" + parameter + "}";
    }
    return line;
}

std::string trimmed(const std::string& text) {
    constexpr const char* blanks = " \t";
    const std::size_t first = text.find_first_not_of(blanks);
    return first == std::string::npos ? "" : text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

class PatternAgreement : public testing::TestWithParam<unsigned> {};

TEST_P(PatternAgreement, WithTheSecondReading) {
    constexpr int pairs = 125'000; // in each of eight
    Generator generator(20260129 + GetParam());
    std::map<std::uint32_t, int> seen; // how often each message came, 0 for none
    for (int done = 0; done < pairs;) {
        std::string format;
        std::string value;
        for (const std::string& element : generator.format()) {
            format += element;
            value += generator.rendered(element);
        }
        value = trimmed(generator.chance(2) ? value : generator.damaged(value));
        format = trimmed(format);
        if (value.empty() || format.find('%') == std::string::npos) {
            continue;
        }
        ++done;
        const bool lenient = generator.chance(2);
        const PatternAnswer expected = kvt::test::referenceParse(value, format, lenient);
        const PatternAnswer actual = answerOfEngine(value, format, lenient);
        ASSERT_EQ(lineOf(actual), lineOf(expected))
            << "[" << value << "] by [" << format << "]" << (lenient ? " lenient" : "");
        ASSERT_EQ(actual, expected);
        ++seen[actual.message];
    }
    // The generator has to meet everything, or the agreement is worth little.
    EXPECT_GT(seen[0], pairs / 5);
    for (const std::uint32_t message : {933067u, 933079u, 933081u, 933082u, 933083u, 933085u, 933086u,
                                        933087u, 933088u, 933089u, 933090u, 933091u, 933093u}) {
        EXPECT_GT(seen[message], 5) << message;
    }
}

INSTANTIATE_TEST_SUITE_P(Shards, PatternAgreement, testing::Range(0u, 8u));

} // namespace
