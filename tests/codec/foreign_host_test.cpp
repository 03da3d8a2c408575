// A host that was written in C and knows the library by nothing but the slots reads, writes and iterates strings and
// arrays of all eight types; and the library takes strings and arrays in that are the host's own.

#include <codec/adaptor_samples.h>
#include <codec/foreign_host.h>
#include <support/failure_record.h>

#include <kvt/codec/string_adaptors.h>
#include <kvt/string/ustring_array.h>

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

namespace {

using namespace kvt::test;
using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringArray;

HostString* toHost(IZQTString& string) {
    return reinterpret_cast<HostString*>(&string);
}
HostArray* toHost(IZQTStringArray& array) {
    return reinterpret_cast<HostArray*>(&array);
}

template <typename TypeNumber>
struct ForeignHost : testing::Test {
    static constexpr std::uint32_t N = TypeNumber::value;
    static constexpr std::uint32_t unitSize = sizeof(kvt::ex::detail::CodeUnit<N>);

    static UString<N> string(std::string_view ascii) { return stringOfUnits<N>(ascii); }
    static HostString* host(UString<N>& string) { return toHost(string.getAsIZQTString()); }
    static HostArray* host(UStringArray<N>& array) { return toHost(array.getAsIZQTStringArray()); }
};

TYPED_TEST_SUITE(ForeignHost, EightTypes);

TYPED_TEST(ForeignHost, ReadsAString) {
    auto text = this->string("a banana");
    EXPECT_EQ(hostCount(this->host(text), this->unitSize, 'a'), 4u);
    EXPECT_EQ(hostCount(this->host(text), this->unitSize, 'n'), 2u);
    EXPECT_EQ(hostCount(this->host(text), this->unitSize, '\0'), 0u) << "no half of a wide unit is a unit";
    auto empty = this->string("");
    EXPECT_EQ(hostCount(this->host(empty), this->unitSize, 'a'), 0u);
}

TYPED_TEST(ForeignHost, WritesAString) {
    auto text = this->string(std::string_view("ab\0cd", 5));
    hostReverse(this->host(text), this->unitSize);
    EXPECT_EQ(shown(text), "dc{0}ba");
    auto more = this->string("-more-than-fits-into-a-short-string-");
    hostAppend(this->host(text), this->host(more));
    EXPECT_EQ(shown(text), "dc{0}ba-more-than-fits-into-a-short-string-");
    hostAppend(this->host(more), this->host(more));
    EXPECT_EQ(more.size(), 72u);
    hostCutAtZero(this->host(text));
    EXPECT_EQ(shown(text), "dc");
}

TYPED_TEST(ForeignHost, IteratesAnArray) {
    auto array = arrayOf<TypeParam::value>({"one", "", "two", "three"});
    std::vector<char> bytes(1000);
    const std::uint32_t length = hostConcatenate(this->host(array), bytes.data(), 1000);
    const auto expected = unitsOf<TypeParam::value>("onetwothree");
    EXPECT_EQ(std::string(bytes.data(), length),
              std::string(reinterpret_cast<const char*>(expected.data()), expected.size() * this->unitSize));
    EXPECT_EQ(hostConcatenate(this->host(array), bytes.data(), 4 * this->unitSize), 3 * this->unitSize);
}

TYPED_TEST(ForeignHost, CopiesAndReordersAnArray) {
    auto source = arrayOf<TypeParam::value>({"one", "", "two", "three", "four"});
    auto target = arrayOf<TypeParam::value>({"what was here goes"});
    auto carrier = this->string("");
    hostCopy(this->host(target), this->host(source), this->host(carrier));
    EXPECT_EQ(shown(target), "[one][][two][three][four]");
    hostReverseElements(this->host(target), this->host(carrier));
    EXPECT_EQ(shown(target), "[four][three][two][][one]");
    EXPECT_EQ(shown(source), "[one][][two][three][four]");
}

TYPED_TEST(ForeignHost, SearchesAndRemovesInAnArray) {
    auto array = arrayOf<TypeParam::value>({"b", "a", "b", "", "c", "a", "", "b"});
    UStringArray<TypeParam::value> seen;
    EXPECT_EQ(hostRemoveDuplicates(this->host(array), this->host(seen)), 4u);
    EXPECT_EQ(shown(array), "[b][a][][c]");
}

TYPED_TEST(ForeignHost, MixesItsOwnStringsWithThoseOfTheLibrary) {
    const auto units = unitsOf<TypeParam::value>("two");
    HostString* const own = hostNewString(reinterpret_cast<const char*>(units.data()),
                                          static_cast<std::uint32_t>(units.size()) * this->unitSize);
    auto array = arrayOf<TypeParam::value>({"one", "two"});
    HostArray* const host = this->host(array);
    const std::uint32_t unexpected = hostUnexpectedCalls;
    host->slots->append(host, own);
    EXPECT_TRUE(host->slots->contains(host, own));
    EXPECT_EQ(host->slots->setElement(host, 0, own), 0);
    EXPECT_EQ(shown(array), "[two][two][two]");
    EXPECT_EQ(host->slots->removeAll(host, own), 3u);
    auto text = arrayOf<TypeParam::value>({"", "longer"});
    EXPECT_EQ(this->host(text)->slots->getElement(this->host(text), 1, own), 0) << "by the host's own slot 3";
    EXPECT_EQ(hostCount(own, this->unitSize, 'l'), 1u);
    EXPECT_EQ(own->slots->byteLength(own), 6 * this->unitSize);
    EXPECT_EQ(this->host(text)->slots->getElement(this->host(text), 2, own), 1);
    EXPECT_EQ(own->slots->byteLength(own), 6 * this->unitSize) << "nothing happens where there is no element";
    EXPECT_EQ(this->host(text)->slots->getElement(this->host(text), 0, own), 0);
    EXPECT_EQ(own->slots->data(own), nullptr);
    host->slots->append(host, own);
    EXPECT_EQ(shown(array), "[]") << "a string without any data is an empty one";
    EXPECT_TRUE(host->slots->contains(host, own));
    EXPECT_EQ(host->slots->setElement(host, 0, own), 0);
    EXPECT_EQ(host->slots->removeAll(host, own), 1u);
    EXPECT_EQ(hostUnexpectedCalls, unexpected) << "a foreign string is read by its data and length only";
    hostReleaseString(own);
}

TYPED_TEST(ForeignHost, SeesTheFailuresOfSlotsThatAreNotThere) {
    auto text = this->string("abc");
    auto array = arrayOf<TypeParam::value>({"abc"});
    HostString* const string = this->host(text);
    HostArray* const host = this->host(array);
    const char* const names[] = {"encodeToZQTParsableText", "decodeFromZQTParsableText",
                                 "encodeUtf8ToZQTParsableText", "decodeUtf8FromZQTParsableText"};
    for (int i = 0; i < 4; ++i) {
        EXPECT_EQ(failureOf([&] { string->slots->parsable[i](string); }), notImplementedFailure(names[i]));
    }
    EXPECT_EQ(failureOf([&] { host->slots->appendCsv(host, "a,b"); }),
              notImplementedFailure("appendCSVString"));
    EXPECT_EQ(failureOf([&] { host->slots->appendTokens(host, "a b", " "); }),
              notImplementedFailure("appendTokenizeString"));
    const bool isWide = this->unitSize > 1;
    EXPECT_EQ(failureOf([&] { host->slots->appendText(host, "x"); }),
              isWide ? notImplementedFailure("append") : noFailure());
    EXPECT_EQ(failureOf([&] { host->slots->containsText(host, "x"); }),
              isWide ? notImplementedFailure("contains") : noFailure());
    EXPECT_EQ(failureOf([&] { host->slots->removeAllText(host, "x"); }),
              isWide ? notImplementedFailure("removeAll") : noFailure());
    EXPECT_EQ(shown(text), "abc");
    EXPECT_EQ(shown(array), "[abc]");
}

// ---- Taking the host's own strings and arrays in

struct OwnString {
    explicit OwnString(std::string_view bytes)
        : string(hostNewString(bytes.data(), static_cast<std::uint32_t>(bytes.size()))) {}
    OwnString(const OwnString&) = delete;
    OwnString& operator=(const OwnString&) = delete;
    ~OwnString() { hostReleaseString(string); }
    const IZQTString& interface() const { return *reinterpret_cast<const IZQTString*>(string); }

    HostString* string;
};

struct OwnArray {
    explicit OwnArray(const std::vector<std::string>& texts)
        : array(hostNewArray(static_cast<std::uint32_t>(texts.size()))) {
        for (std::uint32_t i = 0; i < texts.size(); ++i) {
            HostString* const element = array->slots->element(array, i);
            element->slots->assignBytes(element, texts[i].data(),
                                        static_cast<std::uint32_t>(texts[i].size()));
        }
    }
    OwnArray(const OwnArray&) = delete;
    OwnArray& operator=(const OwnArray&) = delete;
    ~OwnArray() { hostReleaseArray(array); }
    const IZQTStringArray& interface() const { return *reinterpret_cast<const IZQTStringArray*>(array); }

    HostArray* array;
};

TYPED_TEST(ForeignHost, StringsAreTakenInFromTheirOwnUnits) {
    const auto units = unitsOf<TypeParam::value>(std::string_view("t\0xt", 4));
    const OwnString own({reinterpret_cast<const char*>(units.data()), units.size() * this->unitSize});
    const std::uint32_t unexpected = hostUnexpectedCalls;
    const auto taken = UString<TypeParam::value>::fromIZQTString(
        own.interface(), static_cast<Encoding::Type>(TypeParam::value));
    EXPECT_EQ(shown(taken), "t{0}xt");
    EXPECT_EQ(hostUnexpectedCalls, unexpected);
}

TYPED_TEST(ForeignHost, StringsAreConvertedFromTheGivenEncoding) {
    const OwnString text(std::string_view("\0a\0b", 4));
    const auto taken = UString<TypeParam::value>::fromIZQTString(text.interface(), Encoding::Utf16BE);
    if (TypeParam::value == Encoding::Binary || TypeParam::value == Encoding::Unknown) {
        EXPECT_EQ(shown(taken), "{0}a{0}b") << "bytes are taken as they are";
    } else {
        EXPECT_EQ(shown(taken), "ab");
    }
    const auto latin =
        UString<TypeParam::value>::fromIZQTString(OwnString("abc").interface(), Encoding::Iso8859_1);
    EXPECT_EQ(shown(latin), "abc");
}

TEST(FromForeignString, AnAnyStringRecordsTheEncoding) {
    const OwnString own("caf\xE9");
    const auto any = UString<30>::fromIZQTString(own.interface(), Encoding::Iso8859_1);
    EXPECT_EQ(any.toStdString(), "caf\xE9");
    EXPECT_EQ(any.encoding().id(), Encoding::Iso8859_1);
    const auto system = UString<30>::fromIZQTString(own.interface(), Encoding::System);
    EXPECT_EQ(system.encoding().id(), Encoding::System) << "the label as it was given";
}

TEST(FromForeignString, ConvertsToTheStringsEncoding) {
    const OwnString latin("caf\xE9");
    EXPECT_EQ(UString<0>::fromIZQTString(latin.interface(), Encoding::Iso8859_1).toStdString(), "caf\u00e9");
    EXPECT_EQ(UString<2>::fromIZQTString(latin.interface(), Encoding::Iso8859_1),
              UString<2>(u"caf\u00e9", 4));
    EXPECT_EQ(UString<3>::fromIZQTString(latin.interface(), Encoding::Iso8859_1),
              UString<3>(U"caf\u00e9", 4));
    EXPECT_EQ(UString<29>::fromIZQTString(latin.interface(), Encoding::Iso8859_1).toStdString(),
              "caf<u00e9>");
    EXPECT_EQ(UString<28>::fromIZQTString(latin.interface(), Encoding::Utf8).toStdString(), "caf\xE9");
    const OwnString empty("");
    EXPECT_TRUE(UString<0>::fromIZQTString(empty.interface(), Encoding::Iso8859_1).isEmpty());
    EXPECT_TRUE(UString<2>::fromIZQTString(empty.interface(), Encoding::Utf16LE).isEmpty());
    EXPECT_TRUE(UString<30>::fromIZQTString(empty.interface(), Encoding::Utf16LE).isEmpty());
}

TEST(FromForeignString, FailsAsTheConversion) {
    const OwnString latin("caf\xE9");
    EXPECT_EQ(failureOf([&] { UString<2>::fromIZQTString(latin.interface(), Encoding::Utf8); }),
              badEncodingFailure("caf\xE9", "UTF-8", "caf\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([&] { UString<1>::fromIZQTString(latin.interface(), Encoding::Iso8859_1); }),
              transcodingFailure("caf\u00e9", "ISO-8859-1", "US-ASCII", "caf\x1A", "\x1A"));
    EXPECT_EQ(failureOf([&] { UString<0>::fromIZQTString(latin.interface(), Encoding::Binary); }),
              binaryFailure("caf\xE9"));
    EXPECT_EQ(failureOf([&] { UString<0>::fromIZQTString(latin.interface(), Encoding::Unknown); }),
              invalidEncodingFailure("unknown"));
}

TEST(FromForeignString, ReadsAStringOfTheLibraryToo) {
    const UString<2> wide(u"caf\u00e9", 4);
    EXPECT_EQ(UString<0>::fromIZQTString(wide.getAsIZQTString(), Encoding::Utf16LE).toStdString(),
              "caf\u00e9");
}

TYPED_TEST(ForeignHost, ArraysAreTakenInElementByElement) {
    std::vector<std::string> bytes;
    for (const std::string_view text :
         {std::string_view("one"), std::string_view(), std::string_view("t\0o", 3)}) {
        const auto units = unitsOf<TypeParam::value>(text);
        bytes.emplace_back(reinterpret_cast<const char*>(units.data()), units.size() * this->unitSize);
    }
    const OwnArray own(bytes);
    const std::uint32_t unexpected = hostUnexpectedCalls;
    const auto taken = UStringArray<TypeParam::value>::fromIZQTStringArray(
        own.interface(), static_cast<Encoding::Type>(TypeParam::value));
    EXPECT_EQ(shown(taken), "[one][][t{0}o]");
    EXPECT_GE(taken.capacity(), 3u);
    EXPECT_EQ(hostUnexpectedCalls, unexpected) << "a foreign array is read by its number and elements only";
    EXPECT_TRUE(UStringArray<TypeParam::value>::fromIZQTStringArray(OwnArray({}).interface(), Encoding::Utf8)
                    .empty());
}

TEST(FromForeignArray, ConvertsEachElement) {
    const OwnArray own({"caf\xE9", "", "\xFC"});
    EXPECT_EQ(shown(UStringArray<0>::fromIZQTStringArray(own.interface(), Encoding::Iso8859_1)),
              "[caf{195}{169}][][{195}{188}]");
    EXPECT_EQ(shown(UStringArray<2>::fromIZQTStringArray(own.interface(), Encoding::Iso8859_1)),
              "[caf{233}][][{252}]");
    const auto any = UStringArray<30>::fromIZQTStringArray(own.interface(), Encoding::Iso8859_1);
    EXPECT_EQ(shown(any), "[caf{233}][][{252}]");
    for (const auto& element : any) {
        EXPECT_EQ(element.encoding().id(), Encoding::Iso8859_1);
    }
}

TEST(FromForeignArray, FailsAsTheConversionOfTheFirstBadElement) {
    const OwnArray own({"good", "caf\xE9", "\xFC"});
    EXPECT_EQ(failureOf([&] { UStringArray<2>::fromIZQTStringArray(own.interface(), Encoding::Utf8); }),
              badEncodingFailure("caf\xE9", "UTF-8", "caf\uFFFD", "\uFFFD"));
    EXPECT_EQ(failureOf([&] { UStringArray<1>::fromIZQTStringArray(own.interface(), Encoding::Iso8859_1); }),
              transcodingFailure("caf\u00e9", "ISO-8859-1", "US-ASCII", "caf\x1A", "\x1A"));
}

TEST(FromForeignArray, ReadsAnArrayOfTheLibraryToo) {
    const UStringArray<2> wide = arrayOf<2>({"one", "two"});
    EXPECT_EQ(shown(UStringArray<0>::fromIZQTStringArray(wide.getAsIZQTStringArray(), Encoding::Utf16LE)),
              "[one][two]");
}

} // namespace
