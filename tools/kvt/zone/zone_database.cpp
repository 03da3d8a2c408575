#include "zone/zone_database.h"

#include "base/text_units.h"

#include <kvt/datetime/zone_folder.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <chrono>
#include <cstdint>
#include <span>
#include <utility>
#include <vector>

namespace host {

namespace {

using Words = std::vector<std::string_view>;

constexpr std::array<std::string_view, 12> monthNames = {"January",   "February", "March",    "April",
                                                         "May",       "June",     "July",     "August",
                                                         "September", "October",  "November", "December"};
constexpr std::array<std::string_view, 7> weekdayNames = {"Sunday",   "Monday", "Tuesday", "Wednesday",
                                                          "Thursday", "Friday", "Saturday"};
constexpr std::size_t nameLength = 3; // of months and weekdays, in what is written

// What the library's reader opens. Where the first part of a zone's name is none of these, `etcetera` takes it.
constexpr std::array<std::string_view, 12> fileNames = {
    "africa", "antarctica",  "asia",         "australasia",  "backward", "etcetera",
    "europe", "leapseconds", "northamerica", "southamerica", "systemv",  "pacificnew"};
constexpr std::pair<std::string_view, std::string_view> folders[] = {
    {"Africa/", "africa"},
    {"America/", "northamerica"},
    {"Antarctica/", "antarctica"},
    {"Arctic/", "europe"},
    {"Asia/", "asia"},
    {"Atlantic/", "europe"},
    {"Europe/", "europe"},
    {"Australia/", "australasia"},
    {"Indian/", "asia"},
    {"Pacific/", "australasia"},
};

std::string fileOf(std::string_view zone) {
    for (const auto& [folder, file] : folders) {
        if (zone.starts_with(folder)) {
            return std::string(file);
        }
    }
    return "etcetera";
}

// Whether `word` is the beginning of `name` or all of it, in any case.
bool abbreviates(std::string_view word, std::string_view name) {
    if (word.empty() || word.size() > name.size()) {
        return false;
    }
    for (std::size_t i = 0; i < word.size(); ++i) {
        if (asciiLower(word[i]) != asciiLower(name[i])) {
            return false;
        }
    }
    return true;
}

std::string quoted(std::string_view text) {
    return std::string("\"").append(text).append("\"");
}

std::string joined(std::span<const std::string> fields) {
    std::string line;
    for (const std::string& field : fields) {
        line += line.empty() ? field : "\t" + field;
    }
    return line;
}

struct Rule {
    std::string lines;
    std::vector<std::string> origins;
};

class Writer {
public:
    ZoneDatabase run(std::string_view zoneinfo, std::string_view leapSeconds) {
        for (const std::string_view name : fileNames) {
            database_.files[std::string(name)];
        }
        database_.version = versionOf(zoneinfo);
        database_.files["version"] = database_.version + "\n";
        forEachLine(zoneinfo, [this](const Words& words) { take(words); });
        if (zoneContinues_) {
            fail("the last zone is cut off");
        }
        placeRules();
        source_ = "leap seconds, ";
        forEachLine(leapSeconds, [this](const Words& words) { takeLeapSecond(words); });
        database_.files["kvt-checksums"] = kvt::ex::datetime::zoneChecksums(database_.files);
        return std::move(database_);
    }

private:
    [[noreturn]] void fail(const std::string& why) const { throw ZoneDatabaseError(here() + ": " + why); }

    std::string here() const { return source_ + "line " + std::to_string(line_); }

    void addLine(const std::string& file, const std::string& line) {
        database_.files[file] += line + "\n";
        database_.origins[file].push_back(here());
    }

    // The first line says it in a comment.
    static std::string versionOf(std::string_view zoneinfo) {
        constexpr std::string_view mark = "# version ";
        if (!zoneinfo.starts_with(mark)) {
            return "unknown";
        }
        const std::string_view rest = zoneinfo.substr(mark.size());
        return std::string(rest.substr(0, rest.find_first_of(" \t\r\n")));
    }

    // Calls `take` with the words of each line that has any, comments gone.
    template <typename Take>
    void forEachLine(std::string_view text, Take take) {
        line_ = 0;
        while (!text.empty()) {
            ++line_;
            const std::size_t end = std::min(text.find('\n'), text.size());
            const Words words = split(text.substr(0, end));
            text.remove_prefix(std::min(end + 1, text.size()));
            if (!words.empty()) {
                take(words);
            }
        }
    }

    Words split(std::string_view line) const {
        line = line.substr(0, line.find('#'));
        Words words;
        constexpr std::string_view blanks = " \t\r\f\v";
        while (true) {
            const std::size_t begin = std::min(line.find_first_not_of(blanks), line.size());
            line.remove_prefix(begin);
            if (line.empty()) {
                return words;
            }
            const std::size_t end = std::min(line.find_first_of(blanks), line.size());
            words.push_back(line.substr(0, end));
            line.remove_prefix(end);
            if (words.back().find('"') != std::string_view::npos) {
                fail("quoted words are not understood");
            }
        }
    }

    void take(const Words& words) {
        if (zoneContinues_) {
            takeZoneLine("\t\t", words, 0);
        } else if (abbreviates(words[0], "Rule")) {
            takeRule(words);
        } else if (abbreviates(words[0], "Zone")) {
            takeZone(words);
        } else if (abbreviates(words[0], "Link")) {
            takeLink(words);
        } else {
            fail(quoted(words[0]) + " is neither Rule, Zone nor Link");
        }
    }

    // Rule NAME FROM TO - IN ON AT SAVE LETTER
    void takeRule(const Words& words) {
        if (words.size() != 10) {
            fail("a rule has ten fields");
        }
        const std::array<std::string, 10> fields = {"Rule",
                                                    std::string(words[1]),
                                                    year(words[2]),
                                                    year(words[3]),
                                                    "-",
                                                    month(words[5]),
                                                    day(words[6]),
                                                    timeOfDay(words[7]),
                                                    amount(words[8]),
                                                    std::string(words[9])};
        Rule& rule = rules_[std::string(words[1])];
        rule.lines += joined(fields) + "\n";
        rule.origins.push_back(here());
        ++database_.rules;
    }

    // Zone NAME, then what each line of a zone has
    void takeZone(const Words& words) {
        if (words.size() < 2) {
            fail("a zone has a name");
        }
        file_ = fileOf(words[1]);
        takeZoneLine("Zone\t" + std::string(words[1]), words, 2);
        ++database_.zones;
    }

    // STDOFF RULES FORMAT [YEAR [MONTH [DAY [TIME]]]]: with an end, the zone goes on in the next line.
    void takeZoneLine(const std::string& head, const Words& words, std::size_t first) {
        const std::size_t count = words.size() - first;
        if (words.size() < first || count < 3 || count > 7) {
            fail("a line of a zone has three to seven fields");
        }
        std::vector<std::string> fields = {head};
        for (std::size_t i = 0; i < count; ++i) {
            const std::string_view word = words[first + i];
            switch (i) {
            case 4:
                fields.push_back(month(word));
                break;
            case 5:
                fields.push_back(day(word));
                break;
            case 6:
                fields.push_back(timeOfDay(word));
                break;
            default:
                fields.emplace_back(word);
                break;
            }
        }
        fileOfRules_.try_emplace(fields[2], file_);
        addLine(file_, joined(fields));
        zoneContinues_ = count > 3;
    }

    // Link TARGET NAME
    void takeLink(const Words& words) {
        if (words.size() != 3) {
            fail("a link has three fields");
        }
        const std::array<std::string, 3> fields = {"Link", std::string(words[1]), std::string(words[2])};
        addLine("backward", joined(fields));
        ++database_.links;
    }

    void placeRules() {
        for (const auto& [name, rule] : rules_) {
            const auto found = fileOfRules_.find(name);
            const std::string file = found != fileOfRules_.end() ? found->second : "etcetera";
            database_.files[file].insert(0, rule.lines);
            std::vector<std::string>& origins = database_.origins[file];
            origins.insert(origins.begin(), rule.origins.begin(), rule.origins.end());
        }
    }

    // Leap YEAR MONTH DAY HH:MM:SS CORRECTION ROLL, or seconds since 1900 and the difference to atomic time.
    void takeLeapSecond(const Words& words) {
        if (words[0] == "Leap" || words[0] == "L") {
            if (words.size() != 7) {
                fail("a leap second has seven fields");
            }
            const std::array<std::string, 7> fields = {"Leap",
                                                       std::string(words[1]),
                                                       month(words[2]),
                                                       std::string(words[3]),
                                                       std::string(words[4]),
                                                       std::string(words[5]),
                                                       std::string(words[6].substr(0, 1))};
            addLeapSecond(joined(fields));
        } else if (words[0].find_first_not_of("0123456789") == std::string_view::npos && words.size() >= 2) {
            takeAtomicDifference(number(words[0]), number(words[1]));
        } else if (!abbreviates(words[0], "Expires")) {
            fail(quoted(words[0]) + " is no leap second");
        }
    }

    // From that moment on the difference is so much; the leap second is the one before.
    void takeAtomicDifference(std::int64_t secondsSince1900, std::int64_t difference) {
        const std::int64_t before = difference_;
        difference_ = difference;
        if (before == 0) {
            return; // the first difference is where the scale begins
        }
        constexpr std::int64_t from1900To1970 = 2'208'988'800;
        using namespace std::chrono;
        const sys_seconds moment{seconds(secondsSince1900 - from1900To1970)};
        const year_month_day date{floor<days>(moment - seconds(1))};
        const bool added = difference > before;
        const std::array<std::string, 7> fields = {"Leap",
                                                   std::to_string(static_cast<int>(date.year())),
                                                   shortMonth(static_cast<unsigned>(date.month()) - 1),
                                                   std::to_string(static_cast<unsigned>(date.day())),
                                                   added ? "23:59:60" : "23:59:59",
                                                   added ? "+" : "-",
                                                   "S"};
        addLeapSecond(joined(fields));
    }

    void addLeapSecond(const std::string& line) {
        addLine("leapseconds", line);
        ++database_.leapSeconds;
    }

    std::int64_t number(std::string_view digits) const {
        std::int64_t value = 0;
        const char* end = digits.data() + digits.size();
        const auto [stop, error] = std::from_chars(digits.data(), end, value);
        if (error != std::errc() || stop != end) {
            fail(quoted(digits) + " is no number");
        }
        return value;
    }

    std::string year(std::string_view word) const {
        if (abbreviates(word, "only") || abbreviates(word, "maximum") || abbreviates(word, "minimum")) {
            if (word.size() == 1 && asciiLower(word[0]) == 'm') {
                fail("\"m\" may be minimum or maximum");
            }
            return abbreviates(word, "only") ? "only" : abbreviates(word, "maximum") ? "max" : "min";
        }
        return std::to_string(number(word));
    }

    static std::string shortMonth(std::size_t index) {
        return std::string(monthNames[index].substr(0, nameLength));
    }

    std::string month(std::string_view word) const { return shortName(monthNames, word, "month"); }

    template <std::size_t N>
    std::string shortName(const std::array<std::string_view, N>& names, std::string_view word,
                          const std::string& kind) const {
        std::string found;
        for (const std::string_view name : names) {
            if (abbreviates(word, name)) {
                if (!found.empty()) {
                    fail(quoted(word) + " may be more than one " + kind);
                }
                found = name.substr(0, nameLength);
            }
        }
        if (found.empty()) {
            fail(quoted(word) + " is no " + kind);
        }
        return found;
    }

    // 5, lastSun, Sun>=8 or Sun<=25
    std::string day(std::string_view word) const {
        constexpr std::string_view last = "last";
        if (word.starts_with(last)) {
            return "last" + shortName(weekdayNames, word.substr(last.size()), "weekday");
        }
        const std::size_t relation = word.find_first_of("<>");
        if (relation == std::string_view::npos) {
            return std::to_string(number(word));
        }
        const std::string_view sign = word.substr(relation, 2);
        if (sign != ">=" && sign != "<=") {
            fail(quoted(word) + " is no day");
        }
        return shortName(weekdayNames, word.substr(0, relation), "weekday") + std::string(sign) +
               std::to_string(number(word.substr(relation + 2)));
    }

    // The letter says whose clock: "s" standard time, "u" UTC, for which "g" and "z" are other names, and "w" the wall
    // clock, which goes without saying.
    static std::string timeOfDay(std::string_view word) {
        std::string text(word == "-" ? "0" : word);
        switch (asciiLower(text.back())) {
        case 'w':
            text.pop_back();
            break;
        case 'g':
        case 'z':
            text.back() = 'u';
            break;
        default:
            break;
        }
        return text;
    }

    // Without the letter that marks standard or summer time, on which no offset depends.
    static std::string amount(std::string_view word) {
        const char last = word.back();
        return std::string(last == 's' || last == 'd' ? word.substr(0, word.size() - 1) : word);
    }

    ZoneDatabase database_;
    std::map<std::string, Rule> rules_;              ///< by name
    std::map<std::string, std::string> fileOfRules_; ///< the file of the first zone that follows them
    std::string file_;                               ///< of the zone in hand
    bool zoneContinues_ = false;
    std::string source_;
    std::size_t line_ = 0;
    std::int64_t difference_ = 0;
};

} // namespace

ZoneDatabase makeZoneDatabase(std::string_view zoneinfo, std::string_view leapSeconds) {
    return Writer().run(zoneinfo, leapSeconds);
}

void requireGood(const ZoneDatabase& database) {
    const auto fault = kvt::ex::datetime::zoneFilesFault(database.files);
    if (!fault) {
        return;
    }
    const bool isLine = fault->line != 0;
    throw ZoneDatabaseError((isLine ? database.origins.at(fault->file).at(fault->line - 1) + ": " : "") +
                            fault->reason);
}

} // namespace host
