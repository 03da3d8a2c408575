// The failures with a fixed content: number, parameters, texts, and the classes as which they are caught, within one
// module and across modules.
#include "catching.h"
#include "items.h"
#include "module.h"
#include <support/allocations.h>

#include <kvt/foundation/throwable.h>

#include <dlfcn.h>
#include <gtest/gtest.h>

#include <array>
#include <cstdint>
#include <functional>
#include <iomanip>
#include <memory>
#include <sstream>
#include <string>

namespace {

using namespace kvt::ex;
using kvt::test::Items;
using kvt::test::itemsOf;

UString<28> binary(const std::string& bytes) {
    return UString<28>(bytes.data(), bytes.size(), Encoding::Binary);
}

std::string nameOf(Encoding encoding) {
    return std::string(encoding.getName());
}

TEST(UStringBadEncodingException, HoldsMessageAndBothPairs) {
    const UStringBadEncodingException failure(binary("a\xE9z"), Encoding::Utf8, "a?z", "?");
    EXPECT_EQ(itemsOf(failure), (Items{"message 910002|a\\xE9z|UTF-8", "pair substituted_conversion|a?z",
                                       "pair substitution_characters|?"}));
    EXPECT_EQ(failure.what().toStdString(), "[0] msgnum=910002 %0=a\\xE9z %1=UTF-8\n"
                                            "[1] substituted_conversion=a?z\n[2] substitution_characters=?");
}

TEST(UStringTranscodingException, HoldsMessageAndBothPairs) {
    const UStringTranscodingException failure("caf\xC3\xA9", Encoding::Utf8, Encoding::UsAscii, "caf\x1A",
                                              "\x1A");
    EXPECT_EQ(itemsOf(failure),
              (Items{"message 910003|caf\xC3\xA9|UTF-8|US-ASCII", "pair substituted_conversion|caf\x1A",
                     "pair substitution_characters|\x1A"}));
}

TEST(UStringTranscodingException, DoesNotEscapeItsText) {
    const UStringTranscodingException failure("a\x01\xC3\xA9\\", Encoding::Utf8, Encoding::UsAscii, "", "");
    EXPECT_EQ(itemsOf(failure).front(), "message 910003|a\x01\xC3\xA9\\|UTF-8|US-ASCII");
}

TEST(UStringBinaryTranscodingException, HoldsTheEscapedBytes) {
    EXPECT_EQ(itemsOf(UStringBinaryTranscodingException(binary("a\nb"))), Items{"message 910004|a\\x0Ab"});
    EXPECT_EQ(itemsOf(UStringBinaryTranscodingException(binary(""))), Items{"message 910004|"});
}

TEST(InvalidEncodingException, HoldsTheNameAsItIs) {
    EXPECT_EQ(itemsOf(InvalidEncodingException("no-such\n")), Items{"message 910005|no-such\n"});
    EXPECT_EQ(itemsOf(InvalidEncodingException("")), Items{"message 910005|"});
}

TEST(UStringNotImplementedException, NamesTheFunction) {
    EXPECT_EQ(UStringNotImplementedException("getAsFoldedCase").what().toStdString(),
              "The function getAsFoldedCase is not implemented.");
    EXPECT_EQ(itemsOf(UStringNotImplementedException("")), Items{"string The function  is not implemented."});
    // Only the placeholder of the text is replaced, not one that came with the name.
    EXPECT_EQ(itemsOf(UStringNotImplementedException("%func% %func%")),
              Items{"string The function %func% %func% is not implemented."});
}

TEST(PythonVersionError, NamesBothVersions) {
    EXPECT_EQ(
        PythonVersionError("3.8", "2.7").what().toStdString(),
        "Workspace requiring Python 3.8 is requested to run on an ZQT Engine configured to use a Python 2.7 "
        "interpreter. ZQT cannot continue given the Python version mismatch");
    EXPECT_EQ(
        PythonVersionError("", "%0").what().toStdString(),
        "Workspace requiring Python  is requested to run on an ZQT Engine configured to use a Python %0 "
        "interpreter. ZQT cannot continue given the Python version mismatch");
}

TEST(FailureParameters, EveryByteIsEscapedOrCopied) {
    for (int value = 0; value < 256; ++value) {
        const std::string byte(1, static_cast<char>(value));
        std::ostringstream hex;
        hex << "\\x" << std::uppercase << std::hex << std::setw(2) << std::setfill('0') << value;
        // 127 is a positive signed number above 31, so it stands as it is.
        const std::string expected = value < 32 || value >= 128 ? hex.str() : byte;
        EXPECT_EQ(itemsOf(UStringBinaryTranscodingException(binary(byte))),
                  Items{"message 910004|" + expected})
            << value;
        EXPECT_EQ(
            itemsOf(UStringBadEncodingException(binary("<" + byte + ">"), Encoding::Utf8, "", "")).front(),
            "message 910002|<" + expected + ">|UTF-8")
            << value;
    }
    std::string all;
    for (int value = 255; value >= 0; --value) {
        all += static_cast<char>(value);
    }
    const std::string item = itemsOf(UStringBinaryTranscodingException(binary(all))).front();
    EXPECT_EQ(item.size(), std::string("message 910004|").size() + 160 * 4 + 96);
    EXPECT_EQ(item.substr(15, 8), "\\xFF\\xFE");
    EXPECT_EQ(item.substr(item.size() - 8), "\\x01\\x00");
}

TEST(FailureParameters, EncodingsAreNamedAsGetNameDoes) {
    for (std::uint32_t id = 0; id <= 30; ++id) {
        const Encoding encoding(static_cast<Encoding::Type>(id));
        const std::string name = nameOf(encoding);
        EXPECT_EQ(itemsOf(UStringBadEncodingException(binary("x"), encoding, "", "")).front(),
                  "message 910002|x|" + name);
        EXPECT_EQ(itemsOf(UStringTranscodingException("x", encoding, Encoding::Utf8, "", "")).front(),
                  "message 910003|x|" + name + "|UTF-8");
        EXPECT_EQ(itemsOf(UStringTranscodingException("x", Encoding::Utf8, encoding, "", "")).front(),
                  "message 910003|x|UTF-8|" + name);
    }
    EXPECT_NE(nameOf(Encoding::System), "zqt-system");
    EXPECT_EQ(itemsOf(UStringBadEncodingException(binary(""), Encoding("koi8r"), "", "")).front(),
              "message 910002||KOI8-R");
}

template <typename Failure>
void readsItsLoss(Failure failure) {
    EXPECT_EQ(failure.getLossyConversion(), UString<0>("lossy"));
    EXPECT_EQ(failure.getSubstitutionCharacters(), UString<0>("subst"));
    const Failure copy(failure);
    EXPECT_EQ(copy.getLossyConversion(), UString<0>("lossy"));
    EXPECT_EQ(copy.getSubstitutionCharacters(), UString<0>("subst"));
    // The first of a name counts, whatever is added on the way.
    failure.addNameValue("substituted_conversion", "later");
    failure.addNameValue("substitution_characters", "later");
    failure.addStackFrame("f", "g", 1);
    EXPECT_EQ(failure.getLossyConversion(), UString<0>("lossy"));
    EXPECT_EQ(failure.getSubstitutionCharacters(), UString<0>("subst"));
    static_cast<Throwable&>(failure) = Throwable("substituted_conversion");
    EXPECT_TRUE(failure.getLossyConversion().isEmpty());
    EXPECT_TRUE(failure.getSubstitutionCharacters().isEmpty());
    failure.addNameValue("Substituted_conversion", "other case");
    failure.addNameValue("substituted_conversion", "first");
    failure.addNameValue("substituted_conversion", "second");
    EXPECT_EQ(failure.getLossyConversion(), UString<0>("first"));
    EXPECT_TRUE(failure.getSubstitutionCharacters().isEmpty());
}

TEST(FailureLoss, IsReadFromTheFirstPairOfItsName) {
    readsItsLoss(UStringBadEncodingException(binary("x"), Encoding::Utf8, "lossy", "subst"));
    readsItsLoss(UStringTranscodingException("x", Encoding::Utf8, Encoding::UsAscii, "lossy", "subst"));
}

// Message numbers are exported for hosts that look them up by the name of the constant.
TEST(FailureNumbers, AreExportedConstants) {
    struct Row {
        const char* symbol;
        std::uint32_t number;
    };
    for (const Row& row : {Row{"_ZN3kvt2ex27UStringBadEncodingException16badInputEncodingE", 910002},
                           Row{"_ZN3kvt2ex27UStringTranscodingException16transcodingErrorE", 910003},
                           Row{"_ZN3kvt2ex33UStringBinaryTranscodingException17binaryTranscodingE", 910004},
                           Row{"_ZN3kvt2ex24InvalidEncodingException11badEncodingE", 910005}}) {
        const auto* const constant = static_cast<const std::uint32_t*>(dlsym(RTLD_DEFAULT, row.symbol));
        ASSERT_NE(constant, nullptr) << row.symbol;
        EXPECT_EQ(*constant, row.number) << row.symbol;
    }
}

struct Thrown {
    const char* name;
    std::function<void()> operation;
    const char* classes;
};

const char* const badEncodingClasses = "Throwable Exception UStringException UStringBadEncodingException ";

std::vector<Thrown> thrownByTheLibrary() {
    return {
        {"unknown name", [] { Encoding("no-such-charset"); },
         "Throwable Exception InvalidEncodingException "},
        {"malformed UTF-8", [] { UString<1> text(UString<0>("\xFF")); }, badEncodingClasses},
        {"not ASCII", [] { UString<1> text(UString<0>("\xC3\xA9")); },
         "Throwable Exception UStringException UStringTranscodingException "},
        {"binary", [] { UString<0> text(binary("x")); },
         "Throwable Exception UStringException UStringBinaryTranscodingException "},
        {"not offered", [] { UString<0>("x").getAsIZQTString().encodeToZQTParsableText(); },
         "Throwable Exception UStringException UStringNotImplementedException "},
    };
}

TEST(FailureAcrossModules, WhatTheLibraryThrowsIsCaughtByEachBase) {
    for (const Thrown& row : thrownByTheLibrary()) {
        EXPECT_EQ(kvt::test::caughtAs(row.operation), row.classes) << row.name;
        EXPECT_EQ(plugin::caughtAs(row.operation), row.classes) << row.name;
    }
}

TEST(FailureAcrossModules, WhatAPluginThrowsIsCaughtByEachBase) {
    const std::array<std::pair<const char*, const char*>, 6> rows{{
        {"Throwable", "Throwable "},
        {"FatalError", "Throwable FatalError "},
        {"UStringException", "Throwable Exception UStringException "},
        {"UStringBadEncodingException", badEncodingClasses},
        {"PythonVersionError", "Throwable FatalError PythonVersionError "},
        {"HiddenFailure", "Throwable Exception "},
    }};
    for (const auto& [name, classes] : rows) {
        EXPECT_EQ(kvt::test::caughtAs([n = name] { plugin::throwFailure(n); }), classes) << name;
    }
}

TEST(FailureAcrossModules, APluginsOwnClassKeepsItsName) {
    try {
        plugin::throwFailure("HiddenFailure");
        FAIL() << "nothing was thrown";
    } catch (const Throwable& failure) {
        EXPECT_EQ(failure.className(), UString<0>("plugin::HiddenFailure"));
        EXPECT_EQ(failure.what(), UString<0>("of the module"));
    }
}

class FailureOfTheProgram : public Exception {
public:
    using Exception::Exception;
};

TEST(FailureAcrossModules, AFailureOfTheProgramPassesThroughOthersAndGathersItems) {
    const auto thrower = [] { throw FailureOfTheProgram("mine"); };
    EXPECT_EQ(plugin::caughtAs(thrower), "Throwable Exception ");
    try {
        plugin::passThrough(thrower);
        FAIL() << "nothing was thrown";
    } catch (const FailureOfTheProgram& failure) {
        EXPECT_EQ(itemsOf(failure), (Items{"string mine", "frame module.cpp|passThrough|7"}));
    }
    // Through frames of the library itself.
    const Throwable carrier("x");
    EXPECT_THROW(carrier.processInfo([&](const UString<0>&) { thrower(); }, {}, {}, {}), FailureOfTheProgram);
}

TEST(FailureAcrossModules, AnArrayOfOneModuleGrowsAndEndsInAnother) {
    const std::ptrdiff_t before = kvt::test::livingBlocks();
    {
        UStringArray<0> array = plugin::makeArray(20);
        ASSERT_EQ(array.size(), 20u);
        for (int i = 0; i < 30; ++i) {
            array.push_back(array[static_cast<std::size_t>(i) % 20]);
        }
        plugin::addTo(array);
        EXPECT_EQ(array[0], UString<0>("0"));
        EXPECT_EQ(array[50], UString<0>("50"));
        for (const UString<0>& element : array) {
            EXPECT_EQ(element.getAsIZQTString().data(), element.rawData());
        }
        plugin::dropArray(std::make_unique<UStringArray<0>>(std::move(array)));
        plugin::dropArray(std::make_unique<UStringArray<0>>());
    }
    EXPECT_EQ(kvt::test::livingBlocks(), before);
}

} // namespace
