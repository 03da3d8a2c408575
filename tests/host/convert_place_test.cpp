// Byte offset, line and column of a loss, in encodings of every build, wherever the blocks of input happen to end.

#include "encode.h"
#include "host_test.h"

#include <nlohmann/json.hpp>

#include <sstream>

namespace kvt::test {

namespace {

// How a test writes a text in an encoding. `lost` is a character that the target cannot hold.
struct Form {
    const char* name;
    std::string (*encode)(std::u32string_view);
    const char* to = "US-ASCII";
};

std::string latin1Of(std::u32string_view text) {
    std::string out;
    for (const char32_t c : text) {
        out += static_cast<char>(c);
    }
    return out;
}

// ASCII, and the one character that these tests use beyond it: U+30BD, whose second byte is that of a backslash.
std::string shiftJisOf(std::u32string_view text) {
    std::string out;
    for (const char32_t c : text) {
        out += c == U'\u30BD' ? std::string("\x83\x5c") : std::string(1, static_cast<char>(c));
    }
    return out;
}

std::string gb18030Of(std::u32string_view text) {
    std::string out;
    for (const char32_t c : text) {
        out += c == U'\u00E9'       ? std::string("\xa8\xa6")
               : c == U'\U00010000' ? std::string("\x90\x30\x81\x30")
                                    : std::string(1, static_cast<char>(c));
    }
    return out;
}

// Each run of U+30BD between escapes of its own.
std::string iso2022Of(std::u32string_view text) {
    std::string out;
    for (const char32_t c : text) {
        out += c == U'\u30BD' ? std::string("\x1b$B%=\x1b(B") : std::string(1, static_cast<char>(c));
    }
    return out;
}

// Lower-case letters, blank, LF, CR and é of EBCDIC code page 1047, where LF is 0x15 or 0x25 and é 0x51.
std::string ebcdicOf(std::u32string_view text) {
    std::string out;
    for (const char32_t c : text) {
        out += c == U'\n'       ? '\x25'
               : c == U'\r'     ? '\x0d'
               : c == U'\u00E9' ? '\x51'
               : c == U'a'      ? '\x81'
                                : '\x82';
    }
    return out;
}

const Form utf8 = {"UTF-8", utf8Of};
const Form latin1 = {"ISO-8859-1", latin1Of};
const Form utf16le = {"UTF-16LE", [](std::u32string_view text) { return utf16Of(text, false); }};
const Form utf16be = {"UTF-16BE", [](std::u32string_view text) { return utf16Of(text, true); }};
const Form utf32le = {"UTF-32LE", [](std::u32string_view text) { return utf32Of(text, false); }};
const Form utf32be = {"UTF-32BE", [](std::u32string_view text) { return utf32Of(text, true); }};
const Form shiftJis = {"Shift_JIS", shiftJisOf};
const Form gb18030 = {"GB18030", gb18030Of};
const Form iso2022 = {"ISO-2022-JP", iso2022Of};
const Form ebcdic = {"ibm-37_P100-1995", ebcdicOf};

struct Found {
    std::uint64_t offset;
    std::uint64_t line;
    std::uint64_t column;
    friend bool operator==(const Found&, const Found&) = default;
    friend std::ostream& operator<<(std::ostream& out, const Found& found) {
        return out << "byte " << found.offset << ", line " << found.line << ", column " << found.column;
    }
};

// Where every character above ASCII stands, found by going through the text.
std::vector<Found> expectedPlaces(const Form& form, std::u32string_view text) {
    std::vector<Found> places;
    std::uint64_t line = 1;
    std::uint64_t column = 1;
    std::uint64_t offset = 0;
    for (std::size_t index = 0; index < text.size(); ++index) {
        const char32_t c = text[index];
        // The escapes before a character belong to it for the offset that a converter gives.
        if (c > 127) {
            places.push_back({offset, line, column});
        }
        offset += form.encode({&c, 1}).size();
        const bool endsLine =
            c == U'\n' || (c == U'\r' && (index + 1 == text.size() || text[index + 1] != U'\n'));
        line += endsLine ? 1 : 0;
        column = endsLine ? 1 : column + 1;
    }
    return places;
}

} // namespace

class KvtConvertPlace : public HostTest {
protected:
    // The places of all losses of converting to `form.to`, as reported.
    std::vector<Found> reported(const Form& form, const std::string& bytes) {
        ChildSetup made = conversion(form);
        made.input = bytes;
        return placesOf(made);
    }

    // The same, with the input coming in pieces of so many bytes.
    std::vector<Found> reportedInPieces(const Form& form, const std::string& bytes, std::size_t size) {
        ChildSetup made = conversion(form);
        std::size_t sent = 0;
        made.oneByOne = true;
        made.makeInput = [&]() -> std::string_view {
            const std::string_view piece = std::string_view(bytes).substr(sent, size);
            sent += piece.size();
            return piece;
        };
        return placesOf(made);
    }

    ChildSetup conversion(const Form& form) {
        return setup({"convert", "--from", form.name, "--to", form.to, "--report", "losses", "-o", "out"});
    }

    std::vector<Found> placesOf(const ChildSetup& made) {
        const ChildResult result = runChild(made);
        EXPECT_LT(result.status, 2) << result.err;
        std::vector<Found> places;
        std::istringstream in(read("losses"));
        for (std::string line; std::getline(in, line);) {
            const auto loss = nlohmann::json::parse(line);
            places.push_back({loss["offset"], loss["line"], loss["column"]});
        }
        return places;
    }

    void expectPlaces(const Form& form, std::u32string_view text) {
        EXPECT_EQ(reported(form, form.encode(text)), expectedPlaces(form, text))
            << form.name << ", " << text.size() << " characters";
    }
};

TEST_F(KvtConvertPlace, LinesEndWithLfCrOrCrlfInEveryEncoding) {
    struct Row {
        const Form& form;
        char32_t lost;
    };
    const std::vector<Row> rows = {{utf8, U'\u0141'},       {utf8, U'\U0001F600'},    {latin1, U'\u00E9'},
                                   {utf16le, U'\u0141'},    {utf16be, U'\U0001F600'}, {utf32le, U'\u0141'},
                                   {utf32be, U'\u0141'},    {shiftJis, U'\u30BD'},    {gb18030, U'\u00E9'},
                                   {gb18030, U'\U00010000'}};
    const std::vector<std::u32string> texts = {
        U"X",       U"aX",          U"\nX",   U"\rX",      U"\r\nX",           U"a\n\nbX",
        U"a\r\rbX", U"a\r\n\r\nbX", U"\n\rX", U"\n\r\nXX", U"Xa\nX\rX\r\nXaX", U"\r\r\n\n\rX",
        U"X\n",     U"abc\nXabc\n",
    };
    for (const Row& row : rows) {
        for (std::u32string text : texts) {
            for (char32_t& c : text) {
                c = c == U'X' ? row.lost : c;
            }
            expectPlaces(row.form, text);
        }
    }
}

TEST_F(KvtConvertPlace, EncodingsWithShiftsAreCountedByTheirText) {
    // The line feeds within the escapes and double bytes of other encodings are not what they seem: here the bytes
    // of one character are "%=", and line ends of EBCDIC are other bytes altogether.
    for (const std::u32string text : {U"aa\naa\u30BDa\r\na\u30BD", U"\u30BDa\u30BD\n\u30BD", U"\n\r\u30BD"}) {
        // A converter takes two escapes without a character between them for bad input; there are none here.
        const auto found = reported(iso2022, iso2022Of(text));
        const auto expected = expectedPlaces(iso2022, text);
        ASSERT_EQ(found.size(), expected.size());
        for (std::size_t index = 0; index < found.size(); ++index) {
            EXPECT_EQ(found[index].line, expected[index].line);
            EXPECT_EQ(found[index].column, expected[index].column);
            // The offset is that of the character or of the escape before it.
            EXPECT_GE(found[index].offset, expected[index].offset);
            EXPECT_LE(found[index].offset, expected[index].offset + 3);
        }
    }
    expectPlaces(ebcdic, U"aab\nab\u00E9\n\n\r\nb\u00E9a\u00E9");
}

TEST_F(KvtConvertPlace, BlockBordersMoveNoPlace) {
    for (const std::size_t border : {65536u, 131072u, 262144u}) {
        for (int shift = -5; shift <= 5; ++shift) {
            // The line end, and then the loss, travel across the border byte by byte.
            const std::size_t length = border + static_cast<std::size_t>(shift + 8) - 8;
            expectPlaces(utf8, std::u32string(length, U'a') + U"\r\n\u0141\n\U0001F600a\u0141");
            expectPlaces(utf8, std::u32string(length, U'\n') + U"\u0141");
            expectPlaces(shiftJis, std::u32string(length, U'a') + U"\r\u30BD\n\u30BD");
        }
    }
}

TEST_F(KvtConvertPlace, BlockBordersWithinWideUnitsMoveNoPlace) {
    for (const std::size_t border : {65536u, 131072u}) {
        for (std::size_t units = border / 2 - 3; units <= border / 2 + 1; ++units) {
            expectPlaces(utf16le, std::u32string(units, U'a') + U"\r\n\u0141\n\U0001F600a\u0141");
            expectPlaces(utf16be, std::u32string(units, U'\r') + U"\n\U0001F600\U0001F600\u0141");
        }
    }
}

TEST_F(KvtConvertPlace, PiecesOfAPipeThatEndAnywhereMoveNoPlace) {
    // Every unit and every line end is split somewhere.
    const std::u32string text = U"ab\r\n\u0141\n\U0001F600\r\ra\u0141\n";
    for (const Form* form : {&utf8, &utf16le, &utf16be, &utf32le, &utf32be}) {
        for (const std::size_t size : {1u, 3u, 5u}) {
            EXPECT_EQ(reportedInPieces(*form, form->encode(text), size), expectedPlaces(*form, text))
                << form->name << " by " << size;
        }
    }
}

TEST_F(KvtConvertPlace, HalvesOfUnitsThatLookLikeLineEndsAreNone) {
    // The second byte of one unit and the first of the next are those of a LF or a CR.
    for (const std::u32string pattern : {U"\u0A41\u0100", U"\u0D41\u0100"}) {
        const std::u32string text = pattern + pattern + pattern + pattern + pattern;
        const std::string bytes = utf16Of(text, false) + "\x3d\xd8";
        const Form form = {"UTF-16LE", utf8Of, "UTF-8"};
        for (const std::size_t size : {1u, 3u, 5u, 7u}) {
            EXPECT_EQ(reportedInPieces(form, bytes, size), (std::vector<Found>{{20, 1, 11}})) << size;
        }
    }
}

TEST_F(KvtConvertPlace, LinesLongerThanWhatIsKeptAreStillCounted) {
    for (const Form* form : {&utf8, &utf16le, &utf32be}) {
        expectPlaces(*form, U"a\n" + std::u32string(700001, U'\u0061') + U"\u0141" +
                                std::u32string(1300003, U'b') + U"\u0141\n\u0141");
    }
    // Two-byte characters, an odd number of bytes into the line.
    expectPlaces(shiftJis, U"a" + std::u32string(5, U'\u30BD') + std::u32string(1500000, U'b') + U"\u30BD");
    std::string bytes = "a";
    for (int index = 0; index < 800000; ++index) {
        bytes += "\x83\x5c";
    }
    const Form toLatin = {"Shift_JIS", shiftJisOf, "UTF-8"};
    EXPECT_EQ(reported(toLatin, bytes + "\xa0"), (std::vector<Found>{{1600001, 1, 800002}}));
}

TEST_F(KvtConvertPlace, BadBytesCountAsOneCharacterEach) {
    const Form form = {"UTF-8", utf8Of, "UTF-16LE"};
    EXPECT_EQ(reported(form, "a\xff\xff z\xe2\x82\n\xe2\x82"),
              (std::vector<Found>{{1, 1, 2}, {2, 1, 3}, {5, 1, 6}, {8, 2, 1}}));
}

TEST_F(KvtConvertPlace, WhatStandsBeforeMayBeSeveralCharacters) {
    struct Row {
        const char* from;
        std::string bytes;
        std::vector<Found> places;
    };
    const std::vector<Row> rows = {
        // Bytes that turn out not to belong together are read again one by one.
        {"GB18030", "\xa1\x35\xff", {{0, 1, 1}, {2, 1, 3}}},
        {"GB18030", "\x81\x30\x81 ", {{0, 1, 1}, {2, 1, 3}}},
        {"EUC-TW", "\x8e\xa1\xa1 \xff", {{0, 1, 1}, {4, 1, 4}}},
        {"ISO-2022-JP", "a\x1b$B%=\x1b(Bb\xff", {{10, 1, 4}}},
        {"UTF-7", "a\n+AGEAYQ-b\xff", {{11, 2, 4}}},
        // A form feed, and no line end.
        {"gsm-03.38-2009", "a\x1b\nb\xff\n\xff", {{4, 1, 4}, {6, 2, 1}}},
    };
    for (const Row& row : rows) {
        const Form form = {row.from, utf8Of, "UTF-16LE"};
        EXPECT_EQ(reported(form, row.bytes), row.places) << row.from;
        EXPECT_EQ(reportedInPieces(form, row.bytes, 1), row.places) << row.from;
    }
}

TEST_F(KvtConvertPlace, ALoneSurrogateAtABlockBorderIsOnItsOwnLine) {
    const Form form = {"UTF-16LE", utf8Of, "UTF-8"};
    for (std::size_t units = 32764; units <= 32770; ++units) {
        const std::string bytes =
            utf16Of(std::u32string(units, U'a'), false) + std::string("\x3d\xd8\n\0x\0", 6);
        EXPECT_EQ(reported(form, bytes), (std::vector<Found>{{2 * units, 1, units + 1}})) << units;
    }
}

TEST_F(KvtConvertPlace, AByteOrderMarkAtTheStartIsNotCounted) {
    expectPlaces(utf8, U"ab\u0141");
    const auto skipped = reported(utf8, "\uFEFFab\u0141\n\u0141");
    EXPECT_EQ(skipped, (std::vector<Found>{{5, 1, 3}, {8, 2, 1}}));
}

TEST_F(KvtConvertPlace, OffsetsAndLinesBeginAnewInEachFile) {
    write("one", "a\n\u0141");
    write("two", "\u0142b");
    EXPECT_EQ(convert("UTF-8", "US-ASCII", "", {"--report", "losses", "one", "two"}).status, 1);
    const std::string report = read("losses");
    EXPECT_TRUE(contains(report, R"("file":"one","offset":2,"line":2,"column":1)")) << report;
    EXPECT_TRUE(contains(report, R"("file":"two","offset":0,"line":1,"column":1)")) << report;
}

} // namespace kvt::test
