// A hash table from names to ids: open addressing, linear probing, entries that never leave.
//
// A look-up takes a view, so it needs no key object; the first insertion of a key wins. It takes no lock either, beside
// one thread that inserts: an entry is written before its slot shows it, and a table that became too small is kept for
// those who are reading it.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace kvt::ex::detail {

/// The smallest prime not below `n` in a fixed table that at first is dense and later about doubles. Bucket counts
/// are taken from it.
std::uint32_t nextPrime(std::uint32_t n);

/// Any thread may call find() at any time; the other members are for one thread at a time.
class NameTable {
public:
    using Entry = std::pair<std::string_view, std::uint32_t>;

    /// Empty, without any memory.
    NameTable() = default;
    NameTable(const NameTable&) = delete;
    NameTable& operator=(const NameTable&) = delete;
    /// Holds `entries`, inserted in order into a table that is sized for them once.
    NameTable(std::initializer_list<Entry> entries);

    /// The id of `key`. What another thread is inserting may be missed.
    std::optional<std::uint32_t> find(std::string_view key) const;
    /// Adds `key` unless it is there already, with whatever id; returns whether it was added.
    bool insert(std::string_view key, std::uint32_t id);

    std::uint32_t size() const { return used_; }
    std::uint32_t buckets() const {
        return generations_.empty() ? 0 : static_cast<std::uint32_t>(generations_.back()->size());
    }
    /// An insertion that finds this many slots taken makes the table larger first.
    std::uint32_t threshold() const { return threshold_; }

private:
    enum class State : std::uint8_t { empty = 0, occupied = 1, deleted = 2 };

    struct Slot {
        std::string key;
        std::uint32_t id = 0;
        std::atomic<State> state{State::empty}; // set when the others are
    };
    using Slots = std::vector<Slot>;

    // The slot that holds `key`, or else the empty one in which it belongs. There is at least one slot.
    static std::size_t probe(const Slots& slots, std::string_view key);
    static void fill(Slots& slots, std::string_view key, std::uint32_t id);
    void growForOne();
    void growForRange(std::uint32_t count);
    void rehash(std::uint32_t buckets);

    static constexpr float maxLoadFactor_ = 0.75F;

    std::atomic<const Slots*> slots_{nullptr};        // the last generation
    std::vector<std::unique_ptr<Slots>> generations_; // each about twice as large as the one before
    std::uint32_t used_ = 0;
    std::uint32_t deleted_ = 0;
    std::uint32_t threshold_ = 0;
};

} // namespace kvt::ex::detail
