// The character maps of the C library against what kvt makes of the same bytes and characters, where ICU has an encoding
// of that name.
//
// Two tables of one name are not always one table: for many a character there are two bytes that could stand for it, or
// the other way round, and ICU and the C library chose differently. A character is left out where ICU itself, asked
// without kvt, says other than the map; everywhere else kvt has to agree with the map, both ways.
#include "suite.h"

#include <reference/icu_reference.h>

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>

#include <gtest/gtest.h>
#include <unicode/uvernum.h>

#include <algorithm>
#include <filesystem>
#include <sstream>

namespace conformance {
namespace {

using kvt::ex::Encoding;
using kvt::ex::UString;
namespace fs = std::filesystem;

const std::string folder = "/usr/share/i18n/charmaps";

struct Mapping {
    char32_t character;
    std::string bytes;
    bool bothWays;
};

struct Charmap {
    std::vector<std::string> names; ///< its own, then others
    std::vector<Mapping> mappings;
};

// "/xa4/x40" or "\xa4\x40".
std::string bytesOf(const std::string& field) {
    std::string bytes;
    for (std::size_t at = 0; at + 3 < field.size(); at += 4) {
        bytes += static_cast<char>(std::stoi(field.substr(at + 2, 2), nullptr, 16));
    }
    return bytes;
}

// The number of "<U00E9>" at the front of `field`, which it loses; nothing where that is another name of a character.
std::optional<char32_t> takeCharacter(std::string& field) {
    const std::size_t end = field.find_first_not_of("0123456789ABCDEF", 2);
    if (field.rfind("<U", 0) != 0 || end == std::string::npos || end < 6 || field[end] != '>') {
        return std::nullopt;
    }
    const auto character = static_cast<char32_t>(std::stoul(field.substr(2), nullptr, 16));
    field.erase(0, end + 1);
    return character;
}

// One line of the table: "<U00E9> /xe9 WORDS", "%IRREVERSIBLE%<U00A8> /xa1/xa7 WORDS", or a range
// "<U4E00>..<U4E05> /x81/x40 WORDS", in which the last byte counts up.
void readMapping(const std::string& line, Charmap& map) {
    const std::string mark = "%IRREVERSIBLE%";
    const bool oneWay = line.rfind(mark, 0) == 0;
    std::istringstream words(oneWay ? line.substr(mark.size()) : line);
    std::string characters;
    std::string bytes;
    words >> characters >> bytes;
    const std::optional<char32_t> first = takeCharacter(characters);
    characters.erase(0, characters.rfind("..", 0) == 0 ? 2 : 0);
    const std::optional<char32_t> last = characters.empty() ? first : takeCharacter(characters);
    if (!first || !last) {
        return;
    }
    std::string at = bytesOf(bytes);
    for (char32_t character = *first; character <= *last; ++character) {
        map.mappings.push_back({character, at, !oneWay});
        at.back() = static_cast<char>(at.back() + 1);
    }
}

Charmap readCharmap(const fs::path& path) {
    Charmap map;
    bool inTable = false;
    for (const std::string& line : linesOf(outputOf("zcat '" + path.string() + "'"))) {
        std::istringstream words(line);
        std::string first;
        std::string second;
        std::string third;
        words >> first >> second >> third;
        if (first == "CHARMAP") {
            inTable = true;
        } else if (first == "END") {
            break;
        } else if (inTable) {
            readMapping(line, map);
        } else if (first == "<code_set_name>") {
            map.names.insert(map.names.begin(), second);
        } else if (first == "%" && second == "alias") {
            map.names.push_back(third);
        }
    }
    return map;
}

constexpr const char* nothing = "a failure";

// What kvt makes of bytes, as UTF-8, and of a character. The bytes go by way of UTF-16, as from UTF-8 to UTF-8 nothing is
// looked at.
std::string readByKvt(Encoding encoding, const std::string& bytes) {
    try {
        return UString<2>(bytes.data(), bytes.size(), encoding).getAsUtf8().toStdString();
    } catch (const kvt::ex::Throwable&) {
        return nothing;
    }
}

std::string writtenByKvt(Encoding encoding, const std::string& text) {
    try {
        return UString<0>(text.data(), text.size()).getAsEncoding(encoding).toStdString();
    } catch (const kvt::ex::Throwable&) {
        return nothing;
    }
}

// The same by ICU alone.
std::string convertedByIcu(const std::string& from, const std::string& to, const std::string& bytes) {
    const kvt::test::Raw raw = kvt::test::convertWithIcu(from, to, bytes);
    return raw.badInput == 0 && raw.notRepresentable == 0 && raw.status == 0 ? raw.bytes : nothing;
}

// The first of the names that ICU knows.
Encoding encodingOf(const Charmap& map) {
    for (const std::string& name : map.names) {
        const Encoding encoding(name, kvt::ex::nothrow);
        if (encoding != Encoding::Unknown) {
            return encoding;
        }
    }
    return Encoding::Unknown;
}

void tryMapping(Suite& suite, Encoding encoding, const Mapping& mapping, const std::string& map) {
    const std::string text = utf8(mapping.character);
    const std::string read = readByKvt(encoding, mapping.bytes);
    const std::string written = mapping.bothWays ? writtenByKvt(encoding, text) : mapping.bytes;
    if (read == text && written == mapping.bytes) {
        suite.check(true, "");
        return;
    }
    const std::string name(encoding.getName());
    const std::string readByIcu = convertedByIcu(name, "UTF-8", mapping.bytes);
    const std::string writtenByIcu = mapping.bothWays ? convertedByIcu("UTF-8", name, text) : mapping.bytes;
    if (readByIcu == read && writtenByIcu == written) {
        suite.leaveOut("characters that ICU's table of that name has otherwise");
    } else {
        suite.check(false, map + " " + hex(mapping.bytes) + " is read as " + hex(read) + ", its character " +
                               hex(text) + " written as " + hex(written) + "; ICU: " + hex(readByIcu) + ", " +
                               hex(writtenByIcu));
    }
}

TEST(ConformanceCharmaps, AgreeWhereIcuHasTheSameTable) {
    if (!fs::exists(folder)) {
        GTEST_SKIP() << folder << " is not there; Debian's package locales brings it";
    }
    Suite suite("character maps of the C library",
                "locales " + packageVersion("locales") + ", ICU " U_ICU_VERSION);
    std::vector<fs::path> files;
    for (const fs::directory_entry& entry : fs::directory_iterator(folder)) {
        files.push_back(entry.path());
    }
    std::sort(files.begin(), files.end());
    for (const fs::path& path : files) {
        const Charmap map = readCharmap(path);
        const Encoding encoding = encodingOf(map);
        if (encoding == Encoding::Unknown) {
            suite.leaveOut("characters of maps whose names ICU does not know", map.mappings.size());
            continue;
        }
        for (const Mapping& mapping : map.mappings) {
            tryMapping(suite, encoding, mapping, path.stem().string());
        }
    }
    suite.finish();
}

} // namespace
} // namespace conformance
