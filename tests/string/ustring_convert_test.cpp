// All 64 pairs of string types, for construction, for the initialiser behind it and for assign(), as a table
// of rules and plain decoders that do what the rules say. Each text of string_samples.h goes through each
// pair, and bytes, failure and what is left in the target are compared.

#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <reference/conversion_reference.h>
#include <reference/wwjd_reference.h>
#include <string/string_samples.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

namespace {

using namespace kvt::test;
using reference::Conversion;

enum Rule { copy, asciiCheck, icu, asciiSource, bytes, viaUtf16, decode, encode, kernel, binary };

// Sources in rows, targets in columns, both in the order 0, 1, 2, 3, 27, 28, 29, 30.
constexpr Rule grid[8][8] = {
    {copy, asciiCheck, icu, icu, icu, bytes, viaUtf16, kernel},
    {copy, copy, icu, icu, asciiSource, bytes, viaUtf16, kernel},
    {icu, icu, copy, icu, icu, bytes, encode, kernel},
    {icu, icu, icu, copy, icu, bytes, viaUtf16, kernel},
    {icu, asciiCheck, icu, icu, copy, bytes, viaUtf16, kernel},
    {binary, binary, binary, binary, binary, copy, binary, binary},
    {viaUtf16, viaUtf16, decode, viaUtf16, viaUtf16, bytes, copy, kernel},
    {kernel, kernel, kernel, kernel, kernel, bytes, kernel, kernel},
};

// Labels of a UString<30>; for each there are texts and a plain decoder.
constexpr std::uint32_t labels[] = {0, 1, 2, 3, 27, 28, 29, 30};

constexpr std::size_t indexOf(std::uint32_t type) {
    return type <= 3 ? type : type - 23;
}

/// What a pair of types gives; `from` and `to` are the types or, for 30, what the objects are labelled.
Conversion expectedBy(Rule rule, std::uint32_t from, std::uint32_t to, const std::string& text) {
    switch (rule) {
    case copy:
    case asciiSource: // the system encoding keeps ASCII
    case bytes:
        return {text, {}};
    case asciiCheck:
        return reference::asciiChecked(text);
    case icu:
        return reference::transcoded(from, to, text);
    case encode:
        return {reference::wwjdEncoded(reference::unitsOfBytes(text)), {}};
    case binary:
        return {"", binaryFailure(text), false};
    default:
        return reference::converted(from, to, text);
    }
}

/// The reference may meet a token without a number, which is a failure of its own.
Conversion expectedOf(Rule rule, std::uint32_t from, std::uint32_t to, const std::string& text) {
    Conversion expected;
    const FailureRecord failure = failureOf([&] { expected = expectedBy(rule, from, to, text); });
    if (!failure.type.empty()) {
        expected = {"", failure, false};
    }
    return expected;
}

template <std::uint32_t N>
std::string wholeUnits(std::string text) {
    text.resize(text.size() - text.size() % sizeof(typename UString<N>::value_type));
    return text;
}

template <std::uint32_t M, std::uint32_t N>
void checkConstruction(const UString<M>& source, std::uint32_t from, const std::string& text) {
    Conversion expected;
    if (N == Encoding::Unknown && M != Encoding::Binary) {
        expected = {text, {}};
    } else {
        expected = expectedOf(grid[indexOf(M)][indexOf(N)], from, N, text);
    }
    std::string actual;
    std::uint32_t label = N;
    const FailureRecord failure = failureOf([&] {
        const UString<N> target(source);
        actual = bytesOf(target);
        label = target.encoding().id();
    });
    EXPECT_EQ(failure, expected.failure);
    if (failure.type.empty()) {
        EXPECT_EQ(printable(actual), printable(wholeUnits<N>(expected.bytes)));
        EXPECT_EQ(label, N == Encoding::Unknown ? from : N);
    }

    Probe<N> probe;
    EXPECT_EQ(failureOf([&] { probe.template init<M>(source); }), expected.failure);
    if (expected.failure.type.empty()) {
        EXPECT_EQ(printable(bytesOf<N>(probe)), printable(wholeUnits<N>(expected.bytes)));
        EXPECT_EQ(probe.encoding().id(), N == Encoding::Unknown ? from : N);
    }
}

template <std::uint32_t M, std::uint32_t N>
void checkAssign(const UString<M>& source, std::uint32_t from, std::uint32_t to, const std::string& text) {
    const Conversion expected = expectedOf(grid[indexOf(M)][indexOf(N)], from, to, text);
    UString<N> target = stringOf<N>("old text", encodingOf(to));
    const std::string before = bytesOf(target);
    const UString<N>* returned = nullptr;
    EXPECT_EQ(failureOf([&] { returned = &target.template assign<M>(source); }), expected.failure);
    EXPECT_EQ(target.encoding().id(), to);
    if (expected.failure.type.empty()) {
        EXPECT_EQ(returned, &target);
    }
    if (expected.failure.type.empty() || expected.stateIsKnown) {
        EXPECT_EQ(printable(bytesOf(target)), printable(wholeUnits<N>(expected.bytes)));
    }
    if (M == Encoding::Binary && N != Encoding::Binary) {
        EXPECT_EQ(bytesOf(target), before) << "a binary failure comes before anything is done";
    }
    // The object is as good as any other afterwards.
    target.clear();
    EXPECT_TRUE(target.isEmpty());
    EXPECT_EQ(target.getAsIZQTString().data(), reinterpret_cast<const char*>(target.rawData()));
}

template <std::uint32_t M, std::uint32_t N>
void checkPair(std::uint32_t from, const std::string& text) {
    const UString<M> source = stringOf<M>(text, encodingOf(from));
    checkConstruction<M, N>(source, from, text);
    if constexpr (N == Encoding::Unknown) {
        for (const std::uint32_t to : labels) {
            SCOPED_TRACE("target labelled " + std::to_string(to));
            checkAssign<M, N>(source, from, to, text);
        }
    } else {
        checkAssign<M, N>(source, from, N, text);
        // From the bytes, the rules are those for encodings known at run time.
        const Conversion expected = expectedOf(N == Encoding::Binary ? bytes : kernel, from, N, text);
        std::string actual;
        EXPECT_EQ(
            failureOf([&] { actual = bytesOf(UString<N>(text.data(), text.size(), encodingOf(from))); }),
            expected.failure);
        if (expected.failure.type.empty()) {
            EXPECT_EQ(printable(actual), printable(wholeUnits<N>(expected.bytes)));
        }
    }
    EXPECT_EQ(bytesOf(source), wholeUnits<M>(text)) << "the source changed";
}

/// `text` as an M, with every label when that is 30, to each type.
template <std::uint32_t M>
void checkRow(std::uint32_t from, const std::string& text) {
    forEachType([&]<std::uint32_t N>() {
        SCOPED_TRACE("from " + std::to_string(M) + " (encoding " + std::to_string(from) + ") to " +
                     std::to_string(N) + ": " + printable(text.substr(0, 60)));
        checkPair<M, N>(from, text);
    });
}

TEST(UStringGrid, SystemEncodingIsUtf8InTheseTests) {
    ASSERT_EQ(Encoding(Encoding::System).evaluate(), Encoding::Utf8);
}

template <std::uint32_t M>
void checkSamples() {
    if constexpr (M == Encoding::Unknown) {
        for (const std::uint32_t from : labels) {
            for (const std::string& text : samplesOf(from)) {
                checkRow<M>(from, text);
            }
        }
    } else {
        for (const std::string& text : samplesOf(M)) {
            checkRow<M>(M, text);
        }
    }
}

TEST(UStringGrid, FromUtf8) {
    checkSamples<0>();
}
TEST(UStringGrid, FromAscii) {
    checkSamples<1>();
}
TEST(UStringGrid, FromUtf16) {
    checkSamples<2>();
}
TEST(UStringGrid, FromUtf32) {
    checkSamples<3>();
}
TEST(UStringGrid, FromSystem) {
    checkSamples<27>();
}
TEST(UStringGrid, FromBinary) {
    checkSamples<28>();
}
TEST(UStringGrid, FromWwjd) {
    checkSamples<29>();
}
TEST(UStringGrid, FromAnyWithEachLabel) {
    checkSamples<30>();
}

TEST(UStringGrid, IncompleteUnitsOfAnAnyStringAreBadInput) {
    for (const std::uint32_t from : {2u, 3u}) {
        for (const char* const text : {"a", "a\x01z", "abcde", "abcdefg"}) {
            checkRow<30>(from, text);
        }
    }
}

/// Random bytes that often look like text.
std::string randomBytes(std::mt19937& random, bool wide) {
    static const std::string narrow =
        "aZ<>u0 \x7F\x80\x8F\x90\x9F\xA0\xBF\xC0\xC2\xC3\xDF\xE0\xE2\xED\xEF\xF0\xF4\xF8\xFF";
    std::string text;
    for (auto count = random() % 24; count > 0; --count) {
        if (wide) {
            const char32_t units[] = {U'a', 0x20AC, 0xD83D, 0xDE00, 0x1F600, 0x10FFFF, 0x110000, 0xFFFD};
            text += utf32Bytes({units[random() % std::size(units)]});
        } else {
            text += narrow[random() % narrow.size()];
        }
    }
    return text;
}

TEST(UStringGrid, RandomBytesConvertAsThePlainDecodersSay) {
    std::mt19937 random(42);
    for (int round = 0; round < 120 && !testing::Test::HasFailure(); ++round) {
        const std::string text = randomBytes(random, false);
        checkRow<0>(0, text);
        checkRow<1>(1, text);
        checkRow<27>(27, text);
        checkRow<28>(28, text);
        checkRow<29>(29, text);
        for (const std::uint32_t from : labels) {
            checkRow<30>(from, text);
        }
        const std::string wide = randomBytes(random, true);
        checkRow<2>(2, wide);
        checkRow<3>(3, wide);
    }
}

TEST(UStringAssign, OfItselfChangesNothing) {
    forEachType([]<std::uint32_t N>() {
        SCOPED_TRACE(N);
        const std::string text = sizeof(typename UString<N>::value_type) == 1
                                     ? "a\xFF" + std::string(40, 'z')
                                     : utf32Bytes(U"a\xD800" + std::u32string(40, U'z'));
        UString<N> string = stringOf<N>(text, Encoding::Windows1252);
        const auto id = string.encoding().id();
        EXPECT_EQ(&string.template assign<N>(string), &string);
        EXPECT_EQ(bytesOf(string), text);
        EXPECT_EQ(string.encoding().id(), id);
    });
}

/// The copies in other encodings are constructions of the type they give.
template <std::uint32_t N>
void checkCopies(const UString<N>& string) {
    const auto check = [&]<std::uint32_t M>(auto get) {
        SCOPED_TRACE("from " + std::to_string(N) + " to " + std::to_string(M) + ": " +
                     printable(bytesOf(string)));
        std::string expected;
        std::string actual;
        const FailureRecord failure = failureOf([&] { expected = bytesOf(UString<M>(string)); });
        EXPECT_EQ(failureOf([&] { actual = bytesOf(get()); }), failure);
        EXPECT_EQ(actual, expected);
    };
    check.template operator()<0>([&]() -> UString<0> { return string.getAsUtf8(); });
    check.template operator()<2>([&]() -> UString<2> { return string.getAsUtf16(); });
    check.template operator()<3>([&]() -> UString<3> { return string.getAsUtf32(); });
    check.template operator()<27>([&]() -> UString<27> { return string.getAsSystem(); });
}

TEST(UStringGetAs, IsTheConstructionOfTheTarget) {
    forEachType([]<std::uint32_t N>() {
        for (const std::string& text : samplesOf(N)) {
            checkCopies<N>(stringOf<N>(text, Encoding::Utf8));
        }
    });
}

TEST(UStringGetAsEncoding, IsAnAssignToAStringOfThatEncoding) {
    forEachType([]<std::uint32_t N>() {
        for (const std::string& text : samplesOf(N)) {
            const UString<N> string = stringOf<N>(text, Encoding::Utf8);
            for (const std::uint32_t to : {0u, 1u, 2u, 3u, 4u, 6u, 20u, 27u, 28u, 29u, 30u}) {
                SCOPED_TRACE("from " + std::to_string(N) + " to " + std::to_string(to) + ": " +
                             printable(text));
                UString<30> expected(encodingOf(to));
                UString<30> actual;
                const FailureRecord failure = failureOf([&] { expected.template assign<N>(string); });
                EXPECT_EQ(failureOf([&] { actual = string.getAsEncoding(encodingOf(to)); }), failure);
                if (failure.type.empty()) {
                    EXPECT_EQ(actual, expected);
                    EXPECT_EQ(actual.encoding().id(), to);
                }
            }
        }
    });
}

TEST(UStringGetAsEncoding, OfBinaryFailsEvenForBinary) {
    EXPECT_EQ(failureOf([] { UString<28>("\x01\xE9").getAsEncoding(Encoding::Binary); }),
              binaryFailure("\x01\xE9"));
}

/// What a failed assign() leaves: the substituted text where one was made, else the text that was there.
template <std::uint32_t N, std::uint32_t M>
void expectAfterFailure(UString<N> target, const UString<M>& source, std::string_view left) {
    EXPECT_ANY_THROW(target.assign(source));
    EXPECT_EQ(bytesOf(target), left) << N << " from " << M;
}

TEST(UStringAssign, FailureLeavesTheSubstitutedTextOnlyWhereOneWasMade) {
    const UString<0> bad("a\xFF", 2);
    expectAfterFailure(UString<1>("old"), bad, "a\x1A");
    expectAfterFailure(UString<30>("old", 3, Encoding::Windows1252), bad, "a?");
    expectAfterFailure(UString<1>("old"), UString<29>("\u00e9"), "?");
    expectAfterFailure(UString<1>("old"), UString<2>(u"\u00e9"), "?");

    expectAfterFailure(UString<29>("old"), bad, "old");
    expectAfterFailure(UString<30>("old", 3, Encoding::Wwjd), bad, "old");
    expectAfterFailure(UString<30>("old", 3, Encoding::Unknown), bad, "old");
    expectAfterFailure(UString<0>("old"), UString<28>("x"), "old");
    expectAfterFailure(UString<1>("old"), UString<29>("a\xFF", 2, Encoding::Wwjd), "old");
    expectAfterFailure(UString<0>("old"), UString<29>("<uzzzz>", 7, Encoding::Wwjd), "old");
    expectAfterFailure(UString<0>("old"), UString<30>("x", 1, Encoding::Unknown), "old");
}

} // namespace
