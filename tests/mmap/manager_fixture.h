// What the tests of memory_manager share: a file in a folder of its own, and segments that hold one word.
#pragma once

#include "scratch.h"

#include <kvt/mmap/memory_manager.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <string>

namespace kvt::test {

inline ex::mmap::manager_options temporary(std::uint64_t size = 65536) {
    return {size, false};
}

inline ex::mmap::manager_options persistent(std::uint64_t size = 65536) {
    return {size, true};
}

inline constexpr std::uint64_t allOnes = ~std::uint64_t(0);

inline void put(ex::mmap::mapped_region_segment& segment, std::uint64_t word) {
    *segment.segment_manager()->find_or_construct<std::uint64_t>("word")(0U) = word;
}

/// All ones where nothing was put.
inline std::uint64_t get(const ex::mmap::mapped_region_segment& segment) {
    const auto found = segment.segment_manager()->find<std::uint64_t>("word");
    return found.first != nullptr ? *found.first : allOnes;
}

class MemoryManager : public testing::Test {
protected:
    Scratch scratch;
    const std::string path = scratch.file();
};

} // namespace kvt::test
