// The text that is written for a string, whoever writes it: operator<<, std::format, {fmt}.
#pragma once

#include <kvt/foundation/string_view.h>
#include <kvt/string/ustring.h>

#include <cstdint>
#include <string>

namespace kvt::ex::detail {

/// As operator<< describes it. Fails as that does.
template <std::uint32_t N>
std::string outputText(const UString<N>& string);

/// That text, without a copy of what is UTF-8 already: it lives as long as this object and the string.
template <std::uint32_t N>
class OutputText {
public:
    explicit OutputText(const UString<N>& string) : text_(outputText(string)) {}
    operator kvt::future::string_view() const noexcept { return text_; }

private:
    std::string text_;
};

template <>
class OutputText<Encoding::Utf8> {
public:
    explicit OutputText(const UString<0>& string) noexcept : string_(&string) {}
    operator kvt::future::string_view() const noexcept { return *string_; }

private:
    const UString<0>* string_;
};

} // namespace kvt::ex::detail
