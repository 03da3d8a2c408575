// Dates and numbers as cells have them: what is read beyond what the library reads by itself, and what is not.

#include <base/failure.h>
#include <translate/date_reader.h>
#include <translate/icu_data.h>
#include <translate/number_reader.h>
#include <translate/row_borders.h>
#include <translate/step_table.h>

#include <gtest/gtest.h>

#include <string>
#include <string_view>

namespace host {

namespace {

std::string dateOf(const std::string& text, const std::string& formats, const std::string& pivot = "",
                   const std::string& language = "") {
    DateReader reader(formats, pivot, language);
    std::string_view out;
    Problem problem;
    return reader.read(text, out, problem) ? std::string(out) : "failed: " + problem.text;
}

bool isDate(const std::string& text, const std::string& formats, const std::string& pivot = "",
            const std::string& language = "") {
    return !dateOf(text, formats, pivot, language).starts_with("failed: ");
}

std::string replaced(std::string text, std::string_view what, std::string_view by) {
    const std::size_t at = text.find(what);
    return at == std::string::npos ? text : text.replace(at, what.size(), by);
}

std::string numberOf(std::string_view text, const std::string& language) {
    NumberReader reader(language);
    std::string_view number;
    return reader.read(text, number) ? std::string(number) : "none";
}

} // namespace

// "YY" in the text is a year of two digits and, by "%Y", of four.
TEST(DateReader, AYearOfTwoDigitsStandsBesideAllThatTheLibraryReads) {
    const struct {
        const char* format;
        const char* text;
        const char* canonical;
    } rows[] = {
        {"%d.%m.%y", "31.01.YY", "20200131"},
        {"%y%m%d", "YY0131", "20200131"},
        {"%y %j", "YY 031", "20200131"},
        {"%y-%j", "YY-31", "20200131"},
        {"%d.%m.%y %H:%M:%S", "31.01.YY 12:30:05", "20200131123005"},
        {"%d.%m.%y %H:%M:%S", "31.01.YY 1:3:5", "20200131010305"},
        {"%d.%m.%y %T", "31.01.YY 12:30:05", "20200131123005"},
        {"%T %d.%m.%y", "12:30:05 31.01.YY", "20200131123005"},
        {"%d.%m.%y %I:%M %p", "31.01.YY 01:30 PM", "20200131133000"},
        {"%p %I %d.%m.%y", "am 11 31.01.YY", "20200131110000"},
        {"%d %b %y", "31 Jan YY", "20200131"},
        {"%d %B %y", "31 January YY", "20200131"},
        {"%B%d%y", "January31YY", "20200131"},
        {"* %d.%m.%y", "Friday 31.01.YY", "20200131"},
        {"%d?%m?%y", "31/01-YY", "20200131"},
        {"%d.%m.%y$", "31.01.YY", "20200131"},
        {"%d%%%m%%%y", "31%01%YY", "20200131"},
    };
    for (const auto& row : rows) {
        const std::string shortText = replaced(row.text, "YY", "20");
        const std::string longText = replaced(row.text, "YY", "2020");
        const std::string longFormat = replaced(row.format, "%y", "%Y");
        EXPECT_EQ(dateOf(longText, longFormat), row.canonical) << longText << " by " << longFormat;
        EXPECT_EQ(dateOf(shortText, row.format, "50"), row.canonical) << shortText << " by " << row.format;
        EXPECT_EQ(dateOf(" " + shortText + " ", row.format, "50"), row.canonical) << row.format;
    }
}

TEST(DateReader, WhatDoesNotFitBesideAYearOfTwoDigitsIsNoDate) {
    const struct {
        const char* format;
        const char* text;
    } rows[] = {
        {"%d.%m.%y", "31.01.2"},
        {"%d.%m.%y", "31.01.x0"},
        {"%d.%m.%y", "31.01.2x"},
        {"%d.%m.%y", "31.01.2020"},
        {"%d.%m.%y", "31-01-20"},
        {"%d.%m.%y", "x.01.20"},
        {"%d.%m.%y", "31"},
        {"%d.%m.%y", ""},
        {"%y %j", "20 x"},
        {"%y %T", "20 12:30"},
        {"%y%m%d %T", "200131 12-30-05"},
        {"%y%m%d %T", "200131 x"},
        {"%y%m%d %S", "200131 x"},
        {"%y%m%d %H:%M:%S", "200131 1:2:"},
        {"%y%m%d %I %p", "200131 01 p"},
        {"%y%m%d %H%p", "200131 1"},
        {"%d %b %y", "31 Ja"},
        {"%d%B", "31"},
        {"%y%m%d?", "200131"},
        {"%d%%%y", "31.20"},
        {"%y%b%d", "20"},
    };
    for (const auto& row : rows) {
        EXPECT_FALSE(isDate(row.text, row.format, "50")) << row.text << " by " << row.format;
    }
    EXPECT_EQ(
        dateOf("31-01-20", "%d.%m.%y", "50"),
        "failed: The value fits the format up to \"%d\" but not where the format goes on with \".%m.%y\".");
}

TEST(DateReader, MonthsOfALanguageAreThoseNames) {
    EXPECT_EQ(dateOf("5. Mai 20", "%d. %B %y", "50", "de"), "20200505");
    EXPECT_EQ(dateOf("MAI 5 2020", "%b %d %Y", "", "de"), "20200505");
    EXPECT_EQ(dateOf("5 \u043C\u0430\u044F 2020", "%d %B %Y", "", "ru"), "20200505");
    EXPECT_FALSE(isDate("5. May 2020", "%d. %B %Y", "", "de"));
    EXPECT_FALSE(isDate("5. ", "%d. %B", "", "de"));
    // Without a name of a month in the format, the language changes nothing.
    EXPECT_EQ(dateOf("05.05.2020", "%d.%m.%Y", "", "de"), "20200505");
    EXPECT_EQ(dateOf("2020-05-05", "ISO", "", "de"), "20200505");
}

TEST(DateReader, OfSeveralFormsTheOneThatFitsBestSaysWhatIsWrong) {
    EXPECT_EQ(
        dateOf("31.01.x", "%Y-%m-%d|%d.%m.%Y"),
        "failed: The value fits the format up to \"%d.%m.\" but not where the format goes on with \"%Y$\".");
    EXPECT_EQ(dateOf("31.02.2020", "%Y-%m-%d|%d.%m.%Y"),
              "failed: By the format \"%d.%m.%Y$\", the value is a day that the calendar does not have.");
    EXPECT_EQ(dateOf("x", "ISO|ZQT"), "failed: \"x\" is in none of the forms that the format names.");
}

TEST(DateReader, APivotSaysWhereTheCenturyEnds) {
    EXPECT_EQ(dateOf("01.01.00", "%d.%m.%y", "00"), "19000101");
    EXPECT_EQ(dateOf("01.01.99", "%d.%m.%y", "99"), "19990101");
    EXPECT_EQ(dateOf("01.01.98", "%d.%m.%y", "99"), "20980101");
    for (const char* pivot : {"5", "500", "x0", "0x"}) {
        EXPECT_THROW(DateReader("%y", pivot, ""), Failure) << pivot;
    }
}

TEST(NumberReader, ReadsNumbersAsPeopleWriteThem) {
    const struct {
        const char* language;
        const char* text;
        const char* number;
    } rows[] = {
        {"en", "0", "0"},
        {"en", "0.5", "0.5"},
        {"en", "-0.5", "-0.5"},
        {"en", "0.", "none"},
        {"en", ".5", "0.5"},
        {"en", "12.", "none"},
        {"en", "1,234,567.25", "1234567.25"},
        {"en", "1234,567", "none"},
        {"en", "1,23", "none"},
        {"en", "1,2345", "none"},
        {"en", "1,,234", "none"},
        {"en", "1,23x", "none"},
        {"en", "1,2x4", "none"},
        {"en", "1,x34", "none"},
        {"en", "", "none"},
        {"en", " ", "none"},
        {"en", "-", "none"},
        {"en", "+", "none"},
        {"en", "+5", "5"},
        {"en", "5+", "none"},
        {"en", "\t5\t", "5"},
        {"en", "-$5", "-5"},
        {"en", "$-5", "-5"},
        {"en", "$5-", "-5"},
        {"en", "-$5-", "none"},
        {"en", "$-5-", "none"},
        {"en", "$\u22125", "-5"},
        {"en", "5\u2212$", "-5"},
        {"en", "5\u2212", "-5"},
        {"en", "5 \u20AC", "5"},
        {"en", "\u00A05\u00A0EUR", "5"},
        {"en", "USD 5 EUR", "none"},
        {"en", "ABCD 5", "none"},
        {"en", "AB 5", "none"},
        {"en", "5 AB", "none"},
        {"en", "5 ABCD", "none"},
        {"en", "5 Eur", "none"},
        {"en", "\u00FC5", "none"},
        {"en", "5\u00FC", "none"},
        {"en", "$$5", "none"},
        {"en", "007", "7"},
        {"en", "1.2.3", "none"},
        {"fr", "1\u2009234\u2007567,5", "1234567.5"},
        {"fr", "1 234", "1234"},
        {"fr", "12 34", "none"},
        {"fr", "1.5", "none"},
        {"de_CH", "1\u2019234.50", "1234.50"},
        {"es", "1.234,5", "1234.5"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(numberOf(row.text, row.language), row.number) << row.language << " '" << row.text << "'";
    }
    const std::string digits(70, '7');
    EXPECT_EQ(numberOf(digits + "." + digits, "en"), digits + "." + digits);
    EXPECT_EQ(numberOf("-" + digits, "en"), "-" + digits);
}

TEST(LanguageData, KnowsWhatALanguageHasAndNoLanguageThatThereIsNot) {
    for (const char* none : {"", "xx", "zz_ZZ", "no such language"}) {
        EXPECT_FALSE(monthNames(none)) << none;
        EXPECT_FALSE(numberSigns(none)) << none;
    }
    EXPECT_EQ(numberSigns("de_AT")->decimal, ",");
    EXPECT_EQ(numberSigns("de-CH")->group, "\u2019");
    EXPECT_EQ(monthNames("de_AT")->front().front(), "J\u00E4nner");
    EXPECT_EQ(foldedName("\u00C4RZ Stra\u00DFe"), "\u00E4rz strasse");
}

TEST(LanguageData, NormalizesToTheFormThatIsNamed) {
    const struct {
        const char* form;
        const char* normalized;
    } rows[] = {
        {"nfc", "\u00FC\uFB01"}, {"nfd", "u\u0308\uFB01"}, {"nfkc", "\u00FCfi"}, {"nfkd", "u\u0308fi"}};
    for (const auto& row : rows) {
        EXPECT_EQ(makeNormalizer(row.form)->normalized("\u00FC\uFB01"), row.normalized) << row.form;
    }
    EXPECT_EQ(makeNormalizer("nfx"), nullptr);
    // The character that grows most.
    std::string grown;
    std::string text;
    for (int count = 0; count < 200; ++count) {
        text += "\uFDFA";
        grown +=
            "\u0635\u0644\u0649 \u0627\u0644\u0644\u0647 \u0639\u0644\u064A\u0647 \u0648\u0633\u0644\u0645";
    }
    EXPECT_EQ(makeNormalizer("nfkc")->normalized(text), grown);
}

TEST(StepTable, ArgumentsThatStandTwiceOrAreUnknownAreRefused) {
    const auto complaint = [](const std::string& name, const StepArguments& arguments) {
        try {
            makeStep(name, arguments, {});
            return std::string("none");
        } catch (const Failure& failure) {
            return std::string(failure.what());
        }
    };
    EXPECT_EQ(complaint("drop", {{"columns", "a"}}), "none");
    EXPECT_EQ(complaint("drop", {{"columns", "a"}, {"columns", "b"}}), "'drop' has 'columns' twice");
    EXPECT_EQ(complaint("drop", {{"colums", "a"}}), "'drop' takes no 'colums'. Did you mean 'columns'?");
    EXPECT_EQ(complaint("drop", {{"columns", ""}}), "'drop' needs 'columns'");
    EXPECT_EQ(complaint("sort", {}), "'sort' needs 'columns'");
    EXPECT_EQ(complaint("dorp", {}), "there is no step 'dorp'. Did you mean 'drop'?");
}

TEST(RowBorders, AWatchedPlaceHasTheFirstBorderFromThereOn) {
    const std::string text = "a\r\nbc\rd\"\n\"e\n\"x\ny\"\r";
    for (std::uint64_t limit = 1; limit <= text.size(); ++limit) {
        RowBorders whole((RowForm()));
        whole.watch(limit);
        whole.add(text + "z\n");
        RowBorders pieces((RowForm()));
        pieces.watch(limit);
        for (const char byte : text + "z\n") {
            pieces.add({&byte, 1});
        }
        ASSERT_TRUE(whole.firstBehind(limit)) << limit;
        EXPECT_GE(*whole.firstBehind(limit), limit);
        EXPECT_EQ(pieces.firstBehind(limit), whole.firstBehind(limit)) << limit;
    }
    RowBorders none((RowForm()));
    none.watch(5);
    none.add("a\n\"b");
    EXPECT_FALSE(none.firstBehind(5));
    EXPECT_FALSE(none.firstBehind(1));
}

} // namespace host
