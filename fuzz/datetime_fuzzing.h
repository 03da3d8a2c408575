// What the fuzzers of the date and time functions share.
//
// An input is a byte for the choice that a function has, if any, and then its texts with a line feed between them.
#pragma once

#include <fuzzing.h>

#include <kvt/datetime/datetime.h>

#include <string>
#include <string_view>

namespace kvt::fuzz {

inline kvt::ex::UString<0> ustring(std::string_view text) {
    return kvt::ex::UString<0>(kvt::ex::UStringView<0>(text));
}

/// Cuts off what stands before the first line feed, or all.
inline std::string_view takeLine(std::string_view& rest) {
    const std::size_t end = std::min(rest.find('\n'), rest.size());
    const std::string_view line = rest.substr(0, end);
    rest.remove_prefix(std::min(end + 1, rest.size()));
    return line;
}

inline std::string_view trimmed(std::string_view text) {
    constexpr std::string_view blanks = " \t\r\n\f\v";
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
    return text.substr(0, text.find_last_not_of(blanks) + 1);
}

inline bool isAscii(std::string_view text) {
    return std::all_of(text.begin(), text.end(), [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

template <typename Result>
bool isGood(const Result& result) {
    return std::get<0>(result) == kvt::ex::datetime::ReturnState::Success ||
           std::get<0>(result) == kvt::ex::datetime::ReturnState::Repaired;
}

inline std::string textOf(const kvt::ex::datetime::TextResult& result) {
    return std::get<1>(result).toStdString();
}

template <typename Result>
std::uint32_t messageOf(const Result& result) {
    return std::get<2>(result) ? std::get<2>(result)->messageNumber : 0;
}

/// A good result has no message, and a bad one no text.
inline void requireShape(const kvt::ex::datetime::TextResult& result) {
    if (isGood(result)) {
        require(!std::get<2>(result), "a good result has no message");
    } else {
        requireEqual(textOf(result), std::string(), "a failure has no text");
    }
}

/// Whether a fraction that was rounded up, or a day that `lenient` let run over, has led behind the last year. Such a
/// text has one digit more than a value and cannot be read again.
inline bool isBehindLastYear(const kvt::ex::datetime::TextResult& result) {
    const std::size_t digits = textOf(result).find_first_not_of("0123456789");
    const std::size_t length = std::min(digits, textOf(result).size());
    return length == std::string_view("100000101").size() ||
           length == std::string_view("100000101000000").size();
}

/// A result that is a value is read again as the same text.
inline void requireCanonical(const kvt::ex::datetime::TextResult& result) {
    requireShape(result);
    if (isGood(result) && !textOf(result).empty() && !isBehindLastYear(result)) {
        requireEqual(textOf(kvt::ex::datetime::format(std::get<1>(result), ustring("ZQT"))), textOf(result),
                     "a result is canonical");
    }
}

} // namespace kvt::fuzz
