// The text of a date: its formats, the special values, and how long it stays.
#include "legacy_support.h"
#include <support/private_member.h>

#include <locale>

namespace kvt::test {

// The private forms, which inline wrappers of a host call.
struct Formatted {
    using Type = void (ObsoleteDate::*)(const char*, const char*&, unsigned long long&) const;
    friend Type memberOf(Formatted);
};
struct Unformatted {
    using Type = void (ObsoleteDate::*)(const char*&, unsigned long long&) const;
    friend Type memberOf(Unformatted);
};
template struct Opens<Formatted, &ObsoleteDate::asString>;
template struct Opens<Unformatted, &ObsoleteDate::asString>;

namespace {

struct TextRow {
    int line;
    const char* format;
    const char* expected;
};

// Of 2020-02-01, a Saturday.
const TextRow textRows[] = {
    {__LINE__, "%Y-%m-%d", "2020-02-01"},       {__LINE__, "%x", "02/01/20"},
    {__LINE__, "%d.%m.%y", "01.02.20"},         {__LINE__, "%a %A %b %B", "Sat Saturday Feb February"},
    {__LINE__, "%j %U %w", "032 04 6"},         {__LINE__, "%H:%M:%S", "00:00:00"},
    {__LINE__, "%% and %", "% and "},           {__LINE__, "no directive", "no directive"},
    {__LINE__, "\xC3\xA9 %Y", "\xC3\xA9 2020"}, {__LINE__, "", ""},
};

TEST(ObsoleteDateText, FollowsTheFormat) {
    const ObsoleteDate date(1, 2, 2020);
    for (const TextRow& row : textRows) {
        EXPECT_EQ(date.asString(row.format), row.expected) << "row " << row.line;
    }
    const std::string longFormat(5000, 'x');
    EXPECT_EQ(date.asString((longFormat + "%Y").c_str()), longFormat + "2020");
}

TEST(ObsoleteDateText, WithoutAFormatIsThatOfTheLocale) {
    EXPECT_EQ(ObsoleteDate(1, 2, 2020).asString(), "02/01/20");
    EXPECT_EQ(ObsoleteDate(31, 12, 1999).asString(), ObsoleteDate(31, 12, 1999).asString("%x"));
}

TEST(ObsoleteDateText, NamesTheSpecialValuesWhateverTheFormat) {
    for (const char* format : {"%Y-%m-%d", "%x", "", "text"}) {
        EXPECT_EQ(dateNumbered(notADate).asString(format), "not-a-date-time") << format;
        EXPECT_EQ(dateNumbered(negativeInfinity).asString(format), "-infinity") << format;
        EXPECT_EQ(dateNumbered(positiveInfinity).asString(format), "+infinity") << format;
    }
    EXPECT_EQ(dateNumbered(notADate).asString(), "not-a-date-time");
    EXPECT_EQ(dateNumbered(negativeInfinity).asString(), "-infinity");
    EXPECT_EQ(dateNumbered(positiveInfinity).asString(), "+infinity");
}

class GermanDates : public std::time_put<char> {
protected:
    iter_type do_put(iter_type out, std::ios_base& stream, char fill, const std::tm* time, char format,
                     char modifier) const override {
        if (format != 'x') {
            return std::time_put<char>::do_put(out, stream, fill, time, format, modifier);
        }
        const std::string pattern = "%d.%m.%Y";
        return put(out, stream, fill, time, pattern.data(), pattern.data() + pattern.size());
    }
};

TEST(ObsoleteDateText, IsWrittenByTheGlobalLocale) {
    const std::locale before = std::locale::global(std::locale(std::locale(), new GermanDates));
    const std::string text = ObsoleteDate(1, 2, 2020).asString();
    std::locale::global(before);
    EXPECT_EQ(text, "01.02.2020");
}

TEST(ObsoleteDateText, BelongsToTheObjectUntilItsNext) {
    const ObsoleteDate date(1, 2, 2020);
    const char* out = nullptr;
    unsigned long long length = 0;
    (date.*memberOf(Formatted()))("%Y-%m-%d", out, length);
    EXPECT_EQ(std::string(out, length), "2020-02-01");
    EXPECT_EQ(out[length], '\0');

    // A copy has a text of its own, and other operations on this object leave its text in place.
    ObsoleteDate copy(date);
    (copy.*memberOf(Unformatted()))(out, length);
    const char* const kept = out;
    EXPECT_EQ(std::string(kept, length), "02/01/20");
    ++copy;
    copy++;
    --copy;
    EXPECT_EQ(copy.day(), 33U);
    EXPECT_TRUE(copy + 1 > copy);
    EXPECT_EQ(std::string(kept), "02/01/20");
}

TEST(ObsoleteDateText, StaysWhenTheNextFails) {
    ObsoleteDate date(1, 1, 1400);
    const char* out = nullptr;
    unsigned long long length = 0;
    (date.*memberOf(Formatted()))("%Y", out, length);
    --date;
    const char* untouched = "untouched";
    unsigned long long same = 9;
    EXPECT_EQ(failureOf([&] { (date.*memberOf(Formatted()))("%Y", untouched, same); }), badYear);
    EXPECT_EQ(std::string(untouched, same), "untouched");
    EXPECT_EQ(std::string(out, length), "1400");
}

} // namespace
} // namespace kvt::test
