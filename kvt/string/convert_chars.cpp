// The conversion rules for encodings known at run time.
#include <kvt/string/detail/convert_chars.h>

#include <kvt/codec/wwjd.h>
#include <kvt/encoding/detail/encoding_profile.h>
#include <kvt/encoding/detail/short_text.h>
#include <kvt/encoding/detail/shortcut.h>
#include <kvt/encoding/icu_transcoder.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/detail/ascii_check.h>
#include <kvt/string/ustring.h>

#include <cstring>

namespace kvt::ex::detail {

template <typename CharOut>
void copyBytes(std::string_view bytes, std::basic_string<CharOut>& out) {
    if constexpr (sizeof(CharOut) == 1) {
        out.assign(bytes);
    } else {
        // The bytes may be those of `out`, which then keeps its size.
        out.resize(bytes.size() / sizeof(CharOut));
        if (!bytes.empty()) { // no bytes may be a null pointer
            std::memmove(out.data(), bytes.data(), out.size() * sizeof(CharOut));
        }
    }
}

namespace {

// Apart from what short texts run through, since it needs much of the stack.
template <typename CharOut>
[[gnu::noinline]] void transcodeOther(Encoding from, Encoding to, std::string_view bytes,
                                      std::basic_string<CharOut>& out) {
    constexpr std::size_t longText = 1024;
    if (bytes.size() <= longText && from != to) {
        const Side source = sideOf(from);
        const Side target = sideOf(to);
        if (source.form != Form::other && target.form != Form::other) {
            out.clear();
            if (convertPieces(source, target, bytes, out) == bytes.size()) {
                return;
            }
        }
    }
    ICUTranscoder(from, to).transcode(bytes, out);
}

} // namespace

// A text that is not long is converted before anything is asked about the converters of this thread, which would cost
// more than the text. One that needs ICU is done again from its beginning.
template <typename CharOut>
void transcodeBytes(Encoding from, Encoding to, std::string_view bytes, std::basic_string<CharOut>& out) {
    if (from != to) {
        const Side source = sideOf(from);
        const Side target = sideOf(to);
        if (source.form != Form::other && target.form != Form::other) {
            out.clear();
            if (convertShort(source, target, bytes, out)) {
                return;
            }
        }
    }
    transcodeOther(from, to, bytes, out);
}

template <typename CharOut>
void fromAscii(Encoding to, std::string_view bytes, std::basic_string<CharOut>& out) {
    if (to.supports7BitASCII()) {
        copyBytes(bytes, out);
    } else {
        transcodeBytes(Encoding::UsAscii, to, bytes, out);
    }
}

template <typename CharOut>
void toAsciiChecked(Encoding from, std::string_view bytes, std::basic_string<CharOut>& out) {
    if constexpr (sizeof(CharOut) == 1) {
        if (from == Encoding(Encoding::Utf8)) {
            utf8ToAscii(bytes, out);
            return;
        }
        if (from.supports7BitASCII() && from.isSingleByte()) {
            singleByteToAscii(from, bytes, out);
            return;
        }
    }
    transcodeBytes(from, Encoding::UsAscii, bytes, out);
}

template <typename CharOut>
void fromUtf16(Encoding to, std::u16string_view units, std::basic_string<CharOut>& out) {
    transcodeBytes(Encoding::Utf16LE, to,
                   {reinterpret_cast<const char*>(units.data()), units.size() * sizeof(char16_t)}, out);
}

void throwBinary(std::string_view bytes) {
    throw UStringBinaryTranscodingException(UString<28>(UStringView<28>(bytes)));
}

namespace {

/// Whether an encoding's text is not what its converter says of it.
bool hasRules(std::uint32_t evaluated) {
    return evaluated == Encoding::UsAscii || evaluated == Encoding::Binary || evaluated == Encoding::Wwjd;
}

template <typename CharOut>
[[gnu::noinline]] void convertByRules(Encoding from, Encoding to, std::string_view bytes,
                                      std::basic_string<CharOut>& out) {
    const std::uint32_t source = from.evaluate();
    const std::uint32_t target = to.evaluate();
    if (source == target || target == Encoding::Binary) {
        copyBytes(bytes, out);
    } else if (source == Encoding::Binary) {
        throwBinary(bytes);
    } else if (source == Encoding::Wwjd) {
        const UString<2> text = wwjdToUtf16(bytes);
        fromUtf16(to, {text.rawData(), text.size()}, out);
    } else if (target == Encoding::Wwjd) {
        std::u16string text;
        convertChars(from, Encoding::Utf16LE, bytes, text);
        copyBytes(utf16ToWwjd(text), out);
    } else if (source == Encoding::UsAscii) {
        fromAscii(to, bytes, out);
    } else {
        toAsciiChecked(from, bytes, out);
    }
}

} // namespace

template <typename CharOut>
void convertChars(Encoding from, Encoding to, std::string_view bytes, std::basic_string<CharOut>& out) {
    const std::uint32_t source = from.evaluate();
    const std::uint32_t target = to.evaluate();
    if (source == target || hasRules(source) || hasRules(target)) {
        convertByRules(from, to, bytes, out);
    } else {
        transcodeBytes(from, to, bytes, out);
    }
}

#define KVT_INSTANTIATE(CharOut)                                                                             \
    template void copyBytes(std::string_view, std::basic_string<CharOut>&);                                  \
    template void transcodeBytes(Encoding, Encoding, std::string_view, std::basic_string<CharOut>&);         \
    template void fromAscii(Encoding, std::string_view, std::basic_string<CharOut>&);                        \
    template void toAsciiChecked(Encoding, std::string_view, std::basic_string<CharOut>&);                   \
    template void fromUtf16(Encoding, std::u16string_view, std::basic_string<CharOut>&);                     \
    template void convertChars(Encoding, Encoding, std::string_view, std::basic_string<CharOut>&);

KVT_INSTANTIATE(char)
KVT_INSTANTIATE(char16_t)
KVT_INSTANTIATE(char32_t)

#undef KVT_INSTANTIATE

} // namespace kvt::ex::detail
