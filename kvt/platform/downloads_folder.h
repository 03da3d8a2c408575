// Where the user's downloads go.
#pragma once

#include <string>

namespace kvt::platform {

/// The folder "Downloads" in the user's home folder, without a slash behind it. Throws std::runtime_error where there
/// is no way to know which one that is.
std::string downloadsFolder();

} // namespace kvt::platform
