// What a segment costs: a few calls to the operating system, one byte written, nothing mapped.
#include <mmap/counted_calls.h>
#include <mmap/segment_words.h>

#include <boost/interprocess/exceptions.hpp>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <utility>

namespace {

using namespace kvt::test;

constexpr Word sizes[] = {1, 4096, 65536, Word{16} << 20, Word{1} << 30, Word{64} << 30};
constexpr std::size_t aFew = 8;

std::size_t mappingsOf(const std::string& path) {
    std::ifstream maps("/proc/self/maps");
    std::size_t count = 0;
    for (std::string line; std::getline(maps, line);) {
        count += line.ends_with(path) ? 1U : 0U;
    }
    return count;
}

std::size_t openFiles() {
    const std::filesystem::directory_iterator files("/proc/self/fd");
    return static_cast<std::size_t>(std::distance(begin(files), end(files)));
}

// Creates a segment of each size and holds what it took against what it may take.
void expectFewCalls(memory_manager& manager, const std::string& path) {
    std::string first;
    Word end = std::filesystem::file_size(path);
    const std::size_t mappings = mappingsOf(path);
    for (const Word size : sizes) {
        CountedCalls counted;
        {
            const CallCounter counter;
            manager.create_segment(size);
            counted = counter.sofar();
        }
        EXPECT_GT(counted.calls, 0U);
        EXPECT_LE(counted.calls, aFew) << size << ": " << counted.names;
        EXPECT_EQ(counted.bytesWritten, 1U) << size << ": " << counted.names;
        if (first.empty()) {
            first = counted.names;
        }
        EXPECT_EQ(counted.names, first) << size;
        end += (size + 4095) / 4096 * 4096;
        EXPECT_EQ(std::filesystem::file_size(path), end);
        EXPECT_EQ(mappingsOf(path), mappings) << "a new segment is not mapped";
    }
}

TEST(SystemCalls, ASegmentOfATemporaryFileTakesAFewWhateverItsSize) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    memory_manager manager(path, temporaryOptions(65536));
    ASSERT_EQ(mappingsOf(path), 0U);
    expectFewCalls(manager, path);
}

TEST(SystemCalls, ASegmentOfAPersistentFileTakesAFewWhateverItsSize) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    memory_manager manager(path, persistentOptions(65536));
    manager.restore(); // which maps the header
    ASSERT_EQ(mappingsOf(path), 1U);
    expectFewCalls(manager, path);
}

TEST(SystemCalls, SavingAndRestoringTakeNone) {
    const ScratchFolder folder;
    memory_manager manager(folder.file("backing"), persistentOptions(1 << 20));
    manager.restore();
    const auto words = toSave(wordsOf(1, 1000));
    CountedCalls counted;
    {
        const CallCounter counter;
        for (int i = 0; i < 10; ++i) {
            manager.save(words);
        }
        for (int i = 0; i < 10; ++i) {
            manager.restore();
        }
        counted = counter.sofar();
    }
    EXPECT_EQ(counted.calls, 0U) << counted.names;
}

TEST(SystemCalls, LoadingMapsOnceAndReleasingFlushesAndUnmaps) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    memory_manager manager(path, temporaryOptions(65536));
    mapped_region_segment segment = manager.create_segment();
    const auto number = [](const std::string& names, const std::string& name) {
        std::size_t count = 0;
        for (std::size_t at = 0; (at = (" " + names).find(" " + name + " ", at)) != std::string::npos; ++at) {
            ++count;
        }
        return count;
    };
    const auto callsOf = [](auto&& work) {
        const CallCounter counter;
        work();
        return counter.sofar().names;
    };
    const std::string loading = callsOf([&] { segment.load(false); });
    EXPECT_EQ(number(loading, "mmap"), 1U) << loading;
    EXPECT_EQ(mappingsOf(path), 1U);
    EXPECT_EQ(callsOf([&] { segment.load(true); }), "");

    const std::string releasingEmpty = callsOf([&] { segment.release(); });
    EXPECT_EQ(number(releasingEmpty, "munmap"), 1U) << releasingEmpty;
    EXPECT_EQ(number(releasingEmpty, "msync"), 0U) << "nothing in it is worth keeping: " << releasingEmpty;
    EXPECT_EQ(mappingsOf(path), 0U);
    EXPECT_EQ(callsOf([&] { segment.release(); }), "");

    segment.load(false);
    put(segment, "words", wordsOf(1, 10));
    const std::string releasing = callsOf([&] { segment.release(); });
    EXPECT_EQ(number(releasing, "munmap"), 1U) << releasing;
    EXPECT_EQ(number(releasing, "msync"), 1U) << releasing;

    segment.load(false);
    mapped_region_segment other;
    EXPECT_EQ(callsOf([&] { segment = std::move(other); }), "") << "assignment exchanges the two";
    EXPECT_EQ(get(other, "words"), wordsOf(1, 10));
}

TEST(SystemCalls, ADestroyedSegmentIsUnmappedWithoutAFlush) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    memory_manager manager(path, temporaryOptions(65536));
    CountedCalls counted;
    {
        mapped_region_segment segment = manager.create_segment();
        segment.load(false);
        put(segment, "words", wordsOf(1, 10));
        {
            const CallCounter counter;
            { const mapped_region_segment last = std::move(segment); }
            counted = counter.sofar();
        }
    }
    EXPECT_NE(counted.names.find("munmap"), std::string::npos) << counted.names;
    EXPECT_EQ(counted.names.find("sync"), std::string::npos) << counted.names;
    EXPECT_EQ(mappingsOf(path), 0U);
}

// The first open() of a temporary manager empties the file or makes it, and its second one is to map it. A persistent
// manager makes a file by the first one, and maps a file that is there by it.
TEST(SystemCalls, AFileThatCannotBeMappedIsRemovedOnlyWhenItWasMadeForThat) {
    const struct {
        int line;
        bool persists;
        bool wasThere;
        std::size_t failingOpen;
    } rows[] = {
        {__LINE__, false, true, 2}, // emptied, and there
        {__LINE__, true, true, 1},   {__LINE__, false, false, 1},
        {__LINE__, false, false, 2}, {__LINE__, true, false, 2},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        const ScratchFolder folder;
        const std::string path = folder.file("backing");
        if (row.wasThere) {
            std::ofstream(path) << std::string(65536, 'x');
        }
        {
            const FailingOpen failing(row.failingOpen);
            EXPECT_THROW(
                memory_manager(path, row.persists ? persistentOptions(65536) : temporaryOptions(65536)),
                boost::interprocess::interprocess_exception);
        }
        EXPECT_EQ(std::filesystem::exists(path), row.wasThere);
    }
}

TEST(SystemCalls, NoOpenFileIsLeftBehind) {
    const ScratchFolder folder;
    const std::size_t before = openFiles();
    {
        memory_manager manager(folder.file("backing"), persistentOptions(65536));
        manager.restore();
        const std::size_t held = openFiles();
        for (int i = 0; i < 50; ++i) {
            mapped_region_segment segment = manager.create_segment(4096);
            segment.load(false);
            put(segment, "words", wordsOf(1, 10));
            segment.release();
        }
        EXPECT_EQ(openFiles(), held);
    }
    EXPECT_EQ(openFiles(), before);
}

} // namespace
