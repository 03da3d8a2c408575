// Numbers as text and text as numbers.
#include <kvt/string/detail/instantiate.h>

#include <kvt/codec/float_text.h>

#include <array>
#include <cerrno>
#include <charconv>
#include <cstdlib>
#include <limits>
#include <string>
#include <string_view>

namespace kvt::ex {
namespace {

constexpr std::uint64_t smallNumbers = 500;

// The digits of a number below 1000.
struct SmallNumber {
    std::array<char, 3> digits{};
    std::uint8_t length = 0;
};

// The texts of the small numbers, which are most of all numbers that are written.
constexpr auto smallNumberTexts = [] {
    std::array<SmallNumber, smallNumbers> made{};
    for (std::uint64_t number = 0; number < smallNumbers; ++number) {
        SmallNumber& text = made[number];
        for (std::uint64_t unit = number < 10 ? 1 : number < 100 ? 10 : 100; unit != 0; unit /= 10) {
            text.digits[text.length++] = static_cast<char>('0' + number / unit % 10);
        }
    }
    return made;
}();

// A string of text that is ASCII in every encoding of the types; a UString<30> is labelled so.
template <std::uint32_t N>
UString<N> fromAsciiText(std::string_view text) {
    if constexpr (sizeof(detail::CodeUnit<N>) != 1) {
        return UString<N>(text.data(), text.size(), Encoding::UsAscii);
    } else if constexpr (N == Encoding::Unknown) {
        return UString<N>(UStringView<N>(text), Encoding::UsAscii);
    } else {
        return UString<N>(UStringView<N>(text));
    }
}

template <std::uint32_t N, typename Integer>
UString<N> integerText(Integer number) {
    const auto value = static_cast<std::uint64_t>(number);
    if (value < smallNumbers) {
        const SmallNumber& text = smallNumberTexts[value];
        return fromAsciiText<N>({text.digits.data(), text.length});
    }
    std::array<char, std::numeric_limits<Integer>::digits10 + 2> text;
    const char* const end = std::to_chars(text.data(), text.data() + text.size(), number).ptr;
    return fromAsciiText<N>({text.data(), static_cast<std::size_t>(end - text.data())});
}

// The number at the beginning of `text`, by the rules of `parse`, which is strtoll or strtoull.
template <typename Integer, typename Parsed>
kvt::future::optional<Integer> parsed(const char* text, Parsed (*parse)(const char*, char**, int)) {
    char* end = nullptr;
    errno = 0;
    const Parsed value = parse(text, &end, 10);
    if (end == text || errno == ERANGE) {
        return {};
    }
    return static_cast<Integer>(value);
}

} // namespace

template <std::uint32_t N>
UString<N> UString<N>::fromNumber_helper(std::int64_t number) {
    return integerText<N>(number);
}

template <std::uint32_t N>
UString<N> UString<N>::fromNumber_helper(std::uint64_t number) {
    return integerText<N>(number);
}

template <std::uint32_t N>
UString<N> UString<N>::fromNumber_helper(double number) {
    std::array<char, floatTextBuffer> text;
    return fromAsciiText<N>({text.data(), double_to_string(number, text.data())});
}

template <std::uint32_t N>
UString<N> UString<N>::fromNumber_helper(float number) {
    std::array<char, floatTextBuffer> text;
    return fromAsciiText<N>({text.data(), float_to_string(number, text.data())});
}

template <std::uint32_t N>
kvt::future::optional<std::int64_t> UString<N>::toSigned() const {
    if constexpr (N == Encoding::Utf8) {
        return parsed<std::int64_t>(rawData(), &std::strtoll);
    } else {
        return getAsUtf8().toSigned();
    }
}

template <std::uint32_t N>
kvt::future::optional<std::uint64_t> UString<N>::toUnsigned() const {
    if constexpr (N == Encoding::Utf8) {
        return parsed<std::uint64_t>(rawData(), &std::strtoull);
    } else {
        return getAsUtf8().toUnsigned();
    }
}

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_USTRING)

} // namespace kvt::ex
