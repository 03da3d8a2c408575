#include "cli/sizes.h"

#include "base/failure.h"
#include "base/text.h"

#include <algorithm>
#include <charconv>
#include <limits>
#include <string_view>

namespace host {

namespace {

// "010" might be meant as an octal number, and "1e3" or "0x10" by another program's rules.
bool isPlain(std::string_view digits) {
    return digits == "0" || (!digits.empty() && digits.front() != '0' &&
                             digits.find_first_not_of("0123456789") == std::string_view::npos);
}

} // namespace

std::uint64_t parseSize(const std::string& option, const std::string& typed) {
    std::uint64_t number = 0;
    const char* const end = typed.data() + typed.size();
    const auto [suffix, error] = std::from_chars(typed.data(), end, number);
    const std::string letter(suffix, end);
    const std::string_view letters = "KMGT";
    const std::size_t power = letter.empty()       ? 0
                              : letter.size() == 1 ? letters.find(letter[0] & ~0x20) + 1
                                                   : letters.size() + 1;
    if (error != std::errc() || power > letters.size() || (power == 0 && !letter.empty()) ||
        number > std::numeric_limits<std::uint64_t>::max() >> (10 * power)) {
        throw Failure(option + " takes a size such as 64K, 128M or 2G, not '" + printable(typed) + "'");
    }
    return number << (10 * power);
}

std::uint64_t parseNumber(const std::string& option, const std::string& typed) {
    std::uint64_t number = 0;
    const auto [stop, error] = std::from_chars(typed.data(), typed.data() + typed.size(), number);
    if (!isPlain(typed) || error != std::errc()) {
        throw Failure(option + " takes a whole number from 0 to " +
                      std::to_string(std::numeric_limits<std::uint64_t>::max()) + " in plain digits, not '" +
                      printable(typed) + "'");
    }
    return number;
}

double parseDecimal(const std::string& option, const std::string& typed) {
    const std::string_view text = typed;
    const std::size_t point = std::min(text.find('.'), text.size());
    const std::string_view fraction = text.substr(std::min(point + 1, text.size()));
    double number = 0.0;
    const auto [stop, error] = std::from_chars(typed.data(), typed.data() + typed.size(), number);
    const bool isWhole = point == text.size();
    if (!isPlain(text.substr(0, point)) || (!isWhole && fraction.empty()) ||
        fraction.find_first_not_of("0123456789") != std::string_view::npos || error != std::errc()) {
        throw Failure(option +
                      " takes a number such as 5 or 0.25, in plain digits and without a sign, not '" +
                      printable(typed) + "'");
    }
    return number;
}

} // namespace host
