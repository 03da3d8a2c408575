// `kvt memory inspect`: what the library has put into a file, and files that are none.

#include "host_test.h"

#include <kvt/mmap/memory_manager.h>

#include <nlohmann/json.hpp>

#include <cstring>
#include <set>
#include <sys/stat.h>

namespace kvt::test {

namespace {

using ex::mmap::manager_options;
using ex::mmap::mapped_region_segment;
using ex::mmap::memory_manager;

ex::vector<unsigned long long> words(std::uint64_t count) {
    ex::vector<unsigned long long> made;
    for (std::uint64_t word = 0; word < count; ++word) {
        made.push_back(word);
    }
    return made;
}

} // namespace

class KvtMemoryInspect : public HostTest {
protected:
    memory_manager manager(const std::string& name, std::uint64_t segmentSize = 65536) const {
        manager_options options;
        options.segment_size = segmentSize;
        options.persistent = true;
        return memory_manager(path(name), options);
    }

    // A small file with all that there can be, and what was saved taken out again in part.
    void writeFile() const {
        memory_manager made = manager("file");
        mapped_region_segment first = made.create_segment();
        first.load(false);
        first.segment_manager()->allocate(1000);
        made.create_segment(8192);
        made.save(words(3));
        made.save(words(0));
        made.save(words(70));
        made.restore();
    }

    nlohmann::json inspect(std::vector<std::string> arguments = {"file"}, int status = 0) {
        arguments.insert(arguments.begin(), {"memory", "inspect", "--json"});
        const ChildResult result = kvt(std::move(arguments));
        EXPECT_EQ(result.status, status) << result.err;
        return nlohmann::json::parse(result.out, nullptr, false);
    }

    // Overwrites eight bytes of the file.
    void put(const std::string& name, std::uint64_t offset, std::uint64_t word) const {
        std::fstream file(path(name), std::ios::in | std::ios::out | std::ios::binary);
        file.seekp(static_cast<std::streamoff>(offset));
        file.write(reinterpret_cast<const char*>(&word), sizeof word);
    }

    std::string failureOf(const std::string& name, std::vector<std::string> more = {}) {
        more.insert(more.begin(), {"memory", "inspect", name});
        const ChildResult result = kvt(std::move(more));
        EXPECT_EQ(result.status, 2) << result.out;
        EXPECT_EQ(result.out, "");
        return result.err;
    }
};

TEST_F(KvtMemoryInspect, ListsSegmentsWithWhatIsInThem) {
    std::uint64_t freeBytes = 0;
    {
        memory_manager made = manager("file");
        mapped_region_segment first = made.create_segment();
        first.load(false);
        first.segment_manager()->allocate(1000);
        freeBytes = first.segment_manager()->get_free_memory();
        made.create_segment(8192);
        made.save(words(3));
        made.save(words(70));
    }
    const nlohmann::json report = inspect();
    EXPECT_EQ(report["file"], "file");
    EXPECT_EQ(report["size"], 65536 + 65536 + 8192);
    EXPECT_EQ(report["header"]["offset"], 0);
    EXPECT_EQ(report["header"]["size"], 65536);
    EXPECT_EQ(report["header"]["state"], "heap");
    EXPECT_GT(report["header"]["allocated"], 192);
    ASSERT_EQ(report["segments"].size(), 2u);
    EXPECT_EQ(report["segments"][0]["index"], 0);
    EXPECT_EQ(report["segments"][0]["offset"], 65536);
    EXPECT_EQ(report["segments"][0]["size"], 65536);
    EXPECT_EQ(report["segments"][0]["state"], "heap");
    EXPECT_EQ(report["segments"][0]["free"], freeBytes);
    EXPECT_GE(report["segments"][0]["allocated"], 1000);
    EXPECT_LT(report["segments"][0]["allocated"], 1100);
    EXPECT_EQ(report["segments"][1]["offset"], 131072);
    EXPECT_EQ(report["segments"][1]["size"], 8192);
    EXPECT_EQ(report["segments"][1]["state"], "unused");
    EXPECT_TRUE(report["segments"][1]["free"].is_null());
    EXPECT_EQ(report["savedVectors"], 2);
    EXPECT_EQ(report["savedWords"], 73);
    EXPECT_EQ(report["unaccounted"], 0);
}

TEST_F(KvtMemoryInspect, ShowsATable) {
    writeFile();
    const ChildResult result = kvt({"memory", "inspect", "file"});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(result.err, "");
    EXPECT_TRUE(
        result.out.starts_with("segment  offset   size  allocated   free  state\nheader        0  65536"))
        << result.out;
    EXPECT_TRUE(contains(result.out, "\n0         65536  65536       1008  64400  heap\n")) << result.out;
    EXPECT_TRUE(contains(result.out, "\n1        131072   8192          -      -  unused\n")) << result.out;
    EXPECT_TRUE(result.out.ends_with("\n2 saved vectors of 70 words in all\n")) << result.out;
}

TEST_F(KvtMemoryInspect, FollowsLongListsWhoseBeginningsAreGone) {
    constexpr std::uint64_t segments = 100;
    constexpr std::uint64_t saved = 83;
    std::uint64_t left = 0;
    {
        memory_manager made = manager("file", 1 << 20);
        for (std::uint64_t index = 0; index < segments; ++index) {
            made.create_segment((index % 3 + 1) * 4096);
        }
        for (std::uint64_t index = 0; index < saved; ++index) {
            made.save(words(index * 5));
            left += index * 5;
        }
        for (std::uint64_t index = 0; index < 17; ++index) {
            left -= made.restore().size();
        }
    }
    const nlohmann::json report = inspect();
    ASSERT_EQ(report["segments"].size(), segments);
    std::uint64_t end = 1 << 20;
    for (std::uint64_t index = 0; index < segments; ++index) {
        EXPECT_EQ(report["segments"][index]["offset"], end);
        EXPECT_EQ(report["segments"][index]["size"], (index % 3 + 1) * 4096);
        end += (index % 3 + 1) * 4096;
    }
    EXPECT_EQ(report["savedVectors"], saved - 17);
    EXPECT_EQ(report["savedWords"], left);
}

TEST_F(KvtMemoryInspect, AFileThatWasMadeAndNeverUsedHasNothing) {
    manager("file", 8192);
    const nlohmann::json report = inspect();
    EXPECT_EQ(report["header"]["state"], "unused");
    EXPECT_EQ(report["header"]["size"], 8192);
    EXPECT_EQ(report["segments"].size(), 0u);
    EXPECT_EQ(report["savedVectors"], 0);
    EXPECT_EQ(inspect({"file", "--segment-size", "4K"})["header"]["size"], 4096);
    EXPECT_EQ(inspect({"file", "--segment-size", "4K"})["unaccounted"], 4096);
}

TEST_F(KvtMemoryInspect, TheSizeOfSegmentsIsReadFromTheFileAndComparedWhenGiven) {
    writeFile();
    for (const char* size : {"64K", "65536", "65000"}) {
        EXPECT_EQ(inspect({"file", "--segment-size", size})["header"]["size"], 65536) << size;
    }
    EXPECT_EQ(failureOf("file", {"--segment-size", "4K"}),
              "kvt: file: its header segment has 65536 bytes, not 4096 bytes\n");
    EXPECT_EQ(failureOf("file", {"--segment-size", "1M"}),
              "kvt: file: it has 139264 bytes, less than the header segment of 1048576 bytes\n");
    EXPECT_EQ(failureOf("file", {"--segment-size", "much"}),
              "kvt: --segment-size takes a size such as 64K, 128M or 2G, not 'much'\n");
}

TEST_F(KvtMemoryInspect, NothingIsChanged) {
    writeFile();
    ::chmod(path("file").c_str(), 0400);
    const std::string before = read("file");
    const auto time = std::filesystem::last_write_time(path("file"));
    inspect();
    EXPECT_TRUE(read("file") == before);
    EXPECT_EQ(std::filesystem::last_write_time(path("file")), time);
    EXPECT_EQ(names(), std::vector<std::string>{"file"});
    EXPECT_EQ(manager("file").restore().size(), 0u);
    EXPECT_EQ(manager("file").restore().size(), 70u);
}

TEST_F(KvtMemoryInspect, SegmentsThatAreNotAsTheyShouldBeAreNamed) {
    writeFile();
    put("file", 65536 + 48, 4096); // the size in the heap of segment 0
    EXPECT_EQ(inspect({"file"}, 1)["segments"][0]["state"], "damaged");
    std::filesystem::resize_file(path("file"), 131072 + 100);
    const ChildResult result = kvt({"memory", "inspect", "file"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.err, "kvt: file: segment 0 is damaged\nkvt: file: segment 1 is cut off\n");
    EXPECT_TRUE(contains(result.out, "cut off\n")) << result.out;
}

TEST_F(KvtMemoryInspect, SegmentsInOneAnothersPlaceAreRefused) {
    writeFile();
    const std::string header = read("file").substr(0, 65536);
    const std::uint64_t secondSegment = 131072;
    for (std::uint64_t offset = 0; offset < header.size(); offset += 8) {
        if (std::memcmp(header.data() + offset, &secondSegment, 8) == 0) {
            put("file", offset, 65536); // where the first one is
        }
    }
    EXPECT_EQ(failureOf("file"), "kvt: file: the header segment is damaged: its table has segments in one "
                                 "another's place\n");
}

TEST_F(KvtMemoryInspect, BytesOfNoSegmentAreCounted) {
    writeFile();
    std::filesystem::resize_file(path("file"), 139264 + 5);
    EXPECT_EQ(inspect()["unaccounted"], 5);
    EXPECT_TRUE(contains(kvt({"memory", "inspect", "file"}).out, "\n5 bytes of the file in no segment\n"));
}

TEST_F(KvtMemoryInspect, FilesOfAnotherKindAreRefused) {
    EXPECT_EQ(failureOf("missing"), "kvt: cannot read missing: No such file or directory\n");
    EXPECT_EQ(failureOf("."), "kvt: .: it is no regular file\n");
    EXPECT_EQ(failureOf("/dev/null"), "kvt: /dev/null: it is no regular file\n");
    ASSERT_EQ(::mkfifo(path("pipe").c_str(), 0600), 0);
    EXPECT_EQ(failureOf("pipe"), "kvt: pipe: it is no regular file\n");
    write("empty", "");
    EXPECT_EQ(failureOf("empty"), "kvt: empty: it is too short for a persistent file of segments: 0 bytes\n");
    write("text", std::string(100000, 'x'));
    EXPECT_EQ(failureOf("text"),
              "kvt: text: it does not begin with a heap; it is no persistent file of segments\n");
    EXPECT_EQ(failureOf(KVT_PROGRAM),
              "kvt: " KVT_PROGRAM ": it does not begin with a heap; it is no persistent file of segments\n");
    {
        memory_manager temporary(path("temporary"), {});
        mapped_region_segment segment = temporary.create_segment(4096);
        segment.load(false);
        std::filesystem::copy_file(path("temporary"), path("copy"));
    }
    EXPECT_EQ(failureOf("copy"),
              "kvt: copy: its first heap has no table of segments; it is no persistent file, or "
              "its header was not finished\n");
    EXPECT_EQ(failureOf("\x1b[31m"), "kvt: cannot read \\x1B[31m: No such file or directory\n");
}

TEST_F(KvtMemoryInspect, ACutHeaderIsRefused) {
    writeFile();
    std::filesystem::resize_file(path("file"), 40000);
    EXPECT_EQ(failureOf("file"),
              "kvt: file: it has 40000 bytes, less than its header segment of 65536 bytes\n");
}

TEST_F(KvtMemoryInspect, AFileMayBeCutAnywhere) {
    writeFile();
    const std::string whole = read("file");
    ASSERT_EQ(whole.size(), 139264u);
    for (const std::size_t length : {1u, 127u, 128u, 200u, 4096u, 65535u}) {
        write("file", whole.substr(0, length));
        const std::string failure = failureOf("file");
        const std::string text = length < 128
                                     ? "kvt: file: it is too short for a persistent file of segments: "
                                     : "kvt: file: it has " + std::to_string(length) +
                                           " bytes, less than its header segment of 65536 bytes\n";
        EXPECT_TRUE(failure.starts_with(text)) << failure;
    }
    for (const std::size_t length : {65536u, 65537u, 131071u, 131072u, 139263u}) {
        write("file", whole.substr(0, length));
        const nlohmann::json report = inspect({"file"}, 1);
        EXPECT_EQ(report["segments"][0]["state"], length < 131072 ? "cut off" : "heap") << length;
        EXPECT_EQ(report["segments"][1]["state"], "cut off") << length;
        EXPECT_EQ(report["unaccounted"], 0) << length;
        EXPECT_EQ(report["savedVectors"], 2) << length;
    }
}

// Every word of the head, the object and its lists, one after the other, is set to what is likely to lead astray.
TEST_F(KvtMemoryInspect, NoDamageOfTheHeaderLeadsAstray) {
    writeFile();
    const std::string whole = read("file");
    int refused = 0;
    std::set<std::string> reasons;
    for (std::uint64_t offset = 0; offset < 560; offset += 8) {
        for (const std::uint64_t value : {std::uint64_t{0}, std::uint64_t{1}, std::uint64_t{65528},
                                          ~std::uint64_t{0} << 4, std::uint64_t{1} << 62}) {
            write("file", whole);
            put("file", offset, value);
            const ChildResult result = kvt({"memory", "inspect", "file"});
            EXPECT_LE(result.status, 2) << offset << " " << value;
            EXPECT_EQ(result.status == 0, result.err.empty()) << offset << " " << value;
            if (result.status == 2) {
                ++refused;
                reasons.insert(result.err.substr(result.err.rfind(": ") + 2));
            }
        }
    }
    EXPECT_GT(refused, 60);
    for (const std::string reason :
         {"a pointer leads out of it\n", "a pointer is missing\n", "a list has no map\n",
          "a list points beside its elements\n", "a list points beside its map\n"}) {
        EXPECT_EQ(reasons.count(reason), 1u) << reason;
    }
}

TEST_F(KvtMemoryInspect, ASegmentForWhichTheFileCouldNotGrowLiesNowhere) {
    {
        memory_manager made = manager("file");
        made.create_segment(8192);
    }
    // The row of its table: where it lies, and how long it is.
    const std::uint64_t row[] = {65536, 8192};
    const std::size_t at = read("file").find(std::string(reinterpret_cast<const char*>(row), sizeof row));
    ASSERT_NE(at, std::string::npos);
    put("file", at, ~std::uint64_t{0});
    const nlohmann::json segment = inspect()["segments"][0];
    EXPECT_EQ(segment["state"], "not made");
    EXPECT_TRUE(segment["offset"].is_null());
    EXPECT_EQ(segment["size"], 8192);
    EXPECT_TRUE(contains(kvt({"memory", "inspect", "file"}).out, "not made"));
}

} // namespace kvt::test
