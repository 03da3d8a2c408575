// Editing where something occurs without regard to case: what is found in the folded text is replaced in the stored
// one.
#include <string/editing_support.h>
#include <support/failure_record.h>

#include <stdexcept>

namespace {

using namespace kvt::test;
using kvt::ex::detail::case_insensitive_t;

template <typename Number>
class UStringEditWithoutCase : public StringTest<Number> {
public:
    static constexpr case_insensitive_t tag{};
};
TYPED_TEST_SUITE(UStringEditWithoutCase, FoldingStringTypes, StringTypeNames);

TYPED_TEST(UStringEditWithoutCase, ReplacesBothCasesAndPutsInWhatItIsGiven) {
    const struct {
        const char *text, *from, *to, *all, *first, *last;
    } rows[] = {
        {"aBAb", "b", "X", "aXAX", "aXAb", "aBAX"},
        {"aBAb", "ab", "Xy", "XyXy", "XyAb", "aBXy"},
        {"AaAa", "a", "aA", "aAaAaAaA", "aAaAa", "AaAaA"},
        {"AaA", "aa", "A", "AA", "AA", "AA"},
        {"ab", "B", "bb", "abb", "abb", "abb"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.text) + ": " + row.from + " by " + row.to);
        auto string = this->make(row.text);
        EXPECT_EQ(&string.replaceAll(this->make(row.from), this->make(row.to), this->tag), &string);
        this->expectText(string, row.all);
        string = this->make(row.text);
        EXPECT_EQ(&string.replaceFirst(this->make(row.from), this->make(row.to), this->tag), &string);
        this->expectText(string, row.first);
        string = this->make(row.text);
        EXPECT_EQ(&string.replaceLast(this->make(row.from), this->make(row.to), this->tag), &string);
        this->expectText(string, row.last);
    }
}

TYPED_TEST(UStringEditWithoutCase, ReturnsAtOnceWhenEmpty) {
    auto empty = this->make("");
    empty.replaceAll(this->make("a"), this->make("b"), this->tag);
    empty.replaceAll({}, this->make("b"), this->tag);
    this->expectText(empty, "");
}

TEST(UStringEditFolded, ReplacesAtTheFoldedPositionWithTheLengthPassed) {
    const case_insensitive_t tag;
    // U+0149 is stored in two bytes and folds to three, so that what is found lies one place further on.
    UString<0> grown("\u0149abc");
    grown.replaceFirst("A", "_", tag);
    EXPECT_EQ(grown.toStdString(), "\u0149a_c");
    // The three bytes of the Kelvin sign fold to one.
    UString<0> shrunk("\u212Axyz");
    shrunk.replaceFirst("X", "_", tag);
    EXPECT_EQ(shrunk.toStdString(), "\xE2_\xAAxyz");
    // "ss" is found in the folded sharp s at 0, and two units go where one was meant.
    UString<2> sharp("\u00DFab");
    sharp.replaceFirst(u"SS", u"!", tag);
    EXPECT_EQ(sharp.getAsUtf8().toStdString(), "!b");
    sharp = UString<2>("a\u00DF");
    sharp.replaceLast(u"S", u"!", tag);
    EXPECT_EQ(sharp.getAsUtf8().toStdString(), "a\u00DF!")
        << "folded position 2 is the end of the stored text";
    // A needle that folds to more units than it was passed with takes as many as it was passed with.
    UString<2> plain("xssy");
    plain.replaceAll(u"\u00DF", u"!", tag);
    EXPECT_EQ(plain.getAsUtf8().toStdString(), "x!sy");
}

TEST(UStringEditFolded, ThrowsWhereTheFoldedPositionIsBeyondTheStoredText) {
    const case_insensitive_t tag;
    UString<2> string("\u00DF\u00DF\u00DFx");
    const std::u16string before(string.begin(), string.end());
    EXPECT_EQ(thrownBy([&] { string.replaceFirst(u"X", u"y", tag); }), outOfRange);
    EXPECT_EQ(thrownBy([&] { string.replaceLast(u"X", u"y", tag); }), outOfRange);
    EXPECT_EQ(thrownBy([&] { string.replaceAll(u"X", u"y", tag); }), outOfRange);
    EXPECT_EQ(std::u16string(string.begin(), string.end()), before);
    // Also when replacements went before it.
    UString<2> later("a\u00DF\u00DF\u00DFx");
    EXPECT_EQ(thrownBy([&] { later.replaceAll(u"a", u"b", tag).replaceAll(u"x", u"y", tag); }), outOfRange);
    EXPECT_EQ(std::u16string(later.begin(), later.end()), u"b\u00DF\u00DF\u00DFx");
    UString<2> both("xa\u00DF\u00DF\u00DFx");
    const std::u16string bothBefore(both.begin(), both.end());
    EXPECT_EQ(thrownBy([&] { both.replaceAll(u"X", u"y", tag); }), outOfRange);
    EXPECT_EQ(std::u16string(both.begin(), both.end()), bothBefore) << "the first one is not replaced either";
}

TEST(UStringEditFolded, SearchesAgainInWhatWasChanged) {
    // Each round folds the text as it then is: the zeros that the first round saw at the end are gone in the second.
    UString<0> string("\u212A\u212A");
    string.replaceAll("k", "", case_insensitive_t());
    // The same by hand, with the bytes as they stand after each round.
    const UString<0> expected = [] {
        UString<0> text("\u212A\u212A");
        for (std::uint64_t pos = 0; pos < text.size();) {
            const std::uint64_t found = text.getAsFoldedCase().find("k", pos);
            if (found == npos) {
                break;
            }
            text.erase(found, 1);
            pos = found;
        }
        return text;
    }();
    EXPECT_EQ(string.toStdString(), expected.toStdString());
    EXPECT_NE(string.toStdString(), "\u212A\u212A");
}

TEST(UStringEditBinary, KnowsNoCaseAndDoesNotFail) {
    const case_insensitive_t tag;
    UString<28> string("AaAa");
    string.replaceAll("a", "x", tag);
    EXPECT_EQ(string.toStdString(), "AxAx");
    string.replaceFirst("A", "y", tag).replaceLast("x", "z", tag);
    EXPECT_EQ(string.toStdString(), "yxAz");
    EXPECT_EQ(thrownBy([&] { string.replaceFirst("a", "b", tag); }), outOfRange);
    EXPECT_EQ(thrownBy([&] { string.replaceLast("a", "b", tag); }), outOfRange);
    string.replaceAll("a", "b", tag);
    string.replaceAll("A", "B", UString<28>::case_insensitive);
    EXPECT_EQ(string.toStdString(), "yxBz");
}

TEST(UStringEditAny, FailsWithoutRegardToCaseUnlessThereIsNothingToSearch) {
    const case_insensitive_t tag;
    const FailureRecord refused = invalidEncodingFailure("unknown");
    UString<30> string("abc", 3, Encoding::Utf8);
    EXPECT_EQ(failureOf([&] { string.replaceAll("a", "b", tag); }), refused);
    EXPECT_EQ(failureOf([&] { string.replaceAll({}, {}, tag); }), refused);
    EXPECT_EQ(failureOf([&] { string.replaceFirst("a", "b", tag); }), refused);
    EXPECT_EQ(failureOf([&] { string.replaceLast("a", "b", tag); }), refused);
    EXPECT_EQ(string.toStdString(), "abc");
    UString<30> empty(Encoding::Utf8);
    EXPECT_EQ(failureOf([&] { empty.replaceAll("a", "b", tag); }), noFailure());
    EXPECT_EQ(failureOf([&] { empty.replaceAll({}, {}, tag); }), noFailure());
    EXPECT_EQ(failureOf([&] { empty.replaceFirst({}, {}, tag); }), refused);
    EXPECT_EQ(failureOf([&] { empty.replaceLast({}, {}, tag); }), refused);
    EXPECT_EQ(empty.encoding().id(), Encoding(Encoding::Utf8).id());
}

TEST(UStringEditFolded, LeavesTheStringWhenFoldingFails) {
    const case_insensitive_t tag;
    UString<29> string("abc");
    const UStringView<29> bad = "x\xE9";
    const FailureRecord expected = failureOf([&] { UString<29>::getAsFoldedCase(bad); });
    EXPECT_EQ(failureOf([&] { string.replaceAll(bad, "y", tag); }), expected);
    EXPECT_EQ(failureOf([&] { string.replaceFirst(bad, "y", tag); }), expected);
    EXPECT_EQ(failureOf([&] { string.replaceLast(bad, "y", tag); }), expected);
    EXPECT_EQ(string.toStdString(), "abc");
    // What is put in makes the text unfit for the second round.
    EXPECT_NE(failureOf([&] { string.replaceAll("a", bad, tag); }), noFailure());
    EXPECT_EQ(string.toStdString(), "abc");
}

} // namespace
