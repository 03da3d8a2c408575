// A part of a test that needs a process of its own: to measure it, to change what the process may do, or to kill it.
#pragma once

#include <functional>
#include <string>

namespace kvt::test {

/// Runs `work` in a forked process and gives the text that it returned: by custom what went wrong, so that an empty
/// text is success. An exception's text is given with "threw " before it, and a signal or another end in words.
///
/// The process must have no other threads.
std::string inForkedProcess(const std::function<std::string()>& work);

} // namespace kvt::test
