// One file, many threads: handles that come and go, and the operations that take the manager's mutex. The thread
// sanitizer looks on in its own build.
#include <mmap/segment_words.h>
#include <reference/mapped_file_reference.h>

#include <gtest/gtest.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <iterator>
#include <map>
#include <memory>
#include <mutex>
#include <random>
#include <set>
#include <stdexcept>
#include <string>
#include <thread>
#include <utility>
#include <vector>

namespace {

using namespace kvt::test;

constexpr unsigned threadCount = 8;
constexpr Word headerSize = 4 << 20;

template <typename Work>
void onManyThreads(Work work) {
    std::atomic<unsigned> ready{0};
    std::vector<std::thread> threads;
    for (unsigned t = 0; t < threadCount; ++t) {
        threads.emplace_back([&, t] {
            ++ready;
            while (ready < threadCount) {
                std::this_thread::yield();
            }
            work(t);
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}

TEST(Threads, HandlesAreCopiedAndDroppedAnywhere) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    {
        const memory_manager first(path, temporaryOptions(4096));
        onManyThreads([&](unsigned t) {
            std::mt19937 random(t);
            std::vector<memory_manager> handles;
            for (int i = 0; i < 2000; ++i) {
                switch (random() % 4) {
                case 0:
                    handles.push_back(first);
                    break;
                case 1:
                    if (!handles.empty()) {
                        handles.pop_back();
                    }
                    break;
                case 2:
                    if (handles.size() > 1) {
                        handles.front() = handles.back();
                        handles.back() = std::move(handles.front());
                        handles.front() = first;
                    }
                    break;
                default:
                    EXPECT_EQ((handles.empty() ? first : handles.back()).options().segment_size, 4096U);
                    EXPECT_FALSE(first.persistent());
                }
            }
        });
        EXPECT_TRUE(std::filesystem::exists(path)) << "one handle is left";
    }
    EXPECT_FALSE(std::filesystem::exists(path));
}

TEST(Threads, TheLastHandleToGoDeletesTheFileOnceWhereverItGoes) {
    const ScratchFolder folder;
    for (unsigned round = 0; round < 200; ++round) {
        const std::string path = folder.file("backing");
        std::vector<std::unique_ptr<memory_manager>> handles;
        handles.push_back(std::make_unique<memory_manager>(path, temporaryOptions(4096)));
        for (unsigned t = 1; t < threadCount; ++t) {
            handles.push_back(std::make_unique<memory_manager>(*handles[0]));
        }
        mapped_region_segment segment = handles[0]->create_segment();
        segment.load(false);
        ASSERT_TRUE(std::filesystem::exists(path));
        onManyThreads([&](unsigned t) { handles[t].reset(); });
        ASSERT_FALSE(std::filesystem::exists(path));
        put(segment, "words", wordsOf(round, 20));
        ASSERT_EQ(get(segment, "words"), wordsOf(round, 20)) << "a loaded segment outlives the file's name";
    }
}

// Each word of a saved vector says who saved it and as which.
TEST(Threads, EachSavedVectorComesBackOnceAndInOrderForEachSaver) {
    const ScratchFolder folder;
    memory_manager manager(folder.file("backing"), persistentOptions(headerSize));
    manager.restore();
    constexpr Word each = 300;
    std::vector<std::vector<Words>> taken(threadCount);
    onManyThreads([&](unsigned t) {
        memory_manager handle = manager;
        for (Word number = 1; number <= each; ++number) {
            handle.save(toSave(Words(1 + number % 70, Word{t} << 32 | number)));
            const Words words = kvt::test::taken(handle.restore());
            if (!words.empty()) {
                taken[t].push_back(words);
            }
        }
    });
    EXPECT_TRUE(manager.restore().empty()) << "as many were taken as were saved";
    std::set<Word> seen;
    for (const std::vector<Words>& byOne : taken) {
        std::map<Word, Word> lastOf;
        for (const Words& words : byOne) {
            const Word number = words.front() & 0xFFFFFFFF;
            const Word saver = words.front() >> 32;
            EXPECT_EQ(words, Words(1 + number % 70, words.front()));
            EXPECT_GT(number, lastOf[saver]) << "of saver " << saver;
            lastOf[saver] = number;
            EXPECT_TRUE(seen.insert(words.front()).second) << "taken twice";
        }
    }
    EXPECT_EQ(seen.size(), threadCount * each);
}

TEST(Threads, SegmentsAreCreatedFilledAndOpenedOnAll) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    memory_manager manager(path, persistentOptions(headerSize));
    constexpr Word each = 25;
    std::mutex mutex;
    std::map<Word, Word> tagOf; // by index, those that are released
    onManyThreads([&](unsigned t) {
        memory_manager handle = manager;
        std::mt19937 random(t);
        for (Word number = 0; number < each; ++number) {
            const Word tag = t * each + number;
            mapped_region_segment segment = handle.create_segment(4096 * (1 + tag % 4));
            segment.load(false);
            put(segment, "words", wordsOf(tag, 100 + tag));
            segment.release();
            handle.save(toSave({tag}));
            std::pair<Word, Word> other;
            {
                const std::lock_guard<std::mutex> lock(mutex);
                tagOf[segment.index()] = tag;
                other = *std::next(tagOf.begin(), static_cast<std::ptrdiff_t>(random() % tagOf.size()));
            }
            mapped_region_segment opened = handle.open_segment(other.first);
            EXPECT_EQ(get(opened, "words"), wordsOf(other.second, 100 + other.second));
            EXPECT_THROW(handle.open_segment(threadCount * each), std::out_of_range);
        }
    });
    ASSERT_EQ(tagOf.size(), threadCount * each);
    const reference::RawFile file(path);
    const reference::Header header = reference::readHeader(file);
    ASSERT_EQ(header.rows.size(), threadCount * each);
    std::int64_t end = headerSize;
    for (Word index = 0; index < header.rows.size(); ++index) {
        const Word tag = tagOf.at(index);
        EXPECT_EQ(header.rows[index], (reference::SegmentRow{end, 4096 * (1 + tag % 4)})) << index;
        const reference::Heap heap = reference::readHeap(file, static_cast<reference::Position>(end));
        EXPECT_EQ(reference::readWords(file, heap.object("words")), wordsOf(tag, 100 + tag));
        end += static_cast<std::int64_t>(header.rows[index].size);
    }
    EXPECT_EQ(header.saved.size(), threadCount * each);
}

TEST(Threads, SegmentsOfATemporaryFileDoNotOverlap) {
    const ScratchFolder folder;
    memory_manager manager(folder.file("backing"), temporaryOptions(8192));
    std::vector<std::vector<mapped_region_segment>> segments(threadCount);
    onManyThreads([&](unsigned t) {
        for (Word number = 0; number < 25; ++number) {
            segments[t].push_back(manager.create_segment());
            segments[t].back().load(false);
            put(segments[t].back(), "words", wordsOf(t * 100 + number, 500));
        }
    });
    std::set<std::int64_t> offsets;
    for (unsigned t = 0; t < threadCount; ++t) {
        for (Word number = 0; number < segments[t].size(); ++number) {
            EXPECT_EQ(get(segments[t][number], "words"), wordsOf(t * 100 + number, 500));
            EXPECT_EQ(segments[t][number].offset() % 8192, 0);
            EXPECT_TRUE(offsets.insert(segments[t][number].offset()).second);
        }
    }
    EXPECT_EQ(*offsets.rbegin(), static_cast<std::int64_t>((threadCount * 25 - 1) * 8192));
}

} // namespace
