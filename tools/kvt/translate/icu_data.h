// What ICU knows of languages and characters, for the columns of tables: names of months, signs of numbers, normal
// forms, and which encodings have states.
#pragma once

#include <array>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// All ways in which a language writes each month, from January, long and short, within a date and alone, with and
/// without a dot behind. None for a language that ICU does not know.
std::optional<std::array<std::vector<std::string>, 12>> monthNames(const std::string& language);

/// How a language writes numbers, in UTF-8.
struct NumberSigns {
    std::string decimal;
    std::string group;
};
std::optional<NumberSigns> numberSigns(const std::string& language);

/// Upper and lower case made one, for names.
std::string foldedName(std::string_view utf8);

/// Whether the character is a sign of a currency.
bool isCurrencySign(char32_t character);

class Normalizer {
public:
    virtual ~Normalizer() = default;
    /// `utf8` is valid.
    virtual std::string normalized(std::string_view utf8) const = 0;
};
/// For "nfc", "nfd", "nfkc" and "nfkd"; null for others.
std::unique_ptr<Normalizer> makeNormalizer(const std::string& form);

/// Whether bytes of a text in the encoding mean the same whatever stands before them, characters apart.
bool isStateless(const std::string& encodingName);

} // namespace host
