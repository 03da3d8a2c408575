// Conversion of whole texts and of pieces, on the converters of the calling thread.
#include <kvt/encoding/icu_transcoder.h>

#include <kvt/encoding/detail/failure_text.h>
#include <kvt/encoding/detail/shortcut.h>
#include <kvt/encoding/detail/transcoder_helper.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/detail/convert_chars.h>

#include <algorithm>

namespace kvt::ex {
namespace {

using detail::TranscoderHelper;

// ICU counts bytes of one call in 31 bits; a longer text is handed over in pieces of this size.
constexpr std::size_t largestPiece = std::size_t{1} << 30;
constexpr std::size_t outputUnits = 4096;

// The bytes for which ICU is asked where the short way ends: those of one character at first, and twice as many each
// time that the short way found little to take behind them. Less than this costs ICU no more than to come and go.
constexpr std::size_t firstLook = 4;
constexpr std::size_t longestLook = 1024;
constexpr std::size_t little = 128;

template <typename CharT>
std::string_view bytesOf(std::basic_string_view<CharT> units) {
    return {reinterpret_cast<const char*>(units.data()), units.size() * sizeof(CharT)};
}

enum class Losses { none, badInput, notRepresentable };

// Takes what the two converters recorded. Bad input outranks a character that the target lacks: with the wrong
// characters read, what could be written does not matter.
Losses takeLosses(TranscoderHelper& from, TranscoderHelper& to) {
    const bool badInput = from.takeLoss();
    const bool notRepresentable = to.takeLoss();
    return badInput ? Losses::badInput : notRepresentable ? Losses::notRepresentable : Losses::none;
}

// Converts `length` bytes of `text` by ICU and takes them from it; and further ones, where `untilSettled`, as long as
// one of the converters holds the beginning of something. Returns false when ICU gave up.
template <typename CharOut>
bool convertByIcu(ICUTranscoder& transcoder, TranscoderHelper& from, TranscoderHelper& to,
                  std::string_view& text, std::size_t length, bool untilSettled, bool& reset,
                  std::basic_string<CharOut>& out) {
    CharOut buffer[outputUnits];
    do {
        std::string_view piece = text.substr(0, length);
        const bool last = piece.size() == text.size();
        text.remove_prefix(piece.size());
        ICUTranscoder::Status status = ICUTranscoder::OutputFull;
        while (status == ICUTranscoder::OutputFull) {
            std::basic_string_view<CharOut> written(buffer, outputUnits);
            status = transcoder.transcodeStream(piece, written, last, reset);
            reset = false;
            if (status == ICUTranscoder::Failed) {
                return false;
            }
            out.append(written);
        }
        length = 1;
    } while (untilSettled && !text.empty() &&
             (from.converter().heldBytes() != 0 || to.converter().holdsUnits()));
    return true;
}

// Converts all of `bytes` and returns what was lost. The text of the two encodings differs. What needs no ICU goes the
// short way, and where ICU had to look and neither encoding has a state, the short way goes on behind that.
template <typename CharOut>
Losses convertAll(ICUTranscoder& transcoder, TranscoderHelper& from, TranscoderHelper& to,
                  std::string_view bytes, std::basic_string<CharOut>& out) {
    out.clear();
    bytes.remove_prefix(detail::convertPrefix(from.side(), to.side(), bytes, out));
    if (bytes.empty()) {
        return takeLosses(from, to);
    }
    bool reset = true;
    if (!detail::canGoOn(from.side(), to.side(), bytes.size())) {
        for (bool goesOn = true; goesOn && !bytes.empty();) {
            goesOn = convertByIcu(transcoder, from, to, bytes, largestPiece, false, reset, out);
        }
        return takeLosses(from, to);
    }
    // It may be the tables that were missing.
    bytes.remove_prefix(detail::convertPrefix(from.side(), to.side(), bytes, out));
    for (std::size_t length = firstLook; !bytes.empty();) {
        if (!convertByIcu(transcoder, from, to, bytes, length, true, reset, out)) {
            break;
        }
        const std::size_t taken = detail::convertPrefix(from.side(), to.side(), bytes, out);
        bytes.remove_prefix(taken);
        length = taken >= little ? firstLook : std::min(2 * length, longestLook);
    }
    return takeLosses(from, to);
}

} // namespace

namespace detail {

UString<0> textForFailure(std::string_view bytes, Encoding encoding) {
    // ASCII text is trusted to be UTF-8, here as in every conversion between the two.
    if (encoding == Encoding(Encoding::Utf8) || encoding == Encoding(Encoding::UsAscii)) {
        return UString<0>(UStringView<0>(bytes));
    }
    ICUTranscoder transcoder(encoding, Encoding::Utf8);
    std::string text;
    convertAll(transcoder, helperFor(encoding), helperFor(Encoding::Utf8), bytes, text);
    return UString<0>(UStringView<0>(text));
}

} // namespace detail

ICUTranscoder::ICUTranscoder() noexcept = default;

ICUTranscoder::ICUTranscoder(Encoding from, Encoding to)
    : from_(&detail::helperFor(from)), to_(&detail::helperFor(to)) {}

bool ICUTranscoder::isValid() const noexcept {
    return from_ != nullptr && to_ != nullptr && from_->isOpen() && to_->isOpen();
}

Encoding ICUTranscoder::fromEncoding() const {
    return from_helper().encoding();
}

Encoding ICUTranscoder::toEncoding() const {
    return to_helper().encoding();
}

bool ICUTranscoder::isSingleByteEncoding(Encoding encoding) {
    TranscoderHelper& helper = detail::helperFor(encoding);
    return helper.isOpen() && helper.converter().maxCharSize() == 1;
}

template <typename CharIn, typename CharOut>
ICUTranscoder::Status ICUTranscoder::transcodeStream(kvt::future::basic_string_view<CharIn>& in,
                                                     kvt::future::basic_string_view<CharOut>& out, bool flush,
                                                     bool reset) {
    const auto* source = reinterpret_cast<const char*>(in.data());
    const auto* const sourceEnd = reinterpret_cast<const char*>(in.data() + in.size());
    // The view of the output names a buffer of the caller's to write into.
    auto* const buffer = const_cast<CharOut*>(out.data());
    auto* target = reinterpret_cast<char*>(buffer);
    const auto* const targetEnd = reinterpret_cast<const char*>(buffer + out.size());

    const detail::icu::Progress progress = detail::icu::Converter::convert(
        to_->converter(), from_->converter(), target, targetEnd, source, sourceEnd, pivot_, pivotSource_,
        pivotTarget_, pivot_ + pivotUnits, reset, flush);

    in.remove_prefix(static_cast<std::size_t>(source - reinterpret_cast<const char*>(in.data())) /
                     sizeof(CharIn));
    out = out.substr(0, static_cast<std::size_t>(target - reinterpret_cast<char*>(buffer)) / sizeof(CharOut));
    switch (progress.end) {
    case detail::icu::Progress::inputTaken:
        return Ok;
    case detail::icu::Progress::outputFull:
        return OutputFull;
    default:
        return Failed;
    }
}

template <typename CharIn, typename CharOut>
void ICUTranscoder::transcode(kvt::future::basic_string_view<CharIn> in, std::basic_string<CharOut>& out) {
    const std::string_view bytes = bytesOf(in);
    const Encoding from = fromEncoding();
    const Encoding to = toEncoding();
    if (from == to) {
        detail::copyBytes(bytes, out);
        return;
    }
    if (!isValid()) {
        throw InvalidEncodingException(UString<0>(UStringView<0>((from_->isOpen() ? to : from).getName())));
    }
    const Losses losses = convertAll(*this, *from_, *to_, bytes, out);
    if (losses == Losses::none) {
        return;
    }
    const std::string_view converted = bytesOf(std::basic_string_view<CharOut>(out));
    UString<0> lossy = detail::textForFailure(converted, to);
    UString<0> substitution = detail::textForFailure(to_->substitutionChars(), to);
    if (losses == Losses::badInput) {
        throw UStringBadEncodingException(UString<28>(UStringView<28>(bytes)), from, std::move(lossy),
                                          std::move(substitution));
    }
    throw UStringTranscodingException(detail::textForFailure(bytes, from), from, to, std::move(lossy),
                                      std::move(substitution));
}

#define KVT_TRANSCODE(CharIn, CharOut)                                                                       \
    template KVT_EXPORT void ICUTranscoder::transcode(kvt::future::basic_string_view<CharIn>,                \
                                                      std::basic_string<CharOut>&);                          \
    template KVT_EXPORT ICUTranscoder::Status ICUTranscoder::transcodeStream(                                \
        kvt::future::basic_string_view<CharIn>&, kvt::future::basic_string_view<CharOut>&, bool, bool);

KVT_TRANSCODE(char, char)
KVT_TRANSCODE(char, char16_t)
KVT_TRANSCODE(char, char32_t)
KVT_TRANSCODE(char16_t, char)
KVT_TRANSCODE(char32_t, char)
KVT_TRANSCODE(char16_t, char32_t)
KVT_TRANSCODE(char32_t, char16_t)

#undef KVT_TRANSCODE

} // namespace kvt::ex
