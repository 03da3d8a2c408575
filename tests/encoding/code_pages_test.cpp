// The two families of code page numbers.
#include <encoding/icu_oracle.h>

#include <kvt/encoding/encoding.h>

#include <gtest/gtest.h>

#include <array>
#include <cstddef>
#include <string>
#include <utility>

namespace {

using kvt::ex::Encoding;
using View = kvt::future::string_view;

struct Page {
    unsigned number;
    Encoding (*get)();
    const char* name;
};

template <unsigned N>
constexpr Page windows(const char* name) {
    return {N, &Encoding::windowsCodePage<N>, name};
}

template <unsigned N>
constexpr Page ibm(const char* name) {
    return {N, &Encoding::ibmCodePage<N>, name};
}

const std::array windowsPages{
    windows<437>("IBM437"),
    windows<720>("ibm-720_P100-1997"),
    windows<737>("ibm-737_P100-1997"),
    windows<775>("IBM775"),
    windows<850>("IBM850"),
    windows<852>("IBM852"),
    windows<855>("IBM855"),
    windows<857>("IBM857"),
    windows<861>("IBM861"),
    windows<862>("IBM862"),
    windows<866>("IBM866"),
    windows<869>("IBM869"),
    windows<874>("windows-874-2000"),
    windows<932>("Shift_JIS"),
    windows<936>("GBK"),
    windows<949>("KSC_5601"),
    windows<950>("Big5"),
    windows<1250>("windows-1250"),
    windows<1251>("windows-1251"),
    windows<1252>("windows-1252"),
    windows<1253>("windows-1253"),
    windows<1254>("windows-1254"),
    windows<1255>("windows-1255"),
    windows<1256>("windows-1256"),
    windows<1257>("windows-1257"),
    windows<1258>("windows-1258"),
    windows<10000>("macintosh"),
    windows<10006>("x-mac-greek"),
    windows<10007>("x-mac-cyrillic"),
    windows<10029>("x-mac-centraleurroman"),
    windows<20127>("US-ASCII"),
};

const std::array ibmPages{
    ibm<37>("IBM037"),
    ibm<367>("US-ASCII"),
    ibm<437>("IBM437"),
    ibm<720>("ibm-720_P100-1997"),
    ibm<737>("ibm-737_P100-1997"),
    ibm<775>("IBM775"),
    ibm<850>("IBM850"),
    ibm<852>("IBM852"),
    ibm<855>("IBM855"),
    ibm<857>("IBM857"),
    ibm<860>("IBM860"),
    ibm<861>("IBM861"),
    ibm<862>("IBM862"),
    ibm<863>("IBM863"),
    ibm<864>("IBM864"),
    ibm<865>("IBM865"),
    ibm<866>("IBM866"),
    ibm<869>("IBM869"),
    ibm<874>("TIS-620"),
    ibm<950>("ibm-950_P110-1999"),
};

template <std::size_t Count>
void checkPages(const std::array<Page, Count>& pages) {
    for (const Page& page : pages) {
        const Encoding encoding = page.get();
        EXPECT_NE(encoding.id(), Encoding::Unknown) << page.number;
        EXPECT_EQ(encoding.id(), Encoding(View(page.name)).id()) << page.number << " " << page.name;
        EXPECT_EQ(page.get().id(), encoding.id()) << page.number << " again";
        if (page.number != 874) { // "TIS-620" names one converter and is the IANA name of another
            EXPECT_EQ(encoding.getName(), kvt::test::canonicalName(page.name)) << page.number;
        }
    }
}

TEST(WindowsCodePage, EachNumberHasItsEncoding) {
    ASSERT_EQ(windowsPages.size(), 31u);
    checkPages(windowsPages);
}

TEST(IbmCodePage, EachNumberHasItsEncoding) {
    ASSERT_EQ(ibmPages.size(), 20u);
    checkPages(ibmPages);
}

TEST(WindowsCodePage, HasFixedIdsWhereThereAreSome) {
    EXPECT_EQ(Encoding::windowsCodePage<1250>().id(), 18u);
    EXPECT_EQ(Encoding::windowsCodePage<1251>().id(), 19u);
    EXPECT_EQ(Encoding::windowsCodePage<1252>().id(), 20u);
    EXPECT_EQ(Encoding::windowsCodePage<1253>().id(), 21u);
    EXPECT_EQ(Encoding::windowsCodePage<1254>().id(), 22u);
    EXPECT_EQ(Encoding::windowsCodePage<1255>().id(), 23u);
    EXPECT_EQ(Encoding::windowsCodePage<1256>().id(), 24u);
    EXPECT_EQ(Encoding::windowsCodePage<1257>().id(), 25u);
    EXPECT_EQ(Encoding::windowsCodePage<1258>().id(), 26u);
    EXPECT_EQ(Encoding::windowsCodePage<20127>().id(), 1u);
    EXPECT_EQ(Encoding::ibmCodePage<367>().id(), 1u);
}

TEST(WindowsCodePage, SharesTwelvePagesWithTheOtherFamily) {
    for (const Page& page : windowsPages) {
        if (page.number > 869) {
            break;
        }
        for (const Page& other : ibmPages) {
            if (other.number == page.number) {
                EXPECT_EQ(page.get(), other.get()) << page.number;
            }
        }
    }
}

TEST(WindowsCodePage, DiffersFromTheOtherFamilyWhereTheNumbersAgreeByChance) {
    EXPECT_NE(Encoding::windowsCodePage<950>(), Encoding::ibmCodePage<950>());
    // The page of the system's table for 949 is another one than that of the family.
    EXPECT_EQ(Encoding::windowsCodePage<949>().getName(), "KSC_5601");
    EXPECT_NE(Encoding::windowsCodePage<949>(), Encoding(View("EUC-KR")));
}

template <unsigned N>
constexpr bool hasWindows = requires {
    Encoding::windowsCodePage<N>();
};
template <unsigned N>
constexpr bool hasIbm = requires {
    Encoding::ibmCodePage<N>();
};

constexpr unsigned scanned = 1300;

template <std::size_t... N>
constexpr auto windowsNumbers(std::index_sequence<N...>) {
    return std::array<bool, sizeof...(N)>{hasWindows<N>...};
}
template <std::size_t... N>
constexpr auto ibmNumbers(std::index_sequence<N...>) {
    return std::array<bool, sizeof...(N)>{hasIbm<N>...};
}

template <std::size_t Count>
bool lists(const std::array<Page, Count>& pages, unsigned number) {
    for (const Page& page : pages) {
        if (page.number == number) {
            return true;
        }
    }
    return false;
}

TEST(CodePageFamilies, HaveNoOtherNumbers) {
    constexpr auto inWindows = windowsNumbers(std::make_index_sequence<scanned>());
    constexpr auto inIbm = ibmNumbers(std::make_index_sequence<scanned>());
    for (unsigned number = 0; number < scanned; ++number) {
        EXPECT_EQ(inWindows[number], lists(windowsPages, number)) << number;
        EXPECT_EQ(inIbm[number], lists(ibmPages, number)) << number;
    }
    static_assert(hasWindows<10000> && hasWindows<10006> && hasWindows<10007> && hasWindows<10029> &&
                  hasWindows<20127>);
    static_assert(!hasWindows<10001> && !hasWindows<10005> && !hasWindows<20866> && !hasWindows<28591> &&
                  !hasWindows<65001> && !hasWindows<51932>);
    static_assert(!hasIbm<1252> && !hasIbm<10000> && !hasIbm<20127> && !hasIbm<65001>);
}

} // namespace
