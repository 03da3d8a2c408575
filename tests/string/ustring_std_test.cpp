// Strings in the company of the standard library: range loops, views both ways, hashes and streams, for all eight
// types.

#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <numeric>
#include <ranges>
#include <sstream>
#include <string>
#include <string_view>
#include <type_traits>
#include <unordered_map>
#include <unordered_set>

namespace {

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringArray;
using kvt::ex::UStringView;

template <typename TypeNumber>
struct UStringStd : testing::Test {
    static constexpr std::uint32_t N = TypeNumber::value;
    using String = UString<N>;
    using View = UStringView<N>;
    using Unit = typename String::value_type;
    using StdString = std::basic_string<Unit>;
    using StdView = std::basic_string_view<Unit>;

    static String string(StdView units) {
        if constexpr (N == Encoding::Unknown) {
            return String(units, Encoding::Windows1252);
        } else {
            return String(units);
        }
    }

    const StdString units{Unit{'a'}, Unit{0}, static_cast<Unit>(0xE9), Unit{'b'}, Unit{'a'}};
    const String text = string(units);
};

template <std::uint32_t N>
using Number = std::integral_constant<std::uint32_t, N>;
using EightTypes = testing::Types<Number<0>, Number<1>, Number<2>, Number<3>, Number<27>, Number<28>,
                                  Number<29>, Number<30>>;
TYPED_TEST_SUITE(UStringStd, EightTypes);

TYPED_TEST(UStringStd, RangeLoopsGoOverTheUnits) {
    typename TestFixture::StdString seen;
    for (const auto unit : this->text) {
        seen += unit;
    }
    EXPECT_EQ(seen, this->units);
    seen.clear();
    for (const auto& unit : typename TestFixture::View(this->text)) {
        seen += unit;
    }
    EXPECT_EQ(seen, this->units);
    for (const auto unit : typename TestFixture::String()) {
        FAIL() << "an empty string has a unit: " << static_cast<unsigned>(unit);
    }
    for (const auto unit : typename TestFixture::View()) {
        FAIL() << "a view of nothing has a unit: " << static_cast<unsigned>(unit);
    }
}

TYPED_TEST(UStringStd, AreContiguousRanges) {
    static_assert(std::ranges::contiguous_range<const typename TestFixture::String>);
    static_assert(std::ranges::sized_range<const typename TestFixture::String>);
    static_assert(std::ranges::contiguous_range<typename TestFixture::View>);
    EXPECT_EQ(std::ranges::count(this->text, typename TestFixture::Unit{'a'}), 2);
    EXPECT_EQ(std::ranges::distance(this->text), 5);
    EXPECT_EQ(std::count(this->text.begin(), this->text.end(), typename TestFixture::Unit{0}), 1);
}

TYPED_TEST(UStringStd, BecomeStandardViewsWithoutACopy) {
    const typename TestFixture::StdView ofString = this->text;
    EXPECT_EQ(ofString.data(), this->text.rawData());
    EXPECT_EQ(ofString.size(), 5u);
    const typename TestFixture::StdView ofView = typename TestFixture::View(this->text);
    EXPECT_EQ(ofView.data(), this->text.rawData());
    EXPECT_EQ(ofView.size(), 5u);
    const auto lengthOf = [](typename TestFixture::StdView view) { return view.size(); };
    EXPECT_EQ(lengthOf(this->text), 5u);
    EXPECT_EQ(lengthOf(typename TestFixture::String()), 0u);
    EXPECT_EQ(typename TestFixture::StdString(this->text), this->units)
        << "a standard string where one is written out";
    EXPECT_TRUE((!std::is_convertible_v<typename TestFixture::String, typename TestFixture::StdString>));
}

TYPED_TEST(UStringStd, AreMadeFromStandardViewsWhereItIsWrittenOut) {
    EXPECT_EQ(this->string(typename TestFixture::StdView(this->units)), this->text);
    const typename TestFixture::View view = typename TestFixture::StdView(this->units);
    EXPECT_EQ(view.data(), this->units.data());
    EXPECT_FALSE((std::is_convertible_v<typename TestFixture::StdView, typename TestFixture::String>));
}

TYPED_TEST(UStringStd, OperationsTakeStringsAndBothKindsOfView) {
    const auto needle = this->string(typename TestFixture::StdView(this->units).substr(3));
    EXPECT_EQ(this->text.find(needle), 3u);
    EXPECT_EQ(this->text.find(typename TestFixture::StdView(needle)), 3u);
    EXPECT_EQ(this->text.find(typename TestFixture::View(needle)), 3u);
    EXPECT_TRUE(this->text.endsWith(needle));
    typename TestFixture::String joined(this->text);
    joined.append(needle);
    EXPECT_EQ(joined.size(), 7u);
    EXPECT_EQ(joined + needle, typename TestFixture::String(joined).append(needle));
}

TYPED_TEST(UStringStd, CompareWithStandardViewsByTheirUnits) {
    EXPECT_TRUE(this->text == typename TestFixture::StdView(this->units));
    EXPECT_FALSE(this->text == typename TestFixture::StdView(this->units).substr(1));
}

TYPED_TEST(UStringStd, HashAsTheirHash) {
    using Text = typename TestFixture::String;
    EXPECT_EQ(std::hash<Text>()(this->text), this->text.hash());
    static_assert(std::is_nothrow_invocable_r_v<std::size_t, std::hash<Text>, const Text&>);
    std::unordered_map<Text, int> map;
    ++map[this->text];
    ++map[this->string(this->units)];
    ++map[Text()];
    EXPECT_EQ(map.size(), 2u);
    EXPECT_EQ(map[this->text], 2);
    std::map<Text, int> ordered{{this->text, 1}, {Text(), 2}};
    EXPECT_EQ(ordered.begin()->second, 2);
}

template <std::uint32_t N>
std::string written(const UString<N>& string) {
    std::ostringstream stream;
    stream << '[' << string << ']';
    return stream.str();
}

TEST(UStringStream, WritesTheSameTextForEveryType) {
    EXPECT_EQ(written(UString<0>("caf\u00e9")), "[caf\u00e9]");
    EXPECT_EQ(written(UString<1>("cafe")), "[cafe]");
    EXPECT_EQ(written(UString<2>("caf\u00e9")), "[caf\u00e9]");
    EXPECT_EQ(written(UString<3>("caf\u00e9")), "[caf\u00e9]");
    EXPECT_EQ(written(UString<27>("caf\u00e9")), "[caf\u00e9]");
    EXPECT_EQ(written(UString<28>("caf\u00e9")), "[caf\\xC3\\xA9]");
    EXPECT_EQ(written(UString<29>("caf\u00e9")), "[caf\u00e9]");
    EXPECT_EQ(written(UString<30>("caf\xE9", 4, Encoding::Iso8859_1)), "[caf\u00e9]");
}

TEST(UStringStream, PadsToTheWidthOfTheStream) {
    std::ostringstream stream;
    stream.width(6);
    stream.fill('.');
    stream << UString<2>("abc");
    EXPECT_EQ(stream.str(), "...abc");
}

TEST(UStringArrayStd, RangeLoopsGoOverTheElements) {
    const UStringArray<2> array{UString<2>("a"), UString<2>("b"), UString<2>("c")};
    std::string joined;
    for (const UString<2>& element : array) {
        joined += element.getAsUtf8().toStdString();
    }
    EXPECT_EQ(joined, "abc");
    const std::size_t units =
        std::accumulate(array.begin(), array.end(), std::size_t{0},
                        [](std::size_t sum, const auto& string) { return sum + string.size(); });
    EXPECT_EQ(units, 3u);
}

} // namespace
