// Zone files against the system's zone compiler. What the look at a folder finds good, the compiler takes, and both give
// the same offset before, at and after each change; what it refuses, the compiler refuses too, or the look is
// stricter on purpose.
//
// Input: bytes that choose the words of a few rules and of a zone; a last one for damage, and what is put in then. Two in
// three inputs are not damaged, since a file with a word of noise in it is seldom one.
#include <zone_fuzzing.h>

#include <reference/zone_reference.h>

#include <cctype>
#include <chrono>
#include <sstream>
#include <string>
#include <vector>

using namespace kvt::fuzz;
using kvt::ex::datetime::ZoneFiles;
using kvt::test::CompiledZone;

namespace {

constexpr const char* zoneName = "Test/Zone";

// ---- The text

constexpr const char* ruleNames[] = {"A", "B", "C-Eur", "a_b"};
constexpr const char* months[] = {"Jan", "Feb", "Mar", "Apr", "May", "Jun",
                                  "Jul", "Aug", "Sep", "Oct", "Nov", "Dec"};
constexpr const char* days[] = {"1",       "2",       "8",       "15",      "28",      "29",
                                "30",      "31",      "lastSun", "lastMon", "Sun>=1",  "Sun>=8",
                                "Fri>=15", "Sun>=25", "Thu>=29", "Sat<=7",  "Sun<=25", "Fri<=1",
                                "last",    "Sun=>1",  "sun>=1",  "0",       "32",      "lastsunday"};
constexpr const char* times[] = {"0",        "0:00",     "1",      "2:00",  "2:00s",  "1:00u",
                                 "23:59:59", "24:00",    "24:00s", "24u",   "25:00",  "26:00w",
                                 "0:00:01",  "3:20:07s", "-1",     "-2:00", "48",     "-2:30",
                                 "-",        "2:60",     "2:00g",  "1:00z", "2:00.5", "168"};
constexpr const char* savings[] = {"0",    "1:00", "0",    "1", "0:30",    "2:00", "0",     "-1:00",
                                   "0:20", "1:30", "0:40", "-", "0:00:30", "3:00", "-0:30", "1:00s"};
constexpr const char* letters[] = {"-", "S", "D", "DD", "+01"};
constexpr const char* offsets[] = {"0",  "1:00",  "-5:00",  "5:30", "0:53:28",  "-15:13:42",
                                   "12", "14:00", "-0",     "+3",   "-0:44:30", "9:59:59",
                                   "23", "24:00", "-24:00", "25:00"};
constexpr const char* formats[] = {"A%sT", "LMT", "A/B", "%z", "%s", "-00"};

std::string yearFrom(Input& input) {
    return std::to_string(1900 + input.byte() % 137);
}

std::string ruleFrom(Input& input) {
    const std::string from = input.byte() % 16 == 0 ? "min" : yearFrom(input);
    const unsigned kind = input.byte();
    const std::string to = kind % 4 == 0 ? "max"
                           : kind % 4 == 1
                               ? std::to_string(std::atoi(from.c_str()) + static_cast<int>(kind / 4))
                               : "only";
    std::string line = "Rule\t";
    for (const std::string& word :
         {std::string(input.pick(ruleNames)), from, to, std::string("-"), std::string(input.pick(months)),
          std::string(input.pick(days)), std::string(input.pick(times)), std::string(input.pick(savings))}) {
        line += word + '\t';
    }
    return line + input.pick(letters) + '\n';
}

std::string spanFrom(Input& input, bool hasUntil) {
    std::string line = input.pick(offsets);
    const unsigned rule = input.byte();
    line += std::string("\t") + (rule % 4 == 0   ? "-"
                                 : rule % 8 == 1 ? input.pick(savings)
                                                 : ruleNames[rule % std::size(ruleNames)]);
    line += std::string("\t") + input.pick(formats);
    if (hasUntil) {
        line += "\t" + yearFrom(input);
        const unsigned words = input.byte() % 4;
        line += words > 0 ? std::string(" ") + input.pick(months) : "";
        line += words > 1 ? std::string(" ") + input.pick(days) : "";
        line += words > 2 ? std::string(" ") + input.pick(times) : "";
    }
    return line + '\n';
}

std::string textFrom(Input& input) {
    std::string text;
    for (unsigned rules = input.byte() % 12; rules > 0; --rules) {
        text += ruleFrom(input);
    }
    text += std::string("Zone\t") + zoneName + "\t";
    for (unsigned spans = input.byte() % 4; spans > 0; --spans) {
        text += spanFrom(input, true) + "\t\t\t";
    }
    text += spanFrom(input, false);
    if (input.byte() % 4 == 0) {
        text += std::string("Link\t") + zoneName + "\tTest/Link\n";
    }
    if (input.byte() % 3 == 1) {
        const std::size_t at = (input.byte() << 8 | input.byte()) % (text.size() + 1);
        text.erase(at, input.byte() % 4);
        text.insert(std::min(at, text.size()), input.rest().substr(0, 16));
    }
    return text;
}

// ---- What may differ

bool holdsOneOf(std::string_view text, const std::vector<const char*>& parts) {
    return std::any_of(parts.begin(), parts.end(),
                       [&](const char* part) { return text.find(part) != std::string_view::npos; });
}

// What the look is stricter in: forms of a word that the compiler takes and the `date` library would read as something
// else, and what that library takes on trust.
bool isStricter(const std::string& reason) {
    return holdsOneOf(reason, {"a word has the byte",
                               "stands within a word",
                               "quoted words",
                               "a line of blanks",
                               "is not a year",
                               "is not a month",
                               "is not a day",
                               "is not a time",
                               "misread",
                               "is not a length of time",
                               "is not a saving",
                               "UNTIL is not after",
                               "two lines for one day",
                               "days change places",
                               "name the same day",
                               "less than two days apart",
                               "has no standard time",
                               "has too many lines",
                               "leads elsewhere",
                               "ends within a line",
                               "begins neither",
                               "stands where a",
                               "there is no zone"});
}

// What the compiler refuses and nobody here reads: abbreviations.
bool isHarmless(const std::string& printed) {
    return holdsOneOf(printed, {"invalid abbreviation format", "%s in ruleless zone",
                                "can't determine time zone abbreviation", "time zone abbreviations"});
}

// What the compiler of today gets wrong, and nobody writes: rules of the year "min" alone, and a zone of several lines
// that follows rules from its first line on.
bool isMiscompiled(std::string_view text) {
    if (text.find("\tmin\t") != std::string_view::npos) {
        return true;
    }
    std::string_view line = text.substr(std::min(text.find("Zone"), text.size()));
    const std::size_t end = std::min(line.find('\n'), line.size());
    const bool goesOn = line.substr(end).starts_with("\n\t");
    std::istringstream words{std::string(line.substr(0, end))};
    std::string word;
    words >> word >> word >> word >> word;
    return goesOn && !word.empty() && std::isalpha(static_cast<unsigned char>(word.front())) != 0;
}

void requireSameOffsets(const date::time_zone& zone, const CompiledZone& compiled, const std::string& text) {
    const auto requireSame = [&](std::int64_t moment) {
        const auto offset = zone.get_info(date::sys_seconds(std::chrono::seconds(moment))).offset.count();
        requireEqual(offset, compiled.offsetAt(moment), "the offset at ", moment, " of\n", text);
    };
    constexpr std::int64_t yearOf2037 = 2114380800;
    // Not all of them, as each is found by going through all changes from the first on.
    const std::size_t step = 1 + compiled.moments.size() / 16;
    for (std::size_t i = 0; i < compiled.moments.size(); i += step) {
        if (const std::int64_t moment = compiled.moments[i]; moment < yearOf2037) {
            requireSame(moment - 1);
            requireSame(moment);
        }
    }
    // And where the compiler has no change.
    for (std::int64_t moment = -3000000000; moment < yearOf2037; moment += 600000007) {
        requireSame(moment);
    }
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const bool canCompile = kvt::test::hasZoneCompiler();
    if (!canCompile) {
        static const bool isSaid = (std::cout << "skipped: no zone compiler\n", true);
        return isSaid ? 0 : 1;
    }
    static const ZoneFolder folder;
    Input input(data, size);
    const std::string text = textFrom(input);
    const ZoneFiles files = {{"europe", text}};
    folder.fill(files);
    const std::filesystem::path compiledFolder = folder.path() / "compiled";
    std::filesystem::remove_all(compiledFolder);
    const kvt::test::Compilation compilation =
        kvt::test::compileZones(folder.path(), {"europe"}, compiledFolder);
    if (const auto fault = kvt::ex::datetime::zoneFilesFault(files)) {
        require(!compilation.isGood || isStricter(fault->reason), "refused, and the compiler takes it: line ",
                fault->line, ", ", fault->reason, "\n", text);
        return 0;
    }
    require(compilation.isGood || isHarmless(compilation.printed), compilation.printed, text);
    if (compilation.isGood && !isMiscompiled(text)) {
        withZones([&](const date::tzdb& database) {
            for (const date::time_zone& zone : database.zones) {
                requireSameOffsets(zone, kvt::test::readCompiledZone(compiledFolder / zone.name()), text);
            }
        });
    }
    return 0;
}
