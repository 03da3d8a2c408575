// Manual pages, from what a command declares.
#pragma once

#include "cli/syntax_page.h"

#include <string>

namespace host {

/// What stands at the foot of every page.
struct PageFoot {
    std::string version; ///< "kvt 0.1.0"
    std::string date;    ///< "2024-01-31"
};

/// "kvt-date-parse", under which the page of "kvt date parse" is found.
std::string manualPageName(const SyntaxPage& page);

/// The page in the language of man(7), of section 1. `parent` is the page of the command above, or null.
std::string manualPage(const SyntaxPage& page, const SyntaxPage* parent, const PageFoot& foot);

} // namespace host
