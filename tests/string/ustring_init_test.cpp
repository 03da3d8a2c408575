// The protected initialisers, which constructors in the headers of a host call. The 64 pairs of
// init(UString<M>) are in ustring_convert_test.cpp; here are the ones without a string, and what they do to
// an object that was filled before.

#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <string/string_samples.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <string>

namespace {

using namespace kvt::test;

template <std::uint32_t N>
Probe<N> filledProbe() {
    return Probe<N>("before, and long enough to have memory of its own", 49, encodingOf(N == 30 ? 20 : N));
}

TEST(UStringInit, EmptySetsUpAnEmptyStringExceptForAnAnyString) {
    forEachType([]<std::uint32_t N>() {
        SCOPED_TRACE(N);
        Probe<N> probe = filledProbe<N>();
        const std::string before = bytesOf<N>(probe);
        probe.init();
        EXPECT_EQ(bytesOf<N>(probe), N == Encoding::Unknown ? before : "");
        EXPECT_EQ(probe.encoding().id(), N == Encoding::Unknown ? 20 : N);
        EXPECT_EQ(probe.getAsIZQTString().data(), reinterpret_cast<const char*>(probe.rawData()));
    });
}

TEST(UStringInit, WithAnEncodingMakesAnEmptyAnyString) {
    for (const std::uint32_t id : {0u, 4u, 27u, 28u, 29u, 30u}) {
        Probe<30> probe = filledProbe<30>();
        probe.init(encodingOf(id));
        EXPECT_TRUE(probe.isEmpty());
        EXPECT_EQ(probe.encoding().id(), id) << "not evaluated";
        EXPECT_EQ(UString<30>(encodingOf(id)).encoding().id(), id);
        EXPECT_TRUE(UString<30>(encodingOf(id)).isEmpty());
    }
}

/// Runs init() with units and with a string of these units: the two are the same.
template <std::uint32_t N, std::uint32_t M>
void checkUnits(const UString<M>& source) {
    SCOPED_TRACE("units of " + std::to_string(M) + " for " + std::to_string(N) + ": " +
                 printable(bytesOf(source)));
    Probe<N> expected;
    Probe<N> actual;
    const FailureRecord failure = failureOf([&] { expected.template init<M>(source); });
    EXPECT_EQ(failureOf([&] { actual.init(source.rawData(), source.size()); }), failure);
    if (failure.type.empty()) {
        EXPECT_EQ(printable(bytesOf<N>(actual)), printable(bytesOf<N>(expected)));
        EXPECT_EQ(actual.encoding().id(), N == Encoding::Unknown ? M : N);
    }
}

TEST(UStringInit, WithUnitsIsInitWithAStringOfThem) {
    forEachType([]<std::uint32_t N>() {
        for (const std::string& text : samplesOf(2)) {
            checkUnits<N>(stringOf<2>(text));
        }
        for (const std::string& text : samplesOf(3)) {
            checkUnits<N>(stringOf<3>(text));
        }
    });
}

TEST(UStringInit, WithUnitsWritesWhatIsStated) {
    Probe<0> utf8;
    utf8.init(u"caf\u00e9", 4);
    EXPECT_EQ(utf8.toStdString(), "caf\u00e9");
    Probe<29> wwjd;
    wwjd.init(U"\U0001F600 ", 2);
    EXPECT_EQ(wwjd.toStdString(), "<ud83d><ude00><space>");
    Probe<28> binary;
    binary.init(u"a", 1);
    EXPECT_EQ(bytesOf<28>(binary), std::string("a\0", 2));
    Probe<30> any;
    any.init(U"a", 1);
    EXPECT_EQ(bytesOf<30>(any), std::string("a\0\0\0", 4));
    EXPECT_EQ(any.encoding().id(), Encoding::Utf32LE);
    any.init(u"\xD800", 1);
    EXPECT_EQ(bytesOf<30>(any), std::string("\x00\xD8", 2));
    EXPECT_EQ(any.encoding().id(), Encoding::Utf16LE);
    Probe<1> ascii;
    EXPECT_EQ(failureOf([&] { ascii.init(u"\u00e9", 1); }),
              transcodingFailure("\u00e9", "UTF-16LE", "US-ASCII", "?", "?"));
}

TEST(UStringInit, OfBytesWithoutATextMeaningLeavesAnEmptyString) {
    const auto check = []<std::uint32_t N>() {
        SCOPED_TRACE(N);
        Probe<N> probe = filledProbe<N>();
        EXPECT_EQ(failureOf([&] { probe.template init<28>(UString<28>("\x01")); }), binaryFailure("\x01"));
        EXPECT_TRUE(probe.isEmpty());
    };
    check.operator()<0>();
    check.operator()<1>();
    check.operator()<2>();
    check.operator()<3>();
    check.operator()<27>();
    check.operator()<29>();
}

TEST(UStringInit, AnAnyStringTakesTheEncodingOfItsSource) {
    Probe<30> probe = filledProbe<30>();
    probe.init<30>(UString<30>("\xA4\xA2", 2, Encoding("EUC-JP")));
    EXPECT_EQ(probe.toStdString(), "\xA4\xA2");
    EXPECT_TRUE(probe.encoding() == Encoding("EUC-JP"));
    probe.init<27>(UString<27>("x"));
    EXPECT_EQ(probe.encoding().id(), Encoding::System) << "not evaluated";
    probe.init<29>(UString<29>(" "));
    EXPECT_EQ(probe.toStdString(), "<space>");
    EXPECT_EQ(probe.encoding().id(), Encoding::Wwjd);
}

} // namespace
