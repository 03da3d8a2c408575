// What ICU says about names, asked directly, without the library under test.
#pragma once

#include <string>
#include <vector>

namespace kvt::test {

/// Every converter that ICU lists, by its own canonical name.
const std::vector<std::string>& icuConverters();

/// Every alias of every converter, each once, in ICU's order.
const std::vector<std::string>& icuAliases();

/// The name that an encoding opened under `name` is to have: MIME, else IANA, else ICU's own, with UTF-16 and UTF-32
/// read as little-endian; empty when ICU cannot open it.
std::string canonicalName(const std::string& name);

/// Whether the longest character has one byte.
bool hasOneByteCharacters(const std::string& name);

} // namespace kvt::test
