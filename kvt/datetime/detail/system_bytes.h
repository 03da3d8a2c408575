// Text in the system's encoding, in which patterns and the values that they read are compared byte by byte.
#pragma once

#include <kvt/foundation/detail/ascii.h>
#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <cstddef>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// Whether the system's encoding is UTF-8. It does not change while the program runs.
inline bool isSystemUtf8() {
    static const bool isUtf8 = Encoding(Encoding::System).evaluate() == Encoding::Utf8;
    return isUtf8;
}

/// Whether seven-bit text has the same bytes in the system's encoding.
bool isAsciiPartOfSystem();

/// Whether UTF-8 text has the same bytes in the system's encoding. It is not looked at where that is UTF-8.
inline bool isSystemText(std::string_view utf8) {
    return isSystemUtf8() || (isAsciiPartOfSystem() && ex::detail::isAllAscii(utf8));
}

/// UTF-8 text as bytes of the system's encoding. Where these are the same bytes, the text is only referred to, and not
/// looked at. Otherwise the constructor throws what the conversion throws, when the text is not well formed or has a
/// character that the system's encoding has not.
class SystemBytes {
public:
    explicit SystemBytes(std::string_view text) : view_(text) {
        if (!isSystemText(text)) {
            convert(text);
        }
    }
    SystemBytes(const SystemBytes&) = delete;
    SystemBytes& operator=(const SystemBytes&) = delete;

    std::string_view view() const noexcept { return view_; }

private:
    void convert(std::string_view text);

    std::optional<UString<27>> converted_;
    std::string_view view_;
};

/// Bytes of the system's encoding as UTF-8. Throws what the conversion throws.
UString<0> textOfSystemBytes(std::string_view bytes);

/// The same for messages: what a cut through a character has left of it is substituted.
UString<0> readableSystemBytes(std::string_view bytes);

/// Adds that to the parameters of a message.
void appendReadable(UStringArray<0>& parameters, std::string_view bytes);

/// The first `length` bytes, and where the system's encoding is UTF-8, the rest of the character that they end in.
std::string_view wholeCharacters(std::string_view bytes, std::size_t length);

/// Where to cut a text in two at `place`: where the system's encoding is UTF-8 and `place` is inside a character, in
/// front of that character.
std::size_t placeBetweenCharacters(std::string_view bytes, std::size_t place) noexcept;

} // namespace kvt::ex::datetime::detail
