#include "zone_reference.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <fcntl.h>
#include <fstream>
#include <iterator>
#include <spawn.h>
#include <sstream>
#include <stdexcept>
#include <string_view>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>

namespace kvt::test {

namespace {

namespace fs = std::filesystem;

// Where systems have it; it is an administrator's tool, and often on no path.
const char* compilerPath() {
    for (const char* path : {"/usr/sbin/zic", "/usr/bin/zic"}) {
        if (::access(path, X_OK) == 0) {
            return path;
        }
    }
    return nullptr;
}

std::string contentsOf(const fs::path& path) {
    std::ifstream file(path, std::ios::binary);
    if (!file) {
        throw std::runtime_error("cannot read " + path.string());
    }
    return {std::istreambuf_iterator<char>(file), {}};
}

bool hasError(const std::string& printed) {
    std::istringstream lines(printed);
    for (std::string line; std::getline(lines, line);) {
        if (line.find("warning: ") == std::string::npos) {
            return true;
        }
    }
    return false;
}

// Numbers from the front of a compiled file, the highest byte first.
class Bytes {
public:
    explicit Bytes(std::string_view rest) : rest_(rest) {}

    std::int64_t number(std::size_t bytes) {
        const std::string_view digits = skip(bytes);
        auto value = static_cast<std::uint64_t>((digits[0] & 0x80) != 0 ? -1 : 0);
        for (const char digit : digits) {
            value = value << 8 | static_cast<unsigned char>(digit);
        }
        return static_cast<std::int64_t>(value);
    }
    std::size_t count() { return static_cast<std::size_t>(number(4)); }
    std::string_view skip(std::size_t bytes) {
        if (bytes > rest_.size()) {
            throw std::runtime_error("a compiled zone is too short");
        }
        const std::string_view skipped = rest_.substr(0, bytes);
        rest_.remove_prefix(bytes);
        return skipped;
    }

private:
    std::string_view rest_;
};

struct Counts {
    std::size_t utcMarks, standardMarks, leapSeconds, changes, types, letters;
};

Counts readHeader(Bytes& bytes) {
    if (bytes.skip(4) != "TZif" || bytes.skip(16)[0] < '2') {
        throw std::runtime_error("not a compiled zone with 64-bit moments");
    }
    Counts counts{};
    for (std::size_t* count : {&counts.utcMarks, &counts.standardMarks, &counts.leapSeconds, &counts.changes,
                               &counts.types, &counts.letters}) {
        *count = bytes.count();
    }
    return counts;
}

} // namespace

bool hasZoneCompiler() {
    return compilerPath() != nullptr;
}

Compilation compileZones(const fs::path& from, const std::vector<std::string>& sources, const fs::path& to) {
    const char* const compiler = compilerPath();
    if (compiler == nullptr) {
        throw std::runtime_error("this machine has no zone compiler");
    }
    std::vector<std::string> words = {compiler, "-b", "fat", "-d", to.string()};
    for (const std::string& source : sources) {
        words.push_back((from / source).string());
    }
    std::vector<char*> arguments;
    for (std::string& word : words) {
        arguments.push_back(word.data());
    }
    arguments.push_back(nullptr);

    const std::string log = to.string() + ".log";
    posix_spawn_file_actions_t actions;
    ::posix_spawn_file_actions_init(&actions);
    ::posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, log.c_str(), O_WRONLY | O_CREAT | O_TRUNC,
                                       0600);
    std::array<char, 9> language = {"LC_ALL=C"};
    std::array<char*, 2> environment = {language.data(), nullptr};
    pid_t child = 0;
    const int failure =
        ::posix_spawn(&child, compiler, &actions, nullptr, arguments.data(), environment.data());
    ::posix_spawn_file_actions_destroy(&actions);
    int status = 0;
    if (failure != 0 || ::waitpid(child, &status, 0) != child) {
        throw std::runtime_error("cannot run the zone compiler");
    }
    // It ends well in spite of some of its errors.
    std::string printed = contentsOf(log);
    return {status == 0 && !hasError(printed), std::move(printed)};
}

std::int64_t CompiledZone::offsetAt(std::int64_t moment) const {
    const auto behind = std::upper_bound(moments.begin(), moments.end(), moment);
    return behind == moments.begin() ? first
                                     : offsets[static_cast<std::size_t>(behind - moments.begin()) - 1];
}

CompiledZone readCompiledZone(const fs::path& file) {
    const std::string text = contentsOf(file);
    Bytes bytes(text);
    const Counts narrow = readHeader(bytes);
    bytes.skip(narrow.changes * 5 + narrow.types * 6 + narrow.letters + narrow.leapSeconds * 8 +
               narrow.standardMarks + narrow.utcMarks);
    const Counts counts = readHeader(bytes);
    CompiledZone zone;
    for (std::size_t i = 0; i < counts.changes; ++i) {
        zone.moments.push_back(bytes.number(8));
    }
    const std::string_view typeOfChange = bytes.skip(counts.changes);
    std::vector<std::int64_t> offsetOfType;
    for (std::size_t i = 0; i < counts.types; ++i) {
        offsetOfType.push_back(bytes.number(4));
        bytes.skip(2);
    }
    for (const char type : typeOfChange) {
        zone.offsets.push_back(offsetOfType.at(static_cast<unsigned char>(type)));
    }
    zone.first = offsetOfType.at(0);
    return zone;
}

} // namespace kvt::test
