// Short texts without ICU (see detail/short_text.h).
//
// All forms but ASCII go by way of UTF-16, and from there to the result in a buffer, so that the result can be made in one
// piece without a pass that measures it.
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
    if (to.form == Form::utf8) {
        return vectors::shortUtf16ToUtf8(units, count, out);
    }
    if (to.form == nativeUtf32) {
        const std::size_t written = vectors::shortUtf16ToUtf32(units, count, out);
        return written != notWhole ? written * sizeof(char32_t) : notWhole;
    }
    return notWhole;
}

std::size_t writeByTable(const EncodingProfile& to, const char16_t* units, std::size_t count, char* out) {
    const EncodingTable* const table = to.encoding();
    if (table == nullptr) {
        return notWhole;
    }
    const EncodingTable::Written written = table->write(units, count, out, shortRoom);
    return written.units == count ? written.bytes : notWhole;
}

template <typename CharOut>
void appendBytes(std::basic_string<CharOut>& out, const void* bytes, std::size_t count) {
    appendInPlace(out, count / sizeof(CharOut), [&](CharOut* place) {
        copyShort(bytes, count, place);
        return count / sizeof(CharOut);
    });
}

/// By way of a buffer, all of it or nothing.
template <typename CharOut>
bool convertBuffered(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    alignas(64) char16_t units[shortRoom];
    alignas(64) char bytes[shortRoom * sizeof(char32_t)];
    std::size_t written = notWhole;
    if (from.form == Form::utf8 && to.form == nativeUtf32) {
        // Beyond U+FFFF, too.
        const std::size_t characters = vectors::shortUtf8ToUtf32(in.data(), in.size(), bytes);
        written = characters != notWhole ? characters * sizeof(char32_t) : notWhole;
    } else if (from.form == nativeUtf16 && !hasTables(to.form)) {
        written = in.size() % sizeof(char16_t) == 0
                      ? writeShort(to, in.data(), in.size() / sizeof(char16_t), bytes)
                      : notWhole;
    } else if (const std::size_t count = readShort(from, in, units); count != notWhole) {
        if (to.form == nativeUtf16) {
            appendBytes(out, units, count * sizeof(char16_t));
            return true;
        }
        written = hasTables(to.form) ? writeByTable(*to.profile, units, count, bytes)
                                     : writeShort(to, reinterpret_cast<const char*>(units), count, bytes);
    }
    if (written == notWhole) {
        return false;
    }
    appendBytes(out, bytes, written);
    return true;
}

} // namespace

template <typename CharOut>
bool convertShort(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    return in.size() <= vectors::shortText * unitBytes(from.form) &&
           (sizeof(CharOut) == 1 || sizeof(CharOut) == unitBytes(to.form)) &&
           (convertAscii(from.form, to.form, in, out) || convertBuffered(from, to, in, out));
}

template bool convertShort(Side, Side, std::string_view, std::basic_string<char>&);
template bool convertShort(Side, Side, std::string_view, std::basic_string<char16_t>&);
template bool convertShort(Side, Side, std::string_view, std::basic_string<char32_t>&);

} // namespace kvt::ex::detail
