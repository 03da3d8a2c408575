#include "convert/unicode_forms.h"

#include "base/failure.h"

#include <unicode/unorm2.h>
#include <unicode/ustring.h>
#include <unicode/utrans.h>

#include <array>

namespace host {

namespace {

// To Latin letters, and then without what ASCII lacks.
constexpr std::u16string_view toAscii = u"Any-Latin; Latin-ASCII";

void require(UErrorCode status, const char* what) {
    if (U_FAILURE(status)) {
        throw Failure(std::string("ICU cannot ") + what + ": " + u_errorName(status));
    }
}

std::u16string utf16Of(std::u32string_view text) {
    std::u16string units;
    for (const char32_t character : text) {
        std::array<char16_t, 2> pair{};
        std::size_t length = 0;
        U16_APPEND_UNSAFE(pair, length, character);
        units.append(pair.data(), length);
    }
    return units;
}

std::u32string utf32Of(std::u16string_view units) {
    std::u32string text;
    for (std::size_t index = 0; index < units.size();) {
        UChar32 character = 0;
        U16_NEXT(units.data(), index, units.size(), character);
        text += static_cast<char32_t>(character);
    }
    return text;
}

const UNormalizer2* asIcu(const void* form) {
    return static_cast<const UNormalizer2*>(form);
}

} // namespace

Normalizer::Normalizer(Normalization form) : form_(nullptr) {
    UErrorCode status = U_ZERO_ERROR;
    form_ = form == Normalization::Nfc ? unorm2_getNFCInstance(&status) : unorm2_getNFKCInstance(&status);
    require(status, "normalize");
}

bool Normalizer::hasBoundaryBefore(char32_t character) const {
    return unorm2_hasBoundaryBefore(asIcu(form_), static_cast<UChar32>(character)) != 0;
}

bool Normalizer::isInert(char32_t character) const {
    return unorm2_isInert(asIcu(form_), static_cast<UChar32>(character)) != 0;
}

std::u32string Normalizer::normalized(std::u32string_view text) const {
    const std::u16string units = utf16Of(text);
    const auto length = static_cast<std::int32_t>(units.size());
    // No normalization makes a text longer than this.
    std::u16string result(units.size() * 18, u'\0');
    UErrorCode status = U_ZERO_ERROR;
    const std::int32_t size = unorm2_normalize(asIcu(form_), units.data(), length, result.data(),
                                               static_cast<std::int32_t>(result.size()), &status);
    require(status, "normalize");
    return utf32Of(std::u16string_view(result).substr(0, static_cast<std::size_t>(size)));
}

Transliteration::Transliteration()
    : transliterator_(nullptr, [](void* opened) { utrans_close(static_cast<UTransliterator*>(opened)); }) {
    UErrorCode status = U_ZERO_ERROR;
    transliterator_.reset(utrans_openU(toAscii.data(), static_cast<std::int32_t>(toAscii.size()),
                                       UTRANS_FORWARD, nullptr, 0, nullptr, &status));
    require(status, "transliterate");
}

std::u32string Transliteration::of(char32_t character) const {
    std::u16string units = utf16Of({&character, 1});
    auto length = static_cast<std::int32_t>(units.size());
    // The longest names of characters in Latin letters are shorter.
    constexpr std::int32_t room = 128;
    units.resize(room);
    std::int32_t limit = length;
    UErrorCode status = U_ZERO_ERROR;
    utrans_transUChars(static_cast<const UTransliterator*>(transliterator_.get()), units.data(), &length,
                       room, 0, &limit, &status);
    return U_SUCCESS(status) ? utf32Of(std::u16string_view(units).substr(0, static_cast<std::size_t>(length)))
                             : std::u32string(1, character);
}

} // namespace host
