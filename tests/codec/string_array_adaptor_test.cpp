// The table of operations through which a host reaches an array of strings: its slots by their places in the virtual
// table, and what each does for all eight types of element.

#include <codec/adaptor_samples.h>
#include <support/failure_record.h>

#include <kvt/codec/string_adaptors.h>
#include <kvt/string/ustring_array.h>

#include <gtest/gtest.h>

#include <new>
#include <string>
#include <utility>

namespace {

using namespace kvt::test;
using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringArray;

using AddString = void(IZQTStringArray*, const IZQTString*);
using AddText = void(IZQTStringArray*, const char*);
using AddTokens = void(IZQTStringArray*, const char*, const char*);
using ElementText = const char*(const IZQTStringArray*, std::uint32_t);
using GetElement = int(const IZQTStringArray*, std::uint32_t, IZQTString*);
using SetElement = int(IZQTStringArray*, std::uint32_t, const IZQTString*);
using Entries = std::uint32_t(const IZQTStringArray*);
using Clear = void(IZQTStringArray*);
using HasString = bool(const IZQTStringArray*, const IZQTString*);
using HasText = bool(const IZQTStringArray*, const char*);
using RemoveString = std::uint32_t(IZQTStringArray*, const IZQTString*);
using RemoveText = std::uint32_t(IZQTStringArray*, const char*);
using Element = IZQTString*(IZQTStringArray*, std::uint32_t);

template <typename TypeNumber>
struct ArrayAdaptor : testing::Test {
    static constexpr std::uint32_t N = TypeNumber::value;
    static constexpr bool isWide = sizeof(kvt::ex::detail::CodeUnit<N>) != 1;
    using String = UString<N>;
    using Array = UStringArray<N>;

    static String string(std::string_view ascii) { return stringOfUnits<N>(ascii); }

    Array array = arrayOf<N>({"one", "", "two", "one", std::string_view("t\0o", 3)});
    IZQTStringArray* host = &array.getAsIZQTStringArray();
    const std::string before = shown(array);
};

TYPED_TEST_SUITE(ArrayAdaptor, EightTypes);

TYPED_TEST(ArrayAdaptor, Slot1AppendsTheUnitsOfAString) {
    auto text = this->string(std::string_view("x\0y", 3));
    slotOf<AddString>(this->host, 1)(this->host, &text.getAsIZQTString());
    EXPECT_EQ(shown(this->array), this->before + "[x{0}y]");
    slotOf<AddString>(this->host, 1)(this->host, &this->array[0].getAsIZQTString());
    EXPECT_EQ(shown(this->array.back()), "one") << "an element of the array itself";
    for (const auto& element : this->array) {
        EXPECT_EQ(element.getAsIZQTString().data(), reinterpret_cast<const char*>(element.rawData()))
            << "each element shows its own text, wherever it has moved to";
    }
}

TYPED_TEST(ArrayAdaptor, Slot1ConvertsNothing) {
    // 0x80 is neither UTF-8 nor ASCII, and in a wide unit a zero byte stands beside it.
    auto text = this->string("a");
    text[0] = static_cast<typename UString<TypeParam::value>::value_type>(0x80);
    slotOf<AddString>(this->host, 1)(this->host, &text.getAsIZQTString());
    EXPECT_EQ(shown(this->array.back()), "{128}");
}

TYPED_TEST(ArrayAdaptor, Slot1TakesAStringOfAnotherTypeAsBytes) {
    UString<28> bytes("abcdefgh\x01", 9);
    slotOf<AddString>(this->host, 1)(this->host, &bytes.getAsIZQTString());
    EXPECT_EQ(this->array.back().getAsIZQTString().byteLength(), this->isWide ? 8u : 9u)
        << "an incomplete last unit is dropped";
    UString<3> wide(U"a\u20ac", 2);
    slotOf<AddString>(this->host, 1)(this->host, &wide.getAsIZQTString());
    EXPECT_EQ(this->array.back().getAsIZQTString().byteLength(), 8u);
    EXPECT_EQ(std::string(this->array.back().getAsIZQTString().data(), 8),
              std::string("a\0\0\0\xAC\x20\0\0", 8));
}

TYPED_TEST(ArrayAdaptor, Slot2AppendsTextWhereUnitsAreBytes) {
    const auto call = [this] { slotOf<AddText>(this->host, 2)(this->host, "caf\xE9"); };
    if (this->isWide) {
        EXPECT_EQ(failureOf(call), notImplementedFailure("append"));
        EXPECT_EQ(shown(this->array), this->before);
    } else {
        EXPECT_EQ(failureOf(call), noFailure());
        EXPECT_EQ(shown(this->array), this->before + "[caf{233}]");
        slotOf<AddText>(this->host, 2)(this->host, "");
        EXPECT_EQ(shown(this->array), this->before + "[caf{233}][]");
        slotOf<AddText>(this->host, 2)(this->host, slotOf<ElementText>(this->host, 3)(this->host, 0));
        EXPECT_EQ(shown(this->array.back()), "one") << "the text of an element of the array itself";
    }
}

TYPED_TEST(ArrayAdaptor, Slot3IsTheFirstUnitOfAnElement) {
    for (std::uint32_t i = 0; i < this->array.size(); ++i) {
        EXPECT_EQ(slotOf<ElementText>(this->host, 3)(this->host, i),
                  reinterpret_cast<const char*>(this->array[i].rawData()));
    }
}

TYPED_TEST(ArrayAdaptor, Slot4CopiesAnElementIntoAString) {
    auto target = this->string("old");
    EXPECT_EQ(slotOf<GetElement>(this->host, 4)(this->host, 4, &target.getAsIZQTString()), 0);
    EXPECT_EQ(shown(target), "t{0}o");
    EXPECT_EQ(slotOf<GetElement>(this->host, 4)(this->host, 1, &target.getAsIZQTString()), 0);
    EXPECT_EQ(shown(target), "");
    EXPECT_EQ(slotOf<GetElement>(this->host, 4)(this->host, 0, &this->array[2].getAsIZQTString()), 0);
    EXPECT_EQ(slotOf<GetElement>(this->host, 4)(this->host, 0, &this->array[0].getAsIZQTString()), 0);
    EXPECT_EQ(shown(this->array), "[one][][one][one][t{0}o]") << "into another element, and into the same";
}

TYPED_TEST(ArrayAdaptor, Slot4LeavesTheStringWhereThereIsNoElement) {
    auto target = this->string("old");
    for (const std::uint32_t index : {5u, 6u, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFFFu}) {
        EXPECT_EQ(slotOf<GetElement>(this->host, 4)(this->host, index, &target.getAsIZQTString()), 1)
            << index;
        EXPECT_EQ(shown(target), "old") << index;
    }
    this->array.clear();
    EXPECT_EQ(slotOf<GetElement>(this->host, 4)(this->host, 0, &target.getAsIZQTString()), 1);
    EXPECT_EQ(shown(target), "old");
}

TYPED_TEST(ArrayAdaptor, Slot5SetsAnElement) {
    auto source = this->string(std::string_view("x\0y", 3));
    EXPECT_EQ(slotOf<SetElement>(this->host, 5)(this->host, 1, &source.getAsIZQTString()), 0);
    EXPECT_EQ(shown(this->array), "[one][x{0}y][two][one][t{0}o]");
    EXPECT_EQ(slotOf<SetElement>(this->host, 5)(this->host, 0, &this->array[2].getAsIZQTString()), 0);
    EXPECT_EQ(slotOf<SetElement>(this->host, 5)(this->host, 2, &this->array[2].getAsIZQTString()), 0);
    EXPECT_EQ(shown(this->array), "[two][x{0}y][two][one][t{0}o]")
        << "from another element, and from the same";
}

TYPED_TEST(ArrayAdaptor, Slot5DoesNothingWhereThereIsNoElement) {
    auto source = this->string("new");
    for (const std::uint32_t index : {5u, 6u, 0x7FFFFFFFu, 0x80000000u, 0xFFFFFFFFu}) {
        EXPECT_EQ(slotOf<SetElement>(this->host, 5)(this->host, index, &source.getAsIZQTString()), 1)
            << index;
        EXPECT_EQ(shown(this->array), this->before) << index;
    }
}

TYPED_TEST(ArrayAdaptor, Slots6And7CountAndRemoveAll) {
    EXPECT_EQ(slotOf<Entries>(this->host, 6)(this->host), 5u);
    slotOf<Clear>(this->host, 7)(this->host);
    EXPECT_EQ(this->array.size(), 0u);
    EXPECT_EQ(slotOf<Entries>(this->host, 6)(this->host), 0u);
    slotOf<Clear>(this->host, 7)(this->host);
    EXPECT_EQ(slotOf<Entries>(this->host, 6)(this->host), 0u);
}

TYPED_TEST(ArrayAdaptor, Slot8ComparesLengthAndContent) {
    const std::pair<std::string_view, bool> rows[] = {
        {"one", true}, {"", true},     {"two", true},   {{"t\0o", 3}, true},   {"on", false},
        {"t", false},  {"One", false}, {"ones", false}, {{"one\0", 4}, false}, {{"\0", 1}, false}};
    for (const auto& [text, expected] : rows) {
        auto needle = this->string(text);
        EXPECT_EQ(slotOf<HasString>(this->host, 8)(this->host, &needle.getAsIZQTString()), expected) << text;
    }
    EXPECT_TRUE(slotOf<HasString>(this->host, 8)(this->host, &this->array[4].getAsIZQTString()));
    this->array.clear();
    auto empty = this->string("");
    EXPECT_FALSE(slotOf<HasString>(this->host, 8)(this->host, &empty.getAsIZQTString()));
}

TYPED_TEST(ArrayAdaptor, Slot8CountsWholeUnitsOnly) {
    // Three bytes more than "two" are three units of a narrow string and less than one of UTF-32.
    std::string bytes(this->array[2].getAsIZQTString().data(), this->array[2].getAsIZQTString().byteLength());
    bytes.append(sizeof(kvt::ex::detail::CodeUnit<TypeParam::value>) - 1, 'x');
    UString<28> needle(bytes.data(), bytes.size());
    EXPECT_TRUE(slotOf<HasString>(this->host, 8)(this->host, &needle.getAsIZQTString()));
}

TYPED_TEST(ArrayAdaptor, Slot9ComparesTextWhereUnitsAreBytes) {
    if (this->isWide) {
        EXPECT_EQ(failureOf([this] { slotOf<HasText>(this->host, 9)(this->host, "one"); }),
                  notImplementedFailure("contains"));
        EXPECT_EQ(shown(this->array), this->before);
    } else {
        EXPECT_TRUE(slotOf<HasText>(this->host, 9)(this->host, "one"));
        EXPECT_TRUE(slotOf<HasText>(this->host, 9)(this->host, ""));
        EXPECT_FALSE(slotOf<HasText>(this->host, 9)(this->host, "t")) << "\"t\\0o\" has three units";
        EXPECT_FALSE(slotOf<HasText>(this->host, 9)(this->host, "onetwo"));
    }
}

TYPED_TEST(ArrayAdaptor, Slots10And11Throw) {
    EXPECT_EQ(failureOf([this] { slotOf<AddText>(this->host, 10)(this->host, "a,b"); }),
              notImplementedFailure("appendCSVString"));
    EXPECT_EQ(failureOf([this] { slotOf<AddText>(this->host, 10)(this->host, nullptr); }),
              notImplementedFailure("appendCSVString"));
    EXPECT_EQ(failureOf([this] { slotOf<AddTokens>(this->host, 11)(this->host, "a b", " "); }),
              notImplementedFailure("appendTokenizeString"));
    EXPECT_EQ(failureOf([this] { slotOf<AddTokens>(this->host, 11)(this->host, nullptr, nullptr); }),
              notImplementedFailure("appendTokenizeString"));
    EXPECT_EQ(shown(this->array), this->before);
}

TYPED_TEST(ArrayAdaptor, Slot12RemovesEachEqualElementAndKeepsTheOrder) {
    auto needle = this->string("one");
    EXPECT_EQ(slotOf<RemoveString>(this->host, 12)(this->host, &needle.getAsIZQTString()), 2u);
    EXPECT_EQ(shown(this->array), "[][two][t{0}o]");
    EXPECT_EQ(slotOf<RemoveString>(this->host, 12)(this->host, &needle.getAsIZQTString()), 0u);
    EXPECT_EQ(shown(this->array), "[][two][t{0}o]");
    auto empty = this->string("");
    EXPECT_EQ(slotOf<RemoveString>(this->host, 12)(this->host, &empty.getAsIZQTString()), 1u);
    EXPECT_EQ(shown(this->array), "[two][t{0}o]");
}

TYPED_TEST(ArrayAdaptor, Slot12TakesAnElementOfTheArray) {
    // The first of them is overwritten while the others are still compared with it.
    for (const std::uint32_t index : {0u, 2u, 5u}) {
        this->array = arrayOf<TypeParam::value>({"one", "two", "one", "one", "three", "one"});
        EXPECT_EQ(slotOf<RemoveString>(this->host, 12)(this->host, &this->array[index].getAsIZQTString()),
                  4u);
        EXPECT_EQ(shown(this->array), "[two][three]") << index;
    }
    EXPECT_EQ(slotOf<RemoveString>(this->host, 12)(this->host, &this->array[0].getAsIZQTString()), 1u);
    EXPECT_EQ(slotOf<RemoveString>(this->host, 12)(this->host, &this->array[0].getAsIZQTString()), 1u);
    EXPECT_TRUE(this->array.empty());
}

TYPED_TEST(ArrayAdaptor, Slot13RemovesTextWhereUnitsAreBytes) {
    if (this->isWide) {
        EXPECT_EQ(failureOf([this] { slotOf<RemoveText>(this->host, 13)(this->host, "one"); }),
                  notImplementedFailure("removeAll"));
        EXPECT_EQ(shown(this->array), this->before);
    } else {
        EXPECT_EQ(slotOf<RemoveText>(this->host, 13)(this->host, "none"), 0u);
        EXPECT_EQ(shown(this->array), this->before);
        const char* const own = slotOf<ElementText>(this->host, 3)(this->host, 0);
        EXPECT_EQ(slotOf<RemoveText>(this->host, 13)(this->host, own), 2u)
            << "the text of an element that goes";
        EXPECT_EQ(shown(this->array), "[][two][t{0}o]");
        EXPECT_EQ(slotOf<RemoveText>(this->host, 13)(this->host, ""), 1u);
        EXPECT_EQ(shown(this->array), "[two][t{0}o]");
    }
}

TYPED_TEST(ArrayAdaptor, Slot14IsTheElementsOwnInterface) {
    for (std::uint32_t i = 0; i < this->array.size(); ++i) {
        EXPECT_EQ(slotOf<Element>(this->host, 14)(this->host, i), &this->array[i].getAsIZQTString());
    }
    const auto text = unitsOf<TypeParam::value>("new");
    slotOf<Element>(this->host, 14)(this->host, 2)->assignText(reinterpret_cast<const char*>(text.c_str()));
    EXPECT_EQ(shown(this->array), "[one][][new][one][t{0}o]");
}

TYPED_TEST(ArrayAdaptor, NamesAndSlotsAreTheSameOperations) {
    IZQTStringArray& named = *this->host;
    auto text = this->string("two");
    auto target = this->string("");
    named.append(text.getAsIZQTString());
    EXPECT_EQ(named.entries(), 6u);
    EXPECT_EQ(named.elementText(5), reinterpret_cast<const char*>(this->array[5].rawData()));
    EXPECT_EQ(named.getElement(2, target.getAsIZQTString()), 0);
    EXPECT_EQ(shown(target), "two");
    EXPECT_EQ(named.setElement(1, text.getAsIZQTString()), 0);
    EXPECT_TRUE(named.contains(text.getAsIZQTString()));
    EXPECT_EQ(&named.element(1), &this->array[1].getAsIZQTString());
    EXPECT_EQ(named.removeAll(text.getAsIZQTString()), 3u);
    EXPECT_EQ(shown(this->array), "[one][one][t{0}o]");
    EXPECT_EQ(failureOf([&] { named.appendCSVString(""); }), notImplementedFailure("appendCSVString"));
    EXPECT_EQ(failureOf([&] { named.appendTokenizeString("", ""); }),
              notImplementedFailure("appendTokenizeString"));
    if (!this->isWide) {
        named.append("one");
        EXPECT_TRUE(named.contains("one"));
        EXPECT_EQ(named.removeAll("one"), 3u);
        EXPECT_EQ(shown(this->array), "[t{0}o]");
    }
    named.clear();
    EXPECT_TRUE(this->array.empty());
}

TYPED_TEST(ArrayAdaptor, BelongsToItsArrayThroughCopiesAndMoves) {
    using Strings = UStringArray<TypeParam::value>;
    const auto showsOwnElements = [](Strings& strings) {
        IZQTStringArray& interface = strings.getAsIZQTStringArray();
        const auto& constant = static_cast<const Strings&>(strings).getAsIZQTStringArray();
        return &constant == &interface && interface.entries() == strings.size() &&
               (strings.empty() || &interface.element(0) == &strings[0].getAsIZQTString());
    };
    Strings copy(this->array);
    EXPECT_NE(&copy.getAsIZQTStringArray(), this->host);
    EXPECT_EQ(shown(copy), this->before);
    EXPECT_TRUE(showsOwnElements(copy));
    Strings moved(std::move(copy));
    EXPECT_EQ(shown(moved), this->before);
    EXPECT_TRUE(showsOwnElements(moved));
    EXPECT_TRUE(showsOwnElements(copy)) << "a moved-from array is an empty one";
    EXPECT_EQ(copy.getAsIZQTStringArray().entries(), 0u);
    copy = moved;
    EXPECT_TRUE(showsOwnElements(copy));
    copy.clear();
    copy = std::move(moved);
    EXPECT_EQ(shown(copy), this->before);
    EXPECT_TRUE(showsOwnElements(copy));
    EXPECT_EQ(this->host->entries(), 5u) << "the first array has kept its own";
}

TYPED_TEST(ArrayAdaptor, StringsKeepTheirOwnInterfaceWhileTheArrayGrows) {
    for (int i = 0; i < 40; ++i) {
        auto text = this->string(std::string(static_cast<std::size_t>(i), 'x'));
        this->host->append(text.getAsIZQTString());
        for (std::uint32_t at = 0; at < this->array.size(); ++at) {
            ASSERT_EQ(this->host->elementText(at), reinterpret_cast<const char*>(this->array[at].rawData()))
                << at;
        }
    }
}

// ---- Strings: what holds for the interface inside each of the eight

TYPED_TEST(ArrayAdaptor, AStringsInterfaceFollowsItsStringThroughCopiesAndMoves) {
    auto source = this->string("a text that is too long for the short form of a string");
    auto copy(source);
    copy.getAsIZQTString().assignBytes(nullptr, 0);
    EXPECT_EQ(source.size(), 54u);
    EXPECT_TRUE(copy.isEmpty());
    auto moved(std::move(source));
    EXPECT_EQ(moved.getAsIZQTString().data(), reinterpret_cast<const char*>(moved.rawData()));
    EXPECT_EQ(source.getAsIZQTString().byteLength(), 0u) << "a moved-from string is an empty one";
    source = moved;
    const auto text = unitsOf<TypeParam::value>("x");
    source.getAsIZQTString().assignText(reinterpret_cast<const char*>(text.c_str()));
    EXPECT_EQ(shown(source), "x");
    EXPECT_EQ(moved.size(), 54u);
}

TYPED_TEST(ArrayAdaptor, ParsableTextFailsOnEveryString) {
    auto string = this->string("abc");
    IZQTString* const interface = &string.getAsIZQTString();
    const char* const names[] = {"encodeToZQTParsableText", "decodeFromZQTParsableText",
                                 "encodeUtf8ToZQTParsableText", "decodeUtf8FromZQTParsableText"};
    for (int number = 6; number <= 9; ++number) {
        const FailureRecord failure =
            failureOf([&] { slotOf<void(IZQTString*)>(interface, number)(interface); });
        EXPECT_EQ(failure, notImplementedFailure(names[number - 6]));
        EXPECT_EQ(failure.text, "The function " + std::string(names[number - 6]) + " is not implemented.");
        // A host may pass whatever its own declaration names; nothing looks at it.
        EXPECT_EQ(failureOf([&] {
                      slotOf<void(IZQTString*, const char*, int)>(interface, number)(interface, nullptr,
                                                                                     number);
                  }),
                  notImplementedFailure(names[number - 6]));
    }
    EXPECT_EQ(shown(string), "abc");
}

// ---- Encodings of run-time strings

TEST(AnyStringArrayAdaptor, AppendedElementsCarryNoEncoding) {
    UStringArray<30> array = arrayOf<30>({"one"});
    UString<30> labelled("caf\xE9", 4, Encoding::Iso8859_1);
    array.getAsIZQTStringArray().append(labelled.getAsIZQTString());
    array.getAsIZQTStringArray().append("text");
    ASSERT_EQ(array.size(), 3u);
    EXPECT_EQ(array[0].encoding().id(), Encoding::Windows1252);
    EXPECT_EQ(array[1].encoding().id(), Encoding::Unknown);
    EXPECT_EQ(array[2].encoding().id(), Encoding::Unknown);
    EXPECT_EQ(array[1].toStdString(), "caf\xE9");
}

TEST(AnyStringArrayAdaptor, WritingAnElementLeavesItsEncoding) {
    UStringArray<30> array = arrayOf<30>({"one", "two"});
    const UString<30> source("x", 1, Encoding::Iso8859_1);
    EXPECT_EQ(array.getAsIZQTStringArray().setElement(0, source.getAsIZQTString()), 0);
    EXPECT_EQ(array[0].toStdString(), "x");
    EXPECT_EQ(array[0].encoding().id(), Encoding::Windows1252);
    UString<30> target("", 0, Encoding::Iso8859_15);
    EXPECT_EQ(array.getAsIZQTStringArray().getElement(1, target.getAsIZQTString()), 0);
    EXPECT_EQ(target.toStdString(), "two");
    EXPECT_EQ(target.encoding().id(), Encoding::Iso8859_15);
}

TEST(AnyStringArrayAdaptor, EncodingsTakeNoPartInComparisons) {
    UStringArray<30> array = arrayOf<30>({"one"});
    const UString<30> other("one", 3, Encoding::Utf16BE);
    EXPECT_TRUE(array.getAsIZQTStringArray().contains(other.getAsIZQTString()));
    EXPECT_EQ(array.getAsIZQTStringArray().removeAll(other.getAsIZQTString()), 1u);
}

// ---- The order of the slots, seen from the other side: an implementation that is not the library's

class HostArray final : public IZQTStringArray {
public:
    explicit HostArray(int& destroyed) : destroyed_(&destroyed) {}
    void append(const IZQTString&) override { called_ = 1; }
    void append(const char*) override { called_ = 2; }
    const char* elementText(std::uint32_t) const override { return "3"; }
    int getElement(std::uint32_t, IZQTString&) const override { return 4; }
    int setElement(std::uint32_t, const IZQTString&) override { return 5; }
    std::uint32_t entries() const override { return 6; }
    void clear() override { called_ = 7; }
    bool contains(const IZQTString&) const override { return true; }
    bool contains(const char*) const override { return false; }
    void appendCSVString(const char*) override { called_ = 10; }
    void appendTokenizeString(const char*, const char*) override { called_ = 11; }
    std::uint32_t removeAll(const IZQTString&) override { return 12; }
    std::uint32_t removeAll(const char*) override { return 13; }
    IZQTString& element(std::uint32_t) override { return string_.getAsIZQTString(); }
    ~HostArray() override { ++*destroyed_; }

    int called_ = 0;
    UString<0> string_;

private:
    int* destroyed_;
};

TEST(IZQTStringArraySlots, StandInTheStatedOrder) {
    int destroyed = 0;
    HostArray host(destroyed);
    slotOf<AddString>(&host, 1)(&host, nullptr);
    EXPECT_EQ(host.called_, 1);
    slotOf<AddText>(&host, 2)(&host, nullptr);
    EXPECT_EQ(host.called_, 2);
    EXPECT_STREQ(slotOf<ElementText>(&host, 3)(&host, 0), "3");
    EXPECT_EQ(slotOf<GetElement>(&host, 4)(&host, 0, nullptr), 4);
    EXPECT_EQ(slotOf<SetElement>(&host, 5)(&host, 0, nullptr), 5);
    EXPECT_EQ(slotOf<Entries>(&host, 6)(&host), 6u);
    slotOf<Clear>(&host, 7)(&host);
    EXPECT_EQ(host.called_, 7);
    EXPECT_TRUE(slotOf<HasString>(&host, 8)(&host, nullptr));
    EXPECT_FALSE(slotOf<HasText>(&host, 9)(&host, nullptr));
    slotOf<AddText>(&host, 10)(&host, nullptr);
    EXPECT_EQ(host.called_, 10);
    slotOf<AddTokens>(&host, 11)(&host, nullptr, nullptr);
    EXPECT_EQ(host.called_, 11);
    EXPECT_EQ(slotOf<RemoveString>(&host, 12)(&host, nullptr), 12u);
    EXPECT_EQ(slotOf<RemoveText>(&host, 13)(&host, nullptr), 13u);
    EXPECT_EQ(slotOf<Element>(&host, 14)(&host, 0), &host.string_.getAsIZQTString());
}

TEST(IZQTStringArraySlots, TheLastOneDestroysThroughTheInterface) {
    int destroyed = 0;
    IZQTStringArray* host = new HostArray(destroyed);
    // The first of the two destructor entries leaves the memory, which the second gives back.
    slotOf<Clear>(host, 15)(host);
    EXPECT_EQ(destroyed, 1);
    ::operator delete(static_cast<void*>(host));
    host = new HostArray(destroyed);
    slotOf<Clear>(host, 16)(host);
    EXPECT_EQ(destroyed, 2);
}

} // namespace
