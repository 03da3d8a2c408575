// The fuzzy parts of a pattern: "*" for one word, "?" for one character.

#include "pattern_rows.h"

namespace {

using kvt::test::expectParsed;
using kvt::test::failure;
using kvt::test::mismatch;
using kvt::test::success;

TEST(ParseFuzzyCharacter, TakesAnyOneByte) {
    expectParsed({
        {"2020/01.02", "%Y?%m?%d", success("20200102")},
        {"2020 01\t02", "%Y?%m?%d", success("20200102")},
        {"2020\xC3\xA9"
         "01-02",
         "%Y??%m-%d", success("20200102")},
        {"2020\xC3\xA9"
         "01-02",
         "%Y?%m-%d", mismatch("%Y?", "%m-%d")},
        {"2020", "%Y?", mismatch("%Y", "?")},
        {"2020-01-02?", "%Y-%m-%d?$", success("20200102")},
    });
}

TEST(ParseFuzzyWord, TakesOneWord) {
    expectParsed({
        {"on 2020-01-02", "* %Y-%m-%d", success("20200102")},
        {"the 2nd, 2020-01-02", "* * %Y-%m-%d", success("20200102")},
        {"2020-01-02 UTC", "%Y-%m-%d *", success("20200102")},
        {"2020-01-02 UTC", "%Y-%m-%d *$", success("20200102")},
        {"2020-01-02 UTC x", "%Y-%m-%d *$", mismatch("%Y-%m-%d *", "$")},
        {"2020-01-02x", "%Y-%m-%d*$", success("20200102")},
        {"a\tb\v2020-01-02", "*\t*\v%Y-%m-%d", success("20200102")},
    });
}

TEST(ParseFuzzyWord, NeedsAWord) {
    expectParsed({
        {"2020-01-02", "%Y-%m-%d*", mismatch("%Y-%m-%d", "*")},
        {"2020-01-02 x", "%Y-%m-%d*", mismatch("%Y-%m-%d", "*")},
        {"2020-01-02 x", "%Y-%m-%d* x", mismatch("%Y-%m-%d", "* x")},
        {"2020\n", "%Y*", mismatch("%Y", "*")},
    });
}

TEST(ParseFuzzyWord, EndsInTheTextBehindIt) {
    expectParsed({
        {"abcT 12", "*T %H", success("120000")},
        {"T 12", "*T %H", success("120000")},
        {"1999T 12", "*T %H", success("120000")},
        {"the 2nd 12", "* *nd %H", success("120000")},
        {"abc 12", "*T %H", mismatch("", "*T %H")},
        {"bc 12", "*abc %H", mismatch("", "*abc %H")}, // longer than the word
        {"12 abcT", "%H *T$x", mismatch("%H *T", "$x")},
        {"12 abcT", "%H *T$", success("120000")},
        {"12 abct", "%H *T$", mismatch("%H ", "*T$")},
    });
}

// The tail reaches up to white space or "$": a flag in it is only text.
TEST(ParseFuzzyWord, TakesFlagsWithinTheTextAsTheyStand) {
    expectParsed({
        {"abcT12", "*T%H", mismatch("", "*T%H")},
        {"abcT%H 12", "*T%H %H", success("120000")},
        {"abcT* 12", "*T* %H", success("120000")},
        {"abcT? 12", "*T? %H", success("120000")},
    });
}

TEST(ParseFuzzyWord, DoesNotMeetAnotherFuzzyFlag) {
    expectParsed({
        {"abc 12", "** %H", mismatch("", "** %H")},
        {"abc 12", "*? %H", mismatch("", "*? %H")},
        {"12 abc", "%H **", mismatch("%H ", "**")},
    });
}

TEST(ParseFuzzyWord, EndsInACharacterThatHasAFlag) {
    expectParsed({
        {"abc% 12", "*%% %H", success("120000")},
        {"abc* 12", "*%* %H", success("120000")},
        {"abc? 12", "*%? %H", success("120000")},
        {"abc 12", "*%% %H", mismatch("", "*%% %H")},
        {"abc 12", "*%* %H", mismatch("", "*%* %H")},
    });
}

// All of the tail behind its "%" has to end the word, but only the flag is done with: the rest is read again.
TEST(ParseFuzzyWord, ReadsWhatFollowsSuchACharacterAgain) {
    expectParsed({
        {"abc%x 12", "*%%x %H", mismatch("*%%", "x %H")},
        {"abc%xx 12", "*%%x %H", mismatch("", "*%%x %H")},
        {"abc*%H 12", "*%*%H", mismatch("*%*", "%H")},
    });
}

// "%$" is cut in two, as "$" ends a tail: the word is taken, whatever it is, and the flag is read behind it.
TEST(ParseFuzzyWord, LeavesADollarToBeRead) {
    expectParsed({
        {"abc$ 12", "*%$ %H", mismatch("*", "%$ %H")},
        {"abc", "*%$", mismatch("*", "%$")},
    });
}

TEST(ParseFuzzyWord, LeavesAnyOtherFlagToBeReadBehindTheWord) {
    expectParsed({
        {"abc12", "*%H", mismatch("*", "%H")},
        {"abc 12", "*%H", mismatch("*", "%H")},
        {"abc", "*%q", failure(933079, {"%q", "@DateTimeParse()"})},
        {"abc", "*%", failure(933079, {"%", "@DateTimeParse()"})},
        {"abc 12", "*%B", mismatch("*", "%B")},
    });
}

TEST(ParseFuzzyWord, EndsARunOfNumbers) {
    expectParsed({
        {"2020abc 1-2", "%Y* %m-%d", success("20200102")},
        {"2020xx 1", "%Y*x %j", success("20200101")},
    });
}

} // namespace
