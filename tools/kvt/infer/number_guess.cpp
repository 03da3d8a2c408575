#include "infer/number_guess.h"

#include "base/text_units.h"

#include <algorithm>

namespace host {

namespace {

std::size_t digitsOf(std::string_view text) {
    return static_cast<std::size_t>(std::find_if_not(text.begin(), text.end(), isDigit) - text.begin());
}

// A sign of any currency: those of Latin-1, and U+20A0 to U+20CF.
std::size_t currencySize(std::string_view text) {
    for (const std::string_view sign : {"$", "\xC2\xA2", "\xC2\xA3", "\xC2\xA4", "\xC2\xA5"}) {
        if (text.starts_with(sign)) {
            return sign.size();
        }
    }
    const bool isInBlock =
        text.size() >= 3 && text.starts_with("\xE2\x82") && static_cast<unsigned char>(text[2]) >= 0xA0;
    return isInBlock ? 3 : 0;
}

// U+0020, U+00A0, U+2009 and U+202F.
std::size_t blankSize(std::string_view text) {
    for (const std::string_view blank : {" ", "\xC2\xA0", "\xE2\x80\x89", "\xE2\x80\xAF"}) {
        if (text.starts_with(blank)) {
            return blank.size();
        }
    }
    return 0;
}

void skipBlanks(std::string_view& text) {
    for (std::size_t size = blankSize(text); size != 0; size = blankSize(text)) {
        text.remove_prefix(size);
    }
}

std::size_t groupSignSize(std::string_view text, NumberStyle style) {
    switch (style) {
    case NumberStyle::Point:
        return text.starts_with(',') ? 1 : 0;
    case NumberStyle::Comma:
        return text.starts_with('.') ? 1 : 0;
    case NumberStyle::Space:
        return blankSize(text);
    case NumberStyle::Apostrophe:
        return text.starts_with('\'') ? 1 : text.starts_with("\xE2\x80\x99") ? 3 : 0;
    case NumberStyle::Plain:
        break;
    }
    return 0;
}

// The digits, with groups of three if there are any, and the decimals; what is left of the text is behind them.
bool takeNumber(std::string_view& text, NumberStyle style) {
    std::size_t digits = digitsOf(text);
    if (digits == 0) {
        return false;
    }
    const bool mayHaveGroups = digits <= 3;
    text.remove_prefix(digits);
    while (mayHaveGroups) {
        const std::size_t sign = groupSignSize(text, style);
        if (sign == 0 || digitsOf(text.substr(sign)) != 3) {
            break;
        }
        text.remove_prefix(sign + 3);
    }
    const bool hasComma = style == NumberStyle::Comma || style == NumberStyle::Space;
    if (text.starts_with(hasComma ? ',' : '.')) {
        digits = digitsOf(text.substr(1));
        text.remove_prefix(digits == 0 ? 0 : 1 + digits);
    }
    return true;
}

bool takeSign(std::string_view& text) {
    const std::size_t size = text.starts_with('-') || text.starts_with('+') ? 1
                             : text.starts_with("\xE2\x88\x92")             ? 3
                                                                            : 0;
    text.remove_prefix(size);
    return size != 0;
}

struct Reading {
    bool isNumber = false;
    bool hasCurrency = false;
};

// A sign, a currency in front or behind, blanks between.
Reading read(std::string_view text, NumberStyle style) {
    const bool hadSign = takeSign(text);
    std::size_t currency = currencySize(text);
    text.remove_prefix(currency);
    const bool hasCurrency = currency != 0;
    if (hasCurrency) {
        skipBlanks(text);
        if (!hadSign) {
            takeSign(text);
        }
    }
    if (!takeNumber(text, style)) {
        return {};
    }
    if (!hasCurrency) {
        std::string_view behind = text;
        skipBlanks(behind);
        currency = currencySize(behind);
        if (currency != 0) {
            text = behind.substr(currency);
        }
    }
    return {text.empty(), currency != 0 || hasCurrency};
}

bool hasLeadingZero(std::string_view cell) {
    return cell.size() > 1 && cell.front() == '0' && digitsOf(cell) == cell.size();
}

} // namespace

bool NumberGuess::add(std::string_view cell) {
    constexpr std::size_t longest = 64;
    if (cell.size() > longest || std::none_of(cell.begin(), cell.end(), isDigit)) {
        return false;
    }
    bool isNumber = false;
    bool hasCurrency = false;
    for (std::size_t i = 0; i < numberStyles; ++i) {
        const auto style = static_cast<NumberStyle>(i);
        const Reading reading = read(cell, style);
        if (!reading.isNumber || (style == NumberStyle::Plain && reading.hasCurrency)) {
            continue;
        }
        ++counts_[i];
        if (digitsOf(cell) != cell.size() && example(style).empty()) {
            examples_.emplace_back(style, cell);
        }
        isNumber = true;
        hasCurrency = reading.hasCurrency;
    }
    cells_ += isNumber ? 1 : 0;
    withCurrency_ += hasCurrency ? 1 : 0;
    withLeadingZero_ += isNumber && hasLeadingZero(cell) ? 1 : 0;
    return isNumber;
}

std::string NumberGuess::example(NumberStyle style) const {
    const auto found = std::find_if(examples_.begin(), examples_.end(),
                                    [&](const auto& example) { return example.first == style; });
    return found == examples_.end() ? std::string() : found->second;
}

NumberStyle NumberGuess::style() const {
    return static_cast<NumberStyle>(std::max_element(counts_.begin(), counts_.end()) - counts_.begin());
}

} // namespace host
