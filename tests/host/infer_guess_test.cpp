// The parts of `kvt infer`: what each of them makes of cells, rows and bytes.
#include "infer/column_guess.h"
#include "infer/date_guess.h"
#include "infer/double_encoding.h"
#include "infer/encoding_guess.h"
#include "infer/number_guess.h"
#include "infer/table_guess.h"

#include <kvt/datetime/datetime.h>

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

namespace {

using namespace host;

// ---- Dates

std::vector<std::string> formatsOf(const std::vector<std::string>& cells) {
    DateGuess guess;
    for (const std::string& cell : cells) {
        guess.add(cell);
    }
    std::vector<std::string> formats;
    for (const DateForm& form : guess.forms()) {
        formats.push_back(form.format);
    }
    return formats;
}

using Formats = std::vector<std::string>;

TEST(DateGuess, KnowsTheFormsThatPeopleWrite) {
    const struct {
        const char* cell;
        const char* format;
    } rows[] = {
        {"2020-01-31", "%Y-%m-%d"},
        {"31.1.2020", "%d.%m.%Y"},
        {"31/01/2020", "%d/%m/%Y"},
        {"01/31/2020", "%m/%d/%Y"},
        {"20200131", "%Y%m%d"},
        {"20200131235959", "%Y%m%d%H%M%S"},
        {"31 Jan 2020", "%d %b %Y"},
        {"31 January 2020", "%d %B %Y"},
        {"January 31, 2020", "%B %d, %Y"},
        {"31/Jan/2020 13:14:15", "%d/%b/%Y %H:%M:%S"},
        {"2020-01-31T13:14:15.123456789+01:00", "%Y-%m-%dT%H:%M:%S%Ez"},
        {"2020-01-31T13:14:15Z", "%Y-%m-%dT%H:%M:%S%Ez"},
        {"2020-01-31 13:14:15 +0100", "%Y-%m-%d %H:%M:%S %Ez"},
        {"1/31/2020 1:14 PM", "%m/%d/%Y %I:%M %p"},
        {"13:14", "%H:%M"},
        {"13:14:15.5", "%H:%M:%S"},
        {"31.01.20", "%d.%m.%y"},
        {"2020-031", "%Y-%j"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(formatsOf({row.cell}), Formats{row.format}) << row.cell;
    }
}

TEST(DateGuess, IsNoneForWhatParseRefuses) {
    for (const char* const cell : {"", "32.01.2020", "2020-13-01", "12:60", "1234", "n/a", "2020-01-31 x",
                                   "1.2.3.4", "2020-01-31T13:14:15+1:00:00", "99/99/9999"}) {
        EXPECT_TRUE(formatsOf({cell}).empty()) << cell;
    }
}

TEST(DateGuess, KnowsMonthsInOtherLanguages) {
    const struct {
        std::vector<std::string> cells;
        const char* format;
        const char* language;
    } rows[] = {
        {{"3. M\xC3\xA4rz 2020", "5. April 2020", "1. MAI 2021"}, "%d. %B %Y", "de"},
        {{"3. Okt. 2020", "5. Dez. 2020"}, "%d. %B %Y", "de"},
        {{"14 juillet 1789", "1 ao\xC3\xBBt 2001"}, "%d %b %Y", "fr"},
        {{"14 juil. 1789", "1 f\xC3\xA9vr. 2001 12:30"}, "%d %b %Y", "fr"},
        {{"3 de enero de 2020", "24 de abril de 2021"}, "%d de %B de %Y", "es"},
        {{"12 \xD1\x8F\xD0\xBD\xD0\xB2\xD0\xB0\xD1\x80\xD1\x8F 2020"}, "%d %b %Y", "ru"},
        {{"12-pa\xC5\xBA-19", "13-lis-20"}, "%d-%b-%y", "pl"},
    };
    for (const auto& row : rows) {
        DateGuess guess;
        for (const std::string& cell : row.cells) {
            EXPECT_TRUE(guess.add(cell)) << cell;
        }
        EXPECT_EQ(guess.cells(), row.cells.size()) << row.cells[0];
        ASSERT_FALSE(guess.forms().empty()) << row.cells[0];
        EXPECT_EQ(guess.forms()[0].format, row.format) << row.cells[0];
        ASSERT_FALSE(guess.months().empty()) << row.cells[0];
        EXPECT_EQ(guess.months()[0], row.language) << row.cells[0];
        std::uint64_t sum = 0;
        for (const DateForm& form : guess.forms()) {
            sum += form.cells;
        }
        EXPECT_EQ(sum, guess.cells()) << row.cells[0];
    }
}

TEST(DateGuess, PrefersEnglishMonthsWhereTheyDo) {
    DateGuess guess;
    for (const char* const cell : {"3 April 2020", "5 August 2020", "31.12.2020"}) {
        EXPECT_TRUE(guess.add(cell));
    }
    EXPECT_TRUE(guess.months().empty());
    EXPECT_EQ(guess.cells(), 3U);
}

TEST(DateGuess, TakesTheLanguageOfMostCells) {
    ColumnGuess guess;
    for (int i = 0; i < 20; ++i) {
        guess.add("3. Oktober 2020");
    }
    guess.add("3 October 2020");
    guess.add("31.12.2020");
    EXPECT_EQ(guess.type(), ColumnGuess::Type::Date);
    EXPECT_EQ(guess.dates().cells(), 21U);
    EXPECT_EQ(guess.others(), 1U);
    EXPECT_EQ(guess.exampleOfOthers(), "3 October 2020");
    ASSERT_FALSE(guess.dates().months().empty());
    EXPECT_EQ(guess.dates().months().front(), "de");
}

TEST(DateGuess, TakesNoOtherWordForAMonth) {
    for (const char* const cell : {"3. Hafer 2020", "3. M\xC3\xA4rzen 2020", "M\xC3\xA4rz",
                                   "M\xC3\xA4rz 2020 kam er", "32. M\xC3\xA4rz 2020"}) {
        EXPECT_TRUE(formatsOf({cell}).empty()) << cell;
    }
}

// What one day above 12 decides, it decides for the column.
TEST(DateGuess, TellsDayFromMonthByTheColumn) {
    EXPECT_EQ(formatsOf({"01/02/2020", "03/31/2020"}), Formats{"%m/%d/%Y"});
    EXPECT_EQ(formatsOf({"01/02/2020", "31/03/2020"}), Formats{"%d/%m/%Y"});
    EXPECT_EQ(formatsOf({"31/03/2020", "03/31/2020", "03/30/2020"}), (Formats{"%m/%d/%Y", "%d/%m/%Y"}));
}

TEST(DateGuess, SaysWhatElseReadsTheSameCells) {
    DateGuess guess;
    guess.add("01/02/2020");
    guess.add("03/04/2021");
    ASSERT_EQ(guess.forms().size(), 1U);
    EXPECT_EQ(guess.forms()[0].format, "%d/%m/%Y");
    EXPECT_EQ(guess.forms()[0].alternative, "%m/%d/%Y");
    EXPECT_EQ(guess.forms()[0].cells, 2U);
    EXPECT_EQ(guess.forms()[0].example, "01/02/2020");
}

TEST(DateGuess, CountsEachFormThatOccurs) {
    DateGuess guess;
    for (const char* const cell : {"2020-01-31", "31.01.2020", "2020-02-01", "x"}) {
        guess.add(cell);
    }
    const auto forms = guess.forms();
    ASSERT_EQ(forms.size(), 2U);
    EXPECT_EQ(forms[0].format, "%Y-%m-%d");
    EXPECT_EQ(forms[0].cells, 2U);
    EXPECT_EQ(forms[1].cells, 1U);
    EXPECT_EQ(guess.cells(), 3U);
}

// Whatever format() writes by a form with a whole year, the form is among those that are found.
TEST(DateGuess, FindsTheFormByWhichADateWasWritten) {
    std::mt19937 random(20261122);
    for (const char* const format : {"%Y-%m-%d", "%d.%m.%Y %H:%M:%S", "%m/%d/%Y %I:%M %p", "%d-%b-%Y",
                                     "%B %d, %Y", "%Y/%m/%dT%H:%M", "%Y%m%d%H%M%S"}) {
        DateGuess guess;
        for (int i = 0; i < 200; ++i) {
            char value[32];
            std::snprintf(value, sizeof value, "%04u%02u%02u%02u%02u%02u", 1000 + unsigned(random() % 9000),
                          1 + unsigned(random() % 12), 1 + unsigned(random() % 28), unsigned(random() % 24),
                          unsigned(random() % 60), unsigned(random() % 60));
            const auto text =
                kvt::ex::datetime::format(kvt::ex::UString<0>(value), kvt::ex::UString<0>(format));
            EXPECT_TRUE(guess.add(std::get<1>(text).toStdString()));
        }
        const auto forms = guess.forms();
        ASSERT_EQ(forms.size(), 1U) << format;
        EXPECT_EQ(forms[0].format, format);
    }
}

// ---- Numbers

NumberGuess numbersOf(const std::vector<std::string>& cells) {
    NumberGuess guess;
    for (const std::string& cell : cells) {
        guess.add(cell);
    }
    return guess;
}

TEST(NumberGuess, KnowsTheStyles) {
    EXPECT_EQ(numbersOf({"1", "2.5", "-3"}).style(), NumberStyle::Plain);
    EXPECT_EQ(numbersOf({"1,234.56", "7"}).style(), NumberStyle::Point);
    EXPECT_EQ(numbersOf({"1.234,56", "7"}).style(), NumberStyle::Comma);
    EXPECT_EQ(numbersOf({"1 234,56", "1\xC2\xA0"
                                     "234"})
                  .style(),
              NumberStyle::Space);
    EXPECT_EQ(numbersOf({"1\xE2\x80\xAF"
                         "234,5"})
                  .style(),
              NumberStyle::Space);
    EXPECT_EQ(numbersOf({"1'234.56"}).style(), NumberStyle::Apostrophe);
}

TEST(NumberGuess, LetsTheColumnDecideWhatASignMeans) {
    EXPECT_EQ(numbersOf({"1.234", "2.345"}).style(), NumberStyle::Plain);
    EXPECT_EQ(numbersOf({"1.234", "2.345", "1,5"}).style(), NumberStyle::Comma);
    EXPECT_EQ(numbersOf({"1,234", "1.5"}).style(), NumberStyle::Point);
}

TEST(NumberGuess, TakesSignsAndCurrencies) {
    for (const char* const cell : {"-1", "+1",
                                   "\xE2\x88\x92"
                                   "1",
                                   "$1", "-$1.50", "1 \xE2\x82\xAC", "\xE2\x82\xAC -1", "1$"}) {
        EXPECT_EQ(numbersOf({cell}).cells(), 1U) << cell;
    }
    EXPECT_EQ(numbersOf({"$1", "2"}).withCurrency(), 1U);
    EXPECT_NE(numbersOf({"$1", "$2"}).style(), NumberStyle::Plain); // the sign has to go
}

TEST(NumberGuess, RefusesWhatIsNone) {
    for (const char* const cell :
         {"", "-", "$", "1-2", "1,2,3", "1.2.3", "12,34.5", "1e5", "0x10", "1 2", "--1", "a1", "1a"}) {
        EXPECT_EQ(numbersOf({cell}).cells(), 0U) << cell;
    }
}

// ---- Columns

ColumnGuess::Type typeOf(const std::vector<std::string>& cells) {
    ColumnGuess guess;
    for (const std::string& cell : cells) {
        guess.add(cell);
    }
    return guess.type();
}

TEST(ColumnGuess, IsWhatNineOfTenCellsAre) {
    using Type = ColumnGuess::Type;
    EXPECT_EQ(typeOf({}), Type::Empty);
    EXPECT_EQ(typeOf({"", " "}), Type::Empty);
    EXPECT_EQ(typeOf({"1", "", "3"}), Type::Number);
    EXPECT_EQ(typeOf({"1", "x", "3"}), Type::Text);
    EXPECT_EQ(typeOf({"1", "2", "3", "4", "5", "6", "7", "8", "9", "n/a"}), Type::Number);
    EXPECT_EQ(typeOf({"01.02.2020", ""}), Type::Date);
    EXPECT_EQ(typeOf({"20200131", "20200201"}), Type::Date);
    EXPECT_EQ(typeOf({"20200131", "20209999"}), Type::Number);
    EXPECT_EQ(typeOf({"00123", "00124"}), Type::Text); // a zero in front is part of a name
}

// ---- Tables

TEST(TableGuess, FindsTheDelimiterThatPartsRowsAlike) {
    EXPECT_EQ(guessTable("a;b,c;d\n1;2,5;3\n", true).form.delimiter, ';');
    EXPECT_EQ(guessTable("a\tb\n1\t2\n", true).form.delimiter, '\t');
    EXPECT_EQ(guessTable("a|b|c\n", true).form.delimiter, '|');
    EXPECT_EQ(guessTable("a,b\n\"x;y\",1\n\"x;y;z\",2\n", true).form.delimiter, ',');
    EXPECT_EQ(guessTable("one\ntwo\n", true).columns, 1U);
    EXPECT_EQ(guessTable("", true).rows, 0U);
}

TEST(TableGuess, FindsSingleQuotesWhereThereAreNoDoubleOnes) {
    EXPECT_EQ(guessTable("'a,b',c\n'd','e'\n", true).form.quote, '\'');
    EXPECT_EQ(guessTable("\"a\",'b'\n", true).form.quote, '"');
    EXPECT_EQ(guessTable("it's,so\n", true).form.quote, '"');
}

TEST(TableGuess, DoesNotCountARowThatIsCut) {
    const TableGuess guess = guessTable("a,b,c\n1,2,3\n4,", false);
    EXPECT_EQ(guess.columns, 3U);
    EXPECT_EQ(guess.rows, 2U);
}

// ---- Encodings

std::string encodingOf(std::string_view bytes) {
    EncodingGuess guess(bytes);
    guess.add(bytes);
    return guess.finish().front().name;
}

TEST(EncodingGuess, BelievesAMark) {
    EXPECT_EQ(encodingOf("\xEF\xBB\xBF"
                         "a"),
              "UTF-8");
    EXPECT_EQ(encodingOf(std::string_view("\xFF\xFE"
                                          "a\0",
                                          4)),
              "UTF-16LE");
    EXPECT_EQ(encodingOf(std::string_view("\xFE\xFF\0a", 4)), "UTF-16BE");
    EXPECT_EQ(encodingOf(std::string_view("\xFF\xFE\0\0a\0\0\0", 8)), "UTF-32LE");
    EXPECT_EQ(encodingOf(std::string_view("\0\0\xFE\xFF\0\0\0a", 8)), "UTF-32BE");
}

TEST(EncodingGuess, KnowsWideUnitsByTheirZeros) {
    EXPECT_EQ(encodingOf(std::string_view("a\0,\0b\0\n\0", 8)), "UTF-16LE");
    EXPECT_EQ(encodingOf(std::string_view("\0a\0,\0b\0\n", 8)), "UTF-16BE");
    EXPECT_EQ(encodingOf(std::string_view("a\0\0\0b\0\0\0", 8)), "UTF-32LE");
}

TEST(EncodingGuess, PrefersUtf8WhereItFits) {
    EXPECT_EQ(encodingOf("abc"), "UTF-8");
    EXPECT_EQ(encodingOf("M\xC3\xBCller"), "UTF-8");
    EXPECT_EQ(encodingOf("M\xFCller und S\xF6hne, gegr\xFCndet in K\xF6ln"), "windows-1252");
}

// A few broken places in much UTF-8 are damage, and not another encoding.
TEST(EncodingGuess, ForgivesUtf8AFewPlaces) {
    std::string text;
    for (int i = 0; i < 100; ++i) {
        text += "\xC3\xBC ";
    }
    text += "\xFF";
    EncodingGuess guess(text);
    guess.add(text);
    const EncodingOpinion best = guess.finish().front();
    EXPECT_EQ(best.name, "UTF-8");
    EXPECT_EQ(best.losses, 1U);
    EXPECT_EQ(best.firstLoss, 300U);
}

TEST(EncodingGuess, KnowsTextOfSevenBitsThatIsMoreThanAscii) {
    EXPECT_EQ(encodingOf("\x1B$B;3ED\x1B(B,\x1B$BEl5~\x1B(B\n\x1B$B;3ED\x1B(B,\x1B$BEl5~\x1B(B\n"),
              "ISO-2022-JP");
}

// All of the text is looked at: what the beginning seems to be is given up at the last byte.
TEST(EncodingGuess, LooksAtAllOfTheText) {
    EncodingGuess guess("abc");
    guess.add("abc");
    guess.add("M\xFCller");
    EXPECT_NE(guess.finish().front().name, "UTF-8");
}

// ---- The wrong encoding, once

TEST(DoubleEncoding, KnowsUtf8ThatWasReadAsWindows1252) {
    DoubleEncoding doubled;
    doubled.add("M\xC3\x83\xC2\xBCller");
    doubled.add("M\xC3\xBCller");
    doubled.add("\xC3\x83 la carte");
    doubled.add("\xE2\x82\xAC");
    EXPECT_EQ(doubled.cells(), 1U);
    EXPECT_EQ(doubled.meant(), "M\xC3\xBCller");
    doubled.add("\xC3\xA2\xE2\x82\xAC\xE2\x84\xA2"); // a typographic apostrophe
    EXPECT_EQ(doubled.cells(), 2U);
}

} // namespace
