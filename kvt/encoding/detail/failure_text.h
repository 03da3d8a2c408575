// Text for the parameters of a failure.
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/string/ustring.h>

#include <string_view>

namespace kvt::ex::detail {

/// Text of `encoding` as UTF-8, with substitutions where it is not valid. It reports no loss: a failure whose
/// parameters are made by it is neither hidden by another one nor made for ever. The encoding has a converter.
UString<0> textForFailure(std::string_view bytes, Encoding encoding);

} // namespace kvt::ex::detail
