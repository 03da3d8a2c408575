// The one place where ICU's converters are opened and called.
#include <kvt/encoding/detail/icu.h>

#include <unicode/ucnv.h>
#include <unicode/ucnv_cb.h>
#include <unicode/ucnv_err.h>
#include <unicode/uset.h>
#include <unicode/utypes.h>

#include <algorithm>
#include <array>
#include <new>
#include <optional>
#include <vector>

namespace kvt::ex::detail::icu {
namespace {

// Reset, close and clone reach the callbacks too, and are not losses.
bool isLoss(UConverterCallbackReason reason) {
    return reason == UCNV_UNASSIGNED || reason == UCNV_ILLEGAL || reason == UCNV_IRREGULAR;
}

void toUnicodeCallback(const void* context, UConverterToUnicodeArgs* arguments, const char* bytes,
                       std::int32_t length, UConverterCallbackReason reason, UErrorCode* error) {
    if (isLoss(reason) && *error != U_BUFFER_OVERFLOW_ERROR) {
        auto* const listener = static_cast<LossListener*>(const_cast<void*>(context));
        listener->onBadInput({bytes, static_cast<std::size_t>(length)}, arguments->target, *error);
    }
    UCNV_TO_U_CALLBACK_SUBSTITUTE(nullptr, arguments, bytes, length, reason, error);
}

void fromUnicodeCallback(const void* context, UConverterFromUnicodeArgs* arguments, const char16_t* units,
                         std::int32_t length, UChar32 codePoint, UConverterCallbackReason reason,
                         UErrorCode* error) {
    if (isLoss(reason) && *error != U_BUFFER_OVERFLOW_ERROR) {
        auto* const listener = static_cast<LossListener*>(const_cast<void*>(context));
        listener->onNotRepresentable(static_cast<char32_t>(codePoint), *error);
    }
    UCNV_FROM_U_CALLBACK_SUBSTITUTE(nullptr, arguments, units, length, codePoint, reason, error);
}

Progress progressOf(UErrorCode error) {
    if (error == U_BUFFER_OVERFLOW_ERROR) {
        return {Progress::outputFull, error};
    }
    return {U_SUCCESS(error) ? Progress::inputTaken : Progress::failed, error};
}

// Whether the converter reads and writes each of the 128 ASCII characters as its own byte. That holds between any
// other characters too, as only stateless kinds of converters are asked.
bool keepsAscii(UConverter* converter) {
    switch (ucnv_getType(converter)) {
    case UCNV_SBCS:
    case UCNV_DBCS:
    case UCNV_MBCS:
    case UCNV_LATIN_1:
    case UCNV_US_ASCII:
    case UCNV_CESU8:
        break;
    default:
        return false;
    }
    std::array<char, 128> bytes;
    std::array<char16_t, 128> units;
    for (std::size_t i = 0; i < bytes.size(); ++i) {
        bytes[i] = static_cast<char>(i);
        units[i] = static_cast<char16_t>(i);
    }
    constexpr auto count = static_cast<std::int32_t>(units.size());
    // One more than expected, so that a longer result shows.
    std::array<char16_t, 129> decoded{};
    std::array<char, 129> encoded{};
    UErrorCode error = U_ZERO_ERROR;
    const std::int32_t decodedCount =
        ucnv_toUChars(converter, decoded.data(), count + 1, bytes.data(), count, &error);
    const std::int32_t encodedCount =
        ucnv_fromUChars(converter, encoded.data(), count + 1, units.data(), count, &error);
    return U_SUCCESS(error) && decodedCount == count && encodedCount == count &&
           std::equal(units.begin(), units.end(), decoded.begin()) &&
           std::equal(bytes.begin(), bytes.end(), encoded.begin());
}

// Whether each character is one byte, and each byte by itself a character or none. US-ASCII is left out, which needs
// no table.
bool isSingleByte(UConverter* converter) {
    const UConverterType type = ucnv_getType(converter);
    return (type == UCNV_SBCS || type == UCNV_LATIN_1) && ucnv_getMaxCharSize(converter) == 1;
}

// Whether the converter reads from a table in which a character is one or more bytes.
bool hasSeveralBytes(UConverter* converter) {
    const UConverterType type = ucnv_getType(converter);
    return type == UCNV_MBCS || type == UCNV_DBCS;
}

/// Tries out how a converter treats characters that follow each other. They are of many scripts, since an encoding
/// changes its state where it changes its set of characters, and U+FEFF is among them, which some read and write at the
/// beginning only.
class Trial {
public:
    explicit Trial(Encoding encoding)
        : converter_(ucnv_open(encoding.getName().data(), &openError_), &ucnv_close) {
        // It is open once already, so that nothing but memory can be missing.
        if (converter_ == nullptr) {
            throw std::bad_alloc();
        }
        UErrorCode error = U_ZERO_ERROR;
        ucnv_setFromUCallBack(converter_.get(), UCNV_FROM_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
        ucnv_setToUCallBack(converter_.get(), UCNV_TO_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
    }

    /// Whether characters are in a text the same bytes as alone, both ways.
    bool isStateless() const {
        std::vector<Sample> samples;
        for (const std::u16string_view character : characters) {
            const std::optional<std::string> bytes = encoded(character);
            // An encoding that lacks it may have one that resembles it.
            if (bytes && decoded(*bytes) == character) {
                samples.push_back({character, *bytes});
            }
        }
        const bool isTried = std::any_of(samples.begin(), samples.end(),
                                         [](const Sample& sample) { return sample.text[0] >= 0x80; });
        if (!isTried && ucnv_getMaxCharSize(converter_.get()) > 1) {
            return false;
        }
        std::u16string text;
        std::string bytes;
        const auto append = [&](const Sample& sample) {
            text += sample.text;
            bytes += sample.bytes;
        };
        // Each behind its neighbours of both sides, and behind itself.
        std::for_each(samples.begin(), samples.end(), append);
        std::for_each(samples.rbegin(), samples.rend(), [&](const Sample& sample) {
            append(sample);
            append(sample);
        });
        return encoded(text) == bytes && decoded(bytes) == text;
    }

    /// Of all converters only some that read letters with marks behind them are.
    bool isBehind() const {
        const std::optional<std::string> letter = encoded(u"A");
        UErrorCode unused = U_ZERO_ERROR;
        return letter && decoded(*letter, false)->empty() &&
               ucnv_toUCountPending(converter_.get(), &unused) == 0;
    }

private:
    struct Sample {
        std::u16string_view text;
        std::string bytes;
    };

    static constexpr std::u16string_view characters[] = {
        u"\uFEFF", u"A",      u"~",      u"\u00E9", u"\u00D7", u"\u0159", u"\u03B1",     u"\u0416",
        u"\u05D0", u"\u0634", u"\u0905", u"\u0985", u"\u0B85", u"\u0E01", u"\u20AC",     u"\u3042",
        u"\uFF71", u"\u4E2D", u"\u6587", u"\uAC00", u"\uFFFD", u"\n",     u"\U0001F600", u"\U00020000",
    };

    // From the converter's initial state on and back to it.
    std::optional<std::string> encoded(std::u16string_view text) const {
        std::string bytes(text.size() * 16, '\0');
        char* target = bytes.data();
        const char16_t* source = text.data();
        UErrorCode error = U_ZERO_ERROR;
        ucnv_reset(converter_.get());
        ucnv_fromUnicode(converter_.get(), &target, target + bytes.size(), &source, source + text.size(),
                         nullptr, 1, &error);
        requireMemory(error);
        bytes.resize(static_cast<std::size_t>(target - bytes.data()));
        return U_SUCCESS(error) ? std::optional(bytes) : std::nullopt;
    }

    std::optional<std::u16string> decoded(std::string_view bytes, bool flush = true) const {
        std::u16string text(bytes.size() * 4, u'\0');
        char16_t* target = text.data();
        const char* source = bytes.data();
        UErrorCode error = U_ZERO_ERROR;
        ucnv_reset(converter_.get());
        ucnv_toUnicode(converter_.get(), &target, target + text.size(), &source, source + bytes.size(),
                       nullptr, flush ? 1 : 0, &error);
        requireMemory(error);
        text.resize(static_cast<std::size_t>(target - text.data()));
        return U_SUCCESS(error) ? std::optional(text) : std::nullopt;
    }

    // What is found out is kept for good.
    static void requireMemory(UErrorCode error) {
        if (error == U_MEMORY_ALLOCATION_ERROR) {
            throw std::bad_alloc();
        }
    }

    UErrorCode openError_ = U_ZERO_ERROR;
    std::unique_ptr<UConverter, decltype(&ucnv_close)> converter_;
};

} // namespace

std::string standardName(const char* name) {
    UErrorCode error = U_ZERO_ERROR;
    const std::unique_ptr<UConverter, decltype(&ucnv_close)> converter(ucnv_open(name, &error), &ucnv_close);
    // What is said of a name is kept for good, and another time there may be memory.
    if (error == U_MEMORY_ALLOCATION_ERROR) {
        throw std::bad_alloc();
    }
    if (converter == nullptr) {
        return {};
    }
    error = U_ZERO_ERROR;
    const char* const canonical = ucnv_getName(converter.get(), &error);
    for (const char* const standard : {"MIME", "IANA"}) {
        error = U_ZERO_ERROR;
        const char* const standardised = ucnv_getStandardName(canonical, standard, &error);
        if (standardised != nullptr) {
            return standardised;
        }
    }
    return canonical;
}

std::string_view errorName(int error) {
    return u_errorName(static_cast<UErrorCode>(error));
}

void Converter::Close::operator()(UConverter* converter) const noexcept {
    ucnv_close(converter);
}

Converter::Converter(Encoding encoding) : encoding_(encoding) {
    const std::string_view name = encoding.getName();
    // An id that was never handed out has no name, and ICU takes no name for that of its own default.
    if (name.empty()) {
        return;
    }
    UErrorCode error = U_ZERO_ERROR;
    converter_.reset(ucnv_open(name.data(), &error));
    lacksMemory_ = error == U_MEMORY_ALLOCATION_ERROR;
    // Compound text is left with ICU's own substitution: once another is set, ucnv_close frees what is not its own.
    if (converter_ == nullptr || unicodeForm(encoding) != Form::other ||
        ucnv_getType(converter_.get()) == UCNV_COMPOUND_TEXT) {
        return;
    }
    // Where ICU refuses, its own substitution stays.
    error = U_ZERO_ERROR;
    ucnv_setSubstString(converter_.get(), u"?", 1, &error);
}

void Converter::setListener(LossListener& listener) {
    listener_ = &listener;
    UErrorCode error = U_ZERO_ERROR;
    ucnv_setFromUCallBack(converter_.get(), &fromUnicodeCallback, &listener, nullptr, nullptr, &error);
    error = U_ZERO_ERROR;
    ucnv_setToUCallBack(converter_.get(), &toUnicodeCallback, &listener, nullptr, nullptr, &error);
}

// To ICU, compound text has no state to reset, though its converter goes on in the character set that was last written.
bool Converter::forgetsToReset() const {
    return isOpen() && ucnv_getType(converter_.get()) == UCNV_COMPOUND_TEXT;
}

void Converter::reset() {
    if (!forgetsToReset()) {
        ucnv_reset(converter_.get());
        return;
    }
    LossListener* const listener = listener_;
    *this = Converter(encoding_);
    if (isOpen() && listener != nullptr) {
        setListener(*listener);
    }
}

int Converter::maxCharSize() const {
    return ucnv_getMaxCharSize(converter_.get());
}

std::string Converter::substitution() const {
    std::array<char, 20> bytes;
    auto length = static_cast<std::int8_t>(bytes.size());
    UErrorCode error = U_ZERO_ERROR;
    ucnv_getSubstChars(converter_.get(), bytes.data(), &length, &error);
    return U_SUCCESS(error) ? std::string(bytes.data(), static_cast<std::size_t>(length)) : std::string();
}

void Converter::requireMemory() const {
    if (lacksMemory_) {
        throw std::bad_alloc();
    }
}

Form Converter::form() {
    requireMemory();
    if (!isOpen()) {
        return Form::other;
    }
    if (isSingleByte(converter_.get())) {
        return keepsAscii(converter_.get()) ? Form::asciiSingleByte : Form::singleByte;
    }
    if (hasSeveralBytes(converter_.get()) && nature().isStateless) {
        return keepsAscii(converter_.get()) ? Form::asciiSeveralBytes : Form::severalBytes;
    }
    return keepsAscii(converter_.get()) ? Form::asciiCompatible : Form::other;
}

Converter::Nature Converter::nature() const {
    const Trial trial(encoding_);
    return {trial.isStateless(), trial.isBehind()};
}

std::vector<Converter::Range> Converter::characters() const {
    const std::unique_ptr<USet, decltype(&uset_close)> set(uset_openEmpty(), &uset_close);
    UErrorCode error = U_ZERO_ERROR;
    if (set != nullptr) {
        ucnv_getUnicodeSet(converter_.get(), set.get(), UCNV_ROUNDTRIP_AND_FALLBACK_SET, &error);
    }
    if (set == nullptr || error == U_MEMORY_ALLOCATION_ERROR) {
        throw std::bad_alloc(); // and not a part of the characters, of which a table would be made for good
    }
    std::vector<Range> ranges;
    for (std::int32_t i = 0; U_SUCCESS(error) && i < uset_getItemCount(set.get()); ++i) {
        UChar32 first = 0;
        UChar32 last = 0;
        // Behind the ranges come sequences of characters, which have a length.
        if (uset_getItem(set.get(), i, &first, &last, nullptr, 0, &error) == 0) {
            ranges.push_back({static_cast<char32_t>(first), static_cast<char32_t>(last)});
        }
        error = U_ZERO_ERROR;
    }
    return ranges;
}

Converter Converter::clone() const {
    Converter copy;
    // A bytewise copy, as ICU makes it of compound text, shares what both would release.
    if (ucnv_getType(converter_.get()) != UCNV_COMPOUND_TEXT) {
        UErrorCode error = U_ZERO_ERROR;
#if U_ICU_VERSION_MAJOR_NUM >= 71
        copy.converter_.reset(ucnv_clone(converter_.get(), &error));
#else
        copy.converter_.reset(ucnv_safeClone(converter_.get(), nullptr, nullptr, &error));
#endif
        copy.encoding_ = encoding_;
        copy.listener_ = listener_;
    }
    return copy;
}

std::size_t Converter::heldBytes() const {
    UErrorCode error = U_ZERO_ERROR;
    const std::int32_t held = ucnv_toUCountPending(converter_.get(), &error);
    return U_SUCCESS(error) && held > 0 ? static_cast<std::size_t>(held) : 0;
}

bool Converter::countsHeldBytes() const {
    switch (ucnv_getType(converter_.get())) {
    case UCNV_HZ:
    case UCNV_UTF7:
    case UCNV_IMAP_MAILBOX:
        return false;
    default:
        return true;
    }
}

// How the text would go on shows what the converter is in the middle of. HZ: a "!" is itself, or the first byte of a
// character, unless it comes behind a "~" or behind such a byte. UTF-7: a "-" is a "+" right behind one; and seven "A",
// which are 42 bits of 0, make up a third character only where at least 6 bits of 0 were left over before.
std::size_t Converter::forgottenBytes() const {
    switch (ucnv_getType(converter_.get())) {
    case UCNV_HZ: {
        const std::optional<std::u16string> next = whatFollows("!");
        return !next || (*next != u"" && *next != u"!") ? 1 : 0;
    }
    case UCNV_UTF7:
        if (whatFollows("-") == u"+") {
            return 1;
        }
        return whatFollows("AAAAAAA") == std::u16string(3, u'\0') ? heldBytes() : 0;
    default:
        return 0;
    }
}

std::optional<std::u16string> Converter::whatFollows(std::string_view bytes) const {
    const Converter copy = clone();
    UErrorCode error = U_ZERO_ERROR;
    ucnv_setToUCallBack(copy.converter_.get(), UCNV_TO_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
    std::array<char16_t, 16> units{};
    char16_t* target = units.data();
    const char* source = bytes.data();
    ucnv_toUnicode(copy.converter_.get(), &target, units.data() + units.size(), &source,
                   bytes.data() + bytes.size(), nullptr, 0, &error);
    return U_SUCCESS(error) ? std::optional(std::u16string(units.data(), target)) : std::nullopt;
}

bool Converter::holdsUnits() const {
    UErrorCode error = U_ZERO_ERROR;
    return ucnv_fromUCountPending(converter_.get(), &error) != 0;
}

Progress Converter::toUnicode(const char*& source, const char* sourceEnd, char16_t*& target,
                              const char16_t* targetEnd, bool flush) {
    UErrorCode error = U_ZERO_ERROR;
    ucnv_toUnicode(converter_.get(), &target, targetEnd, &source, sourceEnd, nullptr, flush ? 1 : 0, &error);
    return progressOf(error);
}

Progress Converter::fromUnicode(const char16_t*& source, const char16_t* sourceEnd, char*& target,
                                const char* targetEnd, bool flush) {
    UErrorCode error = U_ZERO_ERROR;
    ucnv_fromUnicode(converter_.get(), &target, targetEnd, &source, sourceEnd, nullptr, flush ? 1 : 0,
                     &error);
    return progressOf(error);
}

Progress Converter::convert(Converter& to, Converter& from, char*& target, const char* targetEnd,
                            const char*& source, const char* sourceEnd, char16_t* pivot,
                            char16_t*& pivotSource, char16_t*& pivotTarget, const char16_t* pivotEnd,
                            bool reset, bool flush) {
    for (Converter* const converter : {&to, &from}) {
        if (reset && converter->forgetsToReset()) {
            converter->reset();
        }
    }
    UErrorCode error = U_ZERO_ERROR;
    ucnv_convertEx(to.converter_.get(), from.converter_.get(), &target, targetEnd, &source, sourceEnd, pivot,
                   &pivotSource, &pivotTarget, pivotEnd, reset ? 1 : 0, flush ? 1 : 0, &error);
    return progressOf(error);
}

} // namespace kvt::ex::detail::icu
