// Rows of delimited text against a reader that goes byte by byte: cells, their text, line ends, faults, and the borders
// at which a text may be cut.

#include <reference/row_reference.h>

#include <translate/cell_text.h>
#include <translate/row_borders.h>
#include <translate/row_reader.h>

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

namespace kvt::test {

namespace {

using host::RowBorders;
using host::RowFault;
using host::RowForm;
using host::RowReader;

std::string shown(std::string_view text) {
    std::string out;
    for (const char byte : text) {
        out += byte == '\n' ? "\\n" : byte == '\r' ? "\\r" : byte == '\0' ? "\\0" : std::string(1, byte);
    }
    return out;
}

void expectSameRows(std::string_view text, const RowForm& form) {
    SCOPED_TRACE(shown(text));
    RowReader reader(form, text);
    std::string scratch;
    for (const ReferenceRow& row : referenceRows(text, form.delimiter, form.quote)) {
        ASSERT_TRUE(reader.next());
        ASSERT_EQ(reader.cellCount(), row.cells.size());
        ASSERT_EQ(static_cast<int>(reader.fault()), static_cast<int>(row.fault));
        if (row.fault != ReferenceFault::None) {
            ASSERT_EQ(static_cast<std::size_t>(reader.faultPlace() - text.data()), row.faultPlace);
        }
        ASSERT_EQ(static_cast<std::size_t>(reader.row().data() - text.data()), row.begin);
        ASSERT_EQ(reader.lineEnd(), row.lineEnd);
        for (std::size_t index = 0; index < row.cells.size(); ++index) {
            ASSERT_EQ(reader.cell(index), row.cells[index].asItStands);
            if (row.fault == ReferenceFault::None) {
                ASSERT_EQ(host::textOfCell(reader.cell(index), form, scratch), row.cells[index].text);
            }
        }
    }
    ASSERT_FALSE(reader.next());
}

void expectSameBorders(std::string_view text, const RowForm& form, std::size_t pieceLength) {
    SCOPED_TRACE(shown(text) + " in pieces of " + std::to_string(pieceLength));
    RowBorders borders(form);
    for (std::size_t at = 0; at < text.size(); at += pieceLength) {
        borders.add(text.substr(at, pieceLength));
        const std::string_view soFar = text.substr(0, at + pieceLength);
        ASSERT_EQ(borders.border(), referenceBorder(soFar, form.delimiter, form.quote)) << shown(soFar);
        ASSERT_EQ(borders.size(), soFar.size());
    }
}

} // namespace

TEST(RowReader, ReadsEveryShortTextAsTheReferenceDoes) {
    constexpr std::string_view alphabet("a,\"\n\r\0", 6);
    for (std::size_t length = 0; length <= 6; ++length) {
        std::size_t count = 1;
        for (std::size_t i = 0; i < length; ++i) {
            count *= alphabet.size();
        }
        for (std::size_t number = 0; number < count; ++number) {
            std::string text;
            for (std::size_t rest = number, i = 0; i < length; ++i, rest /= alphabet.size()) {
                text += alphabet[rest % alphabet.size()];
            }
            expectSameRows(text, RowForm{});
            expectSameBorders(text, RowForm{}, 1);
            expectSameBorders(text, RowForm{}, 2);
            if (testing::Test::HasFatalFailure()) {
                return;
            }
        }
    }
}

TEST(RowReader, ReadsLongTextsAsTheReferenceDoes) {
    std::mt19937 random(12);
    constexpr std::string_view pieces[] = {"a",
                                           "word",
                                           "\"",
                                           "\"\"",
                                           ";",
                                           ";\"",
                                           "\"\n",
                                           "\n",
                                           "\r\n",
                                           "\r",
                                           "some words, and more of them behind a comma; none is quoted",
                                           "\"a quoted cell; with\r\na line end\"",
                                           std::string_view("\0", 1)};
    for (int round = 0; round < 2000; ++round) {
        std::string text;
        // Few quotes leave long stretches without any.
        const std::size_t kinds = random() % 2 == 0 ? std::size(pieces) : 2;
        for (std::size_t i = 0, count = random() % 60; i < count; ++i) {
            const std::size_t pick = random() % (kinds + 4);
            text += pick < kinds ? pieces[pick] : pick % 2 == 0 ? "\n" : "cell;";
        }
        expectSameRows(text, RowForm{';', '"'});
        expectSameBorders(text, RowForm{';', '"'}, 1 + random() % 100);
        if (testing::Test::HasFatalFailure()) {
            return;
        }
    }
}

TEST(RowReader, AQuoteCountsOnlyWhereACellBegins) {
    RowReader reader({}, "5\" pipe,x\n");
    ASSERT_TRUE(reader.next());
    EXPECT_EQ(reader.fault(), RowFault::None);
    EXPECT_EQ(reader.cell(0), "5\" pipe");
    EXPECT_EQ(reader.cell(1), "x");
}

TEST(RowReader, TakesAnyDelimiterAndQuote) {
    RowReader reader({'\t', '\''}, "'a\tb'\tc\"d\r\n");
    ASSERT_TRUE(reader.next());
    ASSERT_EQ(reader.cellCount(), 2U);
    EXPECT_EQ(reader.cell(0), "'a\tb'");
    EXPECT_EQ(reader.cell(1), "c\"d");
    EXPECT_EQ(reader.lineEnd(), "\r\n");
}

TEST(CellText, WhatIsWrittenIsReadBack) {
    std::mt19937 random(3);
    constexpr std::string_view alphabet = "ab,\"\n\r ";
    for (int round = 0; round < 20000; ++round) {
        std::string text;
        for (std::size_t i = 0, length = random() % 8; i < length; ++i) {
            text += alphabet[random() % alphabet.size()];
        }
        std::string cell;
        host::appendCell(cell, text, {});
        RowReader reader({}, cell);
        if (!reader.next()) {
            EXPECT_EQ(text, "");
            continue;
        }
        std::string scratch;
        EXPECT_EQ(reader.fault(), RowFault::None);
        ASSERT_EQ(reader.cellCount(), 1U);
        EXPECT_EQ(host::textOfCell(reader.cell(0), {}, scratch), text);
        EXPECT_FALSE(reader.next());
    }
}

TEST(CellText, QuotesStandOnlyWhereTheyMust) {
    for (const auto& [text, cell] : {std::pair("plain", "plain"),
                                     {"", ""},
                                     {" a ", " a "},
                                     {"a,b", "\"a,b\""},
                                     {"a\"b", "\"a\"\"b\""},
                                     {"a\nb", "\"a\nb\""},
                                     {"a;b", "a;b"}}) {
        std::string out;
        host::appendCell(out, text, {});
        EXPECT_EQ(out, cell);
    }
}

} // namespace kvt::test
