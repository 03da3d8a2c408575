// Who includes whom: the rules of include_rules.h on the repository as it is, and on small trees that break them, so
// that a rule which could not fail would show.

#include "include_rules.h"

#include <gtest/gtest.h>

#include <ostream>

namespace house {
namespace {

using Rule = Offences (*)(const Tree&);

const Tree& repository() {
    static const Tree tree = readTree(KVT_SOURCE_DIR, KVT_PUBLIC_HEADER_LIST, KVT_OPTIONAL_HEADER_LIST);
    return tree;
}

std::string joined(const Offences& offences) {
    std::string text;
    for (const std::string& offence : offences) {
        text += offence + "\n";
    }
    return text;
}

TEST(Includes, RepositoryIsFoundAtAll) {
    EXPECT_TRUE(repository().files.contains("kvt/foundation/export.h"));
    EXPECT_TRUE(repository().publicHeaders.contains("kvt/foundation/export.h"));
    EXPECT_TRUE(repository().optionalHeaders.contains("kvt/string/ustring_fmt.h"));
    EXPECT_GT(repository().includes.size(), 20U);
}

TEST(Includes, OwnHeadersAreNamedFromTheRoot) {
    EXPECT_EQ(joined(ownHeadersAreNamedFromTheRoot(repository())), "");
}

TEST(Includes, FilesMakeNoCycle) {
    EXPECT_EQ(joined(noCycles(repository())), "");
}

TEST(Includes, FoldersKnowOnlyTheirNeighbours) {
    EXPECT_EQ(joined(foldersKnowOnlyTheirNeighbours(repository())), "");
}

TEST(Includes, MemoryKnowsNoString) {
    EXPECT_EQ(joined(memoryKnowsNoString(repository())), "");
}

TEST(Includes, PublicHeadersStandAlone) {
    EXPECT_EQ(joined(publicHeadersStandAlone(repository())), "");
}

TEST(Includes, EveryHeaderIsPublicOrPrivate) {
    EXPECT_EQ(joined(everyHeaderIsPublicOrPrivate(repository())), "");
}

TEST(Includes, OutsideIsBehindItsDoor) {
    EXPECT_EQ(joined(outsideIsBehindItsDoor(repository())), "");
}

TEST(Includes, ToolsUsePublicHeaders) {
    EXPECT_EQ(joined(toolsUsePublicHeaders(repository())), "");
}

TEST(Includes, RoomsKnowOnlyTheirNeighbours) {
    EXPECT_EQ(joined(roomsKnowOnlyTheirNeighbours(repository())), "");
}

TEST(IncludesOf, FindsEachLineWithItsNumber) {
    const auto found =
        includesOf("f.h", "// head\n#include <a/b.h>\n  #  include \"c.h\" // why\n#define include <x>\n");
    ASSERT_EQ(found.size(), 2U);
    EXPECT_EQ(found[0].line, 2);
    EXPECT_EQ(found[0].target, "a/b.h");
    EXPECT_TRUE(found[0].angled);
    EXPECT_EQ(found[1].line, 3);
    EXPECT_EQ(found[1].target, "c.h");
    EXPECT_FALSE(found[1].angled);
}

struct Planted {
    int line; // of this row
    Rule rule;
    std::string file;
    std::string text;
    std::string expected; // what the offence begins with; empty: none
};

void PrintTo(const Planted& row, std::ostream* out) {
    *out << "row at line " << row.line << ": " << row.file << ": " << row.text;
}

// A tree in order, to which each row adds one file.
Tree treeWith(const std::string& file, const std::string& text) {
    Tree tree;
    tree.publicHeaders = {"kvt/foundation/pimpl.h",
                          "kvt/foundation/memory.h",
                          "kvt/foundation/vector.h",
                          "kvt/foundation/export.h",
                          "kvt/string/ustring.h",
                          "kvt/string/ustring_fmt.h",
                          "kvt/kvt.h"};
    tree.optionalHeaders = {"kvt/string/ustring_fmt.h"};
    const std::vector<std::pair<std::string, std::string>> files = {
        {"kvt/foundation/export.h", ""},
        {"kvt/foundation/pimpl.h", "#include <utility>\n"},
        {"kvt/foundation/memory.h", "#include <kvt/foundation/export.h>\n"},
        {"kvt/foundation/vector.h", "#include <kvt/foundation/memory.h>\n"},
        {"kvt/string/ustring.h", "#include <kvt/foundation/vector.h>\n"},
        {"kvt/string/ustring_fmt.h", "#include <kvt/string/ustring.h>\n"},
        {"kvt/string/detail/search.h", ""},
        {"kvt/platform/code_page.h", ""},
        {"tools/kvt/base/text.h", ""},
        {"tools/kvt/cli/options.h", "#include \"base/text.h\"\n"},
        {"tools/kvt/sort/chunk.h", ""},
        {"kvt/kvt.h", "#include <kvt/foundation/export.h>\n#include <kvt/foundation/memory.h>\n"
                      "#include <kvt/foundation/pimpl.h>\n#include <kvt/foundation/vector.h>\n"
                      "#include <kvt/string/ustring.h>\n"},
    };
    const auto add = [&](const std::string& name, const std::string& content) {
        tree.files.insert(name);
        std::erase_if(tree.includes, [&](const Include& include) { return include.file == name; });
        const auto includes = includesOf(name, content);
        tree.includes.insert(tree.includes.end(), includes.begin(), includes.end());
    };
    for (const auto& [name, content] : files) {
        add(name, content);
    }
    add(file, text);
    return tree;
}

class PlantedOffence : public testing::TestWithParam<Planted> {};

TEST_P(PlantedOffence, IsFoundWithItsFileAndLine) {
    const Planted& row = GetParam();
    const Offences offences = row.rule(treeWith(row.file, row.text));
    if (row.expected.empty()) {
        EXPECT_EQ(joined(offences), "");
    } else {
        ASSERT_EQ(offences.size(), 1U) << joined(offences);
        EXPECT_EQ(offences[0].substr(0, row.expected.size()), row.expected);
    }
}

const Planted plantedRows[] = {
    {__LINE__, ownHeadersAreNamedFromTheRoot, "kvt/string/a.cpp", "#include <kvt/string/ustring.h>", ""},
    {__LINE__, ownHeadersAreNamedFromTheRoot, "kvt/string/a.cpp", "\n#include \"ustring.h\"",
     "kvt/string/a.cpp:2:"},
    {__LINE__, ownHeadersAreNamedFromTheRoot, "kvt/string/a.cpp", "#include <kvt/string/gone.h>",
     "kvt/string/a.cpp:1:"},
    {__LINE__, noCycles, "kvt/string/a.cpp", "#include <kvt/string/ustring.h>", ""},
    {__LINE__, noCycles, "kvt/foundation/export.h", "#include <kvt/foundation/export.h>",
     "kvt/foundation/export.h:1:"},
    {__LINE__, noCycles, "kvt/foundation/export.h", "\n#include <kvt/foundation/vector.h>",
     "kvt/foundation/memory.h:1:"},
    {__LINE__, foldersKnowOnlyTheirNeighbours, "kvt/regex/a.h", "#include <kvt/string/ustring.h>", ""},
    {__LINE__, foldersKnowOnlyTheirNeighbours, "kvt/string/a.cpp", "#include <kvt/regex/uregex.h>",
     "kvt/string/a.cpp:1:"},
    {__LINE__, foldersKnowOnlyTheirNeighbours, "kvt/datetime/a.cpp", "#include <kvt/regex/uregex.h>",
     "kvt/datetime/a.cpp:1:"},
    {__LINE__, foldersKnowOnlyTheirNeighbours, "kvt/mmap/a.h", "#include <kvt/foundation/pimpl.h>", ""},
    {__LINE__, foldersKnowOnlyTheirNeighbours, "kvt/mmap/a.h", "#include <kvt/foundation/throwable.h>",
     "kvt/mmap/a.h:1:"},
    {__LINE__, foldersKnowOnlyTheirNeighbours, "kvt/legacy/a.h", "#include <kvt/foundation/export.h>", ""},
    {__LINE__, foldersKnowOnlyTheirNeighbours, "kvt/legacy/a.h", "#include <kvt/foundation/vector.h>",
     "kvt/legacy/a.h:1:"},
    {__LINE__, foldersKnowOnlyTheirNeighbours, "kvt/other/a.h", "#include <kvt/foundation/export.h>",
     "kvt/other/a.h:1:"},
    {__LINE__, foldersKnowOnlyTheirNeighbours, "kvt/string/a.cpp", "#include <kvt/kvt.h>",
     "kvt/string/a.cpp:1:"},
    {__LINE__, memoryKnowsNoString, "kvt/foundation/vector.h", "#include <string>", ""},
    {__LINE__, memoryKnowsNoString, "kvt/foundation/pimpl.h", "#include <string_view>",
     "kvt/foundation/pimpl.h:1:"},
    {__LINE__, memoryKnowsNoString, "kvt/foundation/export.h", "#include <kvt/encoding/encoding.h>",
     "kvt/foundation/export.h:1:"},
    {__LINE__, publicHeadersStandAlone, "kvt/string/a.cpp", "#include <unicode/ucnv.h>", ""},
    {__LINE__, publicHeadersStandAlone, "kvt/string/ustring.h", "#include <unicode/ucnv.h>",
     "kvt/string/ustring.h:1:"},
    {__LINE__, publicHeadersStandAlone, "kvt/string/ustring.h", "#include <kvt/string/detail/search.h>",
     "kvt/string/ustring.h:1:"},
    {__LINE__, publicHeadersStandAlone, "kvt/string/ustring.h", "#include <boost/regex.hpp>",
     "kvt/string/ustring.h:1:"},
    {__LINE__, publicHeadersStandAlone, "kvt/string/ustring_fmt.h", "#include <fmt/format.h>", ""},
    {__LINE__, publicHeadersStandAlone, "kvt/string/ustring.h", "#include <fmt/format.h>",
     "kvt/string/ustring.h:1:"},
    {__LINE__, publicHeadersStandAlone, "kvt/string/ustring.h", "#include <kvt/string/ustring_fmt.h>",
     "kvt/string/ustring.h:1:"},
    {__LINE__, publicHeadersStandAlone, "kvt/string/ustring_fmt.h", "#include <unicode/ucnv.h>",
     "kvt/string/ustring_fmt.h:1:"},
    {__LINE__, everyHeaderIsPublicOrPrivate, "kvt/string/detail/more.h", "", ""},
    {__LINE__, everyHeaderIsPublicOrPrivate, "kvt/string/more.h", "", "kvt/string/more.h:1:"},
    {__LINE__, everyHeaderIsPublicOrPrivate, "kvt/kvt.h",
     "#include <kvt/foundation/export.h>\n#include <kvt/foundation/memory.h>\n#include "
     "<kvt/foundation/pimpl.h>\n"
     "#include <kvt/foundation/vector.h>\n",
     "kvt/kvt.h:1: does not include kvt/string/ustring.h"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/encoding/icu.cpp", "#include <unicode/ucnv.h>", ""},
    {__LINE__, outsideIsBehindItsDoor, "kvt/encoding/encoding.cpp", "#include <unicode/ucnv.h>",
     "kvt/encoding/encoding.cpp:1:"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/encoding/unicode_convert.cpp", "#include <hwy/highway.h>", ""},
    {__LINE__, outsideIsBehindItsDoor, "kvt/encoding/shortcut.cpp", "#include <hwy/highway.h>",
     "kvt/encoding/shortcut.cpp:1:"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/platform/code_page.cpp", "#include <langinfo.h>", ""},
    {__LINE__, outsideIsBehindItsDoor, "kvt/foundation/throwable.cpp", "\n\n#include <cxxabi.h>",
     "kvt/foundation/throwable.cpp:3:"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/mmap/a.cpp", "#include <sys/mman.h>", "kvt/mmap/a.cpp:1:"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/legacy/a.cpp",
     "#include <boost/date_time/gregorian/gregorian.hpp>", ""},
    {__LINE__, outsideIsBehindItsDoor, "kvt/datetime/a.cpp",
     "#include <boost/date_time/gregorian/gregorian.hpp>", "kvt/datetime/a.cpp:1:"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/datetime/calendar.cpp", "#include <date/date.h>", ""},
    {__LINE__, outsideIsBehindItsDoor, "kvt/datetime/a.cpp", "#include <date/date.h>",
     "kvt/datetime/a.cpp:1:"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/regex/detail/engine.h", "#include <boost/regex.hpp>", ""},
    {__LINE__, outsideIsBehindItsDoor, "kvt/regex/a.cpp", "#include <boost/regex.hpp>", "kvt/regex/a.cpp:1:"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/string/a.cpp", "#include <boost/regex.hpp>",
     "kvt/string/a.cpp:1:"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/mmap/a.h", "#include <boost/interprocess/offset_ptr.hpp>", ""},
    {__LINE__, outsideIsBehindItsDoor, "kvt/string/a.h", "#include <boost/container/deque.hpp>",
     "kvt/string/a.h:1:"},
    {__LINE__, outsideIsBehindItsDoor, "kvt/datetime/a.cpp", "#include <boost/multiprecision/cpp_int.hpp>",
     "kvt/datetime/a.cpp:1:"},
    {__LINE__, outsideIsBehindItsDoor, "tools/kvt/cli/syntax.cpp", "#include <CLI/CLI.hpp>", ""},
    {__LINE__, outsideIsBehindItsDoor, "tools/kvt/sort/a.cpp", "#include <CLI/CLI.hpp>",
     "tools/kvt/sort/a.cpp:1:"},
    {__LINE__, outsideIsBehindItsDoor, "tools/kvt/sort/a.cpp", "#include <unistd.h>", ""},
    {__LINE__, outsideIsBehindItsDoor, "tools/kvt/text/unicode_pattern.cpp", "#include <unicode/uregex.h>",
     ""},
    {__LINE__, outsideIsBehindItsDoor, "tools/kvt/sort/a.cpp", "#include <unicode/uregex.h>",
     "tools/kvt/sort/a.cpp:1:"},
    {__LINE__, toolsUsePublicHeaders, "tools/kvt/main.cpp", "#include <kvt/string/ustring.h>", ""},
    {__LINE__, toolsUsePublicHeaders, "tools/kvt/main.cpp", "#include <kvt/platform/code_page.h>",
     "tools/kvt/main.cpp:1:"},
    {__LINE__, roomsKnowOnlyTheirNeighbours, "tools/kvt/main.cpp", "#include \"sort/chunk.h\"", ""},
    {__LINE__, roomsKnowOnlyTheirNeighbours, "tools/kvt/sort/a.cpp", "#include \"sort/chunk.h\"", ""},
    {__LINE__, roomsKnowOnlyTheirNeighbours, "tools/kvt/sort/a.cpp", "#include \"cli/options.h\"", ""},
    {__LINE__, roomsKnowOnlyTheirNeighbours, "tools/kvt/sort/a.cpp", "#include \"chunk.h\"",
     "tools/kvt/sort/a.cpp:1: includes chunk.h: there is no such file"},
    {__LINE__, roomsKnowOnlyTheirNeighbours, "tools/kvt/base/a.cpp", "\n#include \"cli/options.h\"",
     "tools/kvt/base/a.cpp:2: includes cli/options.h: not for the room base/"},
    {__LINE__, roomsKnowOnlyTheirNeighbours, "tools/kvt/convert/a.cpp", "#include \"sort/chunk.h\"",
     "tools/kvt/convert/a.cpp:1:"},
    {__LINE__, roomsKnowOnlyTheirNeighbours, "tools/kvt/attic/a.cpp", "#include \"base/text.h\"",
     "tools/kvt/attic/a.cpp:1: includes base/text.h: nothing is settled for the room attic/"},
    {__LINE__, noCycles, "tools/kvt/base/text.h", "#include \"cli/options.h\"", "tools/kvt/cli/options.h:1:"},
};

INSTANTIATE_TEST_SUITE_P(Includes, PlantedOffence, testing::ValuesIn(plantedRows));

} // namespace
} // namespace house
