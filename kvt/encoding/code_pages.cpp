// Encodings by code page number: the table for the system's locale and the two families of named pages.
#include <kvt/encoding/detail/code_page_names.h>
#include <kvt/encoding/encoding.h>

#include <algorithm>
#include <array>

namespace kvt::ex {
namespace detail {
namespace {

struct CodePage {
    std::uint32_t number;
    std::string_view name;
};

constexpr std::array codePages = {
    CodePage{708, "ISO-8859-6"},
    CodePage{720, "ibm-720_P100-1997"},
    CodePage{852, "IBM852"},
    CodePage{862, "IBM862"},
    CodePage{866, "IBM866"},
    CodePage{874, "windows-874-2000"},
    CodePage{932, "Shift_JIS"},
    CodePage{936, "GBK"},
    CodePage{949, "EUC-KR"},
    CodePage{950, "Big5"},
    CodePage{951, "ibm-5471_P100-2006"},
    CodePage{1200, "ISO-8859-1"},
    CodePage{1201, "ISO-8859-1"},
    CodePage{1250, "windows-1250"},
    CodePage{1251, "windows-1251"},
    CodePage{1252, "windows-1252"},
    CodePage{1253, "windows-1253"},
    CodePage{1254, "windows-1254"},
    CodePage{1255, "windows-1255"},
    CodePage{1256, "windows-1256"},
    CodePage{1257, "windows-1257"},
    CodePage{1258, "windows-1258"},
    CodePage{20866, "KOI8-R"},
    CodePage{28592, "ISO-8859-2"},
    CodePage{28593, "ISO-8859-3"},
    CodePage{28594, "ISO-8859-4"},
    CodePage{28595, "ISO-8859-5"},
    CodePage{28596, "ISO-8859-6"},
    CodePage{28597, "ISO-8859-7"},
    CodePage{28598, "ISO-8859-8"},
    CodePage{38598, "ISO-8859-8"},
    CodePage{50220, "Shift_JIS"},
    CodePage{50225, "ISO-2022-KR"},
    CodePage{51932, "EUC-JP"},
    CodePage{51949, "EUC-KR"},
    CodePage{52936, "HZ-GB-2312"},
    CodePage{65000, "UTF-7"},
    CodePage{65001, "UTF-8"},
};

} // namespace

std::string_view codePageName(std::uint32_t codePage) {
    const auto* const found = std::find_if(codePages.begin(), codePages.end(),
                                           [&](const CodePage& page) { return page.number == codePage; });
    return found != codePages.end() ? found->name : std::string_view();
}

} // namespace detail

// A page by its name: looked up at the first call, and again at the next when that throws.
#define KVT_NAMED_PAGE(family, number, name)                                                                 \
    template <>                                                                                              \
    Encoding Encoding::family<number>() {                                                                    \
        static const Encoding encoding{kvt::future::string_view(name)};                                      \
        return encoding;                                                                                     \
    }
// A page with a fixed id.
#define KVT_FIXED_PAGE(family, number, type)                                                                 \
    template <>                                                                                              \
    Encoding Encoding::family<number>() {                                                                    \
        return type;                                                                                         \
    }
// A page that is the same in both families.
#define KVT_SHARED_PAGE(number)                                                                              \
    template <>                                                                                              \
    Encoding Encoding::windowsCodePage<number>() {                                                           \
        return ibmCodePage<number>();                                                                        \
    }

KVT_NAMED_PAGE(ibmCodePage, 37, "IBM037")
KVT_FIXED_PAGE(ibmCodePage, 367, UsAscii)
KVT_NAMED_PAGE(ibmCodePage, 437, "IBM437")
KVT_NAMED_PAGE(ibmCodePage, 775, "IBM775")
KVT_NAMED_PAGE(ibmCodePage, 850, "IBM850")
KVT_NAMED_PAGE(ibmCodePage, 852, "IBM852")
KVT_NAMED_PAGE(ibmCodePage, 855, "IBM855")
KVT_NAMED_PAGE(ibmCodePage, 857, "IBM857")
KVT_NAMED_PAGE(ibmCodePage, 860, "IBM860")
KVT_NAMED_PAGE(ibmCodePage, 861, "IBM861")
KVT_NAMED_PAGE(ibmCodePage, 862, "IBM862")
KVT_NAMED_PAGE(ibmCodePage, 863, "IBM863")
KVT_NAMED_PAGE(ibmCodePage, 864, "IBM864")
KVT_NAMED_PAGE(ibmCodePage, 865, "IBM865")
KVT_NAMED_PAGE(ibmCodePage, 866, "IBM866")
KVT_NAMED_PAGE(ibmCodePage, 869, "IBM869")
KVT_NAMED_PAGE(ibmCodePage, 720, "ibm-720_P100-1997")
KVT_NAMED_PAGE(ibmCodePage, 737, "ibm-737_P100-1997")
KVT_NAMED_PAGE(ibmCodePage, 874, "TIS-620")
KVT_NAMED_PAGE(ibmCodePage, 950, "ibm-950_P110-1999")

KVT_SHARED_PAGE(437)
KVT_SHARED_PAGE(720)
KVT_SHARED_PAGE(737)
KVT_SHARED_PAGE(775)
KVT_SHARED_PAGE(850)
KVT_SHARED_PAGE(852)
KVT_SHARED_PAGE(855)
KVT_SHARED_PAGE(857)
KVT_SHARED_PAGE(861)
KVT_SHARED_PAGE(862)
KVT_SHARED_PAGE(866)
KVT_SHARED_PAGE(869)
KVT_NAMED_PAGE(windowsCodePage, 874, "windows-874-2000")
KVT_NAMED_PAGE(windowsCodePage, 932, "Shift_JIS")
KVT_NAMED_PAGE(windowsCodePage, 936, "GBK")
KVT_NAMED_PAGE(windowsCodePage, 949, "KSC_5601")
KVT_NAMED_PAGE(windowsCodePage, 950, "Big5")
KVT_FIXED_PAGE(windowsCodePage, 1250, Windows1250)
KVT_FIXED_PAGE(windowsCodePage, 1251, Windows1251)
KVT_FIXED_PAGE(windowsCodePage, 1252, Windows1252)
KVT_FIXED_PAGE(windowsCodePage, 1253, Windows1253)
KVT_FIXED_PAGE(windowsCodePage, 1254, Windows1254)
KVT_FIXED_PAGE(windowsCodePage, 1255, Windows1255)
KVT_FIXED_PAGE(windowsCodePage, 1256, Windows1256)
KVT_FIXED_PAGE(windowsCodePage, 1257, Windows1257)
KVT_FIXED_PAGE(windowsCodePage, 1258, Windows1258)
KVT_NAMED_PAGE(windowsCodePage, 10000, "macintosh")
KVT_NAMED_PAGE(windowsCodePage, 10006, "x-mac-greek")
KVT_NAMED_PAGE(windowsCodePage, 10007, "x-mac-cyrillic")
KVT_NAMED_PAGE(windowsCodePage, 10029, "x-mac-centraleurroman")
KVT_FIXED_PAGE(windowsCodePage, 20127, UsAscii)

#undef KVT_NAMED_PAGE
#undef KVT_FIXED_PAGE
#undef KVT_SHARED_PAGE

} // namespace kvt::ex
