// What a caller may write: which conversions are silent and which are explicit, views, streams, hashes,
// comparisons.

#include <kvt/foundation/string_view.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>
#include <string/string_samples.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <sstream>
#include <string>
#include <type_traits>
#include <unordered_set>

namespace {

using namespace kvt::test;
using kvt::ex::UStringView;

template <std::uint32_t N>
constexpr bool constructorsAreAsStated() {
    using String = UString<N>;
    using View = UStringView<N>;
    static_assert(std::is_convertible_v<const char*, String>);
    static_assert(std::is_constructible_v<String, const char*, std::size_t>);
    static_assert(std::is_constructible_v<String, const char*, int>);
    static_assert(std::is_constructible_v<String, const char*, std::size_t, Encoding>);
    static_assert(std::is_constructible_v<String, const char*, std::size_t, Encoding::Type>);
    static_assert(!std::is_constructible_v<String, const char*, Encoding>, "an encoding is no length");
    static_assert(!std::is_constructible_v<String, const char*, Encoding::Type>, "nor is its number");
    static_assert(!std::is_constructible_v<String, int> && !std::is_constructible_v<String, std::size_t>);
    static_assert(!std::is_convertible_v<View, String>, "a copy is written out");
    static_assert(std::is_constructible_v<String, View> == (N != 30));
    static_assert(std::is_constructible_v<String, View, Encoding> == (N == 30));
    static_assert(std::is_constructible_v<String, Encoding> == (N == 30));
    static_assert(!std::is_convertible_v<Encoding, String>);
    static_assert(std::is_constructible_v<String, const char16_t*, std::size_t> == (N == 2));
    static_assert(std::is_constructible_v<String, const char32_t*, std::size_t> == (N == 3));
    static_assert(std::is_convertible_v<const String&, View>);
    static_assert(std::is_same_v<typename View::value_type, typename String::value_type>);
    return true;
}
static_assert(constructorsAreAsStated<0>() && constructorsAreAsStated<1>() && constructorsAreAsStated<2>() &&
              constructorsAreAsStated<3>() && constructorsAreAsStated<27>() &&
              constructorsAreAsStated<28>() && constructorsAreAsStated<29>() &&
              constructorsAreAsStated<30>());

template <std::uint32_t M, std::uint32_t... Ns>
constexpr bool convertsToAll(Numbers<Ns...>) {
    return (std::is_convertible_v<const UString<M>&, UString<Ns>> && ...);
}
static_assert(convertsToAll<0>(AllTypes{}) && convertsToAll<1>(AllTypes{}) && convertsToAll<2>(AllTypes{}) &&
              convertsToAll<3>(AllTypes{}) && convertsToAll<27>(AllTypes{}) &&
              convertsToAll<28>(AllTypes{}) && convertsToAll<29>(AllTypes{}) &&
              convertsToAll<30>(AllTypes{}));

template <typename String, typename = void>
constexpr bool canBeRelabelled = false;
template <typename String>
constexpr bool
    canBeRelabelled<String, std::void_t<decltype(std::declval<String&>().setEncoding(Encoding::Utf8))>> =
        true;
template <typename String, typename = void>
constexpr bool hasStdString = false;
template <typename String>
constexpr bool hasStdString<String, std::void_t<decltype(std::declval<const String&>().toStdString())>> =
    true;

TEST(UStringSurface, OnlyAnAnyStringIsRelabelled) {
    forEachType([]<std::uint32_t N>() { EXPECT_EQ(canBeRelabelled<UString<N>>, N == 30) << N; });
}

TEST(UStringSurface, OnlyUnitsOfEightBitsAreAStdString) {
    forEachType([]<std::uint32_t N>() { EXPECT_EQ(hasStdString<UString<N>>, N != 2 && N != 3) << N; });
}

TEST(UStringSurface, AliasesNameTheTypes) {
    EXPECT_TRUE((std::is_same_v<kvt::ex::Utf8String, UString<0>>));
    EXPECT_TRUE((std::is_same_v<kvt::ex::AsciiString, UString<1>>));
    EXPECT_TRUE((std::is_same_v<kvt::ex::Utf16String, UString<2>>));
    EXPECT_TRUE((std::is_same_v<kvt::ex::Utf32String, UString<3>>));
    EXPECT_TRUE((std::is_same_v<kvt::ex::SystemString, UString<27>>));
    EXPECT_TRUE((std::is_same_v<kvt::ex::BinaryString, UString<28>>));
    EXPECT_TRUE((std::is_same_v<kvt::ex::WwjdString, UString<29>>));
    EXPECT_TRUE((std::is_same_v<kvt::ex::AnyString, UString<30>>));
    EXPECT_TRUE((std::is_same_v<UString<Encoding::Utf8>, UString<0>>));
}

TEST(UStringSurface, ATagOfEachKindSelectsOverloads) {
    using kvt::ex::detail::case_insensitive_t;
    using kvt::ex::detail::case_sensitive_t;
    forEachType([]<std::uint32_t N>() {
        EXPECT_TRUE((std::is_same_v<std::decay_t<decltype(UString<N>::case_sensitive)>, case_sensitive_t>))
            << N;
        using Insensitive = std::conditional_t<N == 28, case_sensitive_t, case_insensitive_t>;
        EXPECT_TRUE((std::is_same_v<std::decay_t<decltype(UString<N>::case_insensitive)>, Insensitive>)) << N;
    });
}

TEST(UStringSurface, NposIsTheSameEverywhere) {
    EXPECT_EQ(+UString<0>::npos, +kvt::future::detail::basic_string_view_constants::npos);
}

TEST(UStringSurface, ConvertsSilentlyWhereAnotherTypeIsWanted) {
    const auto sizeOf = [](const UString<2>& string) { return string.size(); };
    EXPECT_EQ(sizeOf(UString<0>("\U0001F600")), 2u);
    EXPECT_EQ(sizeOf("\u00e9"), 1u);
    UString<0> string = UString<2>(u"\u20ac", 1);
    EXPECT_EQ(string.size(), 3u);
    string = UString<29>("<", 1, Encoding::Utf8);
    EXPECT_EQ(string.toStdString(), "<");
}

TEST(UStringViews, AreMadeFromWhatHoldsUnits) {
    const UString<0> string("text");
    const UStringView<0> ofString = string;
    EXPECT_EQ(ofString.data(), string.rawData());
    EXPECT_EQ(ofString.size(), 4u);
    const UStringView<0> ofText = "text";
    EXPECT_EQ(ofText.size(), 4u);
    const UStringView<0> ofPart("text", 2);
    EXPECT_EQ(ofPart.size(), 2u);
    const UStringView<0> ofView = kvt::future::string_view("te\0t", 4);
    EXPECT_EQ(ofView.size(), 4u);
    const std::string standard = "text";
    const UStringView<0> ofStandard = standard;
    EXPECT_EQ(ofStandard.data(), standard.data());
    const kvt::future::string_view back = ofView;
    EXPECT_EQ(back, std::string_view("te\0t", 4));
    const UStringView<2> wide = u"\u00e9x";
    EXPECT_EQ(wide.size(), 2u);
    const UStringView<3> wider = std::u32string_view(U"x");
    EXPECT_EQ(wider[0], U'x');
    EXPECT_TRUE(UStringView<0>().isEmpty());
    EXPECT_EQ(UStringView<0>().data(), nullptr);
    EXPECT_EQ(std::string(ofPart.begin(), ofPart.end()), "te");
    EXPECT_EQ(sizeof(UStringView<30>), 2 * sizeof(void*)) << "a view has no encoding";
}

TEST(UStringViews, BecomeStringsOfTheirUnits) {
    EXPECT_EQ(UString<0>(UStringView<0>("\xFF")).toStdString(), "\xFF");
    EXPECT_EQ(UString<1>(UStringView<1>("\xE9")).toStdString(), "\xE9");
    EXPECT_EQ(UString<2>(UStringView<2>(u"\xD800")).size(), 1u);
    EXPECT_TRUE(UString<0>(UStringView<0>()).isEmpty());
    const UString<30> any(UStringView<30>("\x80"), Encoding::Windows1252);
    EXPECT_EQ(any.encoding().id(), Encoding::Windows1252);
    EXPECT_EQ(any.getAsUtf8(), UString<0>("\u20ac"));
    const UString<30> source("abc");
    EXPECT_EQ(UString<30>(source, Encoding::Utf16LE).encoding().id(), Encoding::Utf16LE)
        << "a view has no encoding";
}

template <typename String>
std::string written(const String& string) {
    std::ostringstream stream;
    stream << string;
    return stream.str();
}

TEST(UStringStream, WritesUtf8) {
    EXPECT_EQ(written(UString<0>("caf\u00e9")), "caf\u00e9");
    EXPECT_EQ(written(UString<1>("abc")), "abc");
    EXPECT_EQ(written(UString<2>(u"caf\u00e9", 4)), "caf\u00e9");
    EXPECT_EQ(written(UString<3>(U"\U0001F600", 1)), "\U0001F600");
    EXPECT_EQ(written(UString<27>("caf\u00e9")), "caf\u00e9");
    EXPECT_EQ(written(UString<29>("caf\u00e9 <")), "caf\u00e9 <");
    EXPECT_EQ(written(UString<30>("caf\xE9", 4, Encoding::Windows1252)), "caf\u00e9");
    EXPECT_EQ(written(UString<0>("a\0b", 3)), std::string("a\0b", 3));
    EXPECT_EQ(written(UString<0>()), "");
}

TEST(UStringStream, WritesBytesWithoutATextMeaningEscaped) {
    EXPECT_EQ(written(UString<28>("a\x01\xE9\\\x7F\0z", 7)), "a\\x01\\xE9\\\x7F\\x00z");
    EXPECT_EQ(written(UString<28>()), "");
}

TEST(UStringStream, FailsWithNothingWritten) {
    std::ostringstream stream;
    EXPECT_EQ(failureOf([&] { stream << "x" << UString<2>(u"a\xD800", 2) << "y"; }),
              badEncodingFailure({"a\0\0\xD8", 4}, "UTF-16LE", "a\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([&] { stream << UString<30>("a", 1, Encoding::Unknown); }),
              invalidEncodingFailure("unknown"));
    EXPECT_EQ(stream.str(), "x");
}

TEST(UStringHash, IsFnvOfTheBytes) {
    forEachType([]<std::uint32_t N>() {
        for (const std::string& text : samplesOf(N)) {
            std::uint64_t expected = 14695981039346656037u;
            for (const char byte : text) {
                expected ^= static_cast<unsigned char>(byte);
                expected *= 1099511628211u;
            }
            const UString<N> string = stringOf<N>(text);
            EXPECT_EQ(string.hash(), expected) << N << ' ' << printable(text.substr(0, 40));
            EXPECT_EQ(std::hash<UString<N>>()(string), expected);
        }
    });
    EXPECT_EQ(UString<0>("a").hash(), 0xaf63dc4c8601ec8cu) << "the published value";
    EXPECT_EQ(std::unordered_set<UString<0>>({"a", "b", "a"}).size(), 2u);
}

/// Compares as the units say, unsigned.
template <std::uint32_t N>
void checkOrder(const std::string& leftBytes, const std::string& rightBytes) {
    const UString<N> left = stringOf<N>(leftBytes, Encoding::Utf8);
    const UString<N> right = stringOf<N>(rightBytes, Encoding::Utf16LE);
    using Unit = std::conditional_t<sizeof(typename UString<N>::value_type) == 1, unsigned char,
                                    typename UString<N>::value_type>;
    const std::vector<Unit> l(left.begin(), left.end());
    const std::vector<Unit> r(right.begin(), right.end());
    SCOPED_TRACE(std::to_string(N) + " " + printable(leftBytes.substr(0, 40)) + " | " +
                 printable(rightBytes.substr(0, 40)));
    const int order = left.compare(right);
    EXPECT_EQ(order < 0, l < r);
    EXPECT_EQ(order > 0, r < l);
    EXPECT_EQ(left == right, l == r);
    EXPECT_EQ(left != right, l != r);
    EXPECT_EQ(left < right, l < r);
    EXPECT_EQ(left > right, l > r);
    EXPECT_EQ(left <= right, l <= r);
    EXPECT_EQ(left >= right, l >= r);
}

TEST(UStringOrder, IsThatOfTheUnitsAsUnsignedNumbers) {
    forEachType([]<std::uint32_t N>() {
        for (const std::string& left : samplesOf(N)) {
            for (const std::string& right : samplesOf(N)) {
                checkOrder<N>(left, right);
            }
        }
    });
    EXPECT_LT(UString<0>("z"), UString<0>("\xC3\xA9"));
    EXPECT_LT(UString<0>("a"), UString<0>("a\0", 2));
    EXPECT_LT(UString<2>(u"\U0001F600", 2), UString<2>(u"\uFFFD", 1)) << "by unit, not by code point";
    EXPECT_TRUE(UString<0>("abc").compare("abc") == 0);
    const std::map<UString<0>, int> map{{"b", 1}, {"a", 2}};
    EXPECT_EQ(map.begin()->second, 2);
}

TEST(UStringOrder, EncodingOfAnAnyStringTakesNoPart) {
    EXPECT_EQ(UString<30>("a", 1, Encoding::Utf8), UString<30>("a", 1, Encoding("IBM037")));
}

TEST(UStringArrays, AreMadeAsVectorsAre) {
    const kvt::ex::UStringArray<0> array{"a", "b"};
    EXPECT_EQ(array.size(), 2u);
    EXPECT_EQ(array[1].toStdString(), "b");
    EXPECT_EQ(kvt::ex::UStringArray<2>(3, UString<2>("x")).back().size(), 1u);
}

} // namespace
