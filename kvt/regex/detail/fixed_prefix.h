// What every match of a pattern begins with, as far as that is sure: one set of bytes for each of the first places. And
// how many states of its program the engine can visit at most while it tries the pattern at a place.
#pragma once

#include <kvt/regex/detail/engine.h>
#include <kvt/regex/detail/prefix_scan.h>

#include <cstddef>
#include <optional>
#include <string_view>
#include <vector>

namespace kvt::ex::detail {

struct FixedPrefix {
    /// What a part of the pattern takes: as many bytes of the set as it likes, of `least` to `most`.
    struct Part {
        ByteSet set;
        std::size_t least = 0;
        std::size_t most = 0;
        bool takesAll = false; ///< whether the set holds all bytes
    };

    /// Empty where the pattern has no such beginning, or what else is in it forbids to pass over places.
    std::vector<ByteSet> sets;
    /// Where the pattern begins with a run of bytes of a set, that set. It is the first of `sets`, too: there it stands
    /// for the last byte of the run, behind which no other of its bytes can stand.
    std::optional<ByteSet> run;
    /// Whether the pattern takes what has the sets, all of it, and nothing else.
    bool isWholePattern = false;
    /// In the order of the pattern, the parts of all its alternatives.
    std::vector<Part> parts;
    bool hasAlternatives = false;
    double statesOfPrefix = 0; ///< visited at most by a try that fails within the prefix
    double statesOfWay =
        0; ///< visited at most in one way through the program, times the ways by alternatives

    /// Where a match begins that has the sets at `place`: there, or where the run begins that ends there.
    std::size_t beginOfTry(std::string_view text, std::size_t place) const;

    /// The states that a try at `place` visits at most.
    double statesOfTry(std::string_view text, std::size_t place) const;

    /// Whether the engine, trying a pattern of `patternSize` bytes at each of `places`, must get on without giving up
    /// for the number of states that it visits: when all tries fail within the prefix but for some that visit
    /// `visited`.
    bool isSureToEnd(std::size_t patternSize, std::size_t places, double visited) const;
};

/// Reads the program of a pattern.
FixedPrefix fixedPrefix(const Engine& engine);

} // namespace kvt::ex::detail
