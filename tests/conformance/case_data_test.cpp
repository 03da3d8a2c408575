// Folding and mapping of single characters, by the files of the Unicode Character Database. UTF-32 is what is looked at,
// where a character is a unit.
#include "suite.h"

#include <support/unicode_data.h>

#include <kvt/string/ustring.h>

#include <gtest/gtest.h>
#include <unicode/uchar.h>

#include <sstream>

namespace conformance {
namespace {

using kvt::ex::UString;
using kvt::test::codePoints;
using kvt::test::unicodeRows;

// The files may be of a later version of Unicode than ICU is.
bool isKnownToIcu(char32_t character) {
    UVersionInfo age{};
    u_charAge(static_cast<UChar32>(character), age);
    return age[0] != 0;
}

std::string dataVersion() {
    return "unicode-data " + packageVersion("unicode-data") + ", ICU " U_ICU_VERSION;
}

std::string shown(const std::u32string& text) {
    std::ostringstream stream;
    for (const char32_t character : text) {
        stream << std::hex << static_cast<std::uint32_t>(character) << ' ';
    }
    return stream.str();
}

UString<3> stringOf(const std::u32string& text) {
    return {text.data(), text.size()};
}

void checkMapping(Suite& suite, const char* name, const UString<3>& mapped, const std::string& from,
                  const std::string& to) {
    const std::u32string is(mapped.begin(), mapped.end());
    suite.check(is == codePoints(to),
                std::string(name) + " of " + from + " is " + shown(is) + "and should be " + to);
}

TEST(ConformanceCase, Folding) {
    Suite suite("CaseFolding.txt", dataVersion());
    for (const auto& fields : unicodeRows("CaseFolding.txt")) {
        const std::u32string from = codePoints(fields[0]);
        if (!isKnownToIcu(from[0])) {
            suite.leaveOut("characters that this ICU does not know");
        } else if (fields[1] == "T") {
            suite.leaveOut("Turkic foldings");
        } else if (fields[1] == "S") {
            suite.leaveOut("simple foldings of characters that have a full one");
        } else {
            checkMapping(suite, "folding", UString<3>::getAsFoldedCase(stringOf(from)), fields[0], fields[2]);
        }
    }
    suite.finish();
}

TEST(ConformanceCase, SpecialMappings) {
    Suite suite("SpecialCasing.txt", dataVersion());
    for (const auto& fields : unicodeRows("SpecialCasing.txt")) {
        const std::u32string from = codePoints(fields[0]);
        if (fields.size() > 4 && !fields[4].empty()) {
            suite.leaveOut("mappings of one language or place");
            continue;
        }
        checkMapping(suite, "lower case", UString<3>::getAsLowerCase(stringOf(from)), fields[0], fields[1]);
        checkMapping(suite, "upper case", UString<3>::getAsUpperCase(stringOf(from)), fields[0], fields[3]);
    }
    suite.finish();
}

} // namespace
} // namespace conformance
