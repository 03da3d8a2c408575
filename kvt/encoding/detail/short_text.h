// Short texts without ICU, which are mostly what a conversion costs before it begins: taken as a whole, or not at all.
#pragma once

#include <kvt/encoding/detail/shortcut.h>

#include <string>
#include <string_view>

namespace kvt::ex::detail {

/// Converts a text that is short, and for which ICU is not needed, and appends it to `out`; returns whether it was such a
/// text. The rules for the two sides and for `out` are those of convertPrefix().
template <typename CharOut>
bool convertShort(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out);

/// The same for a text that the caller has found not to be ASCII; it only takes longer if it is.
template <typename CharOut>
bool convertShortBuffered(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out);

#define KVT_DECLARE(CharOut)                                                                                 \
    extern template bool convertShort(Side, Side, std::string_view, std::basic_string<CharOut>&);            \
    extern template bool convertShortBuffered(Side, Side, std::string_view, std::basic_string<CharOut>&);

KVT_DECLARE(char)
KVT_DECLARE(char16_t)
KVT_DECLARE(char32_t)

#undef KVT_DECLARE

} // namespace kvt::ex::detail
