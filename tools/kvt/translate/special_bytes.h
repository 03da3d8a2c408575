// The search for a few bytes in a text: 64 bytes at a time become a mask with a bit for each that is one of them, and of a
// short text it is said whether it has any.
//
// SSE2 is part of every 64-bit x86; elsewhere the compiler makes what it can of the plain loop.
#pragma once

#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>

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
            mask |= std::uint64_t{findIn(block)} << part;
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

    /// Whether one of them is in the text.
    bool isIn(std::string_view text) const {
        bool isFound = false;
#ifdef __SSE2__
        if (text.size() >= 4) {
            return isInVectors(text);
        }
#endif
        for (const char byte : text) {
            for (const char special : bytes_) {
                isFound |= byte == special;
            }
        }
        return isFound;
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
    // A bit for each of 16 bytes.
    unsigned findIn(__m128i block) const {
        __m128i found = _mm_cmpeq_epi8(block, vectors_[0]);
        for (std::size_t index = 1; index < Count; ++index) {
            found = _mm_or_si128(found, _mm_cmpeq_epi8(block, vectors_[index]));
        }
        return static_cast<unsigned>(_mm_movemask_epi8(found));
    }

    // Of four bytes or more: in pieces of which the last two overlap where they have to.
    bool isInVectors(std::string_view text) const {
        const char* const begin = text.data();
        const char* const end = begin + text.size();
        if (text.size() < 8) {
            std::int32_t first = 0;
            std::int32_t last = 0;
            std::memcpy(&first, begin, sizeof first);
            std::memcpy(&last, end - sizeof last, sizeof last);
            const __m128i both = _mm_unpacklo_epi32(_mm_cvtsi32_si128(first), _mm_cvtsi32_si128(last));
            return findIn(_mm_unpacklo_epi64(both, both)) != 0;
        }
        if (text.size() < 16) {
            const __m128i first = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(begin));
            const __m128i last = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(end - 8));
            return findIn(_mm_unpacklo_epi64(first, last)) != 0;
        }
        unsigned found = findIn(_mm_loadu_si128(reinterpret_cast<const __m128i*>(end - 16)));
        for (const char* at = begin; end - at > 16; at += 16) {
            found |= findIn(_mm_loadu_si128(reinterpret_cast<const __m128i*>(at)));
        }
        return found != 0;
    }

    __m128i vectors_[Count];
#endif
};

} // namespace host
