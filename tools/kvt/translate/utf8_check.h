// Whether a text is UTF-8, which most are: it need not be decoded then, and no loss be looked for.
#pragma once

#include <string_view>

namespace host {

/// Whether all of it is, characters that end within the text included: no surrogates, no longer forms than there have to
/// be, nothing beyond U+10FFFF.
bool isUtf8(std::string_view text);

} // namespace host
