// Inputs that were made to do harm: each costs bounded memory and time. The limits are those that docs/trust.md states.

#include "host_test.h"

#include <support/trust_page.h>

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <memory>

namespace kvt::test {

namespace {

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool isMeasured = false; // a sanitizer has memory of its own, and takes its time
#else
constexpr bool isMeasured = true;
#endif

constexpr std::uint64_t mebibyte = 1024 * 1024;

/// `head`, and then the pattern again and again, `bytes` in all: more than a test could hold.
std::function<std::string_view()> stream(std::string head, const std::string& pattern, std::uint64_t bytes) {
    std::string block;
    while (block.size() < mebibyte / 8) {
        block += pattern;
    }
    const auto left = std::make_shared<std::uint64_t>(bytes);
    const auto first = std::make_shared<std::string>(std::move(head));
    const auto given = std::make_shared<std::string>();
    return [left, first, given, block]() -> std::string_view {
        *given = first->empty() ? block : *first;
        first->clear();
        given->resize(std::min<std::uint64_t>(given->size(), *left));
        *left -= given->size();
        return *given;
    };
}

std::string millionColumns() {
    std::string row;
    for (int column = 0; column < 1000000; ++column) {
        row.append(column == 0 ? "c" : ",c").append(std::to_string(column));
    }
    return row + "\n" + row + "\n";
}

// Characters beyond ASCII, in UTF-16LE.
std::string manyCharacters() {
    std::string text;
    for (unsigned unit = 0x1000; unit < 0xD350; ++unit) {
        text += static_cast<char>(unit & 0xFF);
        text += static_cast<char>(unit >> 8);
    }
    return text;
}

struct Hostile {
    const char* name;
    std::vector<std::string> arguments;
    std::function<std::string_view()> input;
    int status;
    const char* words; ///< on standard error
};

constexpr std::uint64_t fourGibibytes = std::uint64_t{4} << 30;

std::vector<Hostile> hostileInputs() {
    const std::string as = std::string(5000, 'a') + "b\n";
    const std::string nested = std::string(50000, '(') + "a" + std::string(50000, ')');
    const auto text = [](const std::string& all) { return stream(all, "x", all.size()); };
    return {
        {"a quote that never ends, 4 GiB, to translate",
         {"translate"},
         stream("a,b\n1,\"", "x", fourGibibytes),
         2,
         "the quote that opens at byte 6 is not closed within 64 MiB"},
        {"a row that never ends, 4 GiB, to translate",
         {"translate"},
         stream("a,b\n1,", "x", fourGibibytes),
         2,
         "is longer than 64 MiB"},
        {"a line that never ends, 4 GiB, to match",
         {"match", "y"},
         stream("", "x", fourGibibytes),
         2,
         "is longer than 64 MiB"},
        {"a quote that never ends, 4 GiB, to infer",
         {"infer"},
         stream("a,b\n1,\"", "x", fourGibibytes),
         2,
         "is longer than 64 MiB; the quote that opens at byte 6"},
        {"a row that never ends, 4 GiB, to infer",
         {"infer"},
         stream("a,b\n1,", "x", fourGibibytes),
         2,
         "is longer than 64 MiB"},
        {"a million columns, to infer", {"infer", "-o", "out"}, text(millionColumns()), 0, ""},
        {"a row of 60 million cells, to infer",
         {"infer"},
         stream("a,b,", ",", 60'000'000),
         2,
         "row 1 has 59999999 cells; no more than 1000000 columns are looked at"},
        {"a million columns, to translate",
         {"translate", "-o", "out"},
         text(millionColumns()),
         0,
         "1 row read"},
        {"a line of 64 MiB, to sort in 16 MiB",
         {"sort", "--memory", "16M", "-o", "out"},
         stream("", "x", 64 * mebibyte),
         0,
         ""},
        {"a pattern that explodes: (a+)+$", {"match", "(a+)+$"}, text(as), 2, "REGEX gives up"},
        {"the same with --unicode", {"match", "--unicode", "(a+)+$"}, text(as), 2, "REGEX gives up"},
        {"nested repeats: ((a{1,1000}){1,1000}){1,1000}$",
         {"match", "((a{1,1000}){1,1000}){1,1000}$"},
         text(as),
         2,
         "REGEX gives up"},
        {"50,000 groups in one another", {"match", nested}, text(as), 2, "REGEX cannot be compiled"},
        {"the same groups with --unicode",
         {"match", "--unicode", nested},
         text(as),
         2,
         "REGEX cannot be compiled"},
        {"50,000 arrays in one another, as a job",
         {"translate", "--job", "-"},
         text("a=" + std::string(50000, '[') + std::string(50000, ']')),
         2,
         "kvt: "},
        {"a number of 8 MiB",
         {"number", "--file", "-"},
         text(std::string(8 * mebibyte, '9') + "\n"),
         1,
         "kvt: "},
        {"a million <, to wwjd decode",
         {"wwjd", "decode", "-o", "out"},
         text(std::string(1000000, '<')),
         0,
         ""},
        {"a million losses of 50,000 characters, to convert",
         {"convert", "--from", "UTF-16LE", "--to", "US-ASCII", "--on-error", "replace", "-o", "out"},
         stream("", manyCharacters(), 2000000),
         1,
         "losses"},
    };
}

} // namespace

class HostileInput : public HostTest {};

TEST_F(HostileInput, CostsNoMoreThanThePageSays) {
    std::vector<std::string> tried;
    for (const Hostile& hostile : hostileInputs()) {
        SCOPED_TRACE(hostile.name);
        tried.emplace_back(hostile.name);
        std::map<std::string, std::string> limits = trustRow(KVT_SOURCE_DIR, "Hostile inputs", hostile.name);
        ASSERT_FALSE(limits.empty()) << "docs/trust.md has no such row";
        ChildSetup made = setup(hostile.arguments);
        made.makeInput = hostile.input;
        const auto begin = std::chrono::steady_clock::now();
        const ChildResult result = runChild(made);
        const std::chrono::duration<double> taken = std::chrono::steady_clock::now() - begin;
        EXPECT_EQ(result.status, hostile.status) << result.err.substr(0, 300);
        EXPECT_TRUE(contains(result.err, hostile.words)) << result.err.substr(0, 300);
        if (isMeasured) {
            EXPECT_LE(result.mostMemory / mebibyte, std::stoul(limits["MiB at most"]));
            EXPECT_LE(taken.count(), std::stod(limits["seconds at most"]));
        }
    }
    for (const TrustTable& table : readTrustPage(std::string(KVT_SOURCE_DIR) + "/docs/trust.md")) {
        EXPECT_TRUE(table.heading != "Hostile inputs" || table.rows.size() == tried.size());
    }
}

} // namespace kvt::test
