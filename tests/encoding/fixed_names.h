// The encodings that have a fixed id, for all tests of names and ids.
#pragma once

#include <kvt/encoding/encoding.h>

#include <array>
#include <cstdint>

namespace kvt::test {

struct FixedName {
    kvt::ex::Encoding::Type type;
    std::uint32_t id;
    /// What getName gives; null where it depends on the process's locale.
    const char* name;
};

inline constexpr std::array fixedNames{
    FixedName{kvt::ex::Encoding::Utf8, 0, "UTF-8"},
    FixedName{kvt::ex::Encoding::UsAscii, 1, "US-ASCII"},
    FixedName{kvt::ex::Encoding::Utf16LE, 2, "UTF-16LE"},
    FixedName{kvt::ex::Encoding::Utf32LE, 3, "UTF-32LE"},
    FixedName{kvt::ex::Encoding::Utf16BE, 4, "UTF-16BE"},
    FixedName{kvt::ex::Encoding::Utf32BE, 5, "UTF-32BE"},
    FixedName{kvt::ex::Encoding::Iso8859_1, 6, "ISO-8859-1"},
    FixedName{kvt::ex::Encoding::Iso8859_2, 7, "ISO-8859-2"},
    FixedName{kvt::ex::Encoding::Iso8859_3, 8, "ISO-8859-3"},
    FixedName{kvt::ex::Encoding::Iso8859_4, 9, "ISO-8859-4"},
    FixedName{kvt::ex::Encoding::Iso8859_5, 10, "ISO-8859-5"},
    FixedName{kvt::ex::Encoding::Iso8859_6, 11, "ISO-8859-6"},
    FixedName{kvt::ex::Encoding::Iso8859_7, 12, "ISO-8859-7"},
    FixedName{kvt::ex::Encoding::Iso8859_8, 13, "ISO-8859-8"},
    FixedName{kvt::ex::Encoding::Iso8859_9, 14, "ISO-8859-9"},
    FixedName{kvt::ex::Encoding::Iso8859_11, 15, "iso-8859-11-2001"},
    FixedName{kvt::ex::Encoding::Iso8859_13, 16, "ISO-8859-13"},
    FixedName{kvt::ex::Encoding::Iso8859_15, 17, "ISO-8859-15"},
    FixedName{kvt::ex::Encoding::Windows1250, 18, "windows-1250"},
    FixedName{kvt::ex::Encoding::Windows1251, 19, "windows-1251"},
    FixedName{kvt::ex::Encoding::Windows1252, 20, "windows-1252"},
    FixedName{kvt::ex::Encoding::Windows1253, 21, "windows-1253"},
    FixedName{kvt::ex::Encoding::Windows1254, 22, "windows-1254"},
    FixedName{kvt::ex::Encoding::Windows1255, 23, "windows-1255"},
    FixedName{kvt::ex::Encoding::Windows1256, 24, "windows-1256"},
    FixedName{kvt::ex::Encoding::Windows1257, 25, "windows-1257"},
    FixedName{kvt::ex::Encoding::Windows1258, 26, "windows-1258"},
    FixedName{kvt::ex::Encoding::System, 27, nullptr},
    FixedName{kvt::ex::Encoding::Binary, 28, "zqt-binary"},
    FixedName{kvt::ex::Encoding::Wwjd, 29, "zqt-wwjd"},
    FixedName{kvt::ex::Encoding::Unknown, 30, "Unknown Encoding"},
};

struct NameToId {
    const char* name;
    std::uint32_t id;
};

/// Names that are accepted and never given back.
inline constexpr std::array nameAliases{
    NameToId{"", 30},       NameToId{"zqt-system", 27}, NameToId{"ANSI", 27},   NameToId{"SYSTEM", 27},
    NameToId{"system", 27}, NameToId{"BINARY", 28},     NameToId{"binary", 28},
};

/// The first id that no fixed encoding has.
inline constexpr std::uint32_t firstDynamicId = 31;

} // namespace kvt::test
