// Files whose names are not ASCII, and not always UTF-8, in every place where a command takes a file; and files that
// another process uses.

#include "host_test.h"

#include <kvt/datetime/zone_folder.h>
#include <kvt/mmap/memory_manager.h>

#include <nlohmann/json.hpp>

#include <sstream>

namespace kvt::test {

namespace {

// What a system of UTF-8 writes, what an older one left behind, and what looks like an option or an escape.
const char* const unusual[] = {"\u00fcbung \U0001f4be", "M\xfchle \xff", "- \u0141\u00f3d\u017a \\n"};

std::string manyLines() {
    std::string lines;
    for (int i = 0; i < 20000; ++i) {
        lines += std::to_string(i * 7919 % 20000 + 100000) + "\n";
    }
    return lines;
}

bool isSorted(const std::string& text) {
    std::istringstream lines(text);
    std::string before;
    for (std::string line; std::getline(lines, line); before = line) {
        if (line < before) {
            return false;
        }
    }
    return true;
}

} // namespace

class KvtFileNames : public HostTest {
protected:
    // As an argument that no option parser takes for anything else.
    static std::string argument(const std::string& name, const char* suffix) { return "./" + name + suffix; }

    std::vector<std::string> reportedFiles(const std::string& report) const {
        std::vector<std::string> files;
        std::istringstream lines(read(report));
        for (std::string line; std::getline(lines, line);) {
            files.push_back(nlohmann::json::parse(line).at("file"));
        }
        return files;
    }
};

TEST_F(KvtFileNames, OfInputOutputAndReport) {
    for (const std::string name : unusual) {
        write(name + ".in", "a\u0141\n");
        const ChildResult result =
            kvt({"convert", "--from", "UTF-8", "--to", "US-ASCII", "--report", argument(name, ".losses"),
                 "-o", argument(name, ".out"), argument(name, ".in")});
        EXPECT_EQ(result.status, 1) << result.err;
        EXPECT_EQ(read(name + ".out"), "a?\n");
        EXPECT_EQ(reportedFiles(name + ".losses").size(), 1U); // a line of JSON whatever bytes the name has
        const ChildResult missing = kvt({"match", "a", argument(name, ".none")});
        EXPECT_EQ(missing.status, 2);
        EXPECT_TRUE(contains(missing.err, ": No such file or directory\n")) << missing.err;
    }
    const std::string utf8 = std::string(unusual[0]) + ".losses";
    EXPECT_EQ(reportedFiles(utf8).front(), argument(unusual[0], ".in"));
}

TEST_F(KvtFileNames, OfRejectedRowsAndAJob) {
    for (const std::string name : unusual) {
        write(name + ".csv", "day\n31.12.2019\nnone\n");
        const ChildResult result = kvt(
            {"translate", "--on-error", "skip", "--date", "day=%d.%m.%Y", "--reject", argument(name, ".bad"),
             "--report", argument(name, ".report"), "-o", argument(name, ".out"), argument(name, ".csv")});
        EXPECT_EQ(result.status, 1) << result.err;
        EXPECT_EQ(read(name + ".out"), "day\n20191231\n");
        EXPECT_TRUE(contains(read(name + ".bad"), "none\n")) << read(name + ".bad");
        EXPECT_EQ(reportedFiles(name + ".report").size(), 1U);
        const ChildResult inferred = kvt({"infer", "-o", argument(name, ".made"), argument(name, ".csv")});
        EXPECT_EQ(inferred.status, 0) << inferred.err;
        const ChildResult done = kvt({"translate", "--job", argument(name, ".made"), argument(name, ".csv")});
        EXPECT_TRUE(done.out.starts_with("day\n")) << done.out << done.err;
    }
}

TEST_F(KvtFileNames, OfAWorkspace) {
    for (const std::string name : unusual) {
        const ChildResult result =
            kvt({"sort", "--memory", "64K", "--workspace", argument(name, ".work")}, manyLines());
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_EQ(result.out.size(), manyLines().size());
        EXPECT_TRUE(isSorted(result.out));
        EXPECT_FALSE(exists(name + ".work"));
    }
}

TEST_F(KvtFileNames, OfAZoneFolder) {
    for (const std::string name : unusual) {
        const std::string rules = write(name + ".zi", "# version 2031x\nZ Etc/UTC 0 - UTC\nL Etc/UTC UTC\n");
        const ChildResult written = kvt({"tzdata", "-o", argument(name, ".zones"), "--from", rules});
        EXPECT_EQ(written.status, 0) << written.err;
        const auto fault = ex::datetime::zoneFolderFault(path(name + ".zones"));
        EXPECT_FALSE(fault.has_value()) << fault->file << fault->reason;
        ChildSetup now = setup({"date", "now", "--zone-database", argument(name, ".zones")});
        now.environment = {{"TZ", "Etc/UTC"}};
        const ChildResult result = runChild(now);
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_TRUE(result.out.ends_with("+00:00\n")) << result.out;
    }
}

TEST_F(KvtFileNames, OfAPersistentFile) {
    for (const std::string name : unusual) {
        ex::mmap::manager_options options;
        options.persistent = true;
        ex::mmap::memory_manager(path(name), options).create_segment(65536).load(false);
        ex::mmap::memory_manager again(path(name), options);
        EXPECT_EQ(again.open_segment(0).size(), 65536U);
        const ChildResult inspected = kvt({"memory", "inspect", argument(name, "")});
        EXPECT_EQ(inspected.status, 0) << inspected.err;
    }
}

class KvtSharedFiles : public HostTest {};

TEST_F(KvtSharedFiles, AWorkspaceOfAnotherProcessIsLeftToIt) {
    ChildSetup first = setup({"sort", "--memory", "64K", "--workspace", "work", "-o", "out"});
    std::string second;
    bool isSent = false;
    const std::string lines = manyLines();
    first.makeInput = [&]() -> std::string_view {
        if (!std::exchange(isSent, true)) {
            return lines;
        }
        if (second.empty()) {
            for (int tries = 0; tries < 500 && !exists("work"); ++tries) {
                ::usleep(10000);
            }
            const ChildResult refused = kvt({"sort", "--workspace", "work"}, "b\na\n");
            EXPECT_EQ(refused.status, 2);
            second = refused.err;
        }
        return {};
    };
    EXPECT_EQ(runChild(first).status, 0);
    EXPECT_EQ(second, "kvt: the workspace work exists already; it is a file that is made and removed\n");
    EXPECT_TRUE(isSorted(read("out")));
    EXPECT_EQ(read("out").size(), lines.size());
    EXPECT_FALSE(exists("work"));
}

TEST_F(KvtSharedFiles, APersistentFileInUseIsInspectedAndStaysAsItIs) {
    ex::mmap::manager_options options;
    options.persistent = true;
    ex::mmap::memory_manager manager(path("file"), options);
    auto segment = manager.create_segment(65536);
    segment.load(false);
    const auto word = [&]() -> unsigned long long& {
        return *segment.segment_manager()->find_or_construct<unsigned long long>("word")(1ULL);
    };
    word() = 1;
    const ChildResult inspected = kvt({"memory", "inspect", "--json", "file"});
    EXPECT_EQ(inspected.status, 0) << inspected.err;
    EXPECT_EQ(nlohmann::json::parse(inspected.out).at("segments").size(), 1U) << inspected.out;
    // The owner goes on as if nobody had looked.
    word() = 2;
    segment.release();
    segment.load(false);
    EXPECT_EQ(word(), 2U);
    EXPECT_EQ(manager.create_segment(4096).index(), 1U);
}

} // namespace kvt::test
