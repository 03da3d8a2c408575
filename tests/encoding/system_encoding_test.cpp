// The system's encoding, found by processes that run under locales compiled for the purpose.
#include <gtest/gtest.h>

#include <array>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <map>
#include <memory>
#include <ostream>
#include <string>
#include <unistd.h>

namespace {

namespace fs = std::filesystem;

std::string toHex(const std::string& bytes) {
    constexpr const char* digits = "0123456789ABCDEF";
    std::string hex;
    for (const char c : bytes) {
        hex += digits[static_cast<unsigned char>(c) >> 4];
        hex += digits[static_cast<unsigned char>(c) & 15];
    }
    return hex;
}

// The standard output of a shell command, and whether it ended with status 0.
std::pair<std::string, bool> outputOf(const std::string& command) {
    std::string output;
    FILE* const pipe = popen(command.c_str(), "r");
    if (pipe == nullptr) {
        return {"popen failed", false};
    }
    std::array<char, 4096> buffer;
    std::size_t count = 0;
    while ((count = std::fread(buffer.data(), 1, buffer.size(), pipe)) > 0) {
        output.append(buffer.data(), count);
    }
    const int status = pclose(pipe);
    return {output, status == 0};
}

struct Row {
    /// The character map to compile a locale with; null for a locale that is not compiled here.
    const char* charmap;
    /// The locale's name in the environment.
    const char* locale;
    /// LC_CTYPE after the first use of an encoding.
    const char* localeAfter;
    std::uint32_t evaluated;
    const char* name;
    bool ascii;
    bool single;
    /// UTF-8 text and its bytes in the encoding.
    const char* text;
    const char* bytes;
    /// UTF-8 text around one character that the encoding does not have, and bytes that are not text in it; empty where
    /// there are none.
    const char* outside;
    const char* bad;
};

void PrintTo(const Row& row, std::ostream* stream) {
    *stream << row.locale;
}

const char* const utf8Text = "Gr\xC3\xBC\xC3\x9F"
                             "e \xE6\x97\xA5\xE6\x9C\xAC \xF0\x9F\x98\x80";
const char* const german = "Gr\xC3\xBC\xC3\x9F"
                           "e";
const char* const russian = "\xD0\x9F\xD1\x80\xD0\xB8\xD0\xB2\xD0\xB5\xD1\x82";
const char* const japanese = "\xE6\x97\xA5\xE6\x9C\xAC";
const char* const outsideThai = "a\xE0\xB8\x81z";
const char* const outsideCyrillic = "a\xD0\x96z";
const char* const outsideEuro = "a\xE2\x82\xACz";

const Row rows[] = {
    {"UTF-8", "x_UTF8", "x_UTF8", 0, "UTF-8", true, false, utf8Text, utf8Text, "", "a\xFF"},
    {nullptr, "C", "C.UTF-8", 0, "UTF-8", true, false, utf8Text, utf8Text, "", "a\xFF"},
    {nullptr, "POSIX", "C.UTF-8", 0, "UTF-8", true, false, utf8Text, utf8Text, "", "a\xFF"},
    {nullptr, "C.UTF-8", "C.UTF-8", 0, "UTF-8", true, false, utf8Text, utf8Text, "", "a\xFF"},
    // A locale that is not installed leaves the process in the plain "C" locale.
    {nullptr, "no_SUCH.LOCALE", "C.UTF-8", 0, "UTF-8", true, false, utf8Text, utf8Text, "", "a\xFF"},
    {"ANSI_X3.4-1968", "x_ASCII", "x_ASCII", 1, "US-ASCII", true, true, "abc", "abc", "a\xC3\xA9z", "a\xE9"},
    {"ISO-8859-1", "x_LATIN1", "x_LATIN1", 6, "ISO-8859-1", true, true, german,
     "Gr\xFC\xDF"
     "e",
     outsideEuro, ""},
    {"ISO-8859-15", "x_LATIN9", "x_LATIN9", 17, "ISO-8859-15", true, true, "\xE2\x82\xAC", "\xA4",
     outsideCyrillic, ""},
    {"CP1252", "x_CP1252", "x_CP1252", 20, "windows-1252", true, true, "\xE2\x82\xAC \xC3\xBC", "\x80 \xFC",
     outsideCyrillic, ""},
    {"CP1251", "x_CP1251", "x_CP1251", 19, "windows-1251", true, true, russian, "\xCF\xF0\xE8\xE2\xE5\xF2",
     "a\xC3\xA9z", ""},
    {"KOI8-R", "x_KOI8R", "x_KOI8R", 27, "KOI8-R", true, true, russian, "\xF0\xD2\xC9\xD7\xC5\xD4",
     "a\xC3\xA9z", ""},
    {"KOI8-U", "x_KOI8U", "x_KOI8U", 27, "KOI8-U", false, true, russian, "\xF0\xD2\xC9\xD7\xC5\xD4",
     "a\xC3\xA9z", ""},
    {"EUC-JP", "x_EUCJP", "x_EUCJP", 27, "EUC-JP", true, false, japanese, "\xC6\xFC\xCB\xDC", outsideThai,
     "a\xC6"},
    {"SHIFT_JIS", "x_SJIS", "x_SJIS", 27, "Shift_JIS", false, false, japanese, "\x93\xFA\x96\x7B",
     outsideThai, "a\x81"},
    // Spelt with a word that no number follows.
    {"WINDOWS-31J", "x_W31J", "x_W31J", 27, "Shift_JIS", false, false, japanese, "\x93\xFA\x96\x7B",
     outsideThai, "a\x81"},
    {"EUC-KR", "x_EUCKR", "x_EUCKR", 27, "EUC-KR", true, false, "\xED\x95\x9C", "\xC7\xD1", outsideThai,
     "a\xC7"},
    // Through the table of code pages, where the name alone would give another converter.
    {"CP949", "x_CP949", "x_CP949", 27, "EUC-KR", true, false, "\xED\x95\x9C", "\xC7\xD1", outsideThai,
     "a\xC7"},
    {"IBM874", "x_IBM874", "x_IBM874", 27, "windows-874-2000", true, true, "\xE0\xB8\x81", "\xA1",
     "a\xC3\xA9z", ""},
    {"IBM852", "x_IBM852", "x_IBM852", 27, "IBM852", false, true, "\xC3\xA9", "\x82", outsideCyrillic, ""},
    // A code page that is not in the table goes by its name.
    {"IBM850", "x_IBM850", "x_IBM850", 27, "IBM850", false, true, "\xC3\xA9", "\x82", outsideCyrillic, ""},
    {"CP737", "x_CP737", "x_CP737", 27, "ibm-737_P100-1997", false, true, "\xCE\xB1", "\x98", outsideCyrillic,
     ""},
    {"TIS-620", "x_TIS620", "x_TIS620", 27, "windows-874-2000", true, true, "\xE0\xB8\x81", "\xA1",
     "a\xC3\xA9z", ""},
    {"ISO-8859-11", "x_THAI", "x_THAI", 27, "iso-8859_11-2001", false, true, "\xE0\xB8\x81", "\xA1",
     "a\xC3\xA9z", ""},
    {"GBK", "x_GBK", "x_GBK", 27, "GBK", true, false, "\xE4\xB8\xAD", "\xD6\xD0", outsideThai, "a\xD6"},
    {"BIG5", "x_BIG5", "x_BIG5", 27, "Big5", true, false, "\xE4\xB8\xAD", "\xA4\xA4", outsideThai, "a\xA4"},
    {"MACINTOSH", "x_MAC", "x_MAC", 27, "macintosh", true, true, "\xC3\xA9", "\x8E", outsideCyrillic, ""},
    // What ICU cannot open counts as ISO-8859-1.
    {"ARMSCII-8", "x_ARM", "x_ARM", 6, "ISO-8859-1", true, true, german,
     "Gr\xFC\xDF"
     "e",
     outsideEuro, ""},
    {"GEORGIAN-PS", "x_GEO", "x_GEO", 6, "ISO-8859-1", true, true, german,
     "Gr\xFC\xDF"
     "e",
     outsideEuro, ""},
};

class SystemEncoding : public testing::TestWithParam<Row> {
protected:
    void SetUp() override {
        folder_ = fs::temp_directory_path() /
                  ("kvt_locale_" + std::to_string(getpid()) + "_" + std::to_string(counter_++));
        fs::create_directories(folder_);
        if (const char* const charmap = GetParam().charmap; charmap != nullptr) {
            const fs::path locale = folder_ / GetParam().locale;
            // It complains of character maps that are not ASCII-compatible and says so by its status, but with -c it
            // writes the locale all the same.
            const auto [log, done] = outputOf(std::string("localedef -c -i en_US -f ") + charmap + " '" +
                                              locale.string() + "' 2>&1");
            ASSERT_TRUE(fs::is_directory(locale))
                << "localedef (package \"locales\") made no locale: " << log;
        }
    }
    void TearDown() override { fs::remove_all(folder_); }

    // What the child prints, with `variable` naming the locale.
    void run(const std::string& variable) {
        const Row& row = GetParam();
        const std::string command = "env -u LC_ALL -u LC_CTYPE -u LANG -u LANGUAGE LOCPATH='" +
                                    folder_.string() + "' " + variable + "='" + row.locale + "' '" +
                                    KVT_SYSTEM_ENCODING_CHILD + "' '" + row.name + "' '" + toHex(row.text) +
                                    "' '" + toHex(row.outside) + "' '" + toHex(row.bad) + "'";
        const auto [output, done] = outputOf(command);
        ASSERT_TRUE(done) << command << "\n" << output;
        facts_.clear();
        for (std::size_t at = 0; at < output.size();) {
            const std::size_t end = output.find('\n', at);
            const std::string line = output.substr(at, end - at);
            facts_[line.substr(0, line.find('='))] = line.substr(line.find('=') + 1);
            at = end + 1;
        }
    }

    const std::string& fact(const std::string& key) { return facts_[key]; }

    static std::string pairs(const std::string& lossy, const std::string& substitution) {
        return " " + toHex("pair substituted_conversion|" + lossy) + " " +
               toHex("pair substitution_characters|" + substitution);
    }

private:
    static inline int counter_ = 0;

    fs::path folder_;
    std::map<std::string, std::string> facts_;
};

TEST_P(SystemEncoding, HasIdNamesAndProperties) {
    const Row& row = GetParam();
    ASSERT_NO_FATAL_FAILURE(run("LC_ALL"));
    EXPECT_EQ(fact("id"), "27");
    EXPECT_EQ(fact("evaluate"), std::to_string(row.evaluated));
    EXPECT_EQ(fact("name"), row.name);
    EXPECT_EQ(fact("unevaluated"), "zqt-system");
    EXPECT_EQ(fact("ansi"), row.name);
    EXPECT_EQ(fact("named.id"), std::to_string(row.evaluated));
    EXPECT_EQ(fact("named.equal"), "1");
    EXPECT_EQ(fact("ascii"), row.ascii ? "1" : "0");
    EXPECT_EQ(fact("single"), row.single ? "1" : "0");
    EXPECT_EQ(fact("firstNew"), "31");
    EXPECT_EQ(fact("evaluate.later"), std::to_string(row.evaluated));
    EXPECT_EQ(fact("name.later"), row.name);
}

TEST_P(SystemEncoding, SetsTheCharacterTypeLocaleAtFirstUseAndNoOther) {
    ASSERT_NO_FATAL_FAILURE(run("LC_ALL"));
    EXPECT_EQ(fact("locale.start"), "C");
    EXPECT_EQ(fact("locale.fixed"), "C");
    EXPECT_EQ(fact("locale.after"), GetParam().localeAfter);
    EXPECT_EQ(fact("locale.numeric"), "C");
}

TEST_P(SystemEncoding, IsFoundByEachVariableOfTheEnvironment) {
    for (const char* const variable : {"LC_CTYPE", "LANG"}) {
        ASSERT_NO_FATAL_FAILURE(run(variable));
        EXPECT_EQ(fact("name"), GetParam().name) << variable;
        EXPECT_EQ(fact("locale.after"), GetParam().localeAfter) << variable;
    }
}

TEST_P(SystemEncoding, ConvertsTextOfItsRepertoireBothWays) {
    const Row& row = GetParam();
    ASSERT_NO_FATAL_FAILURE(run("LC_ALL"));
    EXPECT_EQ(fact("to"), toHex(row.bytes));
    EXPECT_EQ(fact("fromBytes"), toHex(row.bytes));
    EXPECT_EQ(fact("getAsSystem"), toHex(row.bytes));
    EXPECT_EQ(fact("back"), toHex(row.text));
    EXPECT_EQ(fact("backUtf16"), toHex(row.text));
    EXPECT_EQ(fact("unchecked"), toHex(row.bad));
    EXPECT_EQ(fact("uncheckedNamed"), toHex(row.bad));
}

TEST_P(SystemEncoding, ReportsACharacterThatItDoesNotHave) {
    const Row& row = GetParam();
    ASSERT_NO_FATAL_FAILURE(run("LC_ALL"));
    if (*row.outside == '\0') {
        EXPECT_EQ(fact("outside"), "none");
        return;
    }
    EXPECT_EQ(fact("outside"),
              "kvt::ex::UStringTranscodingException " +
                  toHex(std::string("message 910003|") + row.outside + "|UTF-8|" + row.name) +
                  pairs("a?z", "?"));
}

TEST_P(SystemEncoding, ReportsBytesThatAreNoTextInIt) {
    const Row& row = GetParam();
    ASSERT_NO_FATAL_FAILURE(run("LC_ALL"));
    if (*row.bad == '\0') {
        EXPECT_EQ(fact("bad"), "none");
        return;
    }
    const std::string escaped = "a\\x" + toHex(std::string(row.bad).substr(1));
    EXPECT_EQ(fact("bad"), "kvt::ex::UStringBadEncodingException " +
                               toHex("message 910002|" + escaped + "|" + row.name) +
                               pairs("a\xEF\xBF\xBD", "\xEF\xBF\xBD"));
}

INSTANTIATE_TEST_SUITE_P(UnderLocale, SystemEncoding, testing::ValuesIn(rows),
                         [](const testing::TestParamInfo<Row>& row) {
                             std::string name = row.param.locale;
                             for (char& c : name) {
                                 c = std::isalnum(static_cast<unsigned char>(c)) != 0 ? c : '_';
                             }
                             return name;
                         });

} // namespace
