// What a failing operation leaves behind: the string as it was. Memory runs out in two ways: the allocation functions
// of this program fail on demand, at each allocation of an operation in turn, and a child process lives within limits.
#include <support/allocations.h>
#include <support/string_types.h>

#include <kvt/foundation/throwable.h>

#include <sys/resource.h>
#include <sys/time.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <fstream>
#include <functional>
#include <new>
#include <stdexcept>

namespace {

using namespace kvt::test;
using kvt::ex::detail::case_insensitive_t;
using kvt::test::failEachAllocation;
using kvt::test::FailingAllocations;

template <typename Number>
class UStringGuarantee : public StringTest<Number> {
public:
    using Base = StringTest<Number>;
    using typename Base::String;
    using typename Base::Unit;
    using typename Base::Units;
    using typename Base::View;

    struct Edit {
        const char* name;
        std::function<void(String&)> run;
    };

    /// Without a unit of room to spare, so that whatever grows has to allocate.
    static Units longText() {
        Units text;
        while (text.size() < 120) {
            text += Base::units("abcX");
        }
        return text;
    }

    /// Each operation that may allocate. On the text above each of them changes it.
    static std::vector<Edit> edits() {
        static const Units added = longText();
        static const Units piece = Base::units("abc");
        static const Units last = Base::units("cX");
        static const String other = Base::make(longText());
        std::vector<Edit> edits = {
            {"append", [](String& s) { s.append(View(added)); }},
            {"append its own text", [](String& s) { s.append(s.substr(3)); }},
            {"+=", [](String& s) { s += other; }},
            {"+= itself", [](String& s) { s += s; }},
            {"prepend", [](String& s) { s.prepend(View(added)); }},
            {"prepend its own text", [](String& s) { s.prepend(s.substr(3)); }},
            {"insert", [](String& s) { s.insert(7, View(added)); }},
            {"insert its own text", [](String& s) { s.insert(7, s.substr(2)); }},
            {"insert a unit", [](String& s) { s.insert(7, Base::unit('y')); }},
            {"replace", [](String& s) { s.replace(5, 2, View(added)); }},
            {"replace by its own text", [](String& s) { s.replace(5, 2, s.substr(2)); }},
            {"push_back", [](String& s) { s.push_back(Base::unit('y')); }},
            {"resize", [](String& s) { s.resize(500, Base::unit('y')); }},
            {"+", [](String& s) { s = s + other; }},
            {"replaceAll", [](String& s) { s.replaceAll(View(piece), View(added)); }},
            {"replaceAll by nothing", [](String& s) { s.replaceAll(View(piece), {}); }},
            {"replaceAll by its own text", [](String& s) { s.replaceAll(s.substr(1, 1), s.substr(0, 50)); }},
            {"replaceFirst", [](String& s) { s.replaceFirst(View(piece), View(added)); }},
            {"replaceLast", [](String& s) { s.replaceLast(View(last), View(added)); }},
        };
        if constexpr (Base::number != Encoding::Unknown) {
            const case_insensitive_t tag;
            const std::vector<Edit> folding = {
                {"replaceAll, any case", [tag](String& s) { s.replaceAll(View(piece), View(added), tag); }},
                {"replaceAll by its own text, any case",
                 [tag](String& s) { s.replaceAll(s.substr(1, 1), s.substr(0, 50), tag); }},
                {"replaceFirst, any case",
                 [tag](String& s) { s.replaceFirst(View(piece), View(added), tag); }},
                {"replaceLast, any case", [tag](String& s) { s.replaceLast(View(last), View(added), tag); }},
            };
            edits.insert(edits.end(), folding.begin(), folding.end());
        }
        return edits;
    }

    static std::string lengthFailure(const std::function<void()>& action) {
        try {
            action();
        } catch (const std::length_error& failure) {
            return failure.what();
        } catch (const std::bad_alloc&) {
            return "out of memory";
        }
        return "no failure";
    }
};
TYPED_TEST_SUITE(UStringGuarantee, StringTypes, StringTypeNames);

TYPED_TEST(UStringGuarantee, AStringOutlivesAnOutOfMemoryAtEachAllocation) {
    const auto text = this->longText();
    for (const auto& edit : this->edits()) {
        SCOPED_TRACE(edit.name);
        auto expected = this->make(text);
        edit.run(expected); // also opens the converters, which are not part of the operation
        EXPECT_NE(shown(this->textOf(expected)), shown(text));

        auto string = this->make(text);
        const std::size_t failures = failEachAllocation([&] { edit.run(string); },
                                                        [&](std::size_t) { this->expectText(string, text); });
        EXPECT_GT(failures, 0u) << "nothing was allocated";
        this->expectText(string, this->textOf(expected));
    }
}

TYPED_TEST(UStringGuarantee, AddingLeavesBothSidesWhenMemoryRunsOut) {
    const auto left = this->make(this->longText());
    const auto right = this->make("abc");
    std::size_t sum = 0;
    EXPECT_GT(failEachAllocation([&] { sum = (left + right).size(); }, [](std::size_t) {}), 0u);
    EXPECT_EQ(sum, left.size() + right.size());
    this->expectText(left, this->longText());
    this->expectText(right, "abc");
}

TYPED_TEST(UStringGuarantee, WhatDoesNotGrowNeedsNoMemory) {
    using Tested = typename TestFixture::String;
    const auto text = this->longText();
    const auto set = this->set("ab");
    const auto needles = this->array({"cX", "zz"});
    const auto needle = this->make("cXab");
    auto string = this->make(text);
    std::uint64_t found = 0;
    {
        const FailingAllocations none(0);
        found += string.find(needle) + string.rfind(needle) + string.find(set[0]) + string.rfind(set[0]);
        found += string.findFirstOf(set) + string.findLastOf(set);
        found += string.findFirstOf(needles) + string.findLastOf(needles);
        found += string.contains(needle) + string.beginsWith(needle) + string.endsWith(needle);
        found += string.compare(needle) != 0;
        found += string.hash() != 0;
        found += string.substr(3, 5).size();
        string.replaceAll(set[0], TestFixture::unit('m'));
        string.replaceAll(set, TestFixture::unit('n'));
        string.removeAll(TestFixture::unit('m'));
        string.strip(set).rstrip(set);
        string.erase(0, 10);
        string.replace(0, 10, needle);
        string.resize(5);
        string.clear();
        string.push_back(set[0]);
        string.append(needle);
    }
    EXPECT_GT(found, 0u);
    this->expectText(string, "acXab");
    static_assert(noexcept(std::declval<const Tested&>().find(set[0])));
    static_assert(noexcept(std::declval<const Tested&>() == std::declval<const Tested&>()));
}

TYPED_TEST(UStringGuarantee, SearchingWithoutRegardToCaseAllocatesTheTwoCopiesAndNoMore) {
    if constexpr (TestFixture::number <= 2) {
        const auto string = this->make(this->longText());
        const auto needle = this->make(this->longText().substr(40));
        const case_insensitive_t tag;
        std::uint64_t found = string.find(needle, 0, tag);
        EXPECT_EQ(found, 0u);
        EXPECT_EQ(failEachAllocation([&] { found = string.find(needle, 1, tag); }, [](std::size_t) {}), 2u);
        EXPECT_EQ(found, 4u);
        EXPECT_EQ(failEachAllocation([&] { found = string.rfind(needle, npos, tag); }, [](std::size_t) {}),
                  2u);
        EXPECT_EQ(failEachAllocation([&] { string.compare(needle, tag); }, [](std::size_t) {}), 2u);
    }
}

TYPED_TEST(UStringGuarantee, RefusesLengthsBeyondTheLargest) {
    using TestedView = typename TestFixture::View;
    const std::size_t largest = typename TestFixture::Units().max_size();
    const std::string tooLong = "string too long";
    auto string = this->make("abca");
    const auto text = this->units("abca");
    // Their lengths are enough to refuse them: nothing is read.
    const TestedView most(text.data(), largest - 3);
    const TestedView all(text.data(), npos);
    for (const TestedView& view : {most, all}) {
        SCOPED_TRACE(view.size());
        EXPECT_EQ(this->lengthFailure([&] { string.append(view); }), tooLong);
        EXPECT_EQ(this->lengthFailure([&] { string.prepend(view); }), tooLong);
        EXPECT_EQ(this->lengthFailure([&] { string.insert(2, view); }), tooLong);
        EXPECT_EQ(this->lengthFailure([&] { string.replace(4, 1, view); }), tooLong);
    }
    EXPECT_EQ(this->lengthFailure([&] { string.replace(1, 3, all); }), tooLong);
    EXPECT_EQ(this->lengthFailure([&] { string.resize(largest + 1); }), tooLong);
    EXPECT_EQ(this->lengthFailure([&] { string.resize(npos); }), tooLong);
    // One unit goes, three stay, and two less than the largest number come: one too many.
    const TestedView almost(text.data(), largest - 2);
    const auto replaces = [&](auto tag) {
        const auto a = this->make("a");
        const auto b = this->make("b");
        EXPECT_EQ(this->lengthFailure([&] { string.replaceAll(b, almost, tag); }), tooLong);
        EXPECT_EQ(this->lengthFailure([&] { string.replaceAll(a, almost, tag); }), tooLong);
        EXPECT_EQ(this->lengthFailure([&] { string.replaceFirst(a, almost, tag); }), tooLong);
        EXPECT_EQ(this->lengthFailure([&] { string.replaceLast(a, almost, tag); }), tooLong);
    };
    replaces(TestFixture::String::case_sensitive);
    if constexpr (TestFixture::number != Encoding::Unknown) {
        replaces(case_insensitive_t());
    }
    this->expectText(string, "abca");
    // A wrong position is found before the length.
    EXPECT_THROW(string.insert(5, all), std::out_of_range);
    EXPECT_THROW(string.replace(5, 0, all), std::out_of_range);
    this->expectText(string, "abca");
}

TYPED_TEST(UStringGuarantee, TheLargestLengthItselfIsAMatterOfMemory) {
    const std::size_t largest = typename TestFixture::Units().max_size();
    auto string = this->make("abca");
    EXPECT_EQ(this->lengthFailure([&] { string.resize(largest); }), "out of memory");
    const auto text = this->units("abca");
    const typename TestFixture::View most(text.data(), largest - 4);
    EXPECT_EQ(this->lengthFailure([&] { string.append(most); }), "out of memory");
    EXPECT_EQ(this->lengthFailure([&] {
        string.replace(2, 2, {text.data(), largest - 2});
    }),
              "out of memory");
    this->expectText(string, "abca");
}

// Nothing protects a caller from an empty text to be replaced: it is found in front of what follows, for ever. With
// something to put in, memory ends that.
TYPED_TEST(UStringGuarantee, ReplacingAllOfAnEmptyTextEndsWithTheMemory) {
    const auto check = [this](auto tag) {
        auto string = this->make("abc");
        const auto to = this->make("xyz");
        EXPECT_THROW(
            {
                const FailingAllocations later(12);
                string.replaceAll(typename TestFixture::View(), to, tag);
            },
            std::bad_alloc);
        this->expectText(string, "abc");
    };
    check(TestFixture::String::case_sensitive);
    if constexpr (TestFixture::number != Encoding::Unknown) {
        check(case_insensitive_t());
    }
}

// With nothing to put in, nothing ends it.
template <typename Number>
class UStringGuaranteeDeathTest : public UStringGuarantee<Number> {
public:
    /// Runs the replacement that has no end until a signal kills the process.
    template <typename Tag>
    [[noreturn]] static void replaceForEver(Tag tag) {
        auto string = StringTest<Number>::make("abc");
        const itimerval soon{{0, 0}, {0, 100'000}};
        setitimer(ITIMER_REAL, &soon, nullptr);
        string.replaceAll(typename StringTest<Number>::View(), {}, tag);
        std::_Exit(1);
    }
};
TYPED_TEST_SUITE(UStringGuaranteeDeathTest, StringTypes, StringTypeNames);

TYPED_TEST(UStringGuaranteeDeathTest, ReplacingAllOfAnEmptyTextByNothingDoesNotEnd) {
    EXPECT_EXIT(this->replaceForEver(TestFixture::String::case_sensitive), testing::KilledBySignal(SIGALRM),
                "");
    if constexpr (TestFixture::number != Encoding::Unknown) {
        EXPECT_EXIT(this->replaceForEver(case_insensitive_t()), testing::KilledBySignal(SIGALRM), "");
    }
}

// A limit on the address space cannot be had where a sanitizer reserves most of it for itself; the failing allocation
// functions above stand in for it there.
#if !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__)

constexpr std::size_t mebibyte = std::size_t{1} << 20;

/// Leaves this process so many bytes of address space beyond what it has.
void leaveMemory(std::size_t bytes) {
    std::size_t pages = 0;
    std::ifstream("/proc/self/statm") >> pages;
    const rlim_t limit = pages * static_cast<std::size_t>(sysconf(_SC_PAGESIZE)) + bytes;
    const rlimit both{limit, limit};
    if (setrlimit(RLIMIT_AS, &both) != 0) {
        std::_Exit(2);
    }
}

/// Ends the process: with 0 when `action` ran out of memory and left the string.
template <typename String, typename Action>
[[noreturn]] void expectOutOfMemory(String& string, Action action) {
    const auto first = string[0];
    const auto last = string.back();
    const std::size_t size = string.size();
    const std::uint64_t hash = string.hash();
    try {
        action();
    } catch (const std::bad_alloc&) {
        const bool same =
            string.size() == size && string.hash() == hash && string[0] == first && string.back() == last;
        std::_Exit(same ? 0 : 3);
    }
    std::_Exit(4);
}

TYPED_TEST(UStringGuaranteeDeathTest, ReplacingAllOfAnEmptyTextUsesUpALimitedProcess) {
    const auto inChild = [this] {
        auto string = this->make(this->longText());
        const auto to = this->make(typename TestFixture::Units(10'000, TestFixture::unit('x')));
        leaveMemory(64 * mebibyte);
        expectOutOfMemory(string, [&] { string.replaceAll(typename TestFixture::View(), to); });
    };
    EXPECT_EXIT(inChild(), testing::ExitedWithCode(0), "");
}

TYPED_TEST(UStringGuaranteeDeathTest, EditsLeaveAStringForWhichALimitedProcessHasNoRoom) {
    const std::size_t size = 20 * mebibyte / sizeof(typename TestFixture::Unit);
    const auto inChild = [&](auto edit) {
        auto string = this->make(typename TestFixture::Units(size, TestFixture::unit('m')));
        leaveMemory(16 * mebibyte);
        expectOutOfMemory(string, [&] { edit(string); });
    };
    using Tested = typename TestFixture::String;
    const auto m = TestFixture::unit('m');
    EXPECT_EXIT(inChild([](Tested& s) { s.append(s.substr(1)); }), testing::ExitedWithCode(0), "");
    EXPECT_EXIT(inChild([](Tested& s) { s.prepend(s); }), testing::ExitedWithCode(0), "");
    EXPECT_EXIT(inChild([&](Tested& s) { s.push_back(m); }), testing::ExitedWithCode(0), "");
    EXPECT_EXIT(inChild([&](Tested& s) { s.insert(5, m); }), testing::ExitedWithCode(0), "");
    EXPECT_EXIT(inChild([&](Tested& s) { s.replace(5, 1, s.substr(0, 2)); }), testing::ExitedWithCode(0), "");
    EXPECT_EXIT(inChild([&](Tested& s) { s.resize(2 * s.size()); }), testing::ExitedWithCode(0), "");
    EXPECT_EXIT(inChild([](Tested& s) { s.replaceAll(s.substr(0, 1), s.substr(0, 3)); }),
                testing::ExitedWithCode(0), "");
    EXPECT_EXIT(inChild([](Tested& s) { s.replaceLast(s.substr(0, 1), s.substr(0, 3)); }),
                testing::ExitedWithCode(0), "");
    EXPECT_EXIT(inChild([](Tested& s) { static_cast<void>(s + s); }), testing::ExitedWithCode(0), "");
}

#endif

} // namespace
