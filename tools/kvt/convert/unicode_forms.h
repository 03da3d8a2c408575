// Text in another form of Unicode, or in another script: the door to ICU's normalization and transliteration.
#pragma once

#include <memory>
#include <string>
#include <string_view>

namespace host {

enum class Normalization {
    None,
    Nfc,  ///< composed where that is the same text
    Nfkc, ///< the same, and forms of one character made one: ligatures, widths, circled numbers
};

/// Puts text into a form of normalization.
class Normalizer {
public:
    /// Not for None. Throws Failure where ICU has no data.
    explicit Normalizer(Normalization form);

    /// Whether what begins with the character is the same whatever stands before it.
    bool hasBoundaryBefore(char32_t character) const;
    /// Whether the character stays as it is, whatever stands around it.
    bool isInert(char32_t character) const;
    std::u32string normalized(std::u32string_view text) const;

private:
    const void* form_; ///< ICU's, which lives as long as the program
};

/// What a character is in Latin letters, and those in ASCII: "Ł" is "L", "ж" is "z".
class Transliteration {
public:
    /// Throws Failure where ICU has no data.
    Transliteration();

    /// The same character where ICU knows no other.
    std::u32string of(char32_t character) const;

private:
    std::unique_ptr<void, void (*)(void*)> transliterator_;
};

} // namespace host
