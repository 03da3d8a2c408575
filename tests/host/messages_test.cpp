// What is said of a failure: by the catalogue of messages, of one that carries several things, and of one that nobody
// foresaw.

#include <base/messages.h>

#include <kvt/foundation/throwable.h>

#include <gtest/gtest.h>

#include <stdexcept>
#include <string>

namespace host {

namespace {

kvt::ex::UString<0> text(const std::string& from) {
    return kvt::ex::UString<0>(from.data(), from.size());
}

kvt::ex::UStringArray<0> list(const std::vector<std::string>& texts) {
    kvt::ex::UStringArray<0> all;
    for (const std::string& one : texts) {
        all.push_back(text(one));
    }
    return all;
}

} // namespace

TEST(Messages, ANumberWithoutATextIsShownWithItsParameters) {
    EXPECT_EQ(findMessage(1), nullptr);
    EXPECT_EQ(describe(1, {}), "message 1");
    EXPECT_EQ(describe(1, {"a", "b"}), "message 1 \"a\" \"b\"");
}

TEST(Messages, PlaceholdersAreFilledOnce) {
    EXPECT_EQ(fill("%1 of %0, %0", {"a", "%1"}), "%1 of a, a");
    EXPECT_EQ(fill("%0 %2 % %x 100%", {"a"}), "a %2 % %x 100%");
    // A number has three digits at most.
    EXPECT_EQ(fill("%0001", {"a", "b"}), "a1");
    EXPECT_EQ(fill("%1000", {"a", "b"}), "%1000");
    EXPECT_EQ(fill("", {"a"}), "");
}

TEST(Messages, EachKnowsHowManyParametersItsTextTakes) {
    EXPECT_EQ(parameterCount(*findMessage(910003)), 3U);
    EXPECT_EQ(parameterCount(*findMessage(920001)), 0U);
    EXPECT_EQ(parameterCount(*findMessage(933065)), 4U);
}

TEST(Messages, AFailureOfTheLibrarySaysAllThatItCarries) {
    kvt::ex::Exception failure(910005, list({"x\ny"}));
    EXPECT_EQ(describe(failure), "\"x\\x0Ay\" is not the name of an encoding that can be used here.");
    failure.addMessageString(text("It was asked for."));
    failure.addNameValue(text("name"), text("value"));
    failure.addStackFrame(text("file"), text("function"), 1);
    failure.addMessage(1, list({"a"}));
    EXPECT_EQ(describe(failure), "\"x\\x0Ay\" is not the name of an encoding that can be used here. "
                                 "It was asked for. message 1 \"a\"");
}

TEST(Messages, LongParametersAreCut) {
    const std::string shortest(200, 'x');
    EXPECT_EQ(describe(kvt::ex::Exception(1, list({shortest}))), "message 1 \"" + shortest + "\"");
    EXPECT_EQ(describe(kvt::ex::Exception(1, list({shortest + "y"}))), "message 1 \"" + shortest + "...\"");
    // Characters count, not bytes.
    std::string umlauts;
    for (int count = 0; count < 200; ++count) {
        umlauts += "\u00FC";
    }
    EXPECT_EQ(describe(kvt::ex::Exception(1, list({umlauts}))), "message 1 \"" + umlauts + "\"");
}

TEST(Messages, AFailureThatSaysNothingHasAKind) {
    EXPECT_EQ(describe(kvt::ex::Exception()), "a failure of the kind kvt::ex::Exception without a message");
    EXPECT_EQ(describe(std::length_error("too\nlong")),
              "an unforeseen failure of the kind std::length_error: too\\x0Along");
}

} // namespace host
