// The files of a zone database, looked over as texts: each line by itself (zone_line), then what lines say of each
// other.
//
// Some of what is asked for keeps the `date` library from going astray; that it does so otherwise is in its tz.cpp:
//
// - It prints a line that it does not know, and one that it cannot read. Where such a line is a zone's, it loads the
//   database from within its loading, which ends the process.
// - The last line of a zone reigns for ever, so that a zone cut off behind a line gives that line's offset.
// - A word that is not a rule's name is read as a length of time, and a failure there leaves the zone half made; so
//   does a rule without standard time.
// - Of rules with one name it makes pieces of which any two stand in the same years or in none together, and goes from
//   change to change by them, year by year. The work grows with the square of the pieces. In each year it takes them in
//   the order of the numbers of their days, as 8 for "Sun>=8" and 31 for "lastSun", where only the weekday says otherwise.
// - It looks for the first and for the last change within a line of a zone, each from the beginning, and goes on from
//   the first until it meets the last. They have to be in this order, also where the line's offset and saving are not
//   those of the line before.

#include <kvt/datetime/detail/zone_files.h>
#include <kvt/datetime/detail/zone_line.h>

#include <algorithm>
#include <cstdlib>
#include <optional>
#include <unordered_map>
#include <unordered_set>
#include <utility>

namespace kvt::ex::datetime {

namespace {

using detail::BadZoneLine;
using detail::ZoneRule;
using detail::ZoneSpan;
using detail::ZoneWords;

// Five times what the richest rule of today has.
constexpr std::size_t mostPieces = 1000;
// From -1:00 to 2:00 of saving on either side, and some.
constexpr std::int64_t leastSeconds = 6 * 3600;

struct Place {
    std::string_view file;
    std::size_t line = 0;
};

[[noreturn]] void fail(const Place& place, std::string reason) {
    throw ZoneFolderFault{std::string(place.file), place.line, std::move(reason)};
}

std::string quoted(std::string_view text) {
    return std::string("\"").append(text).append("\"");
}

class Reader {
public:
    void readFile(std::string_view name, std::string_view text) {
        place_ = {name, 1 + static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n'))};
        if (!text.empty() && text.back() != '\n') {
            fail(place_, "the file ends within a line, as if it were cut off");
        }
        place_.line = 0;
        tabsBelongToZone_ = false;
        while (!text.empty()) {
            ++place_.line;
            const std::size_t end = text.find('\n');
            readLine(text.substr(0, end));
            text.remove_prefix(end + 1);
        }
        requireZoneDone();
    }

    void checkReferences() const {
        if (zones_.empty()) {
            fail({}, "there is no zone in any file");
        }
        for (const Follower& follower : followers_) {
            const auto rule = rules_.find(follower.rule);
            if (rule == rules_.end()) {
                fail(follower.place, "there is no rule " + quoted(follower.rule));
            }
            if (std::none_of(rule->second.begin(), rule->second.end(),
                             [](const PlacedRule& line) { return line.rule.saveMinutes == 0; })) {
                fail(follower.place, "the rule " + quoted(follower.rule) + " has no standard time");
            }
        }
        for (const Link& link : links_) {
            if (zones_.contains(link.name)) {
                fail(link.place, quoted(link.name) + " is a zone already");
            }
            if (!zones_.contains(link.target) && !targets_.contains(link.target)) {
                fail(link.place, "there is no zone " + quoted(link.target));
            }
        }
        for (const auto& [name, lines] : rules_) {
            checkRule(lines);
        }
    }

private:
    struct PlacedRule {
        ZoneRule rule;
        Place place;
    };
    struct Link {
        std::string_view name;
        std::string_view target;
        Place place;
    };
    struct Follower { // a line of a zone that follows a rule
        std::string_view rule;
        Place place;
    };

    void readLine(std::string_view line) {
        // In a comment, too: zeros are what a disk puts in the place of text that it lost, line ends included.
        if (line.find('\0') != std::string_view::npos) {
            fail(place_, "a line has a byte of zero");
        }
        if (line.empty() || line[0] == '#') {
            return;
        }
        try {
            const ZoneWords words = detail::zoneWords(line);
            if (words.count == 0) {
                // Such a line is a continuation without anything in it, or it gets printed.
                if (line[0] != '\t' || !tabsBelongToZone_) {
                    throw BadZoneLine{"a line of blanks is not empty"};
                }
                return;
            }
            takeLine(line, words);
        } catch (BadZoneLine& bad) {
            fail(place_, std::move(bad.reason));
        }
    }

    void takeLine(std::string_view line, const ZoneWords& words) {
        const std::string_view keyword = words.word[0];
        const bool isZone = keyword == "Zone";
        if (!isZone && keyword != "Rule" && keyword != "Link" && keyword != "Leap") {
            continueZone(line, words);
            return;
        }
        requireZoneDone();
        tabsBelongToZone_ = isZone;
        if (isZone) {
            takeZone(words);
        } else if (keyword == "Rule") {
            const ZoneRule rule = detail::readZoneRule(words);
            rules_[rule.name].push_back({rule, place_});
        } else if (keyword == "Link") {
            takeLink(words);
        } else {
            detail::readLeapSecond(words);
        }
    }

    void takeZone(const ZoneWords& words) {
        if (words.count < 2) {
            throw BadZoneLine{"the zone has no name"};
        }
        zone_ = words.word[1];
        if (!zones_.insert(zone_).second) {
            throw BadZoneLine{"the zone " + quoted(zone_) + " is there already"};
        }
        previous_.reset();
        takeSpan(detail::readZoneSpan(words, 2));
    }

    void continueZone(std::string_view line, const ZoneWords& words) {
        if (line[0] != '\t' || !tabsBelongToZone_) {
            throw BadZoneLine{
                quoted(words.word[0]) +
                " begins neither a Rule, Zone, Link or Leap nor, behind a tab, the next line of a zone"};
        }
        if (!isOpen()) {
            throw BadZoneLine{"the zone " + quoted(zone_) + " has ended, by a line without UNTIL"};
        }
        takeSpan(detail::readZoneSpan(words, 0));
    }

    void takeSpan(const ZoneSpan& span) {
        if (previous_ && span.until) {
            const std::int64_t change = std::abs(span.offsetSeconds - previous_->offsetSeconds);
            if (*span.until - *previous_->until < leastSeconds + change) {
                throw BadZoneLine{"the line's UNTIL is not after that of the line before"};
            }
        }
        if (!span.rule.empty()) {
            followers_.push_back({span.rule, place_});
        }
        previous_ = span;
        spanPlace_ = place_;
    }

    // Whether the zone in hand has to go on.
    bool isOpen() const { return previous_ && previous_->until; }

    void requireZoneDone() {
        if (isOpen()) {
            fail(spanPlace_, "the zone " + quoted(zone_) + " ends by an UNTIL, as if the rest were cut off");
        }
        previous_.reset();
    }

    void takeLink(const ZoneWords& words) {
        if (words.count != 3) {
            throw BadZoneLine{"a link has three words, not " + std::to_string(words.count)};
        }
        const Link link = {words.word[2], words.word[1], place_};
        links_.push_back(link);
        // Releases of old had some links in two files.
        if (targets_.insert({link.name, link.target}).first->second != link.target) {
            throw BadZoneLine{"the link " + quoted(link.name) + " leads elsewhere already"};
        }
    }

    static void checkRule(const std::vector<PlacedRule>& lines) {
        std::vector<int> edges;
        for (const PlacedRule& line : lines) {
            edges.push_back(line.rule.from);
            edges.push_back(line.rule.to + 1);
        }
        std::sort(edges.begin(), edges.end());
        edges.erase(std::unique(edges.begin(), edges.end()), edges.end());
        std::size_t pieces = 0;
        for (const PlacedRule& line : lines) {
            const auto first = std::lower_bound(edges.begin(), edges.end(), line.rule.from);
            const auto behind = std::lower_bound(first, edges.end(), line.rule.to + 1);
            pieces += static_cast<std::size_t>(behind - first);
            if (pieces > mostPieces) {
                fail(line.place, "the rule " + quoted(line.rule.name) + " has too many lines");
            }
        }
        checkDays(lines);
    }

    static void checkDays(const std::vector<PlacedRule>& lines) {
        for (std::size_t later = 1; later < lines.size(); ++later) {
            for (std::size_t earlier = 0; earlier < later; ++earlier) {
                checkPair(lines[earlier].rule, lines[later]);
            }
        }
    }

    /// Seconds since 1970, by the clock that the rule names.
    static std::int64_t momentOf(const ZoneRule& rule, int year) {
        return daysOf(rule.on, year) * secondsPerDay + rule.atSeconds;
    }

    static void checkPair(const ZoneRule& other, const PlacedRule& line) {
        const ZoneRule& rule = line.rule;
        const unsigned monthsApart =
            std::max(rule.on.month, other.on.month) - std::min(rule.on.month, other.on.month);
        // A day of the week by a day of the month is at most in the month beside it.
        if (monthsApart <= 1) {
            checkYears(other, line);
        } else if (monthsApart == 11) {
            const bool isLate = rule.on.month == 12;
            checkTurnOfYear(isLate ? rule : other, isLate ? other : rule, line);
        }
    }

    static void checkYears(const ZoneRule& other, const PlacedRule& line) {
        const ZoneRule& rule = line.rule;
        const int from = std::max(rule.from, other.from);
        const int to = std::min({rule.to, other.to, from + calendarRepeats - 1});
        // The `date` library goes by the days that are named, and gives those of one name in any order.
        const auto named = std::pair(rule.on.month, rule.on.day);
        const auto otherNamed = std::pair(other.on.month, other.on.day);
        for (int year = from; year <= to; ++year) {
            if (daysOf(rule.on, year) == daysOf(other.on, year)) {
                failPair(line, " for one day of one year");
            }
            if (named == otherNamed) {
                failPair(line, " of one year that name the same day, as \"1\" and \"Sun>=1\"");
            }
            const std::int64_t apart = momentOf(rule, year) - momentOf(other, year);
            if ((apart > 0) != (otherNamed < named)) {
                failPair(line, " of which the days change places in some years");
            }
            requireApart(std::abs(apart), line);
        }
    }

    static void checkTurnOfYear(const ZoneRule& december, const ZoneRule& january, const PlacedRule& line) {
        const int from = std::max(december.from, january.from - 1);
        const int to = std::min({december.to, january.to - 1, from + calendarRepeats - 1});
        for (int year = from; year <= to; ++year) {
            requireApart(momentOf(january, year + 1) - momentOf(december, year), line);
        }
    }

    // Which of two lines comes first may depend on their clocks, and on what the other one does to them.
    static void requireApart(std::int64_t seconds, const PlacedRule& line) {
        if (seconds < 2 * secondsPerDay) {
            failPair(line, " that are less than two days apart");
        }
    }

    [[noreturn]] static void failPair(const PlacedRule& line, const char* what) {
        fail(line.place, "the rule " + quoted(line.rule.name) + " has two lines" + what);
    }

    static constexpr int calendarRepeats = 400; // years
    static constexpr std::int64_t secondsPerDay = 86400;

    Place place_;
    std::string_view zone_;            ///< the one in hand
    std::optional<ZoneSpan> previous_; ///< its last line
    Place spanPlace_;
    bool tabsBelongToZone_ = false; ///< as the `date` library sees it: since a Zone, up to another keyword
    std::unordered_set<std::string_view> zones_;
    std::unordered_map<std::string_view, std::string_view> targets_; ///< of links by their names
    std::map<std::string_view, std::vector<PlacedRule>> rules_;
    // In the order in which they stand, so that the first fault is the one that is named.
    std::vector<Link> links_;
    std::vector<Follower> followers_;
};

// The first of the lines that are not the same in both.
std::size_t firstDifference(std::string_view left, std::string_view right) {
    const auto differs = std::mismatch(left.begin(), left.end(), right.begin(), right.end()).first;
    return 1 + static_cast<std::size_t>(std::count(left.begin(), differs, '\n'));
}

void checkChecksums(const ZoneFiles& files) {
    const auto listed = files.find(std::string(detail::checksumFileName));
    if (listed == files.end()) {
        return;
    }
    const std::string found = zoneChecksums(files);
    if (listed->second == found) {
        return;
    }
    const std::size_t line = firstDifference(listed->second, found);
    if (line > detail::zoneFileNames.size()) {
        fail({detail::checksumFileName, line}, "there are more lines than files");
    }
    fail({detail::zoneFileNames[line - 1], 0},
         "the file is not the one that line " + std::to_string(line) + " of " +
             quoted(detail::checksumFileName) +
             " was written for; if it was changed on purpose, remove that list");
}

void check(const ZoneFiles& files) {
    Reader reader;
    for (const std::string_view name : detail::zoneFileNames) {
        if (const auto file = files.find(std::string(name)); file != files.end()) {
            reader.readFile(name, file->second);
        }
    }
    reader.checkReferences();
    checkChecksums(files);
}

} // namespace

kvt::future::optional<ZoneFolderFault> zoneFilesFault(const ZoneFiles& files) {
    try {
        check(files);
        return {};
    } catch (ZoneFolderFault& fault) {
        return std::move(fault);
    }
}

} // namespace kvt::ex::datetime
