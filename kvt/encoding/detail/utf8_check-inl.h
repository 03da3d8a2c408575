// Whether UTF-8 is well-formed, a register at a time, compiled for each instruction set that has vectors.
//
// It is checked as J. Keiser and D. Lemire do it in "Validating UTF-8 In Less Than One Instruction Per Byte" (2020): by
// three look-ups by half bytes of each byte and its predecessor, whose common bits are the errors.
#if defined(KVT_UTF8_CHECK_INL_H) == defined(HWY_TARGET_TOGGLE) // once for each instruction set
#ifdef KVT_UTF8_CHECK_INL_H
#undef KVT_UTF8_CHECK_INL_H
#else
#define KVT_UTF8_CHECK_INL_H
#endif

#include <kvt/encoding/detail/unicode_characters-inl.h>

#include <hwy/highway.h>

#include <cstdint>

#if KVT_HAS_VECTORS

HWY_BEFORE_NAMESPACE();
namespace kvt::ex::detail::vectors::HWY_NAMESPACE {

/// The three tables of the check, by the upper and the lower half of a byte and the upper half of the next.
struct Utf8Check {
    static constexpr std::uint8_t tooShort = 1 << 0;
    static constexpr std::uint8_t tooLong = 1 << 1;
    static constexpr std::uint8_t overlong3 = 1 << 2;
    static constexpr std::uint8_t tooLarge = 1 << 3;
    static constexpr std::uint8_t surrogate = 1 << 4;
    static constexpr std::uint8_t overlong2 = 1 << 5;
    static constexpr std::uint8_t tooLarge1000 = 1 << 6;
    static constexpr std::uint8_t overlong4 = 1 << 6;
    static constexpr std::uint8_t twoTrails = 1 << 7;
    static constexpr std::uint8_t carry = tooShort | tooLong | twoTrails;

    alignas(16) static constexpr std::uint8_t firstHigh[16] = {tooLong,
                                                               tooLong,
                                                               tooLong,
                                                               tooLong,
                                                               tooLong,
                                                               tooLong,
                                                               tooLong,
                                                               tooLong, // ASCII
                                                               twoTrails,
                                                               twoTrails,
                                                               twoTrails,
                                                               twoTrails, // trail bytes
                                                               tooShort | overlong2,
                                                               tooShort,
                                                               tooShort | overlong3 | surrogate,
                                                               tooShort | tooLarge | tooLarge1000 |
                                                                   overlong4};
    alignas(16) static constexpr std::uint8_t firstLow[16] = {carry | overlong3 | overlong2 | overlong4,
                                                              carry | overlong2,
                                                              carry,
                                                              carry,
                                                              carry | tooLarge,
                                                              carry | tooLarge | tooLarge1000,
                                                              carry | tooLarge | tooLarge1000,
                                                              carry | tooLarge | tooLarge1000,
                                                              carry | tooLarge | tooLarge1000,
                                                              carry | tooLarge | tooLarge1000,
                                                              carry | tooLarge | tooLarge1000,
                                                              carry | tooLarge | tooLarge1000,
                                                              carry | tooLarge | tooLarge1000,
                                                              carry | tooLarge | tooLarge1000 | surrogate,
                                                              carry | tooLarge | tooLarge1000,
                                                              carry | tooLarge | tooLarge1000};
    alignas(16) static constexpr std::uint8_t secondHigh[16] = {
        tooShort,
        tooShort,
        tooShort,
        tooShort,
        tooShort,
        tooShort,
        tooShort,
        tooShort, // ASCII
        tooLong | overlong2 | twoTrails | overlong3 | tooLarge1000 | overlong4,
        tooLong | overlong2 | twoTrails | overlong3 | tooLarge,
        tooLong | overlong2 | twoTrails | surrogate | tooLarge,
        tooLong | overlong2 | twoTrails | surrogate | tooLarge,
        tooShort,
        tooShort,
        tooShort,
        tooShort};

    /// Not zero where a byte does not fit what stands before it. Three bytes before `p` can be read.
    template <class D>
    static HWY_INLINE hn::Vec<D> errors(D d, const std::uint8_t* p, hn::Vec<D> bytes) {
        return errors(d, bytes, hn::LoadU(d, p - 1), hn::LoadU(d, p - 2), hn::LoadU(d, p - 3));
    }

    /// The same, with the bytes that stand one, two and three places before each.
    template <class D>
    static HWY_INLINE hn::Vec<D> errors(D d, hn::Vec<D> bytes, hn::Vec<D> before1, hn::Vec<D> before2,
                                        hn::Vec<D> before3) {
        using V = hn::Vec<D>;
        const V table1 = hn::LoadDup128(d, firstHigh);
        const V table2 = hn::LoadDup128(d, firstLow);
        const V table3 = hn::LoadDup128(d, secondHigh);
        const V low = hn::Set(d, 0x0F);
        const V special = hn::And(hn::And(hn::TableLookupBytes(table1, hn::ShiftRight<4>(before1)),
                                          hn::TableLookupBytes(table2, hn::And(before1, low))),
                                  hn::TableLookupBytes(table3, hn::ShiftRight<4>(bytes)));
        // 0x80 where the byte must be the third or fourth of a character.
        const V third = hn::SaturatedSub(before2, hn::Set(d, 0xE0 - 0x80));
        const V fourth = hn::SaturatedSub(before3, hn::Set(d, 0xF0 - 0x80));
        const V must = hn::And(hn::Or(third, fourth), hn::Set(d, 0x80));
        return hn::Xor(must, special);
    }
};

} // namespace kvt::ex::detail::vectors::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif

#endif
