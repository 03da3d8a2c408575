#include "include_rules.h"

#include <algorithm>
#include <fstream>
#include <functional>
#include <iterator>
#include <map>
#include <regex>
#include <sstream>
#include <stdexcept>
#include <string_view>

namespace house {

namespace {

namespace fs = std::filesystem;

std::string readFile(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    if (!in) {
        throw std::runtime_error("cannot read " + path.string());
    }
    return {std::istreambuf_iterator<char>(in), {}};
}

std::set<std::string> linesOf(const fs::path& path) {
    std::set<std::string> lines;
    std::istringstream text(readFile(path));
    for (std::string line; std::getline(text, line);) {
        lines.insert(line);
    }
    return lines;
}

bool isHeader(const std::string& file) {
    return file.ends_with(".h");
}

bool isOwn(const std::string& target) {
    return target.starts_with("kvt/");
}

// "string" of "kvt/string/detail/search.h"; empty for kvt/kvt.h, which belongs to no folder.
std::string folderOf(const std::string& file) {
    const auto first = file.find('/');
    const auto second = file.find('/', first + 1);
    return second == std::string::npos ? std::string() : file.substr(first + 1, second - first - 1);
}

bool isPrivate(const std::string& file) {
    return file.find("/detail/") != std::string::npos || folderOf(file) == "platform";
}

bool beginsWithOneOf(const std::string& text, const std::vector<std::string>& prefixes) {
    return std::any_of(prefixes.begin(), prefixes.end(),
                       [&](const std::string& prefix) { return text.starts_with(prefix); });
}

std::string offence(const Include& include, const std::string& what) {
    return include.file + ":" + std::to_string(include.line) + ": includes " + include.target + ": " + what;
}

// What a folder may include. A name that ends in "/" is a whole folder; every folder may include itself.
const std::map<std::string, std::vector<std::string>>& neighbours() {
    static const std::vector<std::string> text = {"kvt/foundation/", "kvt/encoding/", "kvt/string/",
                                                  "kvt/codec/", "kvt/platform/"};
    static const std::map<std::string, std::vector<std::string>> table = {
        {"foundation", text},
        {"encoding", text},
        {"string", text},
        {"codec", text},
        {"platform", text},
        {"regex", text},
        {"datetime", text},
        {"mmap",
         {"kvt/foundation/export.h", "kvt/foundation/optional.h", "kvt/foundation/pimpl.h",
          "kvt/foundation/vector.h", "kvt/platform/"}},
        {"legacy", {"kvt/foundation/export.h", "kvt/platform/"}},
    };
    return table;
}

// The same for the rooms of the command.
const std::map<std::string, std::vector<std::string>>& neighbourRooms() {
    static const std::map<std::string, std::vector<std::string>> table = {
        {"base", {}},
        {"cli", {"base/"}},
        {"text", {"base/", "cli/"}},
        {"convert", {"base/", "cli/", "text/"}},
        {"zone", {"base/", "cli/", "text/"}},
        {"date", {"base/", "cli/", "text/", "zone/"}},
        {"sort", {"base/", "cli/", "text/", "date/"}},
        {"memory", {"base/", "cli/"}},
        {"translate", {"base/", "cli/", "text/", "convert/", "zone/", "date/", "sort/"}},
        {"infer", {"base/", "cli/", "text/", "translate/"}},
    };
    return table;
}

constexpr std::string_view rooms = "tools/kvt/";

// "base/text.h" for tools/kvt/base/text.h; empty for what is not of the command.
std::string withinRooms(const std::string& file) {
    return file.starts_with(rooms) ? file.substr(rooms.size()) : std::string();
}

std::string roomOf(const std::string& fileWithinRooms) {
    return fileWithinRooms.substr(0, fileWithinRooms.find('/') + 1);
}

using Graph = std::map<std::string, std::vector<const Include*>>;

Graph graphOf(const Tree& tree) {
    Graph graph;
    for (const Include& include : tree.includes) {
        const std::string room = withinRooms(include.file);
        if (isOwn(include.file) && isOwn(include.target)) {
            graph[include.file].push_back(&include);
        } else if (!room.empty() && !include.angled) {
            graph[room].push_back(&include);
        }
    }
    return graph;
}

} // namespace

std::vector<Include> includesOf(const std::string& file, const std::string& text) {
    static const std::regex pattern(R"re(^\s*#\s*include\s*([<"])([^>"]+)[>"])re");
    std::vector<Include> found;
    std::istringstream lines(text);
    std::string line;
    for (int number = 1; std::getline(lines, line); ++number) {
        std::smatch match;
        if (std::regex_search(line, match, pattern)) {
            found.push_back({file, number, match[2].str(), match[1].str() == "<"});
        }
    }
    return found;
}

Tree readTree(const fs::path& root, const fs::path& publicHeaderList, const fs::path& optionalHeaderList) {
    Tree tree;
    for (const char* top : {"kvt", "tools"}) {
        if (!fs::exists(root / top)) {
            continue;
        }
        for (const auto& entry : fs::recursive_directory_iterator(root / top)) {
            const auto extension = entry.path().extension();
            if (extension != ".h" && extension != ".cpp") {
                continue;
            }
            const std::string file = fs::relative(entry.path(), root).generic_string();
            tree.files.insert(file);
            const auto includes = includesOf(file, readFile(entry.path()));
            tree.includes.insert(tree.includes.end(), includes.begin(), includes.end());
        }
    }
    tree.publicHeaders = linesOf(publicHeaderList);
    tree.optionalHeaders = linesOf(optionalHeaderList);
    return tree;
}

Offences ownHeadersAreNamedFromTheRoot(const Tree& tree) {
    Offences offences;
    for (const Include& include : tree.includes) {
        if (!isOwn(include.file)) {
            continue;
        }
        if (!include.angled) {
            offences.push_back(offence(include, "the library's headers are included as <kvt/...>"));
        } else if (isOwn(include.target) && !tree.files.contains(include.target)) {
            offences.push_back(offence(include, "there is no such file"));
        }
    }
    return offences;
}

Offences noCycles(const Tree& tree) {
    const Graph graph = graphOf(tree);
    Offences offences;
    std::set<std::string> done;
    std::vector<std::string> path;
    const std::function<void(const std::string&)> visit = [&](const std::string& file) {
        path.push_back(file);
        if (const auto edges = graph.find(file); edges != graph.end()) {
            for (const Include* include : edges->second) {
                const auto start = std::find(path.begin(), path.end(), include->target);
                if (start != path.end()) {
                    std::string cycle;
                    for (auto step = start; step != path.end(); ++step) {
                        cycle += *step + " > ";
                    }
                    offences.push_back(offence(*include, "a cycle: " + cycle + include->target));
                } else if (!done.contains(include->target)) {
                    visit(include->target);
                }
            }
        }
        path.pop_back();
        done.insert(file);
    };
    for (const auto& [file, edges] : graph) {
        if (!done.contains(file)) {
            visit(file);
        }
    }
    return offences;
}

Offences foldersKnowOnlyTheirNeighbours(const Tree& tree) {
    Offences offences;
    for (const Include& include : tree.includes) {
        if (!isOwn(include.file) || !isOwn(include.target)) {
            continue;
        }
        if (include.target == "kvt/kvt.h") {
            offences.push_back(offence(include, "<kvt/kvt.h> is for users"));
            continue;
        }
        const std::string folder = folderOf(include.file);
        if (folder.empty() || folder == folderOf(include.target)) {
            continue;
        }
        const auto allowed = neighbours().find(folder);
        if (allowed == neighbours().end()) {
            offences.push_back(offence(include, "nothing is settled for the folder " + folder));
        } else if (!beginsWithOneOf(include.target, allowed->second)) {
            offences.push_back(offence(include, "not for the folder " + folder));
        }
    }
    return offences;
}

Offences memoryKnowsNoString(const Tree& tree) {
    static const std::vector<std::string> strings = {"kvt/string/", "kvt/encoding/", "kvt/codec/",
                                                     "kvt/foundation/string_view.h", "string"};
    std::map<std::string, std::vector<const Include*>> all;
    for (const Include& include : tree.includes) {
        all[include.file].push_back(&include);
    }
    Offences offences;
    for (const std::string start : {"kvt/foundation/pimpl.h", "kvt/foundation/memory.h"}) {
        std::set<std::string> seen = {start};
        std::vector<std::string> open = {start};
        while (!open.empty()) {
            const std::string file = open.back();
            open.pop_back();
            for (const Include* include : all[file]) {
                if (beginsWithOneOf(include->target, strings)) {
                    offences.push_back(
                        offence(*include, "reached from " + start + ", which knows no string"));
                } else if (seen.insert(include->target).second) {
                    open.push_back(include->target);
                }
            }
        }
    }
    return offences;
}

Offences publicHeadersStandAlone(const Tree& tree) {
    static const std::vector<std::string> behind = {"unicode/", "double-conversion/", "date/", "CLI/",
                                                    "hwy/",     "nlohmann/"};
    static const std::vector<std::string> forUsersOf = {"fmt/"};
    Offences offences;
    for (const Include& include : tree.includes) {
        if (!tree.publicHeaders.contains(include.file)) {
            continue;
        }
        const std::string folder = folderOf(include.file);
        if (isOwn(include.target) && !tree.publicHeaders.contains(include.target)) {
            offences.push_back(offence(include, "a public header includes public headers only"));
        } else if (beginsWithOneOf(include.target, behind)) {
            offences.push_back(offence(include, "no public header needs headers of that library"));
        } else if (beginsWithOneOf(include.target, forUsersOf) &&
                   !tree.optionalHeaders.contains(include.file)) {
            offences.push_back(offence(include, "only an optional header needs headers of that library"));
        } else if (tree.optionalHeaders.contains(include.target)) {
            offences.push_back(offence(include, "an optional header is included by users only"));
        } else if (include.target.starts_with("boost/") && folder != "mmap") {
            offences.push_back(offence(include, "Boost shows in public headers of mmap only"));
        }
    }
    return offences;
}

Offences everyHeaderIsPublicOrPrivate(const Tree& tree) {
    Offences offences;
    std::set<std::string> inUmbrella;
    for (const Include& include : tree.includes) {
        if (include.file == "kvt/kvt.h") {
            inUmbrella.insert(include.target);
        }
    }
    for (const std::string& file : tree.files) {
        if (isOwn(file) && isHeader(file) && !isPrivate(file) && !tree.publicHeaders.contains(file)) {
            offences.push_back(file + ":1: neither a public header of its CMakeLists.txt nor in detail/");
        }
    }
    for (const std::string& header : tree.publicHeaders) {
        if (isPrivate(header)) {
            offences.push_back(header + ":1: private, yet listed among the public headers");
        }
        if (header != "kvt/kvt.h" && !tree.optionalHeaders.contains(header) && !inUmbrella.contains(header)) {
            offences.push_back("kvt/kvt.h:1: does not include " + header);
        }
    }
    return offences;
}

Offences outsideIsBehindItsDoor(const Tree& tree) {
    struct House {
        std::vector<std::string> headers;
        std::vector<std::string> doors; // files, or folders that end in "/"
        std::string rule;
        bool ofTheLibrary = true; // else of the command
    };
    static const std::vector<House> houses = {
        {{"unicode/"},
         {"kvt/encoding/icu.cpp", "kvt/encoding/detail/icu.h", "kvt/string/ustring_case.cpp",
          "kvt/string/case_table.cpp", "kvt/string/detail/case_table.h"},
         "ICU is used in kvt/encoding/icu.cpp and its private header, and for case"},
        {{"hwy/"},
         {"kvt/encoding/byte_set.cpp", "kvt/encoding/unicode_convert.cpp", "kvt/encoding/unicode_measure.cpp",
          "kvt/encoding/detail/unicode_characters-inl.h", "kvt/encoding/detail/unicode_from_utf8-inl.h",
          "kvt/encoding/detail/unicode_to_utf8-inl.h", "kvt/encoding/detail/utf8_check-inl.h",
          "kvt/encoding/unicode_short.cpp", "kvt/string/case_vectors.cpp", "kvt/string/hash_vectors.cpp",
          "kvt/string/unit_vectors.cpp", "kvt/regex/prefix_scan.cpp", "kvt/platform/vector_targets.h"},
         "Highway is used for the Unicode forms, for code pages, case, search and hashes"},
        {{"date/"},
         {"kvt/datetime/calendar.cpp", "kvt/datetime/local_zone.cpp", "kvt/datetime/zone_operations.cpp"},
         "the date library is used for the calendar and for zones"},
        {{"boost/regex"}, {"kvt/regex/detail/engine.h"}, "Boost.Regex comes by kvt/regex/detail/engine.h"},
        {{"boost/interprocess/", "boost/container/"},
         {"kvt/mmap/"},
         "Boost.Interprocess is used in kvt/mmap"},
        {{"boost/date_time/"}, {"kvt/legacy/"}, "Boost.DateTime is used in kvt/legacy"},
        {{"CLI/"},
         {"tools/kvt/cli/syntax.cpp", "tools/kvt/cli/command_line.cpp"},
         "CLI11 takes long to compile; commands use cli/syntax.h",
         false},
        {{"unicode/"},
         {"tools/kvt/base/unicode_data.cpp", "tools/kvt/convert/unicode_forms.cpp",
          "tools/kvt/infer/charset_detector.cpp", "tools/kvt/text/unicode_pattern.cpp",
          "tools/kvt/translate/icu_data.cpp"},
         "ICU is called where the library does not pass on what it has",
         false},
        {{"boost/multiprecision/"},
         {"kvt/datetime/detail/nano_count.h"},
         "NanoCount is the one large number"},
        {{"sys/", "unistd.h", "langinfo.h", "dlfcn.h", "cxxabi.h", "fcntl.h", "pthread.h", "link.h",
          "locale.h", "clocale", "execinfo.h"},
         {"kvt/platform/"},
         "the operating system is called in kvt/platform"},
    };
    Offences offences;
    for (const Include& include : tree.includes) {
        for (const House& house : houses) {
            if (isOwn(include.file) == house.ofTheLibrary && beginsWithOneOf(include.target, house.headers) &&
                !beginsWithOneOf(include.file, house.doors)) {
                offences.push_back(offence(include, house.rule));
            }
        }
    }
    return offences;
}

Offences toolsUsePublicHeaders(const Tree& tree) {
    Offences offences;
    for (const Include& include : tree.includes) {
        if (include.file.starts_with("tools/") && isOwn(include.target) &&
            !tree.publicHeaders.contains(include.target)) {
            offences.push_back(offence(include, "the command uses public headers only"));
        }
    }
    return offences;
}

Offences roomsKnowOnlyTheirNeighbours(const Tree& tree) {
    Offences offences;
    for (const Include& include : tree.includes) {
        const std::string file = withinRooms(include.file);
        if (file.empty() || include.angled) {
            continue;
        }
        const std::string room = roomOf(file);
        if (!tree.files.contains(std::string(rooms) + include.target)) {
            offences.push_back(offence(include, "there is no such file under " + std::string(rooms)));
        } else if (room.empty() || room == roomOf(include.target)) {
            continue; // main.cpp knows all rooms
        } else if (const auto allowed = neighbourRooms().find(room.substr(0, room.size() - 1));
                   allowed == neighbourRooms().end()) {
            offences.push_back(offence(include, "nothing is settled for the room " + room));
        } else if (!beginsWithOneOf(include.target, allowed->second)) {
            offences.push_back(offence(include, "not for the room " + room));
        }
    }
    return offences;
}

} // namespace house
