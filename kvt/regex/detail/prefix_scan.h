// The search for a place where each of the first bytes lies in a set of its own, by vector registers.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace kvt::ex::detail {

/// A set of bytes, in rows of those that have the upper half in common.
struct ByteSet {
    std::array<std::uint16_t, 16> rows{};

    void add(unsigned char byte) {
        rows[byte >> 4U] = static_cast<std::uint16_t>(rows[byte >> 4U] | 1U << (byte & 0xFU));
    }
    void add(const ByteSet& other) {
        for (std::size_t i = 0; i < rows.size(); ++i) {
            rows[i] = static_cast<std::uint16_t>(rows[i] | other.rows[i]);
        }
    }
    bool contains(unsigned char byte) const { return (rows[byte >> 4U] >> (byte & 0xFU) & 1U) != 0; }
    std::size_t count() const;
    /// How frequent its bytes are in texts, roughly: from 0 for none to 1 for all of them.
    double frequency() const;
};

class PrefixScan {
public:
    /// `sets` has one set for each place; no set at all is a scan that is not there.
    explicit PrefixScan(std::vector<ByteSet> sets);

    explicit operator bool() const { return !sets_.empty(); }

    /// The first place at or after `from`, which is at most `size`, where the bytes lie in their sets; `size` where
    /// there is none.
    std::size_t find(const char* text, std::size_t size, std::size_t from) const;

    /// One place that is looked at in registers: the bytes whose halves have a bit in common in these tables are all of
    /// its set, and may be some more.
    struct Probe {
        std::size_t offset = 0;
        std::uint8_t byte = 0; ///< the lowest one of the set
        alignas(16) std::array<std::uint8_t, 16> low{};
        alignas(16) std::array<std::uint8_t, 16> high{};
    };
    struct Probes {
        std::array<Probe, 3> probes;
        bool areBytes =
            false; ///< the first two are of one byte each, which is all that has to be compared there
    };

private:
    bool standsAt(const char* place) const;

    std::vector<ByteSet> sets_;
    Probes probes_;
};

namespace vectors {

/// The first of the `places` from `text` on where all probes say yes; `places` where there is none.
std::size_t findProbes(const PrefixScan::Probes& probes, const char* text, std::size_t places);

} // namespace vectors
} // namespace kvt::ex::detail
