// perl's table of good and bad UTF-8. perl's strings hold more than Unicode has: surrogates, and numbers beyond U+10FFFF.
#include "suite.h"

#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>

namespace conformance {
namespace {

using kvt::ex::UString;

std::vector<std::uint32_t> numbersOf(const std::string& field, char separator) {
    std::vector<std::uint32_t> numbers;
    std::istringstream pieces(field);
    for (std::string piece; std::getline(pieces, piece, separator);) {
        numbers.push_back(static_cast<std::uint32_t>(std::stoul(piece, nullptr, 16)));
    }
    return numbers;
}

bool isUnicode(std::uint32_t number) {
    return number <= 0x10FFFF && (number < 0xD800 || number > 0xDFFF);
}

// The characters of well-formed text; nothing where kvt says that it is not.
std::optional<std::vector<std::uint32_t>> decoded(const std::string& bytes) {
    try {
        const UString<3> text(bytes.data(), bytes.size());
        return std::vector<std::uint32_t>(text.begin(), text.end());
    } catch (const kvt::ex::UStringBadEncodingException&) {
        return std::nullopt;
    }
}

TEST(ConformancePerlUtf8, GoodIsReadAndBadIsRefused) {
    if (sourceFolder("perl").empty()) {
        GTEST_SKIP() << noSources("perl");
    }
    Suite suite("perl's table of UTF-8", "perl " + sourceVersion("perl"));
    bool inTable = false;
    for (const std::string& line : linesOf(contentsOf(sourceFolder("perl") + "/t/op/utf8decode.t"))) {
        inTable = inTable || line == "__DATA__";
        std::istringstream words(line);
        std::string id;
        std::string verdict;
        std::string characters;
        std::string length;
        std::string bytes;
        words >> id >> verdict >> characters >> length >> bytes;
        const bool isCase = inTable && std::count(id.begin(), id.end(), '.') == 2 && !bytes.empty();
        if (!isCase) {
            continue;
        }
        std::string input;
        for (const std::uint32_t byte : numbersOf(bytes, ':')) {
            input += static_cast<char>(byte);
        }
        const auto found = decoded(input);
        if (verdict != "y") {
            suite.check(!found, "taken: " + line);
            continue;
        }
        const std::vector<std::uint32_t> expected = numbersOf(characters, ',');
        if (std::all_of(expected.begin(), expected.end(), isUnicode)) {
            suite.check(found == expected, "not taken, or as something else: " + line);
        } else if (!found) {
            suite.leaveOut("surrogates and numbers beyond U+10FFFF, which perl takes and Unicode does not");
        } else {
            suite.check(false, "taken: " + line);
        }
    }
    suite.finish();
}

} // namespace
} // namespace conformance
