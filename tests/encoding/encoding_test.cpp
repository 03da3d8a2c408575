// Encoding as a program sees it: ids, names, comparison, and what an encoding says of its characters.
#include <encoding/fixed_names.h>
#include <encoding/icu_oracle.h>
#include <foundation/items.h>

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/throwable.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>
#include <functional>
#include <map>
#include <random>
#include <set>
#include <string>
#include <type_traits>
#include <vector>

namespace {

using kvt::ex::Encoding;
using kvt::ex::InvalidEncodingException;
using kvt::ex::UString;
using kvt::test::canonicalName;
using kvt::test::firstDynamicId;
using kvt::test::FixedName;
using kvt::test::fixedNames;
using kvt::test::itemsOf;
using kvt::test::NameToId;
using View = kvt::future::string_view;

Encoding of(const std::string& name) {
    return Encoding(View(name), kvt::ex::nothrow);
}

std::string nameOf(Encoding encoding) {
    return std::string(encoding.getName());
}

TEST(EncodingType, IsOneWordByValue) {
    static_assert(sizeof(Encoding) == 4);
    static_assert(std::is_trivially_copyable_v<Encoding>);
    static_assert(std::is_same_v<std::underlying_type_t<Encoding::Type>, std::uint32_t>);
    static_assert(std::is_convertible_v<Encoding::Type, std::uint32_t>); // unscoped
    static_assert(std::is_convertible_v<Encoding::Type, Encoding>);
    static_assert(std::is_same_v<UString<Encoding::Utf8>, UString<0>>);
    static_assert(std::is_empty_v<kvt::ex::nothrow_t>);
    static_assert(std::is_same_v<std::remove_cv_t<decltype(kvt::ex::nothrow)>, kvt::ex::nothrow_t>);
    SUCCEED();
}

TEST(EncodingType, NamesAreConvertedOnRequestOnly) {
    static_assert(std::is_constructible_v<Encoding, View>);
    static_assert(!std::is_convertible_v<View, Encoding>);
    static_assert(!std::is_convertible_v<const char*, Encoding>);
    static_assert(!std::is_constructible_v<Encoding, std::nullptr_t>);
    static_assert(std::is_constructible_v<Encoding, View, kvt::ex::nothrow_t>);
    SUCCEED();
}

TEST(EncodingFixed, EachTypeHasItsIdAndName) {
    ASSERT_EQ(fixedNames.size(), 31u);
    for (const FixedName& row : fixedNames) {
        const Encoding encoding = row.type;
        EXPECT_EQ(encoding.id(), row.id);
        EXPECT_EQ(static_cast<std::uint32_t>(row.type), row.id);
        if (row.name != nullptr) {
            EXPECT_EQ(encoding.getName(), row.name) << row.id;
            EXPECT_EQ(encoding.getUnevaluatedName(), row.name) << row.id;
            EXPECT_EQ(encoding.evaluate(), row.id) << row.name;
        }
    }
}

TEST(EncodingFixed, EachNameGivesItsIdBothWays) {
    for (const FixedName& row : fixedNames) {
        if (row.name == nullptr || row.id == Encoding::Unknown) {
            continue;
        }
        EXPECT_EQ(of(row.name).id(), row.id) << row.name;
        EXPECT_EQ(Encoding(View(row.name)).id(), row.id) << row.name;
    }
    // The text for an unknown encoding is not the name of one.
    EXPECT_EQ(of("Unknown Encoding").id(), Encoding::Unknown);
}

TEST(EncodingFixed, AliasesAreAcceptedAndNotGivenBack) {
    for (const NameToId& row : kvt::test::nameAliases) {
        const Encoding encoding = of(row.name);
        EXPECT_EQ(encoding.id(), row.id) << row.name;
        EXPECT_NE(encoding.getName(), row.name);
    }
    EXPECT_EQ(Encoding(View("ANSI")).getUnevaluatedName(), "zqt-system");
    EXPECT_EQ(Encoding(View("ANSI")).getName(), Encoding(Encoding::System).getName());
    EXPECT_EQ(Encoding(View("BINARY")).getName(), "zqt-binary");
}

TEST(EncodingFixed, AliasesAreMatchedWithCase) {
    for (const char* const name : {"System", "ansi", "Ansi", "Binary", "ZQT-WWJD", "Zqt-Binary", "wwjd",
                                   " system", "system ", "ZQT-SYSTEM"}) {
        ASSERT_EQ(canonicalName(name), "") << name << " is known to ICU";
        EXPECT_EQ(of(name).id(), Encoding::Unknown) << name;
    }
}

TEST(EncodingNames, SpellingsThatIcuKnowsFindTheFixedId) {
    for (const NameToId& row : {
             NameToId{"UTF-16", 2},        NameToId{"UTF-32", 3},    NameToId{"utf-16", 2},
             NameToId{"utf-32", 3},        NameToId{"utf-8", 0},     NameToId{"utf8", 0},
             NameToId{"Utf_8", 0},         NameToId{"utf-16be", 4},  NameToId{"UTF-32be", 5},
             NameToId{"ascii", 1},         NameToId{"us", 1},        NameToId{"ANSI_X3.4-1968", 1},
             NameToId{"latin1", 6},        NameToId{"iso8859-1", 6}, NameToId{"ISO_8859-1:1987", 6},
             NameToId{"cp819", 6},         NameToId{"l2", 7},        NameToId{"latin3", 8},
             NameToId{"latin4", 9},        NameToId{"cyrillic", 10}, NameToId{"arabic", 11},
             NameToId{"greek", 12},        NameToId{"hebrew", 13},   NameToId{"latin5", 14},
             NameToId{"iso8859_13", 16},   NameToId{"latin9", 17},   NameToId{"cp1250", 18},
             NameToId{"Windows-1251", 19}, NameToId{"cp1252", 20},   NameToId{"WINDOWS-1252", 20},
             NameToId{"cp1253", 21},       NameToId{"cp1254", 22},   NameToId{"cp1255", 23},
             NameToId{"cp1256", 24},       NameToId{"cp1257", 25},   NameToId{"cp1258", 26},
         }) {
        EXPECT_EQ(of(row.name).id(), row.id) << row.name;
        EXPECT_EQ(Encoding(View(row.name)).id(), row.id) << row.name << " again";
    }
}

TEST(EncodingNames, TheThaiPartOfIso8859HasAnOldFixedNameOfItsOwn) {
    EXPECT_EQ(of("iso-8859-11-2001").id(), 15u);
    // ICU spells its name with an underscore, which is another encoding by name.
    const Encoding spelt = of("ISO-8859-11");
    EXPECT_EQ(spelt.getName(), "iso-8859_11-2001");
    EXPECT_NE(spelt, Encoding(Encoding::Iso8859_11));
}

TEST(EncodingNames, TwoSpellingsOfOneEncodingHaveOneId) {
    struct Row {
        std::vector<const char*> spellings;
        const char* name;
    };
    for (const Row& row : {
             Row{{"KOI8-R", "koi8", "cskoi8r", "koi8_r"}, "KOI8-R"},
             Row{{"sjis", "MS_Kanji", "Shift_JIS", "shift-jis"}, "Shift_JIS"},
             Row{{"IBM437", "cp437", "437", "csPC8CodePage437"}, "IBM437"},
             Row{{"eucjis", "EUC-JP", "X-EUC-JP"}, "EUC-JP"},
             Row{{"gb18030", "GB18030"}, "GB18030"},
             Row{{"UTF-7", "unicode-1-1-utf-7"}, "UTF-7"},
         }) {
        const std::uint32_t id = of(row.spellings.front()).id();
        for (const char* const spelling : row.spellings) {
            EXPECT_EQ(of(spelling).id(), id) << spelling;
            EXPECT_EQ(of(spelling).getName(), row.name) << spelling;
        }
        EXPECT_TRUE(id >= firstDynamicId || id == Encoding::System) << row.name;
    }
}

TEST(EncodingUnknown, WithoutThrowingIsTheId30) {
    for (int time = 0; time < 3; ++time) {
        for (const char* const name : {"no-such-charset", "", "UTF-9", "  ", "\xFF\xFE", "zqt"}) {
            const Encoding encoding = of(name);
            EXPECT_EQ(encoding.id(), Encoding::Unknown) << name;
            EXPECT_EQ(encoding.getName(), "Unknown Encoding");
            EXPECT_EQ(encoding.getUnevaluatedName(), "Unknown Encoding");
            EXPECT_EQ(encoding.evaluate(), 30u);
        }
    }
}

TEST(EncodingUnknown, AnOverlongNameIsUnknown) {
    for (const std::size_t length : {59u, 60u, 61u, 1000u, 100000u}) {
        EXPECT_EQ(of(std::string(length, 'x')).id(), Encoding::Unknown) << length;
    }
}

TEST(EncodingUnknown, ThrowsTheNameAsItWasGiven) {
    for (const std::string& name : {std::string("no-such-charset"), std::string(), std::string("caf\xC3\xA9"),
                                    std::string("\xFF\n"), std::string(200, 'x')}) {
        for (int time = 0; time < 2; ++time) {
            try {
                const Encoding encoding{View(name)};
                FAIL() << name;
            } catch (const InvalidEncodingException& failure) {
                EXPECT_EQ(itemsOf(failure), std::vector<std::string>{"message 910005|" + name});
            }
        }
    }
}

TEST(EncodingNames, AViewNeedNotBeTerminated) {
    const std::string text = "KOI8-RU";
    EXPECT_EQ(Encoding(View(text.data(), 6)).getName(), "KOI8-R");
    EXPECT_EQ(Encoding(View("UTF-8junk", 5)).id(), 0u);
    EXPECT_EQ(Encoding(View("utf-8junk", 5)).id(), 0u);
}

TEST(EncodingNames, AreTerminatedAndStay) {
    std::vector<Encoding> encodings;
    for (const FixedName& row : fixedNames) {
        encodings.emplace_back(row.type);
    }
    for (const char* const name : {"KOI8-R", "Big5", "IBM850", "ibm-720_P100-1997"}) {
        encodings.push_back(of(name));
    }
    std::vector<View> views;
    for (const Encoding encoding : encodings) {
        views.push_back(encoding.getName());
        EXPECT_EQ(std::strlen(views.back().data()), views.back().size());
    }
    for (const std::string& converter : kvt::test::icuConverters()) {
        of(converter); // makes the registry grow
    }
    for (std::size_t i = 0; i < encodings.size(); ++i) {
        EXPECT_EQ(encodings[i].getName().data(), views[i].data());
        EXPECT_EQ(std::string(views[i]), nameOf(encodings[i]));
    }
}

TEST(EncodingNames, AnIdThatWasNeverHandedOutHasNone) {
    for (const std::uint32_t id : {100000u, 0x7FFFFFFFu, 0xFFFFFFFFu}) {
        EXPECT_TRUE(Encoding(static_cast<Encoding::Type>(id)).getName().empty()) << id;
        EXPECT_TRUE(Encoding(static_cast<Encoding::Type>(id)).getUnevaluatedName().empty()) << id;
    }
}

TEST(EncodingNames, TheUnevaluatedNameDiffersForSystemOnly) {
    EXPECT_EQ(Encoding(Encoding::System).getUnevaluatedName(), "zqt-system");
    EXPECT_NE(Encoding(Encoding::System).getName(), "zqt-system");
    for (const char* const name : {"KOI8-R", "Big5", "IBM850"}) {
        if (of(name).id() != Encoding::System) {
            EXPECT_EQ(of(name).getName(), of(name).getUnevaluatedName());
        }
    }
}

TEST(EncodingComparison, IsOfEvaluatedIds) {
    const Encoding system = Encoding::System;
    const Encoding named(system.getName());
    EXPECT_TRUE(system == named);
    EXPECT_FALSE(system != named);
    EXPECT_FALSE(system < named);
    EXPECT_FALSE(named < system);
    EXPECT_EQ(system.id(), 27u);
    EXPECT_EQ(system.evaluate(), named.id());
    EXPECT_EQ(std::hash<Encoding>()(system), std::hash<Encoding>()(named));
    EXPECT_TRUE(Encoding(View("system")) == system);
}

TEST(EncodingComparison, OrdersAsUnsignedNumbers) {
    for (const FixedName& left : fixedNames) {
        for (const FixedName& right : fixedNames) {
            const Encoding a = left.type;
            const Encoding b = right.type;
            EXPECT_EQ(a == b, a.evaluate() == b.evaluate());
            EXPECT_EQ(a != b, a.evaluate() != b.evaluate());
            EXPECT_EQ(a < b, a.evaluate() < b.evaluate());
        }
    }
    const Encoding high = static_cast<Encoding::Type>(0x80000000u);
    EXPECT_TRUE(Encoding(Encoding::Utf8) < high);
    EXPECT_FALSE(high < Encoding(Encoding::Utf8));
}

// The registry, modelled from what it promises: names are looked up among the known ones first and then by their
// canonical form, and a new canonical form takes the next id.
class RegistryModel {
public:
    explicit RegistryModel(std::uint32_t next) : next_(next) {
        for (const FixedName& row : fixedNames) {
            if (row.name != nullptr && row.id != Encoding::Unknown) {
                fixed_.emplace(row.name, row.id);
            }
        }
        fixed_.emplace(nameOf(Encoding::System), 27);
        for (const NameToId& row : kvt::test::nameAliases) {
            fixed_.emplace(row.name, row.id);
        }
    }

    std::uint32_t lookup(const std::string& name) {
        for (const auto& table : {fixed_, dynamic_}) {
            if (const auto found = table.find(name); found != table.end()) {
                return found->second;
            }
        }
        const std::string canonical = canonicalName(name);
        for (const auto& table : {fixed_, dynamic_}) {
            if (const auto found = table.find(canonical); found != table.end()) {
                return dynamic_[name] = found->second;
            }
        }
        dynamic_[name] = next_;
        dynamic_[canonical] = next_;
        names_[next_] = canonical;
        return next_++;
    }

    /// The canonical names of the ids that were handed out.
    const std::map<std::uint32_t, std::string>& names() const { return names_; }

private:
    std::map<std::string, std::uint32_t> fixed_;
    std::map<std::string, std::uint32_t> dynamic_;
    std::map<std::uint32_t, std::string> names_;
    std::uint32_t next_;
};

std::uint32_t firstFreeId() {
    std::uint32_t id = firstDynamicId;
    while (!Encoding(static_cast<Encoding::Type>(id)).getName().empty()) {
        ++id;
    }
    return id;
}

// Other tests of this program may have registered names before; CTest runs each test in a process of its own.
TEST(EncodingRegistration, EveryAliasOfIcuInRandomOrderBehavesAsTheModel) {
    if (firstFreeId() != firstDynamicId) {
        // A spelling that came before would have an id that the model does not know, so start from all of them.
        for (const std::string& alias : kvt::test::icuAliases()) {
            of(alias);
        }
    }
    const std::uint32_t first = firstFreeId();
    std::vector<std::string> aliases = kvt::test::icuAliases();
    ASSERT_GT(aliases.size(), 1000u);
    std::mt19937 random(31);
    std::shuffle(aliases.begin(), aliases.end(), random);
    RegistryModel model(first);
    if (first != firstDynamicId) {
        for (const std::string& alias : aliases) {
            const Encoding encoding = of(alias);
            EXPECT_EQ(encoding.id() == Encoding::Unknown, canonicalName(alias).empty()) << alias;
            EXPECT_LT(encoding.id(), first) << alias;
        }
        EXPECT_EQ(firstFreeId(), first);
        return;
    }
    for (const std::string& alias : aliases) {
        const std::uint32_t expected = model.lookup(alias);
        EXPECT_EQ(of(alias).id(), expected) << alias;
        if (const auto name = model.names().find(expected); name != model.names().end()) {
            EXPECT_EQ(of(alias).getName(), name->second) << alias;
        }
        of("unknown-" + alias); // must take no id
    }
    EXPECT_EQ(firstFreeId(), first + model.names().size());
    EXPECT_GT(model.names().size(), 150u);
}

TEST(EncodingSingleByte, OfFixedEncodings) {
    for (const FixedName& row : fixedNames) {
        if (row.id == Encoding::System || row.id == Encoding::Wwjd) {
            continue;
        }
        const bool expected = row.id == Encoding::UsAscii || (row.id >= 6 && row.id <= 26);
        EXPECT_EQ(Encoding(row.type).isSingleByte(), expected) << row.name;
    }
    EXPECT_EQ(Encoding(Encoding::System).isSingleByte(),
              kvt::test::hasOneByteCharacters(nameOf(Encoding::System)));
    EXPECT_FALSE(of("binary").isSingleByte());
    EXPECT_FALSE(of("no-such-charset").isSingleByte());
}

TEST(EncodingSingleByte, OfWwjdIsAFailureAsItHasNoConverter) {
    for (int time = 0; time < 2; ++time) {
        try {
            Encoding(Encoding::Wwjd).isSingleByte();
            FAIL();
        } catch (const InvalidEncodingException& failure) {
            EXPECT_EQ(itemsOf(failure), std::vector<std::string>{"message 910005|unknown"});
        }
    }
}

TEST(EncodingSingleByte, AgreesWithIcuForEveryConverter) {
    std::size_t single = 0;
    for (const std::string& converter : kvt::test::icuConverters()) {
        const Encoding encoding = of(converter);
        ASSERT_NE(encoding.id(), Encoding::Unknown) << converter;
        const bool expected = kvt::test::hasOneByteCharacters(nameOf(encoding));
        EXPECT_EQ(encoding.isSingleByte(), expected) << converter;
        single += expected ? 1 : 0;
    }
    EXPECT_GT(single, 50u);
}

const std::array<const char*, 12> asciiCompatibleNames{
    "ibm-5471_P100-2006", "windows-874-2000",      "GBK",    "KSC_5601", "Big5",  "macintosh", "x-mac-greek",
    "x-mac-cyrillic",     "x-mac-centraleurroman", "EUC-JP", "EUC-KR",   "KOI8-R"};

TEST(EncodingSupports7BitAscii, OfFixedEncodings) {
    for (const FixedName& row : fixedNames) {
        if (row.id != Encoding::System) {
            EXPECT_EQ(Encoding(row.type).supports7BitASCII(), row.id <= 1 || (row.id >= 6 && row.id <= 26))
                << row.name;
        }
    }
    EXPECT_FALSE(of("binary").supports7BitASCII());
}

TEST(EncodingSupports7BitAscii, OfTheNamedOnes) {
    for (const char* const name : asciiCompatibleNames) {
        EXPECT_TRUE(Encoding(View(name)).supports7BitASCII()) << name;
    }
    EXPECT_TRUE(of("cskoi8r").supports7BitASCII()); // by any spelling
    for (const char* const name : {"Shift_JIS", "IBM437", "IBM850", "GB18030", "ISO-8859-10", "ISO-2022-JP",
                                   "KOI8-U", "UTF-7", "IBM037", "ibm-949_P110-1999", "ISO-8859-11"}) {
        EXPECT_FALSE(Encoding(View(name)).supports7BitASCII()) << name;
    }
}

TEST(EncodingSupports7BitAscii, IsFalseForEveryOtherConverterOfIcu) {
    std::set<std::uint32_t> compatible;
    for (const char* const name : asciiCompatibleNames) {
        compatible.insert(of(name).evaluate());
    }
    for (const std::string& converter : kvt::test::icuConverters()) {
        const Encoding encoding = of(converter);
        const std::uint32_t id = encoding.evaluate();
        const bool expected =
            id <= 1 || (id >= 6 && id <= 26) || ((id == 27 || id > 30) && compatible.count(id) != 0);
        EXPECT_EQ(encoding.supports7BitASCII(), expected) << converter << " " << id;
    }
}

TEST(EncodingSupports7BitAscii, OfSystemIsThatOfItsEncoding) {
    const Encoding system = Encoding::System;
    EXPECT_EQ(system.supports7BitASCII(), Encoding(system.getName()).supports7BitASCII());
}

} // namespace
