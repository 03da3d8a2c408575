// What the tests of whole files have in common: a folder of their own, options in short, and words that are easy to
// make again and hard to mistake, put into segments and taken out of them.
#pragma once

#include <kvt/mmap/memory_manager.h>

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <stdexcept>
#include <string>
#include <system_error>
#include <unistd.h>
#include <vector>

namespace kvt::test {

using ex::mmap::manager_options;
using ex::mmap::mapped_region_segment;
using ex::mmap::memory_manager;

using Word = std::uint64_t;
using Words = std::vector<Word>;

inline manager_options persistentOptions(Word segmentSize) {
    manager_options options;
    options.segment_size = segmentSize;
    options.persistent = true;
    return options;
}

inline manager_options temporaryOptions(Word segmentSize) {
    manager_options options;
    options.segment_size = segmentSize;
    return options;
}

/// Made new; gone with all that is in it.
class ScratchFolder {
public:
    ScratchFolder() {
        std::string name = (std::filesystem::temp_directory_path() / "kvt-mmap-XXXXXX").string();
        if (::mkdtemp(name.data()) == nullptr) {
            throw std::runtime_error("cannot make a temporary folder");
        }
        path_ = name;
    }
    ScratchFolder(const ScratchFolder&) = delete;
    ScratchFolder& operator=(const ScratchFolder&) = delete;
    ~ScratchFolder() {
        std::error_code ignored;
        std::filesystem::remove_all(path_, ignored);
    }

    std::string path() const { return path_.string(); }
    std::string file(const std::string& name) const { return (path_ / name).string(); }

private:
    std::filesystem::path path_;
};

/// `count` words that depend on `tag` and on the place; no two tags have a row in common.
inline Words wordsOf(Word tag, std::size_t count) {
    Words words;
    words.reserve(count);
    for (std::size_t i = 0; i < count; ++i) {
        words.push_back(((tag * 1'000'003 + i) * 0x9E3779B97F4A7C15U) ^ (tag << 32));
    }
    return words;
}

inline ex::vector<unsigned long long> toSave(const Words& words) {
    return {words.begin(), words.end()};
}

inline Words taken(const ex::vector<unsigned long long>& words) {
    return {words.begin(), words.end()};
}

/// Puts `words` into a loaded segment as an array of that name.
inline void put(mapped_region_segment& segment, const std::string& name, const Words& words) {
    segment.segment_manager()->construct_it<Word>(name.c_str())[words.size()](words.begin());
}

/// The array of that name in a loaded segment; empty when there is none.
inline Words get(mapped_region_segment& segment, const std::string& name) {
    const auto [first, count] = segment.segment_manager()->find<Word>(name.c_str());
    return first == nullptr ? Words() : Words(first, first + count);
}

} // namespace kvt::test
