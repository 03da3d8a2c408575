// The shorter ways around ICU (see detail/shortcut.h).
//
// A conversion is measured first: how much of the input is well-formed and complete, and how long the result will be.
// Then the result is made in one piece. Between UTF-8, UTF-16 and UTF-32 in the machine's byte order, that is one step
// (detail/unicode_vectors.h). A code page comes to UTF-8 by its table, which is read once only, a piece of some kilobytes
// at a time. All other forms go by way of UTF-16, such a piece at a time: the code pages again by their tables, so that
// what they hold is measured as UTF-16; the forms in the other byte order by swapping. What is not well-formed, is cut
// off, or is more than the target's form can say, is left to ICU, so this code decides nothing about substitutions.
//
// What ICU does with the text that is taken here, and so must hold for these ways to be the same ones:
//
// - U+FEFF, also at the start, is a character like others in the forms with a stated byte order; none is added.
// - Noncharacters, U+FFFD and NUL pass. Surrogates (alone in UTF-16, encoded in UTF-8 and UTF-32), over-long UTF-8
//   and everything above U+10FFFF are ill-formed.
// - ASCII characters convert one by one, whatever follows. Some ICU tables hold sequences of characters that become
//   one, but none that begins with an ASCII character, and none of bytes that does; a test looks through them all.
#include <kvt/encoding/detail/shortcut.h>

#include <kvt/encoding/detail/encoding_profile.h>
#include <kvt/encoding/detail/short_text.h>
#include <kvt/encoding/detail/unicode_vectors.h>
#include <kvt/foundation/detail/append_in_place.h>
#include <kvt/foundation/detail/utf.h>
#include <kvt/platform/new_pages.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>

namespace kvt::ex::detail {
namespace {

using vectors::Extent;

constexpr std::size_t pivotUnits = 2048;
using Pivot = std::array<char16_t, pivotUnits>;

// The bytes that are tried first where the target may lack a character, so that a text with many such characters is not
// measured to its end after each of them. As long as all goes well, pieces become longer by the factor, as far as the
// next step still finds them in the cache.
constexpr std::size_t firstPiece = 32;
constexpr std::size_t onePiece = 256; // Less than this is taken at once.
constexpr std::size_t pieceFactor = 4;
constexpr std::size_t longestPiece = 8192;

/// Copies units with their bytes reversed. The loop is one that compilers make vector code of.
template <typename Unit>
void copySwapped(const char* from, char* to, std::size_t units) {
    for (std::size_t i = 0; i < units; ++i) {
        Unit unit;
        std::memcpy(&unit, from + i * sizeof unit, sizeof unit);
        if constexpr (sizeof unit == 2) {
            unit = __builtin_bswap16(unit);
        } else {
            unit = __builtin_bswap32(unit);
        }
        std::memcpy(to + i * sizeof unit, &unit, sizeof unit);
    }
}

// ---- How much there is to convert --------------------------------------------------------------------------------

void add(Extent& sum, const Extent& extent) {
    sum.taken += extent.taken;
    sum.utf8 += extent.utf8;
    sum.utf16 += extent.utf16;
    sum.utf32 += extent.utf32;
}

template <typename Unit>
Extent measureSwapped(std::string_view in, Extent (*measure)(const char*, std::size_t)) {
    Extent sum;
    char swapped[sizeof(Pivot)];
    for (bool ended = false; !ended;) {
        const std::size_t units =
            std::min(in.size() / sizeof(Unit) - sum.taken, sizeof swapped / sizeof(Unit));
        copySwapped<Unit>(in.data() + sum.taken * sizeof(Unit), swapped, units);
        const Extent extent = measure(swapped, units);
        add(sum, extent);
        // A piece may have been cut in the middle of a character, and then the next one begins with it.
        ended = extent.taken == 0 || extent.taken + 1 < units;
    }
    return sum;
}

/// The text of a form without tables.
Extent measure(Form from, std::string_view in) {
    switch (from) {
    case Form::asciiCompatible: {
        const std::size_t ascii = vectors::asciiPrefix(in.data(), in.size());
        return {ascii, ascii, ascii, ascii};
    }
    case Form::utf8:
        return vectors::measureUtf8(in.data(), in.size());
    case nativeUtf16:
        return vectors::measureUtf16(in.data(), in.size() / 2);
    case nativeUtf32:
        return vectors::measureUtf32(in.data(), in.size() / 4);
    default:
        return isUtf16(from) ? measureSwapped<std::uint16_t>(in, vectors::measureUtf16)
                             : measureSwapped<std::uint32_t>(in, vectors::measureUtf32);
    }
}

/// The bytes that suffice for a text in the target's form, if the target has all its characters.
std::size_t roomFor(const Extent& extent, Side to) {
    return hasTables(to.form)      ? to.profile->encoding()->roomFor(extent)
           : isUtf16(to.form)      ? extent.utf16 * 2
           : isUtf32(to.form)      ? extent.utf32 * 4
           : to.form == Form::utf8 ? extent.utf8
                                   : extent.utf32;
}

// ---- By way of UTF-16 --------------------------------------------------------------------------------------------

/// Reads well-formed text of a form without tables up to a character border, until the pivot is full. Returns the
/// units; `in` is moved on.
std::size_t decode(Form from, std::string_view& in, Pivot& pivot) {
    auto* const out = reinterpret_cast<char*>(pivot.data());
    std::size_t bytes = std::min(in.size(), pivotUnits * unitBytes(from));
    std::size_t units = 0;
    switch (from) {
    case Form::asciiCompatible:
        units = vectors::widenAscii(in.data(), bytes, out);
        break;
    case Form::utf8:
        while (bytes < in.size() && isContinuation(in[bytes])) {
            --bytes;
        }
        units = vectors::utf8ToUtf16(in.data(), bytes, out, pivotUnits);
        break;
    case Form::utf16le:
    case Form::utf16be:
        units = bytes / 2;
        if (from == nativeUtf16) {
            std::memcpy(out, in.data(), bytes);
        } else {
            copySwapped<std::uint16_t>(in.data(), out, units);
        }
        if (bytes < in.size() && isHighSurrogate(pivot[units - 1])) {
            --units;
            bytes -= 2;
        }
        break;
    default: {
        // Each character may take two units.
        bytes = std::min(in.size(), pivotUnits / 2 * sizeof(char32_t));
        std::array<char32_t, pivotUnits / 2> swapped;
        const char* source = in.data();
        if (from != nativeUtf32) {
            copySwapped<std::uint32_t>(source, reinterpret_cast<char*>(swapped.data()), bytes / 4);
            source = reinterpret_cast<const char*>(swapped.data());
        }
        units = vectors::utf32ToUtf16(source, bytes / 4, out, pivotUnits);
        break;
    }
    }
    in.remove_prefix(bytes);
    return units;
}

using Written = EncodingTable::Written;

/// Writes well-formed UTF-16, as far as the target has its characters. `out` has room for all of it.
Written encode(Side to, const char16_t* text, std::size_t units, char* out, std::size_t room) {
    const auto* const in = reinterpret_cast<const char*>(text);
    switch (to.form) {
    case Form::asciiCompatible: {
        const std::size_t ascii = vectors::narrowAscii(in, units, out);
        return {ascii, ascii};
    }
    case Form::asciiSingleByte:
    case Form::asciiSeveralBytes:
    case Form::singleByte:
    case Form::severalBytes:
        return to.profile->encoding()->write(text, units, out, room);
    case Form::utf8:
        return {units, vectors::utf16ToUtf8(in, units, out, room)};
    case nativeUtf16:
        std::memcpy(out, in, units * 2);
        return {units, units * 2};
    case nativeUtf32:
        return {units, vectors::utf16ToUtf32(in, units, out, room / 4) * 4};
    default:
        if (isUtf16(to.form)) {
            copySwapped<std::uint16_t>(in, out, units);
            return {units, units * 2};
        }
        std::array<char32_t, pivotUnits> wide;
        auto* const wideBytes = reinterpret_cast<char*>(wide.data());
        const std::size_t characters = vectors::utf16ToUtf32(in, units, wideBytes, wide.size());
        copySwapped<std::uint32_t>(wideBytes, out, characters);
        return {units, characters * 4};
    }
}

/// The bytes of `in` that well-formed units of UTF-16 were read from.
std::size_t sourceOf(Side from, std::string_view in, const char16_t* units, std::size_t count) {
    if (hasTables(from.form)) {
        return from.profile->decoding()->bytesOf(in, count);
    }
    if (from.form != Form::utf8 && !isUtf32(from.form)) {
        return count * unitBytes(from.form);
    }
    std::size_t beyondAscii = 0; // units from U+0080 and from U+0800
    std::size_t surrogates = 0;
    for (std::size_t i = 0; i < count; ++i) {
        beyondAscii += (units[i] >= 0x80 ? 1U : 0U) + (units[i] >= 0x800 ? 1U : 0U);
        surrogates += isSurrogate(units[i]) ? 1 : 0;
    }
    return from.form == Form::utf8 ? count + beyondAscii - surrogates : 4 * (count - surrogates / 2);
}

/// Reads what is well-formed at the beginning of a text, as much as the pivot may hold, and says whether the next piece
/// would be nothing.
std::size_t decodePiece(Side from, std::string_view in, Pivot& pivot, bool& ended) {
    if (hasTables(from.form)) {
        const std::size_t units = from.profile->decoding()->read(in, pivot.data(), pivotUnits);
        ended = units < pivotUnits;
        return units;
    }
    const std::string_view piece = in.substr(0, pivotUnits);
    const std::size_t wellFormed = measure(from.form, piece).taken * unitBytes(from.form);
    // A piece may have been cut in the middle of a character.
    ended = wellFormed + longestUtf8 <= piece.size() || wellFormed == 0;
    std::string_view text = piece.substr(0, wellFormed);
    return text.empty() ? 0 : decode(from.form, text, pivot);
}

/// How far a conversion came, in bytes.
struct Progress {
    std::size_t taken;
    std::size_t written;
};

Progress convertByPivot(Form from, Side to, std::string_view in, char* out, std::size_t room) {
    Progress progress{0, 0};
    Pivot pivot;
    for (std::string_view rest = in; !rest.empty();) {
        const std::string_view before = rest;
        const std::size_t units = decode(from, rest, pivot);
        const Written written =
            encode(to, pivot.data(), units, out + progress.written, room - progress.written);
        progress.written += written.bytes;
        if (written.units < units) {
            progress.taken += sourceOf({from}, before, pivot.data(), written.units);
            break;
        }
        progress.taken += before.size() - rest.size();
    }
    return progress;
}

/// Converts text that is well-formed in the source, which has no tables, as far as the target has its characters.
Progress convertWellFormed(Form from, Side to, std::string_view in, char* out, std::size_t room) {
    if (from == to.form) {
        std::memcpy(out, in.data(), in.size());
        return {in.size(), in.size()};
    }
    using Convert = std::size_t (*)(const char*, std::size_t, char*, std::size_t);
    Convert convert = nullptr;
    if (from == Form::utf8) {
        convert = to.form == nativeUtf16   ? vectors::utf8ToUtf16
                  : to.form == nativeUtf32 ? vectors::utf8ToUtf32
                                           : nullptr;
    } else if (from == nativeUtf16) {
        convert = to.form == Form::utf8    ? vectors::utf16ToUtf8
                  : to.form == nativeUtf32 ? vectors::utf16ToUtf32
                                           : nullptr;
    } else if (from == nativeUtf32) {
        convert = to.form == Form::utf8    ? vectors::utf32ToUtf8
                  : to.form == nativeUtf16 ? vectors::utf32ToUtf16
                                           : nullptr;
    }
    if (convert == nullptr) {
        return convertByPivot(from, to, in, out, room);
    }
    const std::size_t unit = unitBytes(to.form);
    return {in.size(), convert(in.data(), in.size() / unitBytes(from), out, room / unit) * unit};
}

/// Makes room for what is likely to come of the rest of a text, by what came of its beginning, so that the result does
/// not move with each piece that is appended. It is short of the truth or too much by little; to be exact, all of the
/// text would have to be read through its table twice.
template <typename CharOut>
void reserveForRest(std::basic_string<CharOut>& out, std::size_t written, std::size_t taken,
                    std::size_t rest) {
    const double expected =
        static_cast<double>(written) / static_cast<double>(taken) * static_cast<double>(rest);
    out.reserve(out.size() + static_cast<std::size_t>(expected * 1.0625) + longestPiece / 2);
    platform::fetchPages(out.data() + out.size(), (out.capacity() - out.size()) * sizeof(CharOut));
}

/// From a form without tables.
template <typename CharOut>
std::size_t convertMeasured(Form from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    const std::size_t before = out.size();
    std::size_t taken = 0;
    std::size_t pieceBytes = isUnicode(to.form) || in.size() <= onePiece ? in.size() : firstPiece;
    for (bool ended = false; !ended && taken < in.size();) {
        std::string_view piece = in.substr(taken, pieceBytes);
        const Extent extent = measure(from, piece);
        const std::size_t wellFormed = extent.taken * unitBytes(from);
        const std::size_t room = roomFor(extent, to);
        // A piece may have been cut in the middle of a character.
        ended = wellFormed + longestUtf8 <= piece.size() || wellFormed == 0;
        piece = piece.substr(0, wellFormed);
        appendInPlace(out, room / sizeof(CharOut), [&](CharOut* units) {
            const Progress progress =
                convertWellFormed(from, to, piece, reinterpret_cast<char*>(units), room);
            taken += progress.taken;
            ended = ended || progress.taken < piece.size();
            return progress.written / sizeof(CharOut);
        });
        if (pieceBytes < longestPiece && !ended) {
            pieceBytes *= pieceFactor;
            if (pieceBytes == longestPiece && in.size() - taken > longestPiece) {
                reserveForRest(out, out.size() - before, taken, in.size() - taken);
            }
        }
    }
    return taken;
}

/// From a form with tables to UTF-8, the bytes of which they hold.
std::size_t convertToUtf8(const DecodingTable& table, std::string_view in, std::string& out) {
    const std::size_t before = out.size();
    Pivot pivot;
    char piece[3 * pivotUnits];
    // Where most letters need no look-up, registers of UTF-16 between are faster.
    const auto read = [&](std::string_view& text) {
        if (!table.keepsLatin()) {
            return table.readUtf8(text, piece, sizeof piece);
        }
        const std::size_t units = table.read(text, pivot.data(), pivotUnits);
        return vectors::utf16ToUtf8(reinterpret_cast<const char*>(pivot.data()), units, piece, sizeof piece);
    };
    std::string_view rest = in;
    std::size_t left = 0;
    do {
        left = rest.size();
        out.append(piece, read(rest));
        const std::size_t taken = in.size() - rest.size();
        if (left == in.size() && taken != 0 && rest.size() > longestPiece) {
            reserveForRest(out, out.size() - before, taken, rest.size());
        }
    } while (rest.size() < left && !rest.empty());
    return in.size() - rest.size();
}

/// From a form with tables.
template <typename CharOut>
std::size_t convertDecoded(const DecodingTable& table, Side to, std::string_view in,
                           std::basic_string<CharOut>& out) {
    const std::size_t before = out.size();
    std::size_t taken = 0;
    Pivot pivot;
    for (std::size_t pieceUnits = isUnicode(to.form) || in.size() <= onePiece ? pivotUnits : firstPiece;
         taken < in.size(); pieceUnits = std::min(pieceUnits * pieceFactor, pivotUnits)) {
        std::string_view rest = in.substr(taken);
        const std::size_t units = table.read(rest, pivot.data(), pieceUnits);
        const Extent extent = vectors::measureUtf16(reinterpret_cast<const char*>(pivot.data()), units);
        const std::size_t room = roomFor(extent, to);
        Written written{0, 0};
        appendInPlace(out, room / sizeof(CharOut), [&](CharOut* place) {
            written = encode(to, pivot.data(), units, reinterpret_cast<char*>(place), room);
            return written.bytes / sizeof(CharOut);
        });
        if (written.units < units) {
            return taken + table.bytesOf(in.substr(taken), written.units);
        }
        const bool isFirst = taken == 0;
        taken = in.size() - rest.size();
        if (units < pieceUnits) {
            break;
        }
        if (isFirst && rest.size() > longestPiece) {
            reserveForRest(out, out.size() - before, taken, rest.size());
        }
    }
    return taken;
}

template <typename CharOut>
std::size_t convertBy(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    if constexpr (sizeof(CharOut) == 1) {
        if (hasTables(from.form) && to.form == Form::utf8) {
            return convertToUtf8(*from.profile->decoding(), in, out);
        }
    }
    return hasTables(from.form) ? convertDecoded(*from.profile->decoding(), to, in, out)
                                : convertMeasured(from.form, to, in, out);
}

/// A form of which the tables are not there, as far as it needs none.
Side withoutTables(Side side) {
    return {keepsAscii(side.form) ? Form::asciiCompatible : Form::other};
}

bool lacksDecoding(Side side) {
    return hasTables(side.form) && side.profile->decoding() == nullptr;
}

bool lacksEncoding(Side side) {
    return hasTables(side.form) && side.profile->encoding() == nullptr;
}

} // namespace

template <typename CharOut>
std::size_t convertPrefix(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    if (from.form == Form::other || to.form == Form::other) {
        return 0;
    }
    return convertShort(from, to, in, out) ? in.size() : convertPieces(from, to, in, out);
}

template <typename CharOut>
std::size_t convertPieces(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    if (sizeof(CharOut) != 1 && sizeof(CharOut) != unitBytes(to.form)) {
        return 0;
    }
    from = lacksDecoding(from) ? withoutTables(from) : from;
    to = lacksEncoding(to) ? withoutTables(to) : to;
    if (from.form == Form::other || to.form == Form::other) {
        return 0;
    }
    std::size_t taken = 0;
    if constexpr (sizeof(CharOut) == 1) {
        // ASCII to ASCII needs no other buffer than the input itself.
        if (isAsciiBytes(from.form) && isAsciiBytes(to.form)) {
            taken = vectors::asciiPrefix(in.data(), in.size());
            out.append(in.data(), taken);
            if (from.form == Form::asciiCompatible || to.form == Form::asciiCompatible) {
                return taken;
            }
        }
    }
    return taken == in.size() ? taken : taken + convertBy(from, to, in.substr(taken), out);
}

std::size_t convertLossy(Side from, Side to, std::string_view in, std::string& out,
                         const LoseCharacter& lose) {
    const EncodingTable* const table = hasTables(to.form) ? to.profile->encoding() : nullptr;
    const auto isLost = [table](char16_t unit) {
        return table != nullptr ? !table->has(unit) : unit >= 0x80;
    };
    std::size_t taken = 0;
    Pivot pivot;
    for (bool ended = false; !ended && taken < in.size();) {
        const std::size_t units = decodePiece(from, in.substr(taken), pivot, ended);
        for (std::size_t done = 0; done < units;) {
            const char16_t* const next = pivot.data() + done;
            if (isLost(*next)) {
                const std::size_t lost = isHighSurrogate(*next) ? 2 : 1;
                const std::size_t length = sourceOf(from, in.substr(taken), next, lost);
                const std::string* const instead = lose(in.substr(taken, length), taken);
                if (instead == nullptr) {
                    return taken;
                }
                out += *instead;
                done += lost;
                taken += length;
                continue;
            }
            const std::size_t left = units - done;
            const std::size_t room = roomFor({left, 3 * left, left, left}, to);
            Written written{0, 0};
            appendInPlace(out, room, [&](char* place) {
                written = encode(to, next, left, place, room);
                return written.bytes;
            });
            taken += sourceOf(from, in.substr(taken), next, written.units);
            done += written.units;
        }
    }
    return taken;
}

std::size_t characterLength(Side from, std::string_view in) {
    if (from.form == Form::other || lacksDecoding(from)) {
        return 0;
    }
    std::string_view rest = in.substr(0, longestUtf8);
    if (hasTables(from.form)) {
        char16_t unit = 0;
        from.profile->decoding()->read(rest, &unit, 1);
        return std::min(in.size(), longestUtf8) - rest.size();
    }
    // As many bytes as its first unit announces.
    std::size_t length = unitBytes(from.form);
    if (from.form == Form::utf8 && !in.empty()) {
        length = utf8Length(in.front());
    } else if (isUtf16(from.form) && in.size() >= 2) {
        const auto high = static_cast<unsigned char>(in[from.form == Form::utf16le ? 1 : 0]);
        length = isHighSurrogate(char32_t{high} << 8) ? 4 : 2;
    }
    const bool isWhole = length <= rest.size() &&
                         measure(from.form, rest.substr(0, length)).taken * unitBytes(from.form) == length;
    return isWhole ? length : 0;
}

bool canGoOn(Side from, Side to, std::size_t bytes) {
    if (from.form == Form::other || to.form == Form::other) {
        return false;
    }
    const bool canRead = !hasTables(from.form) || from.profile->buildDecoding(bytes);
    const bool canWrite = !hasTables(to.form) || to.profile->buildEncoding(bytes);
    return canRead && canWrite;
}

#define KVT_INSTANTIATE(CharOut)                                                                             \
    template std::size_t convertPrefix(Side, Side, std::string_view, std::basic_string<CharOut>&);           \
    template std::size_t convertPieces(Side, Side, std::string_view, std::basic_string<CharOut>&);

KVT_INSTANTIATE(char)
KVT_INSTANTIATE(char16_t)
KVT_INSTANTIATE(char32_t)

#undef KVT_INSTANTIATE

} // namespace kvt::ex::detail
