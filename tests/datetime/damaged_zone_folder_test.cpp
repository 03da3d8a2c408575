// A zone folder that was damaged, as a full disk or a bad copy leaves it. Each is tried by a process of its own, which
// has to end by itself, to print nothing, and to answer right or not at all.
//
// This program never loads a database itself: one that was loaded stays, and would answer for its children.
#include "answer.h"
#include "machine_zone.h"
#include "zone_folder.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/zone_folder.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <functional>
#include <iterator>
#include <map>
#include <random>
#include <set>
#include <sstream>
#include <sys/wait.h>
#include <thread>
#include <vector>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;

// ---- Work in a child process

struct Ended {
    int status = 0; ///< as of waitpid()
    std::string out;
    std::string err;
};

std::string drained(int descriptor) {
    std::string all;
    std::array<char, 65536> block;
    for (ssize_t count = 0; (count = ::read(descriptor, block.data(), block.size())) > 0;) {
        all.append(block.data(), static_cast<std::size_t>(count));
    }
    ::close(descriptor);
    return all;
}

// Runs `work` in a child; what it returns is the child's output. Whoever takes longer than a minute is ended.
Ended inChild(const std::function<std::string()>& work) {
    int out[2];
    std::FILE* const errors = std::tmpfile();
    EXPECT_EQ(::pipe(out), 0);
    const pid_t child = ::fork();
    if (child == 0) {
        ::close(out[0]);
        ::dup2(::fileno(errors), STDERR_FILENO);
        ::alarm(60);
        const std::string text = work();
        const bool isWritten = ::write(out[1], text.data(), text.size()) == static_cast<ssize_t>(text.size());
        ::_exit(isWritten ? 0 : 1);
    }
    EXPECT_GT(child, 0);
    ::close(out[1]);
    Ended ended;
    ended.out = drained(out[0]);
    EXPECT_EQ(::waitpid(child, &ended.status, 0), child);
    ::lseek(::fileno(errors), 0, SEEK_SET);
    ended.err = drained(::dup(::fileno(errors)));
    std::fclose(errors);
    return ended;
}

// ---- What a zone says

constexpr const char* failed = "fails";

// The offset at moments of all times, those around changes of rules and zones included; "fails" where one call does.
std::string offsetsOf(const std::string& zone) {
    kvt::test::setMachineZone(zone);
    std::string offsets;
    for (const char* moment :
         {"18000101000000+00:00", "18950101000000+00:00", "19170615120000+00:00", "19300101000000+00:00",
          "19430801000000+00:00", "19470601000000+00:00", "19610701000000+00:00", "19750101000000+00:00",
          "19800815000000+00:00", "19870402000000+00:00", "19960930000000+00:00", "20000702000000+00:00",
          "20060328000000+00:00", "20070320000000+00:00", "20110327010000+00:00", "20141027120000+00:00",
          "20200101000000+00:00", "20200329010000+00:00", "20240707000000+00:00", "20301027005959+00:00"}) {
        const Answer answer = answerOf(timezoneSet(moment, "local", SetZoneMode::Convert));
        if (answer.state != ReturnState::Success) {
            return answer == kvt::test::silentFailure() ? failed : "a failure of another kind";
        }
        offsets += answer.text.substr(answer.text.size() - 6);
    }
    return offsets;
}

// What the child of a damaged folder says of each zone, and whether now() is of the same mind.
std::string report(const std::string& folder, const std::set<std::string>& zones) {
    setInstallPathWrapper(folder);
    std::string lines;
    for (const std::string& zone : zones) {
        const std::string offsets = offsetsOf(zone);
        const Answer present = answerOf(now(ZoneMode::LocalWithOffset));
        const bool isRefused = present.state == ReturnState::Error && present.message == 933050 &&
                               present.parameters.size() == 1 && !present.parameters[0].empty();
        const bool agrees = offsets == failed ? isRefused : present.state == ReturnState::Success;
        lines += zone + "\t" + offsets + (agrees ? "" : " and now() does not") + "\n";
    }
    return lines;
}

std::map<std::string, std::string> byZone(const std::string& lines) {
    std::map<std::string, std::string> offsets;
    std::istringstream stream(lines);
    for (std::string zone, text; std::getline(stream, zone, '\t') && std::getline(stream, text);) {
        offsets[zone] = text;
    }
    return offsets;
}

// ---- Damage

struct Damage {
    std::string file;
    std::size_t at = 0;
    bool isCut = false;
    std::string text; ///< of the file, now
    std::string what; ///< for messages
};

using Random = std::mt19937_64;

Damage damageOf(const ZoneFiles& files, Random& random) {
    auto file = files.begin();
    std::size_t all = 0;
    for (const auto& [name, text] : files) {
        all += text.size();
    }
    // Each byte of the folder has the same chance.
    for (std::size_t at = random() % all; at >= file->second.size(); ++file) {
        at -= file->second.size();
    }
    Damage damage{file->first, random() % file->second.size(), false, file->second, ""};
    std::string& text = damage.text;
    const std::size_t line = damage.at == 0 ? 0 : text.rfind('\n', damage.at - 1) + 1;
    const std::size_t next = text.find('\n', damage.at) + 1;
    switch (random() % 10) {
    case 0:
    case 1:
    case 2:
        damage.isCut = true;
        text.erase(damage.at);
        damage.what = "cut";
        break;
    case 3:
        damage.isCut = true;
        damage.at = line;
        text.erase(line);
        damage.what = "cut before a line";
        break;
    case 4:
        text.erase(line, next - line);
        damage.what = "without a line";
        break;
    case 5:
        text.insert(line, text.substr(line, next - line));
        damage.what = "with a line twice";
        break;
    case 6:
        text.replace(damage.at, std::min<std::size_t>(512, text.size() - damage.at), 512, '\0');
        damage.what = "with a block of zeros";
        break;
    case 7:
        text[damage.at] = static_cast<char>(random());
        damage.what = "with another byte";
        break;
    case 8:
        text[damage.at] = "0123456789:-\t\n #usAJlM"[random() % 22];
        damage.what = "with another character";
        break;
    default:
        text.erase(damage.at, 1 + random() % 3);
        damage.what = "without some bytes";
        break;
    }
    damage.what = damage.file + ", byte " + std::to_string(damage.at) + ", " + damage.what;
    return damage;
}

// Which zones the text at a place is about.
class Index {
public:
    explicit Index(const ZoneFiles& files) {
        for (const auto& [name, text] : files) {
            std::size_t at = 0;
            std::string zone;
            std::istringstream lines(text);
            for (std::string line; std::getline(lines, line); at += line.size() + 1) {
                std::istringstream words(line);
                std::string first, second, third, fourth;
                words >> first >> second >> third >> fourth;
                const bool isRule = first == "Rule";
                zone = first == "Zone" ? second : first == "Link" ? third : isRule ? "" : zone;
                subjects_[name][at] = {isRule ? second : "", zone};
                if (!isRule && first != "Link") {
                    followers_[first == "Zone" ? fourth : second].insert(zone);
                }
            }
        }
    }

    /// Berlin, the zone or link at that byte, and some of the zones that follow the rule there.
    std::set<std::string> zonesAbout(const std::string& file, std::size_t at) const {
        std::set<std::string> zones = {"Europe/Berlin"};
        const auto& [rule, zone] = std::prev(subjects_.at(file).upper_bound(at))->second;
        if (!zone.empty()) {
            zones.insert(zone);
        }
        if (const auto followers = followers_.find(rule); !rule.empty() && followers != followers_.end()) {
            for (const std::string& follower : followers->second) {
                zones.insert(follower);
                if (zones.size() == 4) {
                    break;
                }
            }
        }
        return zones;
    }

private:
    struct Subject {
        std::string rule;
        std::string zone;
    };
    std::map<std::string, std::map<std::size_t, Subject>> subjects_; ///< by files and beginnings of lines
    std::map<std::string, std::set<std::string>> followers_;         ///< of rules
};

void writeFile(const std::string& folder, const std::string& name, const std::string& text) {
    std::ofstream(std::filesystem::path(folder) / name, std::ios::binary | std::ios::trunc) << text;
}

struct Tally {
    std::size_t right = 0;
    std::size_t refused = 0;
    std::size_t wrong = 0;
};

// Tries `count` damages of a folder. Each has to end well; `mayBeWrong` says which may answer by what they hold.
Tally tryDamages(const ZoneFiles& good, std::size_t count, std::uint64_t seed,
                 const std::function<bool(const Damage&)>& mayBeWrong) {
    host::ZoneDatabase database;
    database.files = good;
    const kvt::test::ZoneFolder folder(database);
    const Index index(good);
    Random random(seed);
    std::vector<Damage> damages;
    std::set<std::string> zones;
    std::vector<std::set<std::string>> about;
    for (std::size_t i = 0; i < count; ++i) {
        damages.push_back(damageOf(good, random));
        about.push_back(index.zonesAbout(damages.back().file, damages.back().at));
        zones.insert(about.back().begin(), about.back().end());
    }
    const Ended whole = inChild([&] { return report(folder.path(), zones); });
    EXPECT_EQ(whole.status, 0);
    EXPECT_EQ(whole.err, "");
    const std::map<std::string, std::string> expected = byZone(whole.out);
    EXPECT_EQ(expected.size(), zones.size());
    for (const auto& [zone, offsets] : expected) {
        EXPECT_EQ(offsets.find('f'), std::string::npos) << zone << " in the good folder: " << offsets;
    }

    Tally tally;
    for (std::size_t i = 0; i < count; ++i) {
        const Damage& damage = damages[i];
        SCOPED_TRACE(damage.what);
        writeFile(folder.path(), damage.file, damage.text);
        const Ended ended = inChild([&] { return report(folder.path(), about[i]); });
        writeFile(folder.path(), damage.file, good.at(damage.file));
        EXPECT_FALSE(WIFSIGNALED(ended.status)) << "signal " << WTERMSIG(ended.status);
        EXPECT_EQ(ended.status, 0);
        EXPECT_EQ(ended.err, "");
        bool isWrong = false;
        bool isRefused = true;
        for (const auto& [zone, offsets] : byZone(ended.out)) {
            isRefused = isRefused && offsets == failed;
            isWrong = isWrong || (offsets != failed && offsets != expected.at(zone));
            if (!mayBeWrong(damage)) {
                EXPECT_TRUE(offsets == failed || offsets == expected.at(zone))
                    << zone << "\nis:       " << offsets << "\nexpected: " << expected.at(zone);
            }
        }
        ++(isWrong ? tally.wrong : isRefused ? tally.refused : tally.right);
        if (testing::Test::HasFailure()) {
            break;
        }
    }
    return tally;
}

// Europe with all that its rules need, without checksums: as somebody else's folder would be.
ZoneFiles foreignFiles() {
    ZoneFiles files = kvt::test::databaseOfTheSystem().files;
    const std::set<std::string> keep = {"Europe/Berlin",   "Europe/Istanbul", "Europe/Lisbon",
                                        "Europe/Dublin",   "Europe/London",   "Europe/Moscow",
                                        "Europe/Volgograd"};
    std::string zones;
    std::set<std::string> rules;
    bool isKept = false;
    std::istringstream europe(files.at("europe"));
    for (std::string line; std::getline(europe, line);) {
        std::istringstream words(line);
        std::string first, second, third, fourth;
        words >> first >> second >> third >> fourth;
        isKept = first == "Zone" ? keep.count(second) != 0 : isKept && first != "Rule";
        if (isKept) {
            zones += line + "\n";
            rules.insert(first == "Zone" ? fourth : second);
        }
    }
    std::string kept;
    for (const auto& [name, text] : files) {
        std::istringstream lines(text);
        for (std::string line; std::getline(lines, line);) {
            std::istringstream words(line);
            std::string first, second;
            words >> first >> second;
            kept += first == "Rule" && rules.count(second) != 0 ? line + "\n" : "";
        }
    }
    std::string links;
    std::istringstream backward(files.at("backward"));
    for (std::string line; std::getline(backward, line);) {
        std::istringstream words(line);
        std::string first, second;
        words >> first >> second;
        links += keep.count(second) != 0 ? line + "\n" : "";
    }
    return {
        {"europe", "# rules\n" + kept + "\n# zones\n" + zones}, {"backward", links}, {"version", "2025b\n"}};
}

// ---- The tests

TEST(DamagedZoneFolder, AnswersRightOrNotAtAll) {
    const Tally tally = tryDamages(kvt::test::databaseOfTheSystem().files, 2000, 20250817,
                                   [](const Damage&) { return false; });
    EXPECT_EQ(tally.wrong, 0u);
    EXPECT_GT(tally.refused, 1800u);
}

TEST(DamagedZoneFolder, OfSomebodyElseHurtsNobody) {
    // Another digit is another zone, without checksums; but what was cut off is missed.
    const Tally tally =
        tryDamages(foreignFiles(), 1000, 20250818, [](const Damage& damage) { return !damage.isCut; });
    EXPECT_GT(tally.refused, 400u);
    EXPECT_GT(tally.right, 50u);
}

class OneDamage : public testing::Test {
protected:
    // What now() says of a folder of which one file is changed.
    Answer answerWith(const std::string& name, const std::function<void(std::string&)>& change) {
        std::string text = database_.files.at(name);
        change(text);
        writeFile(folder_.path(), name, text);
        const Ended ended = inChild([&] {
            kvt::test::setMachineZone("Europe/Berlin");
            setInstallPathWrapper(folder_.path());
            const Answer answer = answerOf(now(ZoneMode::LocalWithOffset));
            return answer.state == ReturnState::Success
                       ? std::string()
                       : std::to_string(answer.message) + answer.parameters.at(0);
        });
        EXPECT_EQ(ended.status, 0);
        EXPECT_EQ(ended.err, "");
        return ended.out.empty() ? kvt::test::success("")
                                 : Answer{ReturnState::Error, "", 0.0, 933050, {ended.out.substr(6)}};
    }
    Answer refusal(const std::string& text) {
        return {ReturnState::Error, "", 0.0, 933050, {folder_.path() + "/" + text}};
    }
    std::size_t linesOf(const std::string& name) {
        const std::string& text = database_.files.at(name);
        return static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n'));
    }

    host::ZoneDatabase database_ = kvt::test::databaseOfTheSystem();
    kvt::test::ZoneFolder folder_{database_};
};

TEST_F(OneDamage, IsNamedWithFileAndLine) {
    EXPECT_EQ(answerWith("europe", [](std::string& text) { text += "Zone\tEurope/Berlin\tgarbage\n"; }),
              refusal("europe, line " + std::to_string(linesOf("europe") + 1) +
                      ": the zone \"Europe/Berlin\" is there already"));
}

TEST_F(OneDamage, ByACutBehindLocalMeanTimeIsNoticed) {
    const auto cut = [](std::string& text) { text.erase(text.find("LMT", text.find("Europe/Berlin")) + 3); };
    std::string text = database_.files.at("europe");
    cut(text);
    const auto lines = static_cast<std::size_t>(std::count(text.begin(), text.end(), '\n'));
    EXPECT_EQ(answerWith("europe", cut), refusal("europe, line " + std::to_string(lines + 1) +
                                                 ": the file ends within a line, as if it were cut off"));
}

TEST_F(OneDamage, ByARuleThatEndsBeforeItBeginsDoesNotHang) {
    EXPECT_EQ(
        answerWith("europe",
                   [](std::string& text) { text = "Rule\tX\t1917\t1318\t-\tJan\t1\t0\t0\t-\n" + text; }),
        refusal("europe, line 1: the rule ends before it begins"));
}

TEST_F(OneDamage, OfADigitIsFoundByTheChecksums) {
    const Answer answer = answerWith(
        "europe", [](std::string& text) { text[text.find("0:53:28", text.find("Europe/Berlin"))] = '1'; });
    ASSERT_EQ(answer.parameters.size(), 1u);
    EXPECT_EQ(answer.parameters[0].rfind(folder_.path() + "/europe: the file is not the one", 0), 0u)
        << answer;
}

TEST_F(OneDamage, IsGoneWhenItIsRepaired) {
    const std::string good = database_.files.at("asia");
    writeFile(folder_.path(), "asia", good.substr(0, good.size() / 2));
    const Ended ended = inChild([&] {
        kvt::test::setMachineZone("Europe/Berlin");
        setInstallPathWrapper(folder_.path());
        std::string states;
        for (int i = 0; i < 3; ++i) {
            states += std::to_string(static_cast<int>(std::get<0>(now(ZoneMode::LocalWithOffset)))) + " ";
        }
        writeFile(folder_.path(), "asia", good);
        return states + offsetsOf("Asia/Tokyo").substr(0, 6);
    });
    EXPECT_EQ(ended.status, 0);
    EXPECT_EQ(ended.err, "");
    EXPECT_EQ(ended.out, "0 0 0 +09:18");
}

TEST_F(OneDamage, IsFoundOnceForManyThreads) {
    for (const bool isDamaged : {true, false}) {
        const std::string good = database_.files.at("asia");
        writeFile(folder_.path(), "asia", isDamaged ? good + "\t" : good);
        const Ended ended = inChild([&] {
            kvt::test::setMachineZone("Europe/Berlin");
            setInstallPathWrapper(folder_.path());
            std::array<ReturnState, 8> states;
            std::vector<std::thread> threads;
            for (ReturnState& state : states) {
                threads.emplace_back([&] { state = std::get<0>(now(ZoneMode::LocalWithOffset)); });
            }
            for (std::thread& thread : threads) {
                thread.join();
            }
            const ReturnState expected = isDamaged ? ReturnState::Error : ReturnState::Success;
            return std::to_string(std::count(states.begin(), states.end(), expected));
        });
        EXPECT_EQ(ended.status, 0);
        EXPECT_EQ(ended.err, "");
        EXPECT_EQ(ended.out, "8") << isDamaged;
    }
}

} // namespace
