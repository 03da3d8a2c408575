// The library beside the engine used directly: thousands of generated patterns, right and wrong ones, on generated
// subjects, from every start. Success, groups, positions and failures have to be the same.
//
// Patterns are put together from a small grammar, so that most of them mean something; then some are damaged, so that
// there is a wide choice of failures.
#include "regex_support.h"

#include <gtest/gtest.h>

#include <map>
#include <optional>
#include <random>

namespace kvt::test {
namespace {

using ex::URegex;

class Generator {
public:
    explicit Generator(std::uint64_t seed) : random_(seed) {}

    std::size_t below(std::size_t count) { return random_() % count; }

    std::string pattern() {
        std::string text = alternatives(2);
        for (std::size_t damage = below(5) == 0 ? 1 + below(2) : 0; damage > 0; --damage) {
            const std::size_t at = below(text.size() + 1);
            if (below(2) == 0) {
                text.insert(at, 1, "()[]{}*+?|\\^$-:<=!9\0\xff"[below(21)]);
            } else {
                text.erase(at, 1 + below(2));
            }
        }
        return text;
    }

    std::string legacyPattern() {
        std::string text;
        for (std::size_t i = below(8); i > 0; --i) {
            text += pick({"a", "b", "(", ")", "{", "}", "|", "$", "\\", ".", "*", "?", "[ab]", "^", "\\d",
                          "1", "[", "\\\\"});
        }
        return text;
    }

    std::string subject() {
        std::string text;
        for (std::size_t i = below(10); i > 0; --i) {
            text += pick(
                {"a", "a", "b", "b", "c", " ", "\n", "1", "ab", "\u00e9", "\xc3", "(", "|", "$", "{", "\\"});
        }
        if (below(20) == 0) {
            text += '\0';
        }
        return text;
    }

private:
    std::string pick(std::initializer_list<const char*> choices) {
        return choices.begin()[below(choices.size())];
    }

    std::string alternatives(int depth) {
        std::string text = sequence(depth);
        while (below(4) == 0) {
            text += "|" + sequence(depth);
        }
        return text;
    }

    std::string sequence(int depth) {
        std::string text;
        for (std::size_t i = below(4); i > 0; --i) {
            text += atom(depth) + repeat();
        }
        return text;
    }

    std::string atom(int depth) {
        if (depth > 0 && below(3) == 0) {
            return pick({"(", "(", "(", "(?:", "(?=", "(?!", "(?>", "(?i:", "(?<n>"}) +
                   alternatives(depth - 1) + ")";
        }
        return pick(
            {"a",     "a",    "b",      "b",        "c",          "1",           "\u00e9",       ".",
             "^",     "$",    "\\b",    "\\B",      "\\w",        "\\W",         "\\d",          "\\s",
             "[ab]",  "[^a]", "[a-c1]", "[\u00e9]", "\\1",        "\\2",         "\\A",          "\\z",
             "\\x61", "\\n",  "(?<=a)", "(?<!b)",   "\\K",        "[[:alpha:]]", "\\Qa.\\E",     "\\N",
             "\\h",   "\\R",  "\\<",    "(?#x)",    "\\p{digit}", "(?1)",        "[[:space:]b]", "\\$"});
    }

    std::string repeat() {
        return below(2) == 0
                   ? ""
                   : pick({"*", "+", "?", "*?", "+?", "??", "{2}", "{1,2}", "{0,}", "{1,3}?", "*+", "?+"});
    }

    std::mt19937_64 random_;
};

// What came out, so that it shows whether there was something to compare.
struct Tally {
    std::size_t compiled = 0;
    std::size_t refused = 0;
    std::size_t matches = 0;
    std::size_t misses = 0;
    std::size_t withUnusedGroup = 0;
    std::map<int, std::size_t> errors;

    void add(const Found& found) {
        ++(found.groups.empty() ? misses : matches);
        for (const Span& group : found.groups) {
            if (group.second == 0 && group.first + 1 <= 1) {
                ++withUnusedGroup;
                break;
            }
        }
    }
};

// Nothing matches in what is passed over, nor in a part of it.
template <std::uint32_t N>
void comparePlaces(const ex::URegex<N>& regex, const boost::regex& engine, const std::string& subject) {
    bool matches = false;
    const EngineError error =
        errorOf([&] { matches = regex.matchesIn(ex::UStringView<N>(subject.data(), subject.size())); });
    const Found found = searchedByEngine(engine, subject, 0);
    ASSERT_EQ(error, found.error);
    ASSERT_EQ(matches, !found.groups.empty());
    std::uint64_t last = 0;
    for (std::size_t start = 0; start <= subject.size(); ++start) {
        const std::uint64_t place = regex.passOver(ex::UStringView<N>(subject.data(), subject.size()), start);
        ASSERT_GE(place, start);
        ASSERT_GE(place, last);
        ASSERT_LE(place, subject.size());
        const std::size_t end = start % 2 == 0 ? place : start + (place - start) / 2;
        if (place > start) {
            ASSERT_EQ(searchedByEngine(engine, subject.substr(0, end), start), Found())
                << "from " << start << " to " << end << " of " << place;
        }
        last = place;
    }
}

template <std::uint32_t N>
void compare(const std::string& pattern, const std::vector<std::string>& subjects, Tally& tally) {
    ex::URegex<N> regex;
    boost::regex engine;
    const EngineError error = errorOf([&] { engine = boost::regex(pattern); });
    ASSERT_EQ(errorOf([&] { regex = ex::URegex<N>(units<N>(pattern)); }), error);
    if (error.code != -1) {
        ++tally.refused;
        ++tally.errors[error.code];
        return;
    }
    ++tally.compiled;
    for (const std::string& subject : subjects) {
        SCOPED_TRACE("subject " + testing::PrintToString(subject));
        const Found whole = matchedByEngine(engine, subject);
        ASSERT_EQ(matchedBy(regex, subject), whole);
        tally.add(whole);
        for (std::size_t start = 0; start <= subject.size(); ++start) {
            const Found found = searchedByEngine(engine, subject, start);
            ASSERT_EQ(searchedBy(regex, subject, start), found) << "from " << start;
            tally.add(found);
        }
        comparePlaces(regex, engine, subject);
        // The engine's own iterator stays for ever where a match ends before it begins.
        if (pattern.find("\\K") == std::string::npos) {
            ASSERT_EQ(allFoundBy(regex, subject), allFoundByEngine(engine, subject));
        } else {
            ASSERT_LE(allFoundBy(regex, subject).matches.size(), 2 * subject.size() + 1);
        }
    }
}

TEST(RegexDifferential, URegexDoesWhatTheEngineDoes) {
    Generator generate(5101);
    Tally tally;
    for (int round = 0; round < 6000; ++round) {
        const std::string pattern = generate.pattern();
        std::vector<std::string> subjects;
        for (int i = 0; i < 5; ++i) {
            subjects.push_back(generate.subject());
        }
        SCOPED_TRACE("round " + std::to_string(round) + ", pattern " + testing::PrintToString(pattern));
        switch (round % 3) {
        case 0:
            compare<0>(pattern, subjects, tally);
            break;
        case 1:
            compare<1>(pattern, subjects, tally);
            break;
        default:
            compare<28>(pattern, subjects, tally);
            break;
        }
        if (HasFatalFailure()) {
            return;
        }
    }
    EXPECT_GT(tally.compiled, 3000u);
    EXPECT_GT(tally.refused, 500u);
    EXPECT_GE(tally.errors.size(), 6u);
    EXPECT_GT(tally.matches, 20000u);
    EXPECT_GT(tally.misses, 20000u);
    EXPECT_GT(tally.withUnusedGroup, 500u);
}

// ---- Patterns that begin with what can be scanned for

// A beginning of fixed width, and a text that is made of it, of parts of it and of other things.
struct Prefixed {
    std::string pattern;
    std::vector<std::string> pieces;
};

const std::vector<Prefixed> prefixes = {
    {"\\d{4}-\\d\\d-\\d\\d", {"2020-01-31", "2020-01-3", "020-01-31", "-", "2020-", "1"}},
    {"(\\d{2}):(\\d\\d)", {"12:34", "1:34", "12:", ":", "12 34"}},
    {"ERROR", {"ERROR", "ERRO", "RROR", "error", "E"}},
    {"(?:ERR(OR))", {"ERROR", "ERROr", "OR"}},
    {"\\[[A-Z]{3}\\]", {"[ABC]", "[AB]", "[", "]", "ABC]"}},
    {"x.y", {"xay", "x\ny", "xy", "xx", "yy"}},
    {"\u00e9[\x80-\xbf]z", {"\u00e9\x80z", "\u00e9z", "\xc3", "z"}},
    {"[^a-y ]{3}", {"Z:1", "zzz", "z z", "a"}},
    {"q[[:alpha:]]\\w{2,4}", {"qab1", "qabcdef", "q1", "qa"}},
    {"[[:xdigit:]]{8}", {"9f3c0a1b", "9f3c0a1", "g"}},
    {"\\Qa.b\\E", {"a.b", "axb", "."}},
    // As long as a beginning may be, and longer.
    {"abcdefghijklmno[0-9]", {"abcdefghijklmno1", "abcdefghijklmno", "abcdefghijklmnop", "1"}},
    {"abcdefghijklmno[0-9]{2}", {"abcdefghijklmno12", "abcdefghijklmno1", "abcdefghijklmno1x", "2"}},
    // Beginnings that begin with a run.
    {"\\d+-", {"12-", "1-", "-", "123", "1-2-", "0"}},
    {"(\\d{2,})-(\\d+)", {"12-3", "1-2", "1-", "-", "123", "12--"}},
    {"(?:(\\w+)@)x", {"ab@x", "a@", "@x", "ab", "a@x@x", "x"}},
    {"z+y", {"zzy", "zy", "z", "y", "zzz"}},
    {"[[:upper:]]+\\[", {"AB[", "A[", "[", "AB", "a["}},
    {"\\d+?-", {"12-", "1-", "-"}},
    {"\\d+\\w", {"12a", "1", "1-"}},
    {"\\d++-", {"12-", "1-", "-", "12"}},
    // Alternatives, of which each place has the bytes of all.
    {"(?:open|activ)ed?", {"open", "opened", "active", "oped", "activ", "acten", "o"}},
    {"(ERROR|WARN|FATAL): ", {"ERROR: ", "WARN: ", "FATAL: ", "WARNR: ", "ERR", "WARN", ":"}},
    {"[0-3]?\\d(\\.|/)Z", {"31.Z", "3/Z", "31", ".Z", "/", "Z"}},
    {"(?:x(?:y|[0-4])|z\\d)q", {"xyq", "x0q", "z9q", "xq", "zyq", "x9q", "q"}},
    {"(?:Zab|)Q", {"ZabQ", "Q", "Zab", "abQ"}},
    {"\\d+(?:-|:)\\d", {"12-3", "1:2", "12", "-3", "1-:2", ":"}},
    {"(?:\\d+-|Q)x", {"12-x", "Qx", "1-", "-x", "12", "Q"}},
    // What takes no byte, before and within it.
    {"^\\d{4}-\\d", {"2020-0", "\n2020-0", "020-0", "\r\n2020-1", "2020", "\f"}},
    {"\\b[A-Z]{3}\\b", {"ABC", "ABCD", "AB", " ABC ", "A", "_ABC"}},
    {"\\b\\d+-", {"12-", "a12-", " 12-", "1-2-", "12"}},
    {"\\b[0-9 ]+-Q", {"12-Q", "a 12-Q", "1 2-Q", "a12-Q", " -Q", "a-Q"}},
    {"\\B[0-9 ]+-Q", {"12-Q", "a 12-Q", "1 2-Q", "a12-Q", " -Q", "a-Q"}},
    {"\\<\\w+\\>@", {"ab@", "@", "a@@", "a b@", "-"}},
    {"(?:^|, )Z\\d", {"Z1", ", Z1", "\nZ2", ",Z1", "Z", ", "}},
};

TEST(RegexDifferential, APatternWithAFixedBeginningIsFoundWhereTheEngineFindsIt) {
    Generator generate(5301);
    Tally tally;
    const std::vector<std::string> others = {
        " ", "\n", "a", "b", "1", "lorem ipsum dolor ", std::string(1, '\0'), "0"};
    for (int round = 0; round < 4000; ++round) {
        const Prefixed& prefix = prefixes[generate.below(prefixes.size())];
        const std::string pattern = prefix.pattern + (round % 4 == 0 ? "" : generate.pattern());
        std::vector<std::string> subjects;
        for (int i = 0; i < 3; ++i) {
            std::string subject;
            for (std::size_t piece = generate.below(30); piece > 0; --piece) {
                subject += generate.below(3) == 0 ? prefix.pieces[generate.below(prefix.pieces.size())]
                                                  : others[generate.below(others.size())];
            }
            subjects.push_back(subject.substr(0, 90));
        }
        SCOPED_TRACE("round " + std::to_string(round) + ", pattern " + testing::PrintToString(pattern));
        compare<0>(pattern, subjects, tally);
        if (HasFatalFailure()) {
            return;
        }
    }
    EXPECT_GT(tally.compiled, 2500u);
    EXPECT_GT(tally.matches, 20000u);
    EXPECT_GT(tally.misses, 20000u);
}

// The engine counts its steps over all places of a search. Where that makes it give up, passing over places must not
// help.
TEST(RegexDifferential, GivingUpIsNotPassedOver) {
    std::size_t givenUp = 0;
    std::size_t ended = 0;
    for (const char* pattern :
         {"ab.*x", "ab.*.*x", "ab.*.*.*x", "ab[ab]*[ab]*x", "(ab)\\w+\\s?\\w+(x|y)",
          "abab.{0,9}.{0,9}.{0,9}x", "ab(a|b|ab).*(a|b|ba)x", "ab.*$x", "a+b.*.*x", "a+b[ab]*[ab]*x",
          "(a+)b.*.*.*x", "(?:ab|ba).*.*x", "^ab.*.*x", "\\bab.*.*.*x", "(?:a(?:b|c)|ba)[ab]*[ab]*x"}) {
        const boost::regex engine(pattern);
        const URegex<0> regex(pattern);
        for (std::size_t count = 1; count < 700; count += 1 + count / 5) {
            for (const char* filler : {"ab", "ab...................", "ab  c"}) {
                std::string subject;
                for (std::size_t i = 0; i < count && subject.size() < 1200; ++i) {
                    subject += filler;
                }
                const Found found = searchedByEngine(engine, subject, 0);
                ASSERT_EQ(searchedBy(regex, subject, 0), found) << pattern << " on " << subject;
                ++(found.error.code == -1 ? ended : givenUp);
            }
        }
    }
    EXPECT_GT(givenUp, 20u);
    EXPECT_GT(ended, 100u);
}

TEST(RegexDifferential, LongTextsWithRareBeginnings) {
    Generator generate(5401);
    std::size_t found = 0;
    for (const Prefixed& prefix : prefixes) {
        for (const char* rest : {"", ".*z", "\\b", "$", "\\s(\\w+)?", "(?=a)a"}) {
            const boost::regex engine(prefix.pattern + rest);
            const URegex<0> regex(units<0>(prefix.pattern + rest));
            for (int round = 0; round < 5; ++round) {
                std::string subject;
                while (subject.size() < 3000) {
                    subject += generate.below(40) == 0 ? prefix.pieces[generate.below(prefix.pieces.size())]
                                                       : "lorem ";
                }
                const std::uint64_t start = generate.below(100);
                const Found expected = searchedByEngine(engine, subject, start);
                ASSERT_EQ(searchedBy(regex, subject, start), expected) << prefix.pattern << rest;
                found += expected.groups.empty() ? 0 : 1;
            }
        }
    }
    EXPECT_GT(found, 50u);
}

// ---- The old dialect

// Position and length, or the failure, as the engine gives them for the pattern translated by hand.
std::pair<Span, EngineError> indexedByEngine(const boost::regex& engine, std::string_view text,
                                             std::uint64_t start) {
    if (start >= text.size()) {
        return {{none, 0}, {}};
    }
    const Found found = searchedByEngine(engine, text, start);
    return {found.groups.empty() ? Span{none, 0} : found.groups[0], found.error};
}

void compareLegacy(const std::string& pattern, const std::vector<std::string>& texts, Tally& tally) {
    boost::regex engine;
    std::optional<ObsoleteRegexp> regexp;
    const EngineError error = errorOf([&] { engine = boost::regex(perlByHand(pattern)); });
    ASSERT_EQ(errorOf([&] { regexp.emplace(pattern.data(), pattern.size()); }), error);
    if (error.code != -1) {
        ++tally.refused;
        ++tally.errors[error.code];
        return;
    }
    ++tally.compiled;
    for (const std::string& text : texts) {
        for (std::size_t start = 0; start <= text.size() + 1; ++start) {
            const auto [expected, failure] = indexedByEngine(engine, text, start);
            Span found{none, 0};
            ASSERT_EQ(errorOf([&] { found = indexedBy(*regexp, text, start); }), failure);
            ASSERT_EQ(found, expected) << "text " << testing::PrintToString(text) << " from " << start;
            ++(expected.first == none ? tally.misses : tally.matches);
        }
    }
}

TEST(RegexDifferential, ObsoleteRegexpDoesWhatTheEngineDoesWithTheTranslation) {
    Generator generate(5201);
    Tally tally;
    for (int round = 0; round < 6000; ++round) {
        const std::string pattern = generate.legacyPattern();
        SCOPED_TRACE("round " + std::to_string(round) + ", pattern " + testing::PrintToString(pattern));
        compareLegacy(pattern, {generate.subject(), generate.subject(), generate.subject()}, tally);
        if (HasFatalFailure()) {
            return;
        }
    }
    EXPECT_GT(tally.compiled, 3000u);
    EXPECT_GT(tally.refused, 500u);
    EXPECT_GE(tally.errors.size(), 3u);
    EXPECT_GT(tally.matches, 5000u);
    EXPECT_GT(tally.misses, 5000u);
}

TEST(RegexDifferential, AllShortLegacyPatternsMeanTheirTranslation) {
    const std::vector<std::string> texts = {"a",    "{}()|$\\", "a\\",  "$a$",   "(a)", "\\|a", "a|$",
                                            "{a}{", "))",       "\\\\", "$$a\n", "|a|", "a{a}"};
    Tally tally;
    forEachShortText("{}()|$\\a*[]", 3, [&](const std::string& pattern) {
        if (!testing::Test::HasFatalFailure()) {
            SCOPED_TRACE("pattern " + pattern);
            compareLegacy(pattern, texts, tally);
        }
    });
    EXPECT_EQ(tally.compiled + tally.refused, 1464u);
    EXPECT_GT(tally.compiled, 700u);
    EXPECT_GT(tally.matches, 2000u);
    EXPECT_GT(tally.misses, 2000u);
}

} // namespace
} // namespace kvt::test
