#include "translate/number_reader.h"

#include "base/failure.h"
#include "base/text.h"
#include "base/text_units.h"
#include "translate/icu_data.h"

#include <algorithm>

namespace host {

namespace {

// Space, no-break space, figure space, thin space, narrow no-break space.
const std::vector<std::string> spaces = {" ", "\u00A0", "\u2007", "\u2009", "\u202F"};
const std::vector<std::string> apostrophes = {"'", "\u2019"};
constexpr std::string_view minusSign = "\u2212";

constexpr bool isCapital(char byte) {
    return byte >= 'A' && byte <= 'Z';
}

bool take(std::string_view& text, std::string_view what) {
    const bool isThere = !what.empty() && text.starts_with(what);
    text.remove_prefix(isThere ? what.size() : 0);
    return isThere;
}

bool takeOneOf(std::string_view& text, const std::vector<std::string>& ones) {
    return std::any_of(ones.begin(), ones.end(), [&](const std::string& one) { return take(text, one); });
}

bool takeLast(std::string_view& text, std::string_view what) {
    const bool isThere = text.ends_with(what);
    text.remove_suffix(isThere ? what.size() : 0);
    return isThere;
}

void stripSpaces(std::string_view& text) {
    while (takeOneOf(text, spaces) || take(text, "\t")) {
    }
    while (std::any_of(spaces.begin(), spaces.end(),
                       [&](const std::string& one) { return takeLast(text, one); }) ||
           takeLast(text, "\t")) {
    }
}

bool isCurrency(std::string_view text) {
    if (text.size() == 3 && std::all_of(text.begin(), text.end(), isCapital)) {
        return true;
    }
    const std::u32string characters = toUtf32(text, kvt::ex::Encoding::Utf8);
    return characters.size() == 1 && isCurrencySign(characters.front());
}

// What is neither digit nor sign at an end of the text, if that is a currency; false where it is anything else.
bool takeCurrency(std::string_view& text) {
    const auto isPart = [](char byte) {
        return isCapital(byte) || byte == '$' || static_cast<unsigned char>(byte) >= 0x80;
    };
    std::size_t front = 0;
    while (front < text.size() && isPart(text[front]) && !text.substr(front).starts_with(minusSign)) {
        ++front;
    }
    std::size_t back = text.size();
    while (back > front && isPart(text[back - 1]) && !text.substr(0, back).ends_with(minusSign)) {
        --back;
    }
    std::string_view before = text.substr(0, front);
    std::string_view behind = text.substr(back);
    // A space of more than one byte is taken for a part, too.
    stripSpaces(before);
    stripSpaces(behind);
    if ((!before.empty() && !behind.empty()) || (!before.empty() && !isCurrency(before)) ||
        (!behind.empty() && !isCurrency(behind))) {
        return false;
    }
    text = text.substr(front, back - front);
    stripSpaces(text);
    return true;
}

// A sign at one of the ends; false for two of them.
bool takeSign(std::string_view& text, bool& isNegative, int& count) {
    const auto note = [&](bool isThere, bool negative) {
        count += isThere ? 1 : 0;
        isNegative = isNegative || (isThere && negative);
    };
    note(take(text, "-"), true);
    note(take(text, minusSign), true);
    note(take(text, "+"), false);
    note(takeLast(text, "-"), true);
    note(takeLast(text, minusSign), true);
    stripSpaces(text);
    return count <= 1;
}

} // namespace

NumberReader::NumberReader(const std::string& language) {
    const auto signs = numberSigns(language);
    if (!signs) {
        throw Failure("ICU knows no language '" + printable(language) + "'");
    }
    decimal_ = signs->decimal;
    groups_ = {signs->group};
    plainDecimal_ = decimal_.size() == 1 ? decimal_.front() : '\0';
    plainGroup_ = signs->group.size() == 1 ? signs->group.front() : '\0';
    for (const auto* alike : {&spaces, &apostrophes}) {
        if (std::find(alike->begin(), alike->end(), signs->group) != alike->end()) {
            groups_ = *alike;
        }
    }
}

// Nearly all numbers: perhaps a minus, one to three digits, groups of three, a fraction. False is no answer.
bool NumberReader::readPlain(std::string_view text, std::string_view& number) {
    const char* at = text.data();
    const char* const end = at + text.size();
    const bool isNegative = at != end && *at == '-';
    at += isNegative ? 1 : 0;
    const bool isBelowOne = end - at >= 2 && *at == '0' && at[1] == plainDecimal_ && !isNegative;
    if (at == end || text.size() > plain_.size() || ((*at < '1' || *at > '9') && !isBelowOne)) {
        return false;
    }
    char* to = plain_.data();
    *to = '-';
    to += isNegative ? 1 : 0;
    const char* const first = at;
    while (at != end && isDigit(*at)) {
        *to++ = *at++;
    }
    if (at != end && *at == plainGroup_ && at - first > 3) {
        return false;
    }
    while (end - at >= 4 && *at == plainGroup_ && isDigit(at[1]) && isDigit(at[2]) && isDigit(at[3])) {
        to = std::copy(at + 1, at + 4, to);
        at += 4;
    }
    if (end - at >= 2 && *at == plainDecimal_) {
        *to++ = '.';
        for (++at; at != end && isDigit(*at); ++at) {
            *to++ = *at;
        }
    }
    number = {plain_.data(), static_cast<std::size_t>(to - plain_.data())};
    return at == end;
}

bool NumberReader::read(std::string_view text, std::string_view& number) {
    if (readPlain(text, number)) {
        return true;
    }
    const bool isNumber = readAny(text, number_);
    number = number_;
    return isNumber;
}

bool NumberReader::readAny(std::string_view text, std::string& out) const {
    bool isNegative = false;
    if (text.empty() || !isDigit(text.front()) || !isDigit(text.back())) {
        int signs = 0;
        stripSpaces(text);
        // Sign and currency may stand in either order.
        if (!takeSign(text, isNegative, signs) || !takeCurrency(text) || !takeSign(text, isNegative, signs)) {
            return false;
        }
    }
    out.clear();
    std::size_t digits = 0; // since the last sign of grouping
    std::size_t groups = 0;
    while (!text.empty()) {
        if (isDigit(text.front())) {
            out += text.front();
            text.remove_prefix(1);
            ++digits;
        } else if (digits >= 1 && (groups == 0 ? digits <= 3 : digits == 3) && takeOneOf(text, groups_)) {
            ++groups;
            digits = 0;
        } else {
            break;
        }
    }
    if (groups != 0 && digits != 3) {
        return false;
    }
    std::size_t zeros = std::min(out.find_first_not_of('0'), out.size());
    const bool hasWhole = !out.empty();
    out.erase(0, zeros);
    if (out.empty()) {
        out = "0";
    }
    if (take(text, decimal_)) {
        if (text.empty() || !std::all_of(text.begin(), text.end(), isDigit)) {
            return false;
        }
        out += '.';
        out += text;
    } else if (!text.empty() || !hasWhole) {
        return false;
    }
    if (isNegative && out.find_first_not_of("0.") != std::string::npos) {
        out.insert(0, 1, '-');
    }
    return true;
}

} // namespace host
