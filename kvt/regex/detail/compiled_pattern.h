// A pattern as the engine compiled it, with what makes searching faster than the engine alone. All results are those of
// the engine.
#pragma once

#include <kvt/regex/detail/engine.h>
#include <kvt/regex/detail/fixed_prefix.h>
#include <kvt/regex/detail/prefix_scan.h>

#include <array>
#include <atomic>
#include <cstddef>
#include <optional>
#include <string_view>

namespace kvt::ex::detail {

/// Never changes for its users; any number of threads may be.
class CompiledPattern {
public:
    /// Throws boost::regex_error, std::bad_alloc.
    explicit CompiledPattern(std::string_view pattern);
    CompiledPattern(const CompiledPattern&) = delete;
    CompiledPattern& operator=(const CompiledPattern&) = delete;
    ~CompiledPattern();

    /// Whether the pattern matches the whole text.
    bool match(std::string_view text, boost::cmatch& result) const;
    /// Whether it matches somewhere from `start` on, which is at most the size; nothing before `start` is seen.
    bool search(std::string_view text, std::size_t start, boost::cmatch& result) const;
    /// Whether it matches anywhere.
    bool matchesIn(std::string_view text) const;
    /// Behind which place a match ends that begins at `start` or behind it, in the text or in a part of it that is
    /// searched by itself.
    std::size_t passOver(std::string_view text, std::size_t start) const;
    /// As search(), with a view of the text before `start`; a match that is empty there counts only where it may be.
    bool searchOn(std::string_view text, std::size_t start, bool mayBeEmpty, boost::cmatch& result) const;

private:
    // The engine counts who uses a program, in the program. So threads have programs of their own, but for those that
    // have the same one of these numbers.
    static constexpr std::size_t programs = 8;

    // What is searched; what looks back sees the text from `base` on.
    struct Range {
        const char* base;
        const char* begin;
        const char* end;
    };

    const Engine& engine() const;
    bool searchIn(const Range& range, boost::match_flag_type flags, boost::cmatch& result) const;
    // Nothing where it is for the plain search to say.
    std::optional<bool> searchByPrefix(const Range& range, boost::cmatch& result) const;

    Engine engine_; // of the thread that compiled the pattern
    std::size_t owner_;
    mutable std::array<std::atomic<const Engine*>, programs> others_{};
    FixedPrefix prefix_; // without the sets, which the scan has
    PrefixScan scan_;
};

} // namespace kvt::ex::detail
