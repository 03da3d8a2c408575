// The dialect of ObsoleteRegexp, in terms of Perl's.
#pragma once

#include <string>
#include <string_view>

namespace kvt::ex::detail {

/// The pattern in Perl syntax: a backslash goes before each of { } ( ) | $ that has none, a final $ excepted.
std::string perlPattern(std::string_view legacyPattern);

} // namespace kvt::ex::detail
