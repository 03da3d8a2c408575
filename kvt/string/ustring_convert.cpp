// Conversion between the string types: the grid of source and target, and the members on it.
#include <kvt/string/detail/convert_chars.h>
#include <kvt/string/detail/instantiate.h>

#include <kvt/codec/wwjd.h>
#include <kvt/encoding/detail/short_ascii.h>
#include <kvt/encoding/detail/short_text.h>
#include <kvt/foundation/throwable.h>

#include <bit>

namespace kvt::ex {
namespace {

/// The ways from one string type to another.
enum class Way {
    copy,          ///< the units as they are
    asciiCheck,    ///< to ASCII, with a check
    icu,           ///< by ICU, or as it would do
    asciiSource,   ///< from ASCII, which is trusted
    bytes,         ///< the units as raw bytes
    viaUtf16,      ///< to or from wwjd by way of UTF-16
    decode,        ///< from wwjd to UTF-16
    encode,        ///< from UTF-16 to wwjd
    binaryFailure, ///< bytes without a text meaning do not convert
    atRunTime,     ///< one of the encodings is known at run time only
};

// The types as rows and columns of the grid.
constexpr std::size_t gridIndex(std::uint32_t type) {
    return type <= 3 ? type : type - 23;
}

// clang-format off
constexpr Way grid[8][8] = {
    // to: 0              1                   2                   3                   27                  28          29                  30
    {Way::copy,          Way::asciiCheck,    Way::icu,           Way::icu,           Way::icu,           Way::bytes, Way::viaUtf16,      Way::atRunTime},     // from 0
    {Way::asciiSource,   Way::copy,          Way::icu,           Way::icu,           Way::asciiSource,   Way::bytes, Way::viaUtf16,      Way::atRunTime},     // from 1
    {Way::icu,           Way::icu,           Way::copy,          Way::icu,           Way::icu,           Way::bytes, Way::encode,        Way::atRunTime},     // from 2
    {Way::icu,           Way::icu,           Way::icu,           Way::copy,          Way::icu,           Way::bytes, Way::viaUtf16,      Way::atRunTime},     // from 3
    {Way::icu,           Way::asciiCheck,    Way::icu,           Way::icu,           Way::copy,          Way::bytes, Way::viaUtf16,      Way::atRunTime},     // from 27
    {Way::binaryFailure, Way::binaryFailure, Way::binaryFailure, Way::binaryFailure, Way::binaryFailure, Way::copy,  Way::binaryFailure, Way::binaryFailure}, // from 28
    {Way::viaUtf16,      Way::viaUtf16,      Way::decode,        Way::viaUtf16,      Way::viaUtf16,      Way::bytes, Way::copy,          Way::atRunTime},     // from 29
    {Way::atRunTime,     Way::atRunTime,     Way::atRunTime,     Way::atRunTime,     Way::atRunTime,     Way::bytes, Way::atRunTime,     Way::atRunTime},     // from 30
};
// clang-format on

// Converts along one cell. The text comes as the bytes of its units.
template <typename CharOut>
void convertAlong(Way way, Encoding from, Encoding to, std::string_view bytes,
                  std::basic_string<CharOut>& out) {
    switch (way) {
    case Way::copy:
    case Way::bytes:
        detail::copyBytes(bytes, out);
        break;
    case Way::asciiCheck:
        detail::toAsciiChecked(from, bytes, out);
        break;
    case Way::icu:
        detail::transcodeBytes(from, to, bytes, out);
        break;
    case Way::asciiSource:
        detail::fromAscii(to, bytes, out);
        break;
    case Way::binaryFailure:
        detail::throwBinary(bytes);
    case Way::viaUtf16:
    case Way::decode:
    case Way::encode:
    case Way::atRunTime:
        // The rules for run-time encodings hold the two steps of wwjd.
        detail::convertChars(from, to, bytes, out);
        break;
    }
}

template <typename CharT>
std::string_view bytesOf(const CharT* units, std::size_t count) {
    return {reinterpret_cast<const char*>(units), count * sizeof(CharT)};
}

/// Whether a string type has ASCII characters as units of their numbers on this machine.
constexpr bool keepsAscii(std::uint32_t type) {
    return type <= Encoding::UsAscii ||
           (type <= Encoding::Utf32LE && std::endian::native == std::endian::little);
}

// The units of a text that is short enough to be looked at before anything else.
constexpr std::size_t shortText = 128;

} // namespace

template <std::uint32_t N>
UString<N>::UString(const char* data, std::size_t byteLength, Encoding from) {
    const std::string_view bytes(data, byteLength);
    if constexpr (N == Encoding::Binary) {
        detail::copyBytes(bytes, this->storage_);
    } else if constexpr (N == Encoding::Unknown) {
        detail::copyBytes(bytes, this->storage_);
        this->encoding_ = from;
    } else {
        detail::convertChars(from, encoding(), bytes, this->storage_);
    }
}

template <std::uint32_t N>
void UString<N>::init(const char16_t* data, std::size_t units) {
    init(UString<Encoding::Utf16LE>(data, units));
}

template <std::uint32_t N>
void UString<N>::init(const char32_t* data, std::size_t units) {
    init(UString<Encoding::Utf32LE>(data, units));
}

// A new UString<30> takes the encoding of its source, so that the units are copied; any other takes the text.
template <std::uint32_t N>
template <std::uint32_t M>
void UString<N>::init(const UString<M>& other) {
    init();
    if constexpr (N == Encoding::Unknown && M != Encoding::Binary) {
        detail::copyBytes(bytesOf(other.rawData(), other.size()), this->storage_);
        this->encoding_ = other.encoding();
    } else {
        assign(other);
    }
}

template <std::uint32_t N>
template <std::uint32_t M>
UString<N>& UString<N>::assign(const UString<M>& other) {
    if constexpr (N != M && keepsAscii(N) && keepsAscii(M)) {
        const auto* const text = reinterpret_cast<const char*>(other.rawData());
        const std::size_t units = other.size();
        if (units <= shortText && detail::isAscii<detail::CodeUnit<M>>(text, units)) {
            this->storage_.clear();
            detail::appendAscii<detail::CodeUnit<M>, detail::CodeUnit<N>>(text, units, this->storage_);
            return *this;
        }
        if constexpr (N != Encoding::UsAscii && M != Encoding::UsAscii) {
            this->storage_.clear();
            if (detail::convertShortBuffered({detail::unicodeForm(M)}, {detail::unicodeForm(N)},
                                             bytesOf(other.rawData(), units), this->storage_)) {
                return *this;
            }
        }
    }
    convertAlong(grid[gridIndex(M)][gridIndex(N)], other.encoding(), encoding(),
                 bytesOf(other.rawData(), other.size()), this->storage_);
    return *this;
}

template <std::uint32_t N>
UString<0> UString<N>::getAsUtf8() const {
    return UString<0>(*this);
}

template <std::uint32_t N>
UString<2> UString<N>::getAsUtf16() const {
    return UString<2>(*this);
}

template <std::uint32_t N>
UString<3> UString<N>::getAsUtf32() const {
    return UString<3>(*this);
}

template <std::uint32_t N>
UString<27> UString<N>::getAsSystem() const {
    return UString<27>(*this);
}

template <std::uint32_t N>
UString<30> UString<N>::getAsEncoding(Encoding encoding) const {
    UString<30> converted(encoding);
    converted.assign(*this);
    return converted;
}

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_USTRING)

#define KVT_INSTANTIATE_CONVERSION(N, M)                                                                     \
    template KVT_EXPORT void UString<N>::init<M>(const UString<M>&);                                         \
    template KVT_EXPORT UString<N>& UString<N>::assign<M>(const UString<M>&);
#define KVT_INSTANTIATE_CONVERSIONS(N) KVT_FOR_EACH_USTRING_WITH(KVT_INSTANTIATE_CONVERSION, N)

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_CONVERSIONS)

#undef KVT_INSTANTIATE_CONVERSION
#undef KVT_INSTANTIATE_CONVERSIONS

} // namespace kvt::ex
