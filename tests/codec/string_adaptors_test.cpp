// The table of operations through which a host reaches a string: its slots by their places in the virtual
// table, as a host compiled elsewhere calls them, and what each does for the three widths of unit.

#include <kvt/codec/string_adaptors.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <type_traits>

namespace {

using namespace kvt::test;
using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::detail::IZQTUStringAdaptor;

/// The function in a slot, counted from 1. With the ABI of this platform the object begins with the address
/// of the table, and the table has the virtual functions in the order of their declaration, the destructor
/// twice.
template <typename Function>
Function* slot(const IZQTString& string, int number) {
    void* const* table = nullptr;
    std::memcpy(&table, static_cast<const void*>(&string), sizeof table);
    return reinterpret_cast<Function*>(table[number - 1]);
}

using AssignText = void(IZQTString*, const char*);
using AssignBytes = void(IZQTString*, const char*, std::uint32_t);
using Pointer = const char*(const IZQTString*);
using Length = std::uint32_t(const IZQTString*);
using Parsable = void(IZQTString*);

template <typename T>
const char* asBytes(const T* units) {
    return reinterpret_cast<const char*>(units);
}

template <typename T>
struct Adaptor : testing::Test {
    std::basic_string<T> storage{T{'a'}, T{'b'}, T{'c'}};
    IZQTUStringAdaptor<T> adaptor{storage};
    IZQTString& string = adaptor;

    static std::basic_string<T> text(const char* ascii) { return {ascii, ascii + std::strlen(ascii)}; }
};

using Units = testing::Types<char, char16_t, char32_t>;
TYPED_TEST_SUITE(Adaptor, Units);

TYPED_TEST(Adaptor, Slot1AssignsTextUpToTheZeroUnit) {
    using T = TypeParam;
    // 0x0101 and the like have zero bytes nowhere, 0x6100 has one: the end is a zero unit.
    const T text[] = {T{'x'}, static_cast<T>(sizeof(T) == 1 ? 0xE9 : 0x6100), T{'z'}, T{0}, T{'!'}, T{0}};
    slot<AssignText>(this->string, 1)(&this->string, asBytes(text));
    EXPECT_EQ(this->storage, std::basic_string<T>(text, 3));
    slot<AssignText>(this->string, 1)(&this->string, asBytes(text + 3));
    EXPECT_TRUE(this->storage.empty());
}

TYPED_TEST(Adaptor, Slot2IsTheTextWithItsZero) {
    EXPECT_EQ(slot<Pointer>(this->string, 2)(&this->string), asBytes(this->storage.data()));
    EXPECT_EQ(this->storage.data()[3], TypeParam{0});
}

TYPED_TEST(Adaptor, Slot3AssignsWholeUnits) {
    using T = TypeParam;
    const T text[] = {T{'x'}, T{0}, T{'z'}};
    slot<AssignBytes>(this->string, 3)(&this->string, asBytes(text), sizeof text);
    EXPECT_EQ(this->storage, std::basic_string<T>(text, 3));
    for (std::uint32_t length = 0; length <= sizeof text; ++length) {
        slot<AssignBytes>(this->string, 3)(&this->string, asBytes(text), length);
        EXPECT_EQ(this->storage, std::basic_string<T>(text, length / sizeof(T))) << length << " bytes";
    }
}

TYPED_TEST(Adaptor, Slot3AcceptsNoBytesAtNoAddress) {
    slot<AssignBytes>(this->string, 3)(&this->string, nullptr, 0);
    EXPECT_TRUE(this->storage.empty());
}

TYPED_TEST(Adaptor, Slot4IsTheFirstUnit) {
    EXPECT_EQ(slot<Pointer>(this->string, 4)(&this->string), asBytes(this->storage.data()));
    this->storage.assign(1000, TypeParam{'y'});
    EXPECT_EQ(slot<Pointer>(this->string, 4)(&this->string), asBytes(this->storage.data()));
}

TYPED_TEST(Adaptor, Slot5IsTheLengthInBytes) {
    EXPECT_EQ(slot<Length>(this->string, 5)(&this->string), 3 * sizeof(TypeParam));
    this->storage.clear();
    EXPECT_EQ(slot<Length>(this->string, 5)(&this->string), 0u);
    this->storage.assign(1000, TypeParam{0});
    EXPECT_EQ(slot<Length>(this->string, 5)(&this->string), 1000 * sizeof(TypeParam));
}

TYPED_TEST(Adaptor, Slots6To9ThrowAndLeaveTheString) {
    const char* const names[] = {"encodeToZQTParsableText", "decodeFromZQTParsableText",
                                 "encodeUtf8ToZQTParsableText", "decodeUtf8FromZQTParsableText"};
    for (int number = 6; number <= 9; ++number) {
        EXPECT_EQ(failureOf([&] { slot<Parsable>(this->string, number)(&this->string); }),
                  notImplementedFailure(names[number - 6]));
    }
    EXPECT_EQ(this->storage, this->text("abc"));
}

TYPED_TEST(Adaptor, NamesAndSlotsAreTheSameOperations) {
    const std::basic_string<TypeParam> text = this->text("text");
    this->string.assignText(asBytes(text.data()));
    EXPECT_EQ(this->storage, text);
    this->string.assignBytes(asBytes(text.data()), 2 * sizeof(TypeParam));
    EXPECT_EQ(this->storage, text.substr(0, 2));
    EXPECT_EQ(this->string.data(), asBytes(this->storage.data()));
    EXPECT_EQ(this->string.text(), asBytes(this->storage.data()));
    EXPECT_EQ(this->string.byteLength(), 2 * sizeof(TypeParam));
    EXPECT_EQ(failureOf([&] { this->string.encodeToZQTParsableText(); }),
              notImplementedFailure("encodeToZQTParsableText"));
    EXPECT_EQ(failureOf([&] { this->string.decodeFromZQTParsableText(); }),
              notImplementedFailure("decodeFromZQTParsableText"));
    EXPECT_EQ(failureOf([&] { this->string.encodeUtf8ToZQTParsableText(); }),
              notImplementedFailure("encodeUtf8ToZQTParsableText"));
    EXPECT_EQ(failureOf([&] { this->string.decodeUtf8FromZQTParsableText(); }),
              notImplementedFailure("decodeUtf8FromZQTParsableText"));
}

TYPED_TEST(Adaptor, AssignsFromItsOwnText) {
    using T = TypeParam;
    this->storage.assign(100, T{'a'});
    this->storage.back() = T{'z'};
    this->string.assignBytes(this->string.data() + 98 * sizeof(T), 2 * sizeof(T));
    EXPECT_EQ(this->storage, this->text("az"));
    this->string.assignText(this->string.text() + sizeof(T));
    EXPECT_EQ(this->storage, this->text("z"));
}

TYPED_TEST(Adaptor, IsTwoWordsAndIsNotCopied) {
    EXPECT_EQ(sizeof(IZQTUStringAdaptor<TypeParam>), 2 * sizeof(void*));
    EXPECT_FALSE(std::is_copy_constructible_v<IZQTUStringAdaptor<TypeParam>>);
    EXPECT_FALSE(std::is_copy_assignable_v<IZQTUStringAdaptor<TypeParam>>);
    EXPECT_TRUE((std::is_base_of_v<IZQTString, IZQTUStringAdaptor<TypeParam>>));
}

/// An implementation of the interface that is not the library's, as a host has it.
class HostString final : public IZQTString {
public:
    explicit HostString(int& destroyed) : destroyed_(&destroyed) {}
    void assignText(const char*) override { called_ = 1; }
    const char* text() const override { return "2"; }
    void assignBytes(const char*, std::uint32_t) override { called_ = 3; }
    const char* data() const override { return "4"; }
    std::uint32_t byteLength() const override { return 5; }
    void encodeToZQTParsableText() override { called_ = 6; }
    void decodeFromZQTParsableText() override { called_ = 7; }
    void encodeUtf8ToZQTParsableText() override { called_ = 8; }
    void decodeUtf8FromZQTParsableText() override { called_ = 9; }
    ~HostString() override { ++*destroyed_; }

    int called_ = 0;

private:
    int* destroyed_;
};

TEST(IZQTStringSlots, StandInTheStatedOrder) {
    int destroyed = 0;
    HostString host(destroyed);
    slot<AssignText>(host, 1)(&host, "");
    EXPECT_EQ(host.called_, 1);
    EXPECT_STREQ(slot<Pointer>(host, 2)(&host), "2");
    slot<AssignBytes>(host, 3)(&host, "", 0);
    EXPECT_EQ(host.called_, 3);
    EXPECT_STREQ(slot<Pointer>(host, 4)(&host), "4");
    EXPECT_EQ(slot<Length>(host, 5)(&host), 5u);
    for (int number = 6; number <= 9; ++number) {
        slot<Parsable>(host, number)(&host);
        EXPECT_EQ(host.called_, number);
    }
}

TEST(IZQTStringSlots, TheLastOneDestroysThroughTheInterface) {
    int destroyed = 0;
    IZQTString* host = new HostString(destroyed);
    // The first of the two destructor entries leaves the memory, which the second gives back.
    slot<Parsable>(*host, 10)(host);
    EXPECT_EQ(destroyed, 1);
    ::operator delete(static_cast<void*>(host));
    host = new HostString(destroyed);
    delete host;
    EXPECT_EQ(destroyed, 2);
}

TEST(UStringAdaptor, BytesOfTheHostAreCountedInBytesForWideStrings) {
    UString<2> wide(u"abc", 3);
    EXPECT_EQ(wide.getAsIZQTString().byteLength(), 6u);
    const char16_t text[] = u"xyz";
    wide.getAsIZQTString().assignBytes(asBytes(text), 6);
    EXPECT_EQ(wide, UString<2>(u"xyz", 3));
    UString<3> wider(U"abc", 3);
    EXPECT_EQ(wider.getAsIZQTString().byteLength(), 12u);
}

TEST(UStringAdaptor, AssignsUnitsAsTheyStand) {
    UString<1> ascii("abc");
    ascii.getAsIZQTString().assignText("caf\xE9");
    EXPECT_EQ(ascii.toStdString(), "caf\xE9");
    UString<0> utf8;
    utf8.getAsIZQTString().assignBytes("\xFF\0\xC3", 3);
    EXPECT_EQ(utf8.toStdString(), std::string("\xFF\0\xC3", 3));
    UString<29> wwjd;
    wwjd.getAsIZQTString().assignText("<lt> ");
    EXPECT_EQ(wwjd.toStdString(), "<lt> ");
}

TEST(UStringAdaptor, LeavesTheEncodingOfAnAnyString) {
    UString<30> any("abc", 3, Encoding::Windows1252);
    any.getAsIZQTString().assignText("\x80");
    EXPECT_EQ(any.encoding().id(), Encoding::Windows1252);
    any.getAsIZQTString().assignBytes("\x80\x81", 2);
    EXPECT_EQ(any.encoding().id(), Encoding::Windows1252);
    EXPECT_EQ(any.toStdString(), "\x80\x81");
}

TEST(UStringAdaptor, ParsableTextFailsForEveryString) {
    UString<0> string("abc");
    EXPECT_EQ(failureOf([&] { string.getAsIZQTString().decodeUtf8FromZQTParsableText(); }),
              notImplementedFailure("decodeUtf8FromZQTParsableText"));
    EXPECT_EQ(string.toStdString(), "abc");
}

TEST(UStringAdaptor, IsReadThroughAConstString) {
    const UString<0> string("abc");
    EXPECT_EQ(string.getAsIZQTString().data(), string.rawData());
    EXPECT_EQ(string.getAsIZQTString().byteLength(), 3u);
    EXPECT_TRUE((std::is_same_v<decltype(string.getAsIZQTString()), const IZQTString&>));
}

} // namespace
