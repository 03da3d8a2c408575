// What was lost, added up: each character and each sequence of bad bytes once, with its count and its first place.
//
// Memory stays bounded whatever is lost: beyond mostEntries different ones, losses are only counted.
#pragma once

#include "text/place.h"

#include <kvt/encoding/stream_transcoder.h>

#include <array>
#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace host {

class Diagnostics;

class LossLedger {
public:
    struct Entry {
        kvt::ex::Loss first;
        Place place;
        std::uint64_t count = 0;
        std::uint64_t order = 0;               ///< how many entries came before it
        std::optional<std::u32string> written; ///< in its place; empty where a substitution was
    };
    static constexpr std::size_t mostEntries = 1000;

    LossLedger() = default;
    LossLedger(LossLedger&&) = default;
    LossLedger& operator=(LossLedger&&) = default;
    ~LossLedger() = default;

    /// Adds a loss. Places cost time, so `place` is called only for a first one.
    void add(const kvt::ex::Loss& loss, const std::function<Place()>& place,
             const std::optional<std::u32string>& written = std::nullopt);
    /// The same for a loss that was added before; returns false where that is not known.
    bool addAgain(const kvt::ex::Loss& loss);
    /// Adds lines that were read in another encoding. That is not a loss.
    void addFallbackLines(std::uint64_t count, const Place& first);
    std::uint64_t fallbackLines() const { return fallbackLines_; }
    const Place& firstFallback() const { return firstFallback_; }

    bool isEmpty() const { return total_ == 0; }
    /// All losses, those without an entry included.
    std::uint64_t total() const { return total_; }
    /// How many of them have no entry.
    std::uint64_t unlisted() const { return unlisted_; }
    std::size_t entryCount() const { return entries_.size(); }
    /// The most frequent first.
    std::vector<Entry> entries() const;

private:
    // A character is the same loss however its bytes are; a bad sequence is known by its bytes alone.
    using Key = std::pair<char32_t, std::string>;
    /// Losses are of few characters and many places: where the entry of a character or of some bad bytes is, by a number
    /// for them.
    struct Known {
        std::uint64_t number = 0;
        Entry* entry = nullptr;
    };
    static std::uint64_t numberOf(const kvt::ex::Loss& loss);
    Known& knownOf(std::uint64_t number) { return known_[number * 0x9E3779B97F4A7C15U >> 56]; }

    std::map<Key, Entry> entries_;
    std::array<Known, 256> known_{}; // a pointer into the map stays good
    std::uint64_t total_ = 0;
    std::uint64_t unlisted_ = 0;
    std::uint64_t fallbackLines_ = 0;
    Place firstFallback_;
};

/// The ledger as lines on standard error.
void printLedger(const LossLedger& ledger, const std::string& from, const std::string& to,
                 Diagnostics& diagnostics);

} // namespace host
