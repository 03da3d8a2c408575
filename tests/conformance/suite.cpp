#include "suite.h"

#include <support/trust_page.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>
#include <stdexcept>
#include <sys/wait.h>

namespace conformance {
namespace {

constexpr const char* fetched = KVT_CONFORMANCE_DIR "/";

} // namespace

Suite::Suite(std::string name, std::string data) : name_(std::move(name)), data_(std::move(data)) {}

void Suite::check(bool passed, const std::string& what) {
    ++run_;
    if (!passed) {
        failed_.push_back(what);
    }
}

void Suite::leaveOut(const std::string& reason, std::size_t cases) {
    leftOut_[reason] += cases;
}

void Suite::finish() const {
    std::string reasons;
    std::size_t leftOut = 0;
    for (const auto& [reason, cases] : leftOut_) {
        reasons += (reasons.empty() ? "" : "; ") + reason + " (" + std::to_string(cases) + ")";
        leftOut += cases;
    }
    const std::string row = "| " + name_ + " | " + data_ + " | " + std::to_string(run_) + " | " +
                            std::to_string(run_ - failed_.size()) + " | " + std::to_string(leftOut) + " | " +
                            reasons + " |";
    std::cout << row << '\n';
    std::string shown;
    for (std::size_t i = 0; i < std::min<std::size_t>(failed_.size(), 20); ++i) {
        shown += failed_[i] + "\n";
    }
    EXPECT_EQ(failed_.size(), 0U) << shown;
    EXPECT_NE(run_, 0U) << "no case was found";

    const auto cells = kvt::test::trustRow(KVT_SOURCE_DIR, "Conformance", name_);
    if (cells.empty()) {
        ADD_FAILURE() << "docs/trust.md has no such row:\n" << row;
    } else if (cells.at("data") == data_) {
        EXPECT_EQ(cells.at("run"), std::to_string(run_)) << row;
        EXPECT_EQ(cells.at("passed"), std::to_string(run_ - failed_.size())) << row;
        EXPECT_EQ(cells.at("left out"), std::to_string(leftOut)) << row;
        EXPECT_EQ(cells.at("why"), reasons) << row;
    } else {
        std::cout << "docs/trust.md speaks of " << cells.at("data") << " instead\n";
    }
}

std::string sourceFolder(const std::string& package) {
    const std::string folder = fetched + package;
    return std::filesystem::exists(folder + "/version") ? folder : "";
}

std::string sourceVersion(const std::string& package) {
    return linesOf(contentsOf(sourceFolder(package) + "/version")).at(0);
}

std::string noSources(const std::string& package) {
    return std::string(fetched) + package +
           " is not there: './dev conformance' fetches it, where apt has sources";
}

std::string packageVersion(const std::string& package) {
    std::string version = outputOf("dpkg-query -W -f '${Version}' " + package + " 2>/dev/null || true");
    return version.substr(0, version.find_last_of('-'));
}

std::string outputOf(const std::string& commandLine) {
    std::FILE* const pipe = ::popen(commandLine.c_str(), "r");
    if (pipe == nullptr) {
        throw std::runtime_error("cannot run " + commandLine);
    }
    std::string output;
    char buffer[65536];
    for (std::size_t got = 0; (got = std::fread(buffer, 1, sizeof buffer, pipe)) != 0;) {
        output.append(buffer, got);
    }
    const int status = ::pclose(pipe);
    if (status != 0) {
        throw std::runtime_error(commandLine + " ended with the status " +
                                 std::to_string(WEXITSTATUS(status)));
    }
    return output;
}

std::string contentsOf(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    if (!file) {
        throw std::runtime_error(path + " cannot be read");
    }
    return {std::istreambuf_iterator<char>(file), {}};
}

std::vector<std::string> linesOf(const std::string& text) {
    std::vector<std::string> lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) {
        lines.push_back(line);
    }
    return lines;
}

std::string utf8(char32_t c) {
    const auto trail = [&](unsigned shift) { return static_cast<char>(0x80 | ((c >> shift) & 0x3F)); };
    if (c < 0x80) {
        return {static_cast<char>(c)};
    }
    if (c < 0x800) {
        return {static_cast<char>(0xC0 | (c >> 6)), trail(0)};
    }
    if (c < 0x10000) {
        return {static_cast<char>(0xE0 | (c >> 12)), trail(6), trail(0)};
    }
    return {static_cast<char>(0xF0 | (c >> 18)), trail(12), trail(6), trail(0)};
}

std::string hex(const std::string& bytes) {
    std::string digits;
    for (const char byte : bytes) {
        char two[3];
        std::snprintf(two, sizeof two, "%02X", static_cast<unsigned char>(byte));
        digits += two;
    }
    return digits;
}

} // namespace conformance
