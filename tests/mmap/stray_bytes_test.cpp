// Nothing of a process's memory gets into a file but what was put there: no bytes from between the members of a
// structure that is made elsewhere and copied into a segment.
//
// Compilers copy such bytes when they do not optimise, so this program has the sources on segments in itself, compiled
// without optimisation. What is put into the files here are small numbers, and then each word of the file is small, in
// size or as a distance, but for the marks of blocks and the names of objects. A word whose bytes were not all meant
// shows, as what lay on the stack before are addresses, and a pattern that is painted there before each step.
#include <mmap/segment_words.h>
#include <reference/mapped_file_reference.h>

#include <kvt/mmap/managed_object.h>

#include <boost/container/deque.hpp>
#include <gtest/gtest.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <ios>
#include <malloc.h>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace {

using namespace kvt::test;
using kvt::ex::mmap::managed_object;
using kvt::ex::mmap::segment_allocator;
using reference::RawFile;

constexpr Word segmentSize = 65536;
constexpr unsigned char paint = 0xA5;

[[gnu::noinline]] void paintStack() {
    volatile unsigned char stack[65536];
    for (volatile unsigned char& byte : stack) {
        byte = paint;
    }
}

template <typename Step>
void painted(const Step& step) {
    paintStack();
    step();
}

// The words over which a name and the zero behind it stretch, with zeros elsewhere.
std::set<Word> wordsOfName(std::string_view name) {
    std::set<Word> words;
    for (std::size_t at = 0; at < name.size(); at += 8) {
        Word word = 0;
        std::memcpy(&word, name.data() + at, std::min<std::size_t>(8, name.size() - at));
        words.insert(word);
    }
    return words;
}

bool isSmall(Word word) {
    const auto number = static_cast<std::int64_t>(word);
    constexpr std::int64_t limit = std::int64_t{1} << 24;
    return -limit < number && number < limit;
}

bool isMark(Word word) {
    constexpr Word unitsOfMark = (Word{1} << 62) - 1;
    return isSmall(word & unitsOfMark);
}

// The description of an object: the length of a name, an alignment of 8, the kind, and four zeros.
bool isDescription(Word word, std::string_view name) {
    return word == (0x21080000U | name.size());
}

class StrayBytes : public ::testing::Test {
protected:
    void SetUp() override { ::mallopt(M_PERTURB, paint); }
    void TearDown() override { ::mallopt(M_PERTURB, 0); }

    void expectNone() const {
        constexpr std::string_view name = "segment_data";
        const std::set<Word> nameWords = wordsOfName(name);
        const RawFile file(path);
        const std::vector<Word> words = file.words(0, file.size() / 8);
        for (std::size_t i = 0; i < words.size(); ++i) {
            EXPECT_TRUE(isSmall(words[i]) || isMark(words[i]) || isDescription(words[i], name) ||
                        nameWords.count(words[i]) > 0)
                << "at " << i * 8 << ": " << std::hex << words[i];
        }
    }

    ScratchFolder folder;
    std::string path = folder.file("backing");
};

TEST_F(StrayBytes, AreNotInAHeader) {
    memory_manager manager(path, persistentOptions(segmentSize));
    painted([&] { manager.restore(); });
    expectNone();
    for (Word tag = 0; tag < 12; ++tag) {
        painted([&] { manager.save(toSave(Words(tag * 17, tag))); });
        painted([&] { manager.create_segment(4096); });
    }
    for (int i = 0; i < 7; ++i) {
        painted([&] { manager.restore(); });
    }
    for (Word i = 0; i < 60; ++i) {
        painted([&] { manager.create_segment(4096 * (i % 3)); });
    }
    expectNone();
}

TEST_F(StrayBytes, AreNotInASegment) {
    memory_manager manager(path, temporaryOptions(segmentSize));
    mapped_region_segment segment = manager.create_segment();
    painted([&] { segment.load(false); });
    expectNone();
    std::vector<void*> blocks;
    for (std::size_t i = 0; i < 40; ++i) {
        painted([&] { blocks.push_back(segment.segment_manager()->allocate(i * 13 + 1)); });
    }
    for (std::size_t i = 0; i < 40; i += 3) {
        painted([&] { segment.segment_manager()->deallocate(blocks.at(i)); });
    }
    painted([&] { segment.release(); });
    painted([&] { segment.load(true); });
    painted([&] { segment.segment_manager()->allocate(1000); });
    expectNone();
}

TEST_F(StrayBytes, AreNotInFrontOfAManagedObject) {
    using Numbers = boost::container::deque<Word, segment_allocator<Word>>;
    memory_manager manager(path, temporaryOptions(segmentSize));
    managed_object<Numbers> numbers(manager.create_segment());
    for (Word i = 0; i < 3; ++i) {
        painted([&] { numbers.access()->push_back(i); });
        painted([&] { numbers.release_memory(); });
    }
    expectNone();
}

} // namespace
