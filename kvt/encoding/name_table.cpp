// The hash table of the encoding registry, and the primes for its sizes.
#include <kvt/encoding/detail/name_table.h>

#include <kvt/foundation/detail/fnv.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <utility>

namespace kvt::ex::detail {
namespace {

// clang-format off
constexpr std::array<std::uint32_t, 159> primes = {
    5, 7, 11, 13, 17, 19, 23, 29, 31, 37, 41, 43, 47, 53, 59, 61, 67, 71, 73, 79, 83, 89, 97, 101, 103,
    107, 109, 113, 127, 137, 149, 157, 167, 179, 191, 197, 211, 223, 233, 251, 263, 277, 293, 307, 331,
    347, 367, 383, 409, 431, 457, 479, 503, 541, 563, 587, 617, 653, 683, 719, 751, 787, 821, 859, 907,
    937, 977, 1019, 1087, 1153, 1181, 1297, 1361, 1409, 1471, 1523, 1571, 1627, 1693, 1741, 1801, 1861,
    1931, 1973, 2039, 2099, 2153, 2213, 2273, 2333, 2393, 2459, 2521, 2579, 2647, 2707, 2777, 2833, 2897,
    2963, 3037, 3109, 3163, 3229, 3299, 3359, 3433, 3499, 3571, 3631, 3701, 3779, 3847, 3911, 4729, 6067,
    8039, 10009, 12037, 14083, 16073, 18917, 20089, 25111, 30071, 35081, 40087, 45083, 50087, 55103, 60101,
    65101, 70111, 75109, 80141, 85121, 90121, 95131, 100129, 150011, 200063, 250253, 302723, 354073,
    400051, 800011, 1210897, 2421817, 4843637, 9687281, 19374587, 38749211, 77498429, 154996859, 309993727,
    619987483, 1239974993, 2479950001, 4294967291,
};
// clang-format on

} // namespace

std::uint32_t nextPrime(std::uint32_t n) {
    const auto* const found = std::lower_bound(primes.begin(), primes.end(), n);
    return found != primes.end() ? *found : primes.back();
}

NameTable::NameTable(std::initializer_list<Entry> entries) {
    growForRange(static_cast<std::uint32_t>(entries.size()));
    for (const auto& [key, id] : entries) {
        insert(key, id);
    }
}

std::optional<std::uint32_t> NameTable::find(std::string_view key) const {
    const Slots* const slots = slots_.load(std::memory_order_acquire);
    if (slots == nullptr) {
        return std::nullopt;
    }
    const Slot& slot = (*slots)[probe(*slots, key)];
    return slot.state.load(std::memory_order_acquire) == State::occupied && slot.key == key
               ? std::optional(slot.id)
               : std::nullopt;
}

bool NameTable::insert(std::string_view key, std::uint32_t id) {
    if (find(key)) {
        return false;
    }
    growForOne();
    fill(*generations_.back(), key, id);
    ++used_;
    return true;
}

std::size_t NameTable::probe(const Slots& slots, std::string_view key) {
    std::size_t index = static_cast<std::uint32_t>(fnv1a(key)) % slots.size();
    while (true) {
        const Slot& slot = slots[index];
        const State state = slot.state.load(std::memory_order_acquire);
        if (state == State::empty || (state == State::occupied && slot.key == key)) {
            return index;
        }
        index = index + 1 < slots.size() ? index + 1 : 0;
    }
}

// Threads that look for the key meanwhile find the slot empty, or all of the entry.
void NameTable::fill(Slots& slots, std::string_view key, std::uint32_t id) {
    Slot& slot = slots[probe(slots, key)];
    slot.key = key;
    slot.id = id;
    slot.state.store(State::occupied, std::memory_order_release);
}

void NameTable::growForOne() {
    if (used_ + deleted_ < threshold_) {
        return;
    }
    // Many deleted slots: the table is large enough and needs cleaning only.
    rehash(deleted_ > used_ ? buckets() : nextPrime(buckets() * 2));
}

void NameTable::growForRange(std::uint32_t count) {
    if (deleted_ + used_ + count > threshold_) {
        const float needed = std::ceil(static_cast<float>(used_ + count) / maxLoadFactor_);
        rehash(nextPrime(static_cast<std::uint32_t>(needed) + 1));
    }
}

void NameTable::rehash(std::uint32_t buckets) {
    auto larger = std::make_unique<Slots>(buckets);
    if (const Slots* const slots = slots_.load(std::memory_order_relaxed)) {
        for (const Slot& slot : *slots) {
            if (slot.state.load(std::memory_order_relaxed) == State::occupied) {
                fill(*larger, slot.key, slot.id);
            }
        }
    }
    generations_.push_back(std::move(larger));
    slots_.store(generations_.back().get(), std::memory_order_release);
    deleted_ = 0;
    threshold_ = static_cast<std::uint32_t>(std::floor(static_cast<float>(buckets) * maxLoadFactor_));
}

} // namespace kvt::ex::detail
