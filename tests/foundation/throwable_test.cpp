// The list that a failure is: how it is made, added to, copied, read and rendered.
#include "items.h"
#include <support/allocations.h>

#include <kvt/foundation/throwable.h>

#include <gtest/gtest.h>

#include <array>
#include <climits>
#include <exception>
#include <memory>
#include <string>
#include <string_view>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

namespace host::errors {

class OrderFailure : public kvt::ex::Exception {
public:
    using Exception::Exception;
};

template <typename T>
class TypedFailure : public kvt::ex::FatalError {};

} // namespace host::errors

namespace {

using kvt::ex::Exception;
using kvt::ex::FatalError;
using kvt::ex::Throwable;
using kvt::ex::UString;
using kvt::ex::UStringArray;
using kvt::ex::UStringException;
using kvt::test::Items;
using kvt::test::itemsOf;

std::string what(const Throwable& failure) {
    return failure.what().toStdString();
}

std::string className(const Throwable& failure) {
    return failure.className().toStdString();
}

UString<0> bytes(std::string_view text) {
    return UString<0>(text.data(), text.size(), kvt::ex::Encoding::Utf8);
}

template <typename Class>
class EachPlainClass : public testing::Test {};

using PlainClasses = testing::Types<Throwable, Exception, FatalError, UStringException>;
TYPED_TEST_SUITE(EachPlainClass, PlainClasses);

TYPED_TEST(EachPlainClass, HasTheFiveConstructors) {
    EXPECT_EQ(itemsOf(TypeParam()), Items{});
    const UString<0> message("a text");
    EXPECT_EQ(itemsOf(TypeParam(message)), Items{"string a text"});
    EXPECT_EQ(itemsOf(TypeParam(UString<0>("name"), UString<0>("value"))), Items{"pair name|value"});
    EXPECT_EQ(itemsOf(TypeParam(UString<0>("f.cpp"), UString<0>("run"), 12)), Items{"frame f.cpp|run|12"});
    EXPECT_EQ(itemsOf(TypeParam(910002UL, UStringArray<0>{"a", "b"})), Items{"message 910002|a|b"});
}

TYPED_TEST(EachPlainClass, LiteralsChooseTheSameConstructors) {
    EXPECT_EQ(itemsOf(TypeParam("a text")), Items{"string a text"});
    EXPECT_EQ(itemsOf(TypeParam("name", "value")), Items{"pair name|value"});
    EXPECT_EQ(itemsOf(TypeParam("f.cpp", "run", -1)), Items{"frame f.cpp|run|-1"});
    EXPECT_EQ(itemsOf(TypeParam(5, {"a", "b"})), Items{"message 5|a|b"});
    EXPECT_EQ(itemsOf(TypeParam(5, {})), Items{"message 5"});
}

TYPED_TEST(EachPlainClass, CopiesAndMoves) {
    static_assert(std::is_copy_constructible_v<TypeParam> && std::is_copy_assignable_v<TypeParam>);
    static_assert(std::is_nothrow_move_constructible_v<TypeParam> &&
                  std::is_nothrow_move_assignable_v<TypeParam>);
    static_assert(std::has_virtual_destructor_v<TypeParam>);
    static_assert(!std::is_base_of_v<std::exception, TypeParam>);
    // The virtual destructor's table and the implementation.
    static_assert(sizeof(TypeParam) == 2 * sizeof(void*));
    TypeParam original("one");
    TypeParam copy(original);
    copy.addMessageString("two");
    EXPECT_EQ(itemsOf(original), Items{"string one"});
    EXPECT_EQ(itemsOf(copy), (Items{"string one", "string two"}));
    TypeParam moved(std::move(copy));
    EXPECT_EQ(itemsOf(moved), (Items{"string one", "string two"}));
    copy = original; // from moved-from to living again
    EXPECT_EQ(itemsOf(copy), Items{"string one"});
    original = std::move(moved);
    EXPECT_EQ(itemsOf(original), (Items{"string one", "string two"}));
    moved = TypeParam("three");
    EXPECT_EQ(itemsOf(moved), Items{"string three"});
    TypeParam& self = moved;
    moved = self;
    EXPECT_EQ(itemsOf(moved), Items{"string three"});
}

TYPED_TEST(EachPlainClass, IsDestroyedThroughTheRoot) {
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    std::unique_ptr<Throwable> failure =
        std::make_unique<TypeParam>("a message that is too long for the small-string buffer");
    failure.reset();
    EXPECT_EQ(kvt::test::livingBlocks(), before);
}

TEST(ThrowableTree, HasEachClassInItsPlace) {
    using namespace kvt::ex;
    static_assert(std::is_base_of_v<detail::PimplBase<ExceptionImpl>, Throwable>);
    static_assert(std::is_convertible_v<Exception*, Throwable*>);
    static_assert(std::is_convertible_v<FatalError*, Throwable*>);
    static_assert(!std::is_base_of_v<Exception, FatalError>);
    static_assert(std::is_convertible_v<UStringException*, Exception*>);
    static_assert(std::is_convertible_v<UStringBadEncodingException*, UStringException*>);
    static_assert(std::is_convertible_v<UStringTranscodingException*, UStringException*>);
    static_assert(std::is_convertible_v<UStringBinaryTranscodingException*, UStringException*>);
    static_assert(std::is_convertible_v<UStringNotImplementedException*, UStringException*>);
    static_assert(std::is_convertible_v<InvalidEncodingException*, Exception*>);
    static_assert(!std::is_base_of_v<UStringException, InvalidEncodingException>);
    static_assert(std::is_convertible_v<PythonVersionError*, FatalError*>);
    SUCCEED();
}

TEST(ThrowableClassName, IsTheQualifiedNameOfTheRunTimeClass) {
    using namespace kvt::ex;
    EXPECT_EQ(className(Throwable()), "kvt::ex::Throwable");
    EXPECT_EQ(className(Exception()), "kvt::ex::Exception");
    EXPECT_EQ(className(FatalError()), "kvt::ex::FatalError");
    EXPECT_EQ(className(UStringException()), "kvt::ex::UStringException");
    EXPECT_EQ(className(InvalidEncodingException("x")), "kvt::ex::InvalidEncodingException");
    EXPECT_EQ(className(UStringNotImplementedException("x")), "kvt::ex::UStringNotImplementedException");
    EXPECT_EQ(className(UStringBinaryTranscodingException(UString<28>())),
              "kvt::ex::UStringBinaryTranscodingException");
    EXPECT_EQ(className(UStringBadEncodingException(UString<28>(), Encoding::Utf8, "", "")),
              "kvt::ex::UStringBadEncodingException");
    EXPECT_EQ(className(UStringTranscodingException("", Encoding::Utf8, Encoding::Utf8, "", "")),
              "kvt::ex::UStringTranscodingException");
    EXPECT_EQ(className(PythonVersionError("3", "2")), "kvt::ex::PythonVersionError");
    EXPECT_EQ(className(host::errors::OrderFailure()), "host::errors::OrderFailure");
    EXPECT_EQ(className(host::errors::TypedFailure<int>()), "host::errors::TypedFailure<int>");
    const host::errors::OrderFailure derived;
    const Throwable& root = derived;
    EXPECT_EQ(className(root), "host::errors::OrderFailure");
    EXPECT_EQ(className(Throwable(derived)), "kvt::ex::Throwable"); // a sliced copy is what it became
}

TEST(ThrowableWhat, OfAnEmptyListNamesTheClass) {
    EXPECT_EQ(what(Throwable()), "Exception thrown: kvt::ex::Throwable");
    EXPECT_EQ(what(Exception()), "Exception thrown: kvt::ex::Exception");
    EXPECT_EQ(what(FatalError()), "Exception thrown: kvt::ex::FatalError");
    EXPECT_EQ(what(UStringException()), "Exception thrown: kvt::ex::UStringException");
    EXPECT_EQ(what(host::errors::OrderFailure()), "Exception thrown: host::errors::OrderFailure");
}

TEST(ThrowableWhat, OfOneItemIsItsTextWithoutAnIndex) {
    EXPECT_EQ(what(Throwable("a text")), "a text");
    EXPECT_EQ(what(Throwable("")), "");
    EXPECT_EQ(what(Throwable("name", "value")), "name=value");
    EXPECT_EQ(what(Throwable("", "")), "=");
    EXPECT_EQ(what(Throwable("file.cpp", "function", 42)), "file.cpp::function::42");
    EXPECT_EQ(what(Throwable("", "", 0)), "::::0");
    EXPECT_EQ(what(Throwable("f", "g", INT_MIN)), "f::g::-2147483648");
    EXPECT_EQ(what(Throwable("f", "g", INT_MAX)), "f::g::2147483647");
    EXPECT_EQ(what(Throwable(910003, {"abc", "UTF-8", "US-ASCII"})),
              "msgnum=910003 %0=abc %1=UTF-8 %2=US-ASCII");
    EXPECT_EQ(what(Throwable(7, {})), "msgnum=7");
    EXPECT_EQ(what(Throwable(7, {""})), "msgnum=7 %0=");
}

TEST(ThrowableWhat, OfSeveralItemsIsOneLineEachWithItsIndex) {
    Throwable failure(910005, {"x"});
    failure.addStackFrame("a.cpp", "f", 3);
    EXPECT_EQ(what(failure), "[0] msgnum=910005 %0=x\n[1] a.cpp::f::3");
    failure.addNameValue("n", "v");
    failure.addMessageString("two\nlines"); // an item's own line feed is not touched
    EXPECT_EQ(what(failure), "[0] msgnum=910005 %0=x\n[1] a.cpp::f::3\n[2] n=v\n[3] two\nlines");
}

TEST(ThrowableWhat, IndexesAreDecimalNumbersOfAnyLength) {
    Throwable failure;
    std::string expected;
    UStringArray<0> parameters;
    std::string message = "msgnum=1";
    for (int i = 0; i < 120; ++i) {
        failure.addMessageString(std::to_string(i * 3).c_str());
        expected += (i > 0 ? "\n[" : "[") + std::to_string(i) + "] " + std::to_string(i * 3);
        parameters.emplace_back("p");
        message += " %" + std::to_string(i) + "=p";
    }
    EXPECT_EQ(what(failure), expected);
    EXPECT_EQ(what(Throwable(1, parameters)), message);
}

TEST(ThrowableItems, KeepEveryByteOfTheirStrings) {
    const std::string odd("a\0b\xFF\xC3=::%0\n", 12);
    Throwable failure(bytes(odd));
    failure.addNameValue(bytes(odd), bytes(odd));
    failure.addMessage(1, {bytes(odd)});
    failure.addStackFrame(bytes(odd), bytes(odd), 1);
    EXPECT_EQ(itemsOf(failure), (Items{"string " + odd, "pair " + odd + "|" + odd, "message 1|" + odd,
                                       "frame " + odd + "|" + odd + "|1"}));
    EXPECT_EQ(what(failure), "[0] " + odd + "\n[1] " + odd + "=" + odd + "\n[2] msgnum=1 %0=" + odd +
                                 "\n[3] " + odd + "::" + odd + "::1");
}

TEST(ThrowableItems, AMessageNumberHas32Bits) {
    const std::array<std::pair<unsigned long, std::string>, 5> rows{{{0UL, "0"},
                                                                     {4294967295UL, "4294967295"},
                                                                     {4294967296UL, "0"},
                                                                     {4294967296UL + 910002UL, "910002"},
                                                                     {ULONG_MAX, "4294967295"}}};
    for (const auto& [number, expected] : rows) {
        EXPECT_EQ(itemsOf(Throwable(number, {})), Items{"message " + expected}) << number;
        Throwable added;
        added.addMessage(number, {"p"});
        EXPECT_EQ(what(added), "msgnum=" + expected + " %0=p") << number;
    }
}

Throwable oneOfEach() {
    Throwable failure("text");
    failure.addStackFrame("file", "function", 1);
    failure.addNameValue("name", "value");
    failure.addMessage(2, {"p"});
    failure.addMessageString("text 2");
    return failure;
}

TEST(ThrowableProcessInfo, GoesThroughTheListInOrder) {
    EXPECT_EQ(itemsOf(oneOfEach()), (Items{"string text", "frame file|function|1", "pair name|value",
                                           "message 2|p", "string text 2"}));
}

TEST(ThrowableProcessInfo, AnEmptyFunctionSkipsItsKind) {
    const Throwable failure = oneOfEach();
    EXPECT_NO_THROW(failure.processInfo(nullptr, nullptr, nullptr, nullptr));
    EXPECT_NO_THROW(Throwable().processInfo({}, {}, {}, {}));
    int strings = 0;
    int frames = 0;
    int pairs = 0;
    int messages = 0;
    failure.processInfo([&](const auto&) { ++strings; }, {}, {}, {});
    failure.processInfo({}, [&](const auto&, const auto&, int) { ++frames; }, {}, {});
    failure.processInfo({}, {}, [&](const auto&, const auto&) { ++pairs; }, {});
    failure.processInfo({}, {}, {}, [&](unsigned long, const auto&) { ++messages; });
    EXPECT_EQ((std::array{strings, frames, pairs, messages}), (std::array{2, 1, 1, 1}));
}

TEST(ThrowableProcessInfo, LetsAFunctionsOwnFailureThrough) {
    const Throwable failure = oneOfEach();
    EXPECT_THROW(
        failure.processInfo([](const auto&) { throw host::errors::OrderFailure("mine"); }, {}, {}, {}),
        host::errors::OrderFailure);
}

std::vector<const void*> addressesOf(const Throwable& failure) {
    std::vector<const void*> addresses;
    failure.processInfo(
        [&](const UString<0>& message) { addresses.push_back(&message); },
        [&](const UString<0>& file, const UString<0>&, int) { addresses.push_back(&file); },
        [&](const UString<0>& name, const UString<0>&) { addresses.push_back(&name); },
        [&](unsigned long, const UStringArray<0>& parameters) { addresses.push_back(&parameters); });
    return addresses;
}

TEST(ThrowableCopy, SharesTheItemsAndHasAListOfItsOwn) {
    Throwable original = oneOfEach();
    Throwable copy(original);
    EXPECT_EQ(addressesOf(copy), addressesOf(original));
    Throwable assigned;
    assigned = copy;
    EXPECT_EQ(addressesOf(assigned), addressesOf(original));
    copy.addMessageString("only here");
    EXPECT_EQ(addressesOf(original).size(), 5u);
    EXPECT_EQ(addressesOf(copy).size(), 6u);
    const Items items = itemsOf(assigned);
    original = Throwable();
    copy = Throwable();
    EXPECT_EQ(itemsOf(assigned), items);
}

TEST(ThrowableCopy, AMovedFromFailureMayBeDestroyed) {
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    {
        Throwable source = oneOfEach();
        const Throwable target(std::move(source));
        EXPECT_EQ(itemsOf(target).size(), 5u);
    }
    EXPECT_EQ(kvt::test::livingBlocks(), before);
}

TEST(ThrowableInFlight, RethrowingKeepsAllItemsInOrder) {
    const auto inner = [] {
        try {
            throw Exception(910005, {"x"});
        } catch (Throwable& failure) {
            failure.addStackFrame("inner.cpp", "inner", 10);
            throw;
        }
    };
    const auto outer = [&inner] {
        try {
            inner();
        } catch (Throwable& failure) {
            failure.addStackFrame("outer.cpp", "outer", 20);
            failure.addNameValue("file", "a.txt");
            throw;
        }
    };
    const Items expected{"message 910005|x", "frame inner.cpp|inner|10", "frame outer.cpp|outer|20",
                         "pair file|a.txt"};
    try {
        outer();
        FAIL() << "nothing was thrown";
    } catch (const Exception& failure) {
        EXPECT_EQ(itemsOf(failure), expected);
        EXPECT_EQ(className(failure), "kvt::ex::Exception");
    }
    try {
        outer();
        FAIL() << "nothing was thrown";
    } catch (const Exception& caught) {
        const Exception failure(caught);
        EXPECT_EQ(itemsOf(failure), expected);
    }
}

TEST(ThrowableInFlight, CopiesTravelToOtherThreads) {
    std::exception_ptr thrown;
    Throwable own = oneOfEach();
    try {
        throw own;
    } catch (...) {
        thrown = std::current_exception();
    }
    std::vector<std::thread> threads;
    std::vector<std::string> texts(8);
    for (std::size_t t = 0; t < texts.size(); ++t) {
        threads.emplace_back([&thrown, &text = texts[t], copy = own]() mutable {
            for (int i = 0; i < 50; ++i) {
                try {
                    std::rethrow_exception(thrown);
                } catch (const Throwable& failure) {
                    Throwable mine(failure);
                    mine.addMessageString("mine");
                    text = what(mine);
                    copy = mine;
                }
            }
            EXPECT_EQ(itemsOf(copy).size(), 6u);
        });
    }
    own = Throwable();
    for (std::thread& thread : threads) {
        thread.join();
    }
    for (const std::string& text : texts) {
        EXPECT_EQ(text,
                  "[0] text\n[1] file::function::1\n[2] name=value\n[3] msgnum=2 %0=p\n[4] text 2\n[5] mine");
    }
}

TEST(ThrowableOutOfMemory, AddingChangesNothingWhenItFails) {
    const UString<0> text("a text that is too long for the small-string buffer");
    const UStringArray<0> parameters{text, text};
    Throwable failure("first");
    const Items before = itemsOf(failure);
    const auto unchanged = [&](std::size_t) { EXPECT_EQ(itemsOf(failure), before); };
    EXPECT_GE(kvt::test::failEachAllocation([&] { failure.addMessageString(text); }, unchanged), 2u);
    failure = Throwable("first");
    EXPECT_GE(kvt::test::failEachAllocation([&] { failure.addNameValue(text, text); }, unchanged), 3u);
    failure = Throwable("first");
    EXPECT_GE(kvt::test::failEachAllocation([&] { failure.addStackFrame(text, text, 1); }, unchanged), 3u);
    failure = Throwable("first");
    EXPECT_GE(kvt::test::failEachAllocation([&] { failure.addMessage(1, parameters); }, unchanged), 3u);
    EXPECT_EQ(itemsOf(failure).size(), 2u);
}

TEST(ThrowableOutOfMemory, ConstructorsAndCopiesLeakNothing) {
    const UString<0> text("a text that is too long for the small-string buffer");
    const Throwable original(text);
    Throwable target("target");
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    const auto check = [&](std::size_t succeeding) {
        EXPECT_EQ(kvt::test::livingBlocks(), before) << succeeding;
        EXPECT_EQ(what(target), "target");
    };
    kvt::test::failEachAllocation([&] { Throwable failure(text); }, check);
    kvt::test::failEachAllocation([&] { Throwable failure(text, text); }, check);
    kvt::test::failEachAllocation([&] { Throwable failure(1, {text, text}); }, check);
    kvt::test::failEachAllocation([&] { Throwable failure(original); }, check);
    kvt::test::failEachAllocation([&] { kvt::ex::InvalidEncodingException failure(text); }, check);
    kvt::test::failEachAllocation([&] { original.what(); }, check);
    const std::size_t failures = kvt::test::failEachAllocation([&] { target = original; }, check);
    EXPECT_GE(failures, 1u);
}

} // namespace
