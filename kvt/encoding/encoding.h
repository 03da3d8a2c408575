// The identity of a character encoding.
//
// An Encoding is one 32-bit id, passed by value. The library knows 31 ids by heart (Encoding::Type); any other name
// that ICU can open is given an id above them when it is first used, valid for this process only. Two spellings of
// one encoding have one id.
//
// The id `System` stands for whatever encoding the process's locale names. evaluate() replaces it by the id of that
// encoding where it has one of its own; all comparisons are made on evaluated ids.
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/foundation/string_view.h>

#include <cstddef>
#include <cstdint>
#include <functional>

namespace kvt::ex {

/// Selects the constructor of Encoding that does not throw.
struct nothrow_t {};
inline constexpr nothrow_t nothrow{};

class KVT_EXPORT Encoding {
public:
    /// The fixed ids. UString takes one as its template argument.
    enum Type : std::uint32_t {
        Utf8 = 0,
        UsAscii = 1,
        Utf16LE = 2,
        Utf32LE = 3,
        Utf16BE = 4,
        Utf32BE = 5,
        Iso8859_1 = 6,
        Iso8859_2 = 7,
        Iso8859_3 = 8,
        Iso8859_4 = 9,
        Iso8859_5 = 10,
        Iso8859_6 = 11,
        Iso8859_7 = 12,
        Iso8859_8 = 13,
        Iso8859_9 = 14,
        Iso8859_11 = 15,
        Iso8859_13 = 16,
        Iso8859_15 = 17,
        Windows1250 = 18,
        Windows1251 = 19,
        Windows1252 = 20,
        Windows1253 = 21,
        Windows1254 = 22,
        Windows1255 = 23,
        Windows1256 = 24,
        Windows1257 = 25,
        Windows1258 = 26,
        System = 27,  ///< the encoding of the process's locale
        Binary = 28,  ///< bytes without a text meaning
        Wwjd = 29,    ///< ASCII text with tokens for everything else, see wwjd.h
        Unknown = 30, ///< no encoding; what an unknown name gives
    };

    /// The encoding with a fixed id.
    Encoding(Type type) noexcept : id_(type) {}

    /// Looks `name` up: a canonical name, an alias that ICU knows, "zqt-system", "ANSI", "SYSTEM" or "system" for
    /// `System`, "BINARY" or "binary" for `Binary`. Names with a fixed id are matched with case; ICU is lenient
    /// about case and punctuation. "UTF-16" and "UTF-32", which state no byte order, are little-endian here.
    /// Throws InvalidEncodingException (910005, %0 = `name`) when nobody knows the name; the empty name is unknown.
    explicit Encoding(kvt::future::string_view name);

    /// The same, but an unknown name gives `Unknown`. Throws nothing but std::bad_alloc.
    Encoding(kvt::future::string_view name, nothrow_t);

    // A literal 0 is a null pointer to the compiler, and would be read as a name.
    Encoding(std::nullptr_t) = delete;

    /// The id as stored: `System` stays `System`.
    std::uint32_t id() const noexcept { return id_; }

    /// The id with `System` replaced by the id of the system's encoding. That is `System` again when the system's
    /// encoding has no fixed id (Shift_JIS, say), so 27 is a possible result. Found once for each process.
    std::uint32_t evaluate() const { return id_ != System ? id_ : evaluatedSystem(); }

    /// The canonical name: the fixed name, or the MIME or IANA name, or ICU's own. `System` gives the name of the
    /// system's encoding, `Unknown` "Unknown Encoding". The view is zero-terminated and valid for the life of the
    /// process.
    kvt::future::string_view getName() const;

    /// The same, but `System` gives "zqt-system".
    kvt::future::string_view getUnevaluatedName() const;

    /// Whether each character takes one byte, as ICU's converter says. False for `Unknown` and `Binary`. Throws
    /// InvalidEncodingException (910005, %0 = "unknown") for `Wwjd`, which has no converter.
    bool isSingleByte() const;

    /// Whether the 128 ASCII characters are known to be their own single bytes, so that ASCII text needs no
    /// conversion. Only encodings that are known to the library answer true; for the others text still converts,
    /// by the longer way.
    bool supports7BitASCII() const;

    /// The encoding of a code page by its number on one family of systems. A number that is not declared below
    /// this class does not compile. The name is looked up at the first call, which throws InvalidEncodingException
    /// (910005, %0 = the name) when ICU cannot open it; the next call tries again.
    template <unsigned N>
    static Encoding windowsCodePage() = delete;
    template <unsigned N>
    static Encoding ibmCodePage() = delete;

    /// Comparisons of evaluated ids. The order is that of the numbers and differs from process to process for
    /// encodings without a fixed id.
    friend bool operator==(Encoding left, Encoding right) { return left.evaluate() == right.evaluate(); }
    friend bool operator!=(Encoding left, Encoding right) { return left.evaluate() != right.evaluate(); }
    friend bool operator<(Encoding left, Encoding right) { return left.evaluate() < right.evaluate(); }

private:
    static Type evaluatedSystem();

    std::uint32_t id_;
};

// clang-format off
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<437>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<720>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<737>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<775>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<850>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<852>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<855>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<857>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<861>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<862>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<866>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<869>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<874>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<932>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<936>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<949>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<950>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<1250>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<1251>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<1252>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<1253>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<1254>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<1255>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<1256>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<1257>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<1258>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<10000>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<10006>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<10007>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<10029>();
template <> KVT_EXPORT Encoding Encoding::windowsCodePage<20127>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<37>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<367>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<437>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<720>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<737>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<775>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<850>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<852>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<855>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<857>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<860>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<861>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<862>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<863>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<864>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<865>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<866>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<869>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<874>();
template <> KVT_EXPORT Encoding Encoding::ibmCodePage<950>();
// clang-format on

} // namespace kvt::ex

/// Hashes the evaluated id, so that equal encodings have equal hashes.
template <>
struct std::hash<kvt::ex::Encoding> {
    std::size_t operator()(kvt::ex::Encoding encoding) const { return encoding.evaluate(); }
};
