// How much memory a large load takes: what is mapped at the time, and not what the file holds. Each load runs in a
// process of its own, which the operating system measures.
#include <mmap/forked.h>
#include <mmap/segment_words.h>
#include <reference/mapped_file_reference.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstddef>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace {

using namespace kvt::test;

constexpr Word mebi = Word{1} << 20;
constexpr Word page = 4096;
constexpr Word segmentSize = 32 * mebi;
constexpr Word load = 4096 * mebi;
constexpr Word limit = 200 * mebi;

// One of the values of /proc/self/status, in bytes.
Word statusValue(const std::string& name) {
    std::ifstream status("/proc/self/status");
    for (std::string line; std::getline(status, line);) {
        if (line.starts_with(name + ":")) {
            return std::stoull(line.substr(name.size() + 1)) * 1024;
        }
    }
    throw std::runtime_error("no " + name);
}

Word residentNow() {
    return statusValue("RssAnon") + statusValue("RssFile") + statusValue("RssShmem");
}

struct Highest {
    Word sampled = 0;
    Word bytes = 0; ///< from the file

    void sample() { sampled = std::max(sampled, residentNow()); }
};

// Fills nearly all of a loaded segment with one block and touches every page of it. A word in each 256th page is
// written, which is enough to know the segment by and keeps the load quick; the others are read, and resident all the
// same.
void fill(mapped_region_segment& segment, Word tag) {
    const Word count = (segmentSize - 4 * page) / sizeof(Word);
    Word* const words = static_cast<Word*>(segment.segment_manager()->allocate(count * sizeof(Word)));
    *segment.segment_manager()->construct<std::ptrdiff_t>("place")() =
        reinterpret_cast<char*>(words) - reinterpret_cast<char*>(segment.segment_manager());
    Word sum = 0;
    for (Word at = 0; at < count; at += page / sizeof(Word)) {
        if (at / (page / sizeof(Word)) % 256 == 0) {
            words[at] = tag * 1000 + at;
        }
        sum += words[at] == 0 ? 1U : 0U;
    }
    if (sum < count / (page / sizeof(Word)) / 2) {
        throw std::runtime_error("a new segment that is not zero");
    }
}

bool holds(mapped_region_segment& segment, Word tag) {
    const Word count = (segmentSize - 4 * page) / sizeof(Word);
    const std::ptrdiff_t place = *segment.segment_manager()->find<std::ptrdiff_t>("place").first;
    const Word* const words =
        reinterpret_cast<const Word*>(reinterpret_cast<const char*>(segment.segment_manager()) + place);
    for (Word at = 0; at < count; at += 256 * page / sizeof(Word)) {
        if (words[at] != tag * 1000 + at) {
            return false;
        }
    }
    return true;
}

std::string overLimit(const Highest& highest) {
    std::ostringstream text;
    const Word highWater = statusValue("VmHWM");
    if (highest.sampled >= limit || highWater >= limit) {
        text << "resident: " << highest.sampled / mebi << " MiB sampled, " << highWater / mebi
             << " MiB at the highest";
    }
    return text.str();
}

TEST(ResidentMemory, FourGibibytesOfSegmentsPassThroughLessThan200Mebibytes) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    EXPECT_EQ(inForkedProcess([&]() -> std::string {
                  memory_manager manager(path, temporaryOptions(segmentSize));
                  Highest highest;
                  std::vector<mapped_region_segment> segments;
                  for (Word tag = 0; tag < load / segmentSize; ++tag) {
                      segments.push_back(manager.create_segment());
                      segments.back().load(false);
                      fill(segments.back(), tag);
                      highest.sample();
                      if (segments.back().release() != segmentSize) {
                          return "release gave something else";
                      }
                  }
                  if (std::filesystem::file_size(path) != load) {
                      return "the file has another size";
                  }
                  // The first has long left memory when the last is done; all are still there.
                  for (Word tag = 0; tag < segments.size(); ++tag) {
                      mapped_region_segment segment = std::move(segments[tag]);
                      segment.load(false);
                      highest.sample();
                      if (!holds(segment, tag)) {
                          return "segment " + std::to_string(tag) + " lost what it held";
                      }
                  }
                  return overLimit(highest);
              }),
              "");
    EXPECT_FALSE(std::filesystem::exists(path));
}

// The measure sees what is kept: an eighth of the load is over the limit when nothing is released.
TEST(ResidentMemory, SegmentsThatAreNotReleasedShow) {
    const ScratchFolder folder;
    const std::string told = inForkedProcess([&] {
        memory_manager manager(folder.file("backing"), temporaryOptions(segmentSize));
        Highest highest;
        std::vector<mapped_region_segment> segments;
        for (Word tag = 0; tag < load / segmentSize / 8; ++tag) {
            segments.push_back(manager.create_segment());
            segments.back().load(false);
            fill(segments.back(), tag);
            highest.sample();
        }
        return overLimit(highest);
    });
    EXPECT_EQ(told.substr(0, 9), "resident:") << told;
}

// A segment that has been dropped without a release gives its memory back as well.
TEST(ResidentMemory, DestroyedSegmentsAreGivenBackToo) {
    const ScratchFolder folder;
    EXPECT_EQ(inForkedProcess([&] {
                  memory_manager manager(folder.file("backing"), persistentOptions(segmentSize));
                  manager.restore();
                  Highest highest;
                  for (Word tag = 0; tag < load / segmentSize / 8; ++tag) {
                      mapped_region_segment segment = manager.create_segment();
                      segment.load(false);
                      fill(segment, tag);
                      highest.sample();
                  }
                  for (Word tag = 0; tag < load / segmentSize / 8; ++tag) {
                      mapped_region_segment segment = manager.open_segment(tag);
                      highest.sample();
                      if (!holds(segment, tag)) {
                          return "segment " + std::to_string(tag) + " lost what it held";
                      }
                  }
                  return overLimit(highest);
              }),
              "");
}

TEST(SparseFile, ASegmentTakesAlmostNothingOnTheDiskUntilItIsWritten) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    memory_manager manager(path, persistentOptions(segmentSize));
    manager.restore();
    constexpr Word count = 64;
    std::vector<mapped_region_segment> segments;
    for (Word i = 0; i < count; ++i) {
        segments.push_back(manager.create_segment());
    }
    const reference::RawFile file(path);
    constexpr Word size = (count + 1) * segmentSize;
    EXPECT_EQ(file.size(), size);
    EXPECT_LT(file.stored(), size / 500) << "a byte at the end of each, and the header";

    for (mapped_region_segment& segment : segments) {
        segment.load(false);
    }
    EXPECT_LT(file.stored(), size / 500) << "a heap writes its first and its last words";
    for (mapped_region_segment& segment : segments) {
        segment.release();
    }
    EXPECT_LT(file.stored(), size / 500);

    segments[10].load(false);
    put(segments[10], "words", wordsOf(1, 4 * mebi / sizeof(Word)));
    segments[10].release();
    EXPECT_GT(file.stored(), 4 * mebi);
    EXPECT_LT(file.stored(), 4 * mebi + size / 500);
}

} // namespace
