// The search for a few bytes in a long text: 64 bytes at a time become a mask with a bit for each that is one of them.
//
// SSE2 is part of every 64-bit x86; elsewhere the compiler makes what it can of the plain loop.
#pragma once

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>

#ifdef __SSE2__
#include <emmintrin.h>
#endif

namespace host {

template <std::size_t Count>
class SpecialBytes {
public:
    static constexpr std::size_t width = 64;

    explicit SpecialBytes(const std::array<char, Count>& bytes) : bytes_(bytes) {
#ifdef __SSE2__
        for (std::size_t index = 0; index < Count; ++index) {
            vectors_[index] = _mm_set1_epi8(bytes[index]);
        }
#endif
    }

    /// Bit n is set where byte n of the 64 is one of those that are sought.
    std::uint64_t find(const char* text) const {
        std::uint64_t mask = 0;
#ifdef __SSE2__
        for (unsigned part = 0; part < width; part += 16) {
            const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(text + part));
            __m128i found = _mm_cmpeq_epi8(block, vectors_[0]);
            for (std::size_t index = 1; index < Count; ++index) {
                found = _mm_or_si128(found, _mm_cmpeq_epi8(block, vectors_[index]));
            }
            mask |= std::uint64_t{static_cast<std::uint32_t>(_mm_movemask_epi8(found))} << part;
        }
#else
        for (unsigned place = 0; place < width; ++place) {
            bool isFound = false;
            for (const char byte : bytes_) {
                isFound |= text[place] == byte;
            }
            mask |= std::uint64_t{isFound} << place;
        }
#endif
        return mask;
    }

    /// The same for the last bytes of a text, fewer than 64.
    std::uint64_t findInLast(const char* text, std::size_t count) const {
        std::array<char, width> padded{};
        std::memcpy(padded.data(), text, count);
        return find(padded.data()) & ((std::uint64_t{1} << count) - 1);
    }

private:
    std::array<char, Count> bytes_;
#ifdef __SSE2__
    __m128i vectors_[Count];
#endif
};

} // namespace host
