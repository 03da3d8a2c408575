// The registry from inside: when it asks ICU and when it does not, which ids it hands out, and what a failure within
// it leaves behind. And the table of code pages from which the system's encoding is taken.
#include <encoding/fixed_names.h>
#include <encoding/icu_oracle.h>
#include <encoding/intercepted_icu.h>
#include <foundation/items.h>
#include <support/allocations.h>

#include <kvt/encoding/detail/code_page_names.h>
#include <kvt/encoding/detail/encoding_registry.h>
#include <kvt/foundation/throwable.h>

#include <gtest/gtest.h>

#include <array>
#include <cstdint>
#include <memory>
#include <set>
#include <string>
#include <utility>
#include <vector>

namespace {

using kvt::ex::Encoding;
using kvt::ex::InvalidEncodingException;
using kvt::ex::detail::codePageName;
using kvt::ex::detail::EncodingRegistry;
using kvt::test::canonicalName;
using kvt::test::openCalls;

EncodingRegistry& registry() {
    return EncodingRegistry::instance();
}

std::uint32_t firstFreeId() {
    std::uint32_t id = EncodingRegistry::firstDynamic;
    while (!registry().nameOf(id).empty()) {
        ++id;
    }
    return id;
}

/// The ICU calls of one look-up.
std::size_t callsFor(const std::string& name) {
    registry(); // its construction asks ICU for the system's name
    const std::size_t before = openCalls();
    registry().lookupId(name);
    return openCalls() - before;
}

TEST(CodePageName, EachRowOfTheTable) {
    const std::array<std::pair<std::uint32_t, const char*>, 38> rows{{
        {708, "ISO-8859-6"},
        {720, "ibm-720_P100-1997"},
        {852, "IBM852"},
        {862, "IBM862"},
        {866, "IBM866"},
        {874, "windows-874-2000"},
        {932, "Shift_JIS"},
        {936, "GBK"},
        {949, "EUC-KR"},
        {950, "Big5"},
        {951, "ibm-5471_P100-2006"},
        {1200, "ISO-8859-1"},
        {1201, "ISO-8859-1"},
        {1250, "windows-1250"},
        {1251, "windows-1251"},
        {1252, "windows-1252"},
        {1253, "windows-1253"},
        {1254, "windows-1254"},
        {1255, "windows-1255"},
        {1256, "windows-1256"},
        {1257, "windows-1257"},
        {1258, "windows-1258"},
        {20866, "KOI8-R"},
        {28592, "ISO-8859-2"},
        {28593, "ISO-8859-3"},
        {28594, "ISO-8859-4"},
        {28595, "ISO-8859-5"},
        {28596, "ISO-8859-6"},
        {28597, "ISO-8859-7"},
        {28598, "ISO-8859-8"},
        {38598, "ISO-8859-8"},
        {50220, "Shift_JIS"},
        {50225, "ISO-2022-KR"},
        {51932, "EUC-JP"},
        {51949, "EUC-KR"},
        {52936, "HZ-GB-2312"},
        {65000, "UTF-7"},
        {65001, "UTF-8"},
    }};
    std::set<std::uint32_t> listed;
    for (const auto& [codePage, name] : rows) {
        EXPECT_EQ(codePageName(codePage), name) << codePage;
        EXPECT_NE(canonicalName(name), "") << name << " is unknown to ICU";
        listed.insert(codePage);
    }
    EXPECT_EQ(listed.size(), rows.size());
    for (std::uint32_t codePage = 0; codePage <= 70000; ++codePage) {
        if (listed.count(codePage) == 0) {
            EXPECT_EQ(codePageName(codePage), "") << codePage;
        }
    }
    EXPECT_EQ(codePageName(0xFFFFFFFF), "");
}

TEST(RegistryNormaliseName, PrefersMimeThenIanaThenIcusOwnName) {
    struct Row {
        const char* name;
        const char* canonical;
    };
    for (const Row& row : {
             Row{"sjis", "Shift_JIS"},          // MIME
             Row{"cp1252", "windows-1252"},     // IANA only
             Row{"cp737", "ibm-737_P100-1997"}, // neither
             Row{"eucjis", "EUC-JP"},           // MIME and IANA differ
             Row{"gb18030", "GB18030"},         // differ in case
             Row{"UTF-16", "UTF-16LE"},
             Row{"utf16", "UTF-16LE"},
             Row{"UTF-32", "UTF-32LE"},
             Row{"UTF-16BE", "UTF-16BE"},
             Row{"UTF-16LE", "UTF-16LE"},
             Row{"utf-32be", "UTF-32BE"},
             Row{"TIS-620", "windows-874-2000"},
             Row{"ibm-874_P100-1995", "TIS-620"},
             Row{"no-such-charset", ""},
             Row{"", ""},
         }) {
        EXPECT_EQ(EncodingRegistry::normaliseName(row.name), row.canonical) << row.name;
    }
}

TEST(RegistryNormaliseName, AgreesWithIcuForEveryAlias) {
    for (const std::string& alias : kvt::test::icuAliases()) {
        EXPECT_EQ(EncodingRegistry::normaliseName(alias), canonicalName(alias)) << alias;
    }
}

TEST(RegistryNormaliseName, ClosesWhatItOpens) {
    // A leak would show in the sanitizers' builds; here the calls are at least one for one.
    const std::size_t before = openCalls();
    EncodingRegistry::normaliseName("KOI8-R");
    EncodingRegistry::normaliseName("no-such-charset");
    EXPECT_EQ(openCalls() - before, 2u);
}

TEST(RegistryNames, OfLowIdsAreTheFixedOnes) {
    for (const kvt::test::FixedName& row : kvt::test::fixedNames) {
        if (row.name != nullptr) {
            EXPECT_EQ(registry().nameOf(row.id), row.name);
        }
    }
    EXPECT_NE(canonicalName(std::string(registry().nameOf(27))), "");
}

TEST(RegistryNames, OfIdsThatWereNotHandedOutAreEmpty) {
    const std::uint32_t free = firstFreeId();
    for (const std::uint32_t id : {free, free + 1, free + 1000, 0x7FFFFFFFu, 0xFFFFFFFFu}) {
        EXPECT_TRUE(registry().nameOf(id).empty()) << id;
    }
}

TEST(RegistryLookup, FixedNamesNeverReachIcu) {
    for (const kvt::test::FixedName& row : kvt::test::fixedNames) {
        if (row.name != nullptr && row.id != Encoding::Unknown) {
            EXPECT_EQ(callsFor(row.name), 0u) << row.name;
            EXPECT_EQ(registry().lookupId(row.name), row.id);
        }
    }
    for (const kvt::test::NameToId& row : kvt::test::nameAliases) {
        EXPECT_EQ(callsFor(row.name), 0u) << row.name;
        EXPECT_EQ(registry().lookupId(row.name), row.id);
    }
    EXPECT_EQ(callsFor(std::string(registry().nameOf(27))), 0u);
}

TEST(RegistryLookup, ASpellingReachesIcuOnce) {
    for (const char* const name : {"Latin-1", "uTf-8", "ibm-1123", "CSkoi8R", "no-such-charset", "\xFF"}) {
        EXPECT_EQ(callsFor(name), 1u) << name;
        EXPECT_EQ(callsFor(name), 0u) << name;
    }
    // The canonical name is remembered with the first spelling of it.
    EXPECT_EQ(callsFor("csBig5"), 1u);
    EXPECT_EQ(callsFor("Big5"), 0u);
    EXPECT_EQ(callsFor("x-big5"), 1u);
    EXPECT_EQ(callsFor("x-big5"), 0u);
}

TEST(RegistryLookup, IdsAreHandedOutInOrderOfFirstUse) {
    const std::uint32_t first = firstFreeId();
    const std::array names{"ibm-1047_P100-1995", "ISO-2022-CN", "ibm-1140_P100-1997", "SCSU"};
    for (std::uint32_t i = 0; i < names.size(); ++i) {
        EXPECT_EQ(registry().lookupId(names[i]), first + i) << names[i];
    }
    EXPECT_EQ(registry().lookupId("Cp1047"), first);
    EXPECT_EQ(registry().nameOf(first + 3), "SCSU");
    EXPECT_TRUE(registry().nameOf(first + 4).empty());
}

TEST(RegistryLookup, UnknownNamesTakeNoId) {
    const std::uint32_t first = firstFreeId();
    for (int i = 0; i < 500; ++i) {
        EXPECT_EQ(registry().lookupId("no-such-" + std::to_string(i)), 30u);
    }
    EXPECT_EQ(firstFreeId(), first);
    EXPECT_EQ(registry().lookupId("ibm-1141_P100-1997"), first);
}

TEST(RegistryLookup, ACanonicalNameMayBeTheSpellingOfAnotherConverter) {
    // What "TIS-620" opens is not the converter whose IANA name it is; whoever comes first decides. Here it is a
    // spelling of an encoding that has its id already, and must be remembered as that.
    const std::uint32_t opened = registry().lookupId("windows-874-2000");
    EXPECT_EQ(registry().nameOf(opened), "windows-874-2000");
    EXPECT_EQ(registry().lookupId("TIS-620"), opened);
    EXPECT_EQ(registry().lookupId("ibm-874_P100-1995"), opened);
}

TEST(RegistryLookup, WhenMemoryRunsOutNoIdIsLostOrSharedByTwo) {
    registry().lookupId("ibm-1142_P100-1997");
    std::uint32_t expected = firstFreeId();
    std::size_t failures = 0;
    for (const char* const name :
         {"cp1143", "ibm-1144_P100-1997", "ebcdic-fr-297+euro", "IBM01148", "CP01149", "ibm-1153_P100-1999",
          "a name that is not known and does not fit a small-string buffer", "ibm-1154_P100-1999", "cp1155",
          "ibm-1156_P100-1999", "ibm-1157_P100-1999", "ibm-1158_P100-1999", "x-IBM1160"}) {
        std::uint32_t id = 0;
        failures += kvt::test::failEachAllocation([&] { id = registry().lookupId(name); },
                                                  [&](std::size_t) {
                                                      // Another name is served all the same.
                                                      EXPECT_EQ(registry().lookupId("UTF-8"), 0u);
                                                  });
        const std::string canonical = canonicalName(name);
        if (canonical.empty()) {
            EXPECT_EQ(id, 30u) << name;
            continue;
        }
        EXPECT_EQ(id, expected++) << name;
        EXPECT_EQ(registry().nameOf(id), canonical) << name;
        EXPECT_EQ(registry().lookupId(canonical), id) << name;
        EXPECT_EQ(registry().lookupId(name), id) << name;
    }
    EXPECT_EQ(firstFreeId(), expected);
    EXPECT_GE(failures, 20u);
}

TEST(CodePageTemplates, AFailingFirstCallIsTriedAgain) {
    registry(); // its construction asks ICU for the system's name
    auto refused = std::make_unique<kvt::test::RefusedConverter>("x-mac-greek");
    const std::size_t before = openCalls();
    try {
        Encoding::windowsCodePage<10006>();
        FAIL() << "nothing was thrown";
    } catch (const InvalidEncodingException& failure) {
        EXPECT_EQ(kvt::test::itemsOf(failure), std::vector<std::string>{"message 910005|x-mac-greek"});
    }
    EXPECT_EQ(openCalls() - before, 1u);
    // The name is remembered as unknown, so the next call fails as well, without ICU.
    EXPECT_THROW(Encoding::windowsCodePage<10006>(), InvalidEncodingException);
    EXPECT_EQ(openCalls() - before, 1u);
    refused.reset();
    EXPECT_THROW(Encoding::windowsCodePage<10006>(), InvalidEncodingException);
}

TEST(CodePageTemplates, AFirstCallWithoutMemoryIsTriedAgain) {
    Encoding encoding = Encoding::Unknown;
    const std::size_t failures = kvt::test::failEachAllocation(
        [&] { encoding = Encoding::windowsCodePage<10029>(); }, [](std::size_t) {});
    EXPECT_GE(failures, 1u);
    EXPECT_EQ(encoding.getName(), "x-mac-centraleurroman");
}

TEST(CodePageTemplates, LookUpOnce) {
    Encoding::windowsCodePage<10007>();
    const std::size_t before = openCalls();
    EXPECT_EQ(Encoding::windowsCodePage<10007>().getName(), "x-mac-cyrillic");
    Encoding::windowsCodePage<1252>();
    Encoding::windowsCodePage<20127>();
    Encoding::ibmCodePage<367>();
    EXPECT_EQ(openCalls(), before);
}

// The last test of this program, as it leaves no name that is new.
TEST(RegistryViews, StayWhileOthersAreAdded) {
    const std::string_view view =
        registry().nameOf(registry().lookupId("cp037")); // short enough to be inline
    const char* const data = view.data();
    for (const std::string& alias : kvt::test::icuAliases()) {
        registry().lookupId(alias);
    }
    EXPECT_EQ(registry().nameOf(registry().lookupId("cp037")).data(), data);
    EXPECT_EQ(view, "IBM037");
}

} // namespace
