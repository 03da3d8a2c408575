// What a string is made of and how it lives: sizes, copies, moves, the table for hosts that must follow the
// object, and accessors. One body for all eight types.

#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>
#include <string/string_samples.h>

#include <gtest/gtest.h>

#include <deque>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace {

using namespace kvt::test;

template <typename N>
struct UStringStorage : testing::Test {
    static constexpr std::uint32_t number = N::value;
    using String = UString<number>;
    using Unit = typename String::value_type;

    /// Short text stays inside the object, long text has memory of its own.
    static std::basic_string<Unit> units(bool longText) {
        std::basic_string<Unit> text{Unit{'a'}, Unit{0}, static_cast<Unit>(0xE9)};
        text.resize(longText ? 200 : 3, Unit{'z'});
        return text;
    }
    static String make(bool longText, Encoding label = Encoding::Windows1252) {
        const std::basic_string<Unit> text = units(longText);
        return stringOf<number>({reinterpret_cast<const char*>(text.data()), text.size() * sizeof(Unit)},
                                label);
    }
    static std::uint32_t labelled(Encoding label) { return number == 30 ? label.id() : number; }

    static void expectText(const String& string, const std::basic_string<Unit>& text) {
        EXPECT_EQ(std::basic_string<Unit>(string.begin(), string.end()), text);
        EXPECT_EQ(string.begin()[string.size()], Unit{0}) << "no zero at the end";
        expectOwnAdaptor(string);
    }
    /// The adaptor reads and writes this very object.
    static void expectOwnAdaptor(const String& string) {
        const IZQTString& adaptor = string.getAsIZQTString();
        EXPECT_EQ(adaptor.data(), reinterpret_cast<const char*>(string.rawData()));
        EXPECT_EQ(adaptor.byteLength(), string.size() * sizeof(Unit));
        const auto* const place = reinterpret_cast<const char*>(&adaptor);
        EXPECT_GE(place, reinterpret_cast<const char*>(&string));
        EXPECT_LT(place, reinterpret_cast<const char*>(&string + 1));
    }
};

struct TypeNames {
    template <typename N>
    static std::string GetName(int) {
        return std::to_string(N::value);
    }
};

template <std::uint32_t N>
using Number = std::integral_constant<std::uint32_t, N>;
using Types = testing::Types<Number<0>, Number<1>, Number<2>, Number<3>, Number<27>, Number<28>, Number<29>,
                             Number<30>>;
TYPED_TEST_SUITE(UStringStorage, Types, TypeNames);

TYPED_TEST(UStringStorage, DefaultIsEmpty) {
    typename TestFixture::String string;
    EXPECT_EQ(string.size(), 0u);
    EXPECT_TRUE(string.isEmpty());
    EXPECT_EQ(string.rawData(), string.begin());
    EXPECT_EQ(string.begin(), string.end());
    EXPECT_EQ(string.front(), typename TestFixture::Unit{0});
    EXPECT_EQ(string.encoding().id(), TestFixture::number);
    this->expectOwnAdaptor(string);
}

TYPED_TEST(UStringStorage, HasTheUnitAndTheNumberOfItsType) {
    using Tested = typename TestFixture::String;
    using Expected = std::conditional_t<TestFixture::number == 2, char16_t,
                                        std::conditional_t<TestFixture::number == 3, char32_t, char>>;
    EXPECT_TRUE((std::is_same_v<typename Tested::value_type, Expected>));
    EXPECT_EQ(+Tested::encodingType, TestFixture::number);
    EXPECT_EQ(+Tested::npos, 0xFFFFFFFFFFFFFFFFu);
    EXPECT_FALSE(std::is_polymorphic_v<Tested>);
}

TYPED_TEST(UStringStorage, IsSixWordsAndSevenWithARunTimeEncoding) {
    EXPECT_EQ(sizeof(typename TestFixture::String), TestFixture::number == 30 ? 56u : 48u);
    EXPECT_EQ(kvt::ex::detail::actualUStringSize(), 48u);
    EXPECT_EQ(kvt::ex::detail::actualUStringSize(), sizeof(UString<0>));
}

TYPED_TEST(UStringStorage, ReadsItsUnits) {
    for (const bool longText : {false, true}) {
        auto string = this->make(longText);
        const auto text = this->units(longText);
        this->expectText(string, text);
        EXPECT_EQ(string.size(), text.size());
        EXPECT_FALSE(string.isEmpty());
        EXPECT_EQ(string.rawData(), string.begin());
        EXPECT_EQ(string.end() - string.begin(), static_cast<std::ptrdiff_t>(text.size()));
        EXPECT_EQ(string.front(), text.front());
        EXPECT_EQ(string.back(), text.back());
        for (std::size_t at = 0; at < text.size(); ++at) {
            EXPECT_EQ(std::as_const(string)[at], text[at]);
            EXPECT_EQ(&string[at], string.begin() + at);
        }
        string[1] = typename TestFixture::Unit{'!'};
        EXPECT_EQ(std::as_const(string)[1], typename TestFixture::Unit{'!'});
    }
    EXPECT_TRUE((std::is_same_v<decltype(std::declval<const typename TestFixture::String&>()[0]),
                                typename TestFixture::Unit>));
}

TYPED_TEST(UStringStorage, CopyHasItsOwnTextAndAdaptor) {
    for (const bool longText : {false, true}) {
        auto source = this->make(longText);
        auto copy = source;
        this->expectText(copy, this->units(longText));
        this->expectText(source, this->units(longText));
        EXPECT_NE(copy.rawData(), source.rawData());
        EXPECT_NE(&copy.getAsIZQTString(), &source.getAsIZQTString());
        EXPECT_EQ(copy.encoding().id(), this->labelled(Encoding::Windows1252));
        copy[0] = typename TestFixture::Unit{'!'};
        this->expectText(source, this->units(longText));
    }
}

TYPED_TEST(UStringStorage, MoveLeavesAnEmptyStringThatKeepsItsEncoding) {
    for (const bool longText : {false, true}) {
        auto source = this->make(longText);
        const auto* const buffer = source.rawData();
        auto target = std::move(source);
        this->expectText(target, this->units(longText));
        EXPECT_EQ(target.rawData() == buffer, longText) << "long text is taken over";
        EXPECT_EQ(target.encoding().id(), this->labelled(Encoding::Windows1252));
        this->expectText(source, {});
        EXPECT_EQ(source.encoding().id(), this->labelled(Encoding::Windows1252));
        source.getAsIZQTString().assignBytes(reinterpret_cast<const char*>(target.rawData()), 4);
        EXPECT_EQ(source.size(), 4 / sizeof(typename TestFixture::Unit));
        this->expectText(target, this->units(longText));
    }
    EXPECT_TRUE(std::is_nothrow_move_constructible_v<typename TestFixture::String>);
    EXPECT_TRUE(std::is_nothrow_move_assignable_v<typename TestFixture::String>);
}

TYPED_TEST(UStringStorage, CopyAssignmentTakesTextAndEncodingAndLeavesTheAdaptor) {
    for (const bool longText : {false, true}) {
        for (const bool longBefore : {false, true}) {
            const auto source = this->make(longText);
            auto target = this->make(longBefore, Encoding::Utf8);
            const IZQTString* const adaptor = &target.getAsIZQTString();
            EXPECT_EQ(&(target = source), &target);
            this->expectText(target, this->units(longText));
            this->expectText(source, this->units(longText));
            EXPECT_EQ(&target.getAsIZQTString(), adaptor);
            EXPECT_EQ(target.encoding().id(), this->labelled(Encoding::Windows1252));
        }
    }
}

TYPED_TEST(UStringStorage, MoveAssignmentTakesTheTextAndLeavesBothAdaptors) {
    for (const bool longText : {false, true}) {
        for (const bool longBefore : {false, true}) {
            auto source = this->make(longText);
            auto target = this->make(longBefore, Encoding::Utf8);
            EXPECT_EQ(&(target = std::move(source)), &target);
            this->expectText(target, this->units(longText));
            EXPECT_EQ(target.encoding().id(), this->labelled(Encoding::Windows1252));
            this->expectOwnAdaptor(source);
            EXPECT_EQ(source.encoding().id(), this->labelled(Encoding::Windows1252));
            source = target;
            this->expectText(source, this->units(longText));
        }
    }
}

TYPED_TEST(UStringStorage, AssignmentOfItselfChangesNothing) {
    for (const bool longText : {false, true}) {
        auto string = this->make(longText);
        auto& same = string;
        string = same;
        this->expectText(string, this->units(longText));
        string = std::move(same);
        this->expectText(string, this->units(longText));
        EXPECT_EQ(string.encoding().id(), this->labelled(Encoding::Windows1252));
    }
}

TYPED_TEST(UStringStorage, SwapIsThreeMoves) {
    auto left = this->make(true, Encoding::Utf8);
    auto right = this->make(false);
    std::swap(left, right);
    this->expectText(left, this->units(false));
    this->expectText(right, this->units(true));
    EXPECT_EQ(left.encoding().id(), this->labelled(Encoding::Windows1252));
    EXPECT_EQ(right.encoding().id(), this->labelled(Encoding::Utf8));
}

TYPED_TEST(UStringStorage, ClearKeepsMemoryAndEncoding) {
    auto string = this->make(true);
    const auto* const buffer = string.rawData();
    string.clear();
    this->expectText(string, {});
    EXPECT_EQ(string.rawData(), buffer);
    EXPECT_EQ(string.encoding().id(), this->labelled(Encoding::Windows1252));
    string.clear();
    this->expectText(string, {});
}

TYPED_TEST(UStringStorage, GrowingContainersKeepEachAdaptorAtItsString) {
    const auto check = [this](auto& container) {
        for (int count = 0; count < 100; ++count) {
            container.push_back(this->make(count % 2 == 0));
        }
        container.erase(container.begin() + 1);
        container.insert(container.begin() + 1, this->make(false));
        for (std::size_t at = 0; at < container.size(); ++at) {
            this->expectText(container[at], this->units(at % 2 == 0));
        }
    };
    kvt::ex::vector<typename TestFixture::String> own;
    std::vector<typename TestFixture::String> standard;
    std::deque<typename TestFixture::String> deque;
    check(own);
    check(standard);
    check(deque);
}

TYPED_TEST(UStringStorage, AdaptorWritesThroughToTheString) {
    auto string = this->make(true);
    const auto text = this->units(false);
    string.getAsIZQTString().assignBytes(reinterpret_cast<const char*>(text.data()),
                                         static_cast<std::uint32_t>(text.size() * sizeof(text[0])));
    this->expectText(string, text);
    EXPECT_EQ(string.encoding().id(), this->labelled(Encoding::Windows1252));
}

TEST(UStringAdaptor, OfAMovedStringReadsTheNewPlace) {
    UString<0> source("text");
    const UString<0> target(std::move(source));
    EXPECT_STREQ(target.getAsIZQTString().text(), "text");
    EXPECT_STREQ(source.getAsIZQTString().text(), "");
}

TEST(AnyStringEncoding, IsReplacedByCopyAssignmentAndKeptByAssign) {
    UString<30> left("\x80", 1, Encoding::Windows1252);
    const UString<30> right("\u20ac");
    UString<30> converted = left;
    converted.assign(right);
    EXPECT_EQ(converted.toStdString(), "\x80");
    EXPECT_EQ(converted.encoding().id(), Encoding::Windows1252);
    left = right;
    EXPECT_EQ(left.toStdString(), "\u20ac");
    EXPECT_EQ(left.encoding().id(), Encoding::Utf8);
}

TEST(AnyStringEncoding, IsRelabelledWithoutConversion) {
    UString<30> string("\xE9", 1, Encoding::Windows1252);
    string.setEncoding(Encoding::Windows1251);
    EXPECT_EQ(string.toStdString(), "\xE9");
    EXPECT_EQ(UString<0>(string).toStdString(), "\u0439");
    string.setEncoding(Encoding::Unknown);
    EXPECT_EQ(string.encoding().id(), Encoding::Unknown);
}

} // namespace
