// Sixteen bytes at a time: each byte is compared with the three before it, which say whether it has to go on with a
// character. What the second byte of a long character may be is looked at where there is one.

#include "translate/utf8_check.h"

#include <cstddef>

#ifdef __SSE2__
#include <emmintrin.h>
#endif

namespace host {

namespace {

// The bytes of the character at the beginning; 0 where there is none.
std::size_t characterLength(std::string_view text) {
    const auto at = [&](std::size_t index) {
        return index < text.size() ? static_cast<unsigned char>(text[index]) : 0U;
    };
    const unsigned lead = at(0);
    if (lead < 0x80) {
        return 1;
    }
    const std::size_t length = lead >= 0xC2 && lead < 0xE0   ? 2
                               : lead >= 0xE0 && lead < 0xF0 ? 3
                               : lead >= 0xF0 && lead < 0xF5 ? 4
                                                             : 0;
    const unsigned lowest = lead == 0xE0 ? 0xA0 : lead == 0xF0 ? 0x90 : 0x80;
    const unsigned highest = lead == 0xED ? 0x9F : lead == 0xF4 ? 0x8F : 0xBF;
    bool isWhole = length != 0 && at(1) >= lowest && at(1) <= highest;
    for (std::size_t index = 2; index < length; ++index) {
        isWhole = isWhole && at(index) >= 0x80 && at(index) <= 0xBF;
    }
    return isWhole ? length : 0;
}

bool isUtf8Singly(std::string_view text) {
    while (!text.empty()) {
        const std::size_t length = characterLength(text);
        if (length == 0) {
            return false;
        }
        text.remove_prefix(length);
    }
    return true;
}

#ifdef __SSE2__
constexpr std::size_t step = 16;

inline __m128i load(const char* from) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(from));
}

inline __m128i every(int byte) {
    return _mm_set1_epi8(static_cast<char>(byte));
}

// Not zero where a byte is more than that.
inline __m128i above(__m128i bytes, int limit) {
    return _mm_subs_epu8(bytes, every(limit));
}

inline __m128i isByte(__m128i bytes, int byte) {
    return _mm_cmpeq_epi8(bytes, every(byte));
}

// What is wrong with the bytes behind E0, ED, F0 and F4. `bytes` are continuations where they have to be.
inline __m128i wrongBehindLead(__m128i lead, __m128i bytes) {
    const __m128i isBelowA0 = _mm_cmpgt_epi8(every(0xA0), bytes);
    const __m128i isBelow90 = _mm_cmpgt_epi8(every(0x90), bytes);
    return _mm_or_si128(_mm_or_si128(_mm_and_si128(isByte(lead, 0xE0), isBelowA0),
                                     _mm_andnot_si128(isBelowA0, isByte(lead, 0xED))),
                        _mm_or_si128(_mm_and_si128(isByte(lead, 0xF0), isBelow90),
                                     _mm_andnot_si128(isBelow90, isByte(lead, 0xF4))));
}

// What is wrong with 16 bytes, behind three at least; nothing is all zeros.
inline __m128i wrongAt(const char* text) {
    const __m128i bytes = load(text);
    const __m128i before = load(text - 1);
    const __m128i goesOn = _mm_or_si128(_mm_or_si128(above(before, 0xBF), above(load(text - 2), 0xDF)),
                                        above(load(text - 3), 0xEF));
    const __m128i begins = _mm_cmpeq_epi8(goesOn, _mm_setzero_si128());
    const __m128i isContinuation = _mm_cmpgt_epi8(every(0xC0), bytes);
    const __m128i isNever = _mm_or_si128(isByte(_mm_and_si128(bytes, every(0xFE)), 0xC0), above(bytes, 0xF4));
    __m128i wrong = _mm_or_si128(_mm_cmpeq_epi8(begins, isContinuation), isNever);
    if (_mm_movemask_epi8(_mm_cmpeq_epi8(above(before, 0xDF), _mm_setzero_si128())) != 0xFFFF) {
        wrong = _mm_or_si128(wrong, wrongBehindLead(before, bytes));
    }
    return wrong;
}

inline bool isAsciiAt(const char* text) {
    const __m128i all = _mm_or_si128(_mm_or_si128(load(text), load(text + step)),
                                     _mm_or_si128(load(text + 2 * step), load(text + 3 * step)));
    return _mm_movemask_epi8(all) == 0;
}
#endif

} // namespace

bool isUtf8(std::string_view text) {
#ifdef __SSE2__
    constexpr std::size_t block = 4 * step;
    constexpr std::size_t longest = 4; // bytes of a character
    if (text.size() > block + longest) {
        // The first bytes have none before them.
        std::size_t at = 0;
        while (at < longest) {
            const std::size_t length = characterLength(text.substr(at));
            if (length == 0) {
                return false;
            }
            at += length;
        }
        __m128i wrong = _mm_setzero_si128();
        for (; at + block <= text.size(); at += block) {
            const char* const here = text.data() + at;
            // Behind ASCII nothing has to go on.
            if (isAsciiAt(here) && static_cast<signed char>(here[-1]) >= 0) {
                continue;
            }
            for (std::size_t part = 0; part < block; part += step) {
                wrong = _mm_or_si128(wrong, wrongAt(here + part));
            }
        }
        if (_mm_movemask_epi8(_mm_cmpeq_epi8(wrong, _mm_setzero_si128())) != 0xFFFF) {
            return false;
        }
        // The last character may go on behind the blocks.
        while ((text[at - 1] & 0xC0) == 0x80) {
            --at;
        }
        at -= (text[at - 1] & 0x80) != 0 ? 1 : 0;
        text.remove_prefix(at);
    }
#endif
    return isUtf8Singly(text);
}

} // namespace host
