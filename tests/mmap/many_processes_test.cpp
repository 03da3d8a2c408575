// A persistent file that goes from process to process, each a program of its own.
#include <mmap/segment_words.h>
#include <reference/mapped_file_reference.h>
#include <support/child_process.h>

#include <gtest/gtest.h>

#include <deque>
#include <random>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

namespace {

using namespace kvt::test;

constexpr Word headerSize = 262144;

std::string shown(const Words& words) {
    std::ostringstream text;
    text << words.size() << ' ' << (words.empty() ? 0 : words.front()) << ' '
         << (words.empty() ? 0 : words.back()) << '\n';
    return text.str();
}

class ManyProcesses : public ::testing::Test {
protected:
    // A process that does that with the file; gives what it printed.
    std::string child(const std::vector<std::string>& what) const {
        ChildSetup setup;
        setup.command = {KVT_SEGMENT_CHILD, path, std::to_string(headerSize)};
        setup.command.insert(setup.command.end(), what.begin(), what.end());
        const ChildResult result = runChild(setup);
        EXPECT_EQ(result.status, 0) << result.out << result.err;
        return result.out;
    }

    ScratchFolder folder;
    std::string path = folder.file("backing");
};

TEST_F(ManyProcesses, WhatOneWroteAnotherReads) {
    EXPECT_EQ(child({"create", "20000", "1", "2000", "create", "1", "2", "100"}), "0 20480\n1 4096\n");
    EXPECT_EQ(child({"read", "1", "read", "0"}), shown(wordsOf(2, 100)) + shown(wordsOf(1, 2000)));
    memory_manager manager(path, persistentOptions(headerSize));
    mapped_region_segment segment = manager.open_segment(0);
    EXPECT_EQ(get(segment, "words"), wordsOf(1, 2000));
    EXPECT_THROW(manager.open_segment(2), std::out_of_range);
}

TEST_F(ManyProcesses, EachAddsASegmentAndReadsOneOfAnOther) {
    std::mt19937 random(77);
    for (Word index = 0; index < 40; ++index) {
        const Word count = 1 + random() % 900;
        std::vector<std::string> what = {"create", "8192", std::to_string(index), std::to_string(count)};
        EXPECT_EQ(child(what), std::to_string(index) + " 8192\n");
        const reference::RawFile file(path);
        const reference::Header header = reference::readHeader(file);
        ASSERT_EQ(header.rows.size(), index + 1);
        const auto position = static_cast<reference::Position>(header.rows.back().offset);
        EXPECT_EQ(reference::readWords(file, reference::readHeap(file, position).object("words")),
                  wordsOf(index, count));
    }
    memory_manager manager(path, persistentOptions(headerSize));
    for (Word index = 0; index < 40; ++index) {
        mapped_region_segment segment = manager.open_segment(index);
        const Words words = get(segment, "words");
        EXPECT_EQ(words, wordsOf(index, words.size()));
    }
}

TEST_F(ManyProcesses, VectorsComeBackInTheOrderInWhichTheyWereSaved) {
    std::mt19937 random(4711);
    std::deque<Words> model;
    child({"restore"});
    Word tag = 0;
    for (int process = 0; process < 60; ++process) {
        std::vector<std::string> what;
        std::string expected;
        const Word saves = random() % 6;
        const Word restores = random() % 6;
        // The header has to be reached before something is saved, so the restoring comes first.
        for (Word i = 0; i < restores || i == 0; ++i) {
            what.emplace_back("restore");
            expected += shown(model.empty() ? Words() : model.front());
            if (!model.empty()) {
                model.pop_front();
            }
        }
        for (Word i = 0; i < saves; ++i) {
            const Word count = random() % 200;
            what.insert(what.end(), {"save", std::to_string(tag), std::to_string(count)});
            model.push_back(wordsOf(tag, count));
            ++tag;
        }
        ASSERT_EQ(child(what), expected) << "process " << process;
        const reference::Header header = reference::readHeader(reference::RawFile(path));
        ASSERT_EQ(header.saved, std::vector<Words>(model.begin(), model.end())) << "process " << process;
    }
    ASSERT_GT(tag, 100U);
}

} // namespace
