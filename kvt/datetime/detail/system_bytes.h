// Text in the system's encoding, in which patterns and the values that they read are compared byte by byte.
#pragma once

#include <kvt/string/ustring.h>

#include <string_view>

namespace kvt::ex::datetime::detail {

/// UTF-8 text as bytes of the system's encoding. Where the two are the same, the text is only referred to.
/// The constructor fails as the conversion does when a character has no form in the system's encoding.
class SystemBytes {
public:
    explicit SystemBytes(std::string_view text);
    SystemBytes(const SystemBytes&) = delete;
    SystemBytes& operator=(const SystemBytes&) = delete;

    std::string_view view() const noexcept { return view_; }

private:
    UString<27> converted_;
    std::string_view view_;
};

/// Bytes of the system's encoding as UTF-8; what a cut through a character has left of it is substituted.
UString<0> textOfSystemBytes(std::string_view bytes);

} // namespace kvt::ex::datetime::detail
