// Short texts without ICU (see detail/short_text.h).
//
// All but ASCII is converted into a buffer, so that the result can be made in one piece without a pass that measures it:
// in one step between Unicode forms and between UTF-8 and a table, else by way of UTF-16.
#include <kvt/encoding/detail/short_text.h>

#include <kvt/encoding/detail/copy_short.h>
#include <kvt/encoding/detail/encoding_profile.h>
#include <kvt/encoding/detail/short_ascii.h>
#include <kvt/encoding/detail/unicode_vectors.h>
#include <kvt/foundation/detail/append_in_place.h>

#include <cstdint>

namespace kvt::ex::detail {
namespace {

template <typename From, typename To, typename CharOut>
bool convertAscii(std::string_view in, std::basic_string<CharOut>& out) {
    const std::size_t units = in.size() / sizeof(From);
    const bool isText = in.size() % sizeof(From) == 0 && isAscii<From>(in.data(), units);
    if (isText) {
        appendAscii<From, To>(in.data(), units, out);
    }
    return isText;
}

/// From units of one size to a form that has ASCII as it is.
template <typename From, typename CharOut>
bool convertAscii(Form to, std::string_view in, std::basic_string<CharOut>& out) {
    if constexpr (sizeof(CharOut) == 1) {
        if (isAsciiBytes(to)) {
            return convertAscii<From, std::uint8_t>(in, out);
        }
    }
    if constexpr (sizeof(CharOut) != sizeof(char32_t)) {
        if (to == nativeUtf16) {
            return convertAscii<From, std::uint16_t>(in, out);
        }
    }
    if constexpr (sizeof(CharOut) != sizeof(char16_t)) {
        if (to == nativeUtf32) {
            return convertAscii<From, std::uint32_t>(in, out);
        }
    }
    return false;
}

template <typename CharOut>
bool convertAscii(Form from, Form to, std::string_view in, std::basic_string<CharOut>& out) {
    return isAsciiBytes(from)    ? convertAscii<std::uint8_t>(to, in, out)
           : from == nativeUtf16 ? convertAscii<std::uint16_t>(to, in, out)
           : from == nativeUtf32 ? convertAscii<std::uint32_t>(to, in, out)
                                 : false;
}

using vectors::notWhole;
using vectors::shortRoom;

std::size_t bytesOf(std::size_t units, std::size_t unitBytes) {
    return units != notWhole ? units * unitBytes : notWhole;
}

/// Reads a short text as UTF-16, or nothing of it. Where it comes from UTF-16, it may be ill-formed.
std::size_t readShort(Side from, std::string_view in, char16_t* units) {
    auto* const out = reinterpret_cast<char*>(units);
    switch (from.form) {
    case Form::utf8:
        return vectors::shortUtf8ToUtf16(in.data(), in.size(), out);
    case nativeUtf16:
        copyShort(in.data(), in.size(), out);
        return in.size() % 2 == 0 ? in.size() / 2 : notWhole;
    case nativeUtf32:
        return in.size() % 4 == 0 ? vectors::shortUtf32ToUtf16(in.data(), in.size() / 4, out) : notWhole;
    default:
        if (!hasTables(from.form) || from.profile->decoding() == nullptr) {
            return notWhole;
        }
        const std::size_t read = from.profile->decoding()->read(in, units, shortRoom);
        return in.empty() ? read : notWhole;
    }
}

/// Writes UTF-16, which may be ill-formed, or nothing of it, and returns the bytes.
std::size_t writeShort(Side to, const char* units, std::size_t count, char* out) {
    return to.form == Form::utf8    ? vectors::shortUtf16ToUtf8(units, count, out)
           : to.form == nativeUtf32 ? bytesOf(vectors::shortUtf16ToUtf32(units, count, out), sizeof(char32_t))
                                    : notWhole;
}

std::size_t writeByTable(const EncodingProfile& to, const char16_t* units, std::size_t count, char* out) {
    const EncodingTable* const table = to.encoding();
    if (table == nullptr) {
        return notWhole;
    }
    const EncodingTable::Written written = table->write(units, count, out, shortRoom);
    return written.units == count ? written.bytes : notWhole;
}

std::size_t convertByUtf16(Side from, Side to, std::string_view in, char* out) {
    alignas(64) char16_t units[shortRoom];
    const std::size_t count = readShort(from, in, units);
    return count == notWhole    ? notWhole
           : hasTables(to.form) ? writeByTable(*to.profile, units, count, out)
                                : writeShort(to, reinterpret_cast<const char*>(units), count, out);
}

/// The bytes written, or `notWhole`.
std::size_t convertTo(Side from, Side to, std::string_view in, char* out) {
    if (from.form == nativeUtf16 && !hasTables(to.form)) {
        return in.size() % sizeof(char16_t) == 0
                   ? writeShort(to, in.data(), in.size() / sizeof(char16_t), out)
                   : notWhole;
    }
    if (to.form == nativeUtf16) {
        return bytesOf(readShort(from, in, reinterpret_cast<char16_t*>(out)), sizeof(char16_t));
    }
    if (from.form == Form::utf8 && to.form == nativeUtf32) {
        // Beyond U+FFFF, too.
        return bytesOf(vectors::shortUtf8ToUtf32(in.data(), in.size(), out), sizeof(char32_t));
    }
    return convertByUtf16(from, to, in, out);
}

/// A table of single bytes.
bool readSingles(const DecodingTable& table, std::string_view in, std::string& out) {
    const std::size_t room = table.roomForUtf8(in);
    const std::size_t before = out.size();
    appendInPlace(out, room, [&](char* place) { return table.readUtf8(in, place, room); });
    if (!in.empty()) {
        out.resize(before);
    }
    return in.empty();
}

/// One of single bytes and of pairs.
bool readPairs(const DecodingTable& table, std::string_view in, std::string& out) {
    DecodingTable::Utf8Cell cells[vectors::shortText];
    const DecodingTable::Found found = table.find(in, cells);
    if (found.bytes == notWhole) {
        return false;
    }
    appendInPlace(out, found.bytes, [&](char* place) {
        DecodingTable::join(cells, found.characters, place);
        return found.bytes;
    });
    return true;
}

/// First into what `out` has, since to allocate would take longer than to convert.
bool writeFew(const EncodingTable& table, std::string_view in, std::string& out) {
    const std::size_t before = out.size();
    std::size_t room = out.capacity() - before;
    const auto write = [&](char* place) { return table.writeUtf8(in, place, room); };
    appendInPlace(out, room, write);
    if (!in.empty()) {
        room = table.roomFor({in.size(), in.size(), in.size(), in.size()});
        appendInPlace(out, room, write);
    }
    if (!in.empty()) {
        out.resize(before);
    }
    return in.empty();
}

/// By way of UTF-16 in registers, which is faster for more than a few characters.
bool writeByUtf16(const EncodingTable& table, std::string_view in, std::string& out) {
    alignas(64) char16_t units[shortRoom];
    const std::size_t count = vectors::shortUtf8ToUtf16(in.data(), in.size(), reinterpret_cast<char*>(units));
    if (count == notWhole) {
        return false;
    }
    const std::size_t before = out.size();
    const std::size_t room = table.roomFor({in.size(), in.size(), count, count});
    EncodingTable::Written written{};
    appendInPlace(out, room, [&](char* place) {
        written = table.write(units, count, place, room);
        return written.bytes;
    });
    if (written.units != count) {
        out.resize(before);
    }
    return written.units == count;
}

// Up to so many bytes a table and UTF-8 need no registers between them.
constexpr std::size_t fewBytes = 32;

/// Between UTF-8 and a form with tables.
bool convertByTable(Side from, Side to, std::string_view in, std::string& out) {
    if (from.form == Form::utf8) {
        const EncodingTable* const table = to.profile->encoding();
        return table != nullptr &&
               (in.size() <= fewBytes ? writeFew(*table, in, out) : writeByUtf16(*table, in, out));
    }
    const DecodingTable* const table = from.profile->decoding();
    return table != nullptr && (table->hasPairs()       ? readPairs(*table, in, out)
                                : in.size() <= fewBytes ? readSingles(*table, in, out)
                                                        : convertShortBuffered(from, to, in, out));
}

bool isShort(Side from, Side to, std::size_t bytes, std::size_t unit) {
    return bytes <= vectors::shortText * unitBytes(from.form) && (unit == 1 || unit == unitBytes(to.form));
}

} // namespace

template <typename CharOut>
bool convertShortBuffered(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    alignas(64) char bytes[shortRoom * sizeof(char32_t)];
    const std::size_t written =
        isShort(from, to, in.size(), sizeof(CharOut)) ? convertTo(from, to, in, bytes) : notWhole;
    if (written == notWhole) {
        return false;
    }
    const std::size_t units = written / sizeof(CharOut);
    appendInPlace(out, units, [&](CharOut* place) {
        copyShort(bytes, written, place);
        return units;
    });
    return true;
}

template <typename CharOut>
bool convertShort(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    if (!isShort(from, to, in.size(), sizeof(CharOut))) {
        return false;
    }
    if (convertAscii(from.form, to.form, in, out)) {
        return true;
    }
    if constexpr (sizeof(CharOut) == 1) {
        if ((from.form == Form::utf8 && hasTables(to.form)) ||
            (to.form == Form::utf8 && hasTables(from.form))) {
            return convertByTable(from, to, in, out);
        }
    }
    return convertShortBuffered(from, to, in, out);
}

#define KVT_INSTANTIATE(CharOut)                                                                             \
    template bool convertShort(Side, Side, std::string_view, std::basic_string<CharOut>&);                   \
    template bool convertShortBuffered(Side, Side, std::string_view, std::basic_string<CharOut>&);

KVT_INSTANTIATE(char)
KVT_INSTANTIATE(char16_t)
KVT_INSTANTIATE(char32_t)

#undef KVT_INSTANTIATE

} // namespace kvt::ex::detail
