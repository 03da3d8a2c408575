// Patterns of a fixed length are read and written without the library, with its results.

#include <translate/fixed_date.h>

#include <kvt/datetime/datetime.h>

#include <gtest/gtest.h>

#include <random>
#include <string>

namespace kvt::test {

TEST(FixedDateForm, GivesWhatTheLibraryGives) {
    std::mt19937 random(7);
    constexpr std::string_view characters = "0123456789.-/: T";
    for (const std::string pattern :
         {"%d.%m.%Y", "%Y%m%d", "%Y-%m-%dT%H:%M:%S", "%m/%d/%Y %H:%M", "%d %m %Y %H", "%H%M%d%m%Y"}) {
        const auto form = host::FixedDateForm::toRead(pattern);
        ASSERT_TRUE(form) << pattern;
        int taken = 0;
        for (int round = 0; round < 100'000; ++round) {
            // A value that fits, but for the numbers, and perhaps for a character.
            std::string value;
            for (std::size_t at = 0; at < pattern.size(); ++at) {
                if (pattern[at] != '%') {
                    value += pattern[at];
                    continue;
                }
                ++at;
                std::string number = std::to_string(pattern[at] == 'Y' ? random() % 10000 : random() % 62);
                const std::size_t width = pattern[at] == 'Y' ? 4 : 2;
                value += std::string(width - std::min(width, number.size()), '0') + number;
            }
            if (random() % 4 == 0) {
                value[random() % value.size()] = characters[random() % characters.size()];
            }
            std::string read;
            if (form->read(value, read)) {
                ++taken;
                const auto result = ex::datetime::parse(ex::UString<0>(value.data(), value.size()),
                                                        ex::UString<0>((pattern + "$").c_str()), false);
                ASSERT_EQ(read, std::get<1>(result).toStdString()) << value << " by " << pattern;
            }
        }
        EXPECT_GT(taken, 100) << pattern;
    }
}

TEST(FixedDateForm, LeavesOtherPatternsToTheLibrary) {
    for (const char* pattern :
         {"%d.%m.%y", "%d.%b.%Y", "%d.%m.%Y*", "%d.%m.%Y?", "%H:%M", "%d.%m", "%d.%m.%Y %M", "ISO",
          "%d.%m.%Y %d", "%d.%m.%Y %H:%M:%S.", "%Ez", "%%%d%m%Y", ""}) {
        EXPECT_FALSE(host::FixedDateForm::toRead(pattern)) << pattern;
    }
}

TEST(FixedDateForm, WritesWhatTheLibraryWrites) {
    std::mt19937 random(8);
    const auto two = [&](unsigned below) {
        const std::string number = std::to_string(random() % below);
        return number.size() == 1 ? "0" + number : number;
    };
    for (const std::string pattern : {"%Y-%m-%d", "%d.%m.%Y", "%m/%Y", "%Y", "%H:%M:%S", "%Y-%m-%dT%H:%M:%S",
                                      "%M", "on %d/%m", "%S s", "%Y~%m", "%d\"%m"}) {
        const auto form = host::FixedDateForm::toWrite(pattern);
        ASSERT_TRUE(form) << pattern;
        int taken = 0;
        for (int round = 0; round < 20'000; ++round) {
            std::string value = (random() % 20 == 0 ? "00" : "") + two(100) + two(100) + two(14) + two(33);
            if (random() % 2 == 0) {
                value += two(25) + two(62) + two(62);
            }
            if (random() % 8 == 0) {
                value[random() % value.size()] = "x -+.:9"[random() % 7];
            }
            std::string written;
            if (form->write(value, written)) {
                ++taken;
                const auto result = ex::datetime::format(ex::UString<0>(value.data(), value.size()),
                                                         ex::UString<0>(pattern.c_str()));
                ASSERT_EQ(written, std::get<1>(result).toStdString()) << value << " by " << pattern;
            }
        }
        EXPECT_GT(taken, 1000) << pattern;
    }
    for (const char* pattern : {"ISO", "%b", "%d.%m.%y", "%Y%Y", "%S.%M", "%d%%", "%F", "", "*%d", "%d?",
                                "%Y$", " %d", "%d ", "\xC3\xBC%Y"}) {
        EXPECT_FALSE(host::FixedDateForm::toWrite(pattern)) << pattern;
    }
}

TEST(FixedDateForm, ReadsNearlyAllPlainDatesItself) {
    const auto form = host::FixedDateForm::toRead("%d.%m.%Y");
    std::string read;
    for (int month = 1; month <= 12; ++month) {
        for (int day = 1; day <= 28; ++day) {
            const auto two = [](int number) {
                return std::string(number < 10 ? "0" : "") + std::to_string(number);
            };
            EXPECT_TRUE(form->read(two(day) + "." + two(month) + ".2023", read));
            EXPECT_EQ(read, "2023" + two(month) + two(day));
        }
    }
    EXPECT_TRUE(form->read("29.02.2000", read));
    EXPECT_FALSE(form->read("29.02.1900", read));
    EXPECT_FALSE(form->read("1.1.2000", read));
}

} // namespace kvt::test
