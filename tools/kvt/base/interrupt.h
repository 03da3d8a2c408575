// Signals. An interrupted program leaves no temporary file behind, and a reader that goes away is an error of
// write() and no death before everything is cleaned up.
#pragma once

#include <string>

namespace host {

/// Called once, before anything else: sees to it that the descriptors 0 to 2 are taken, ignores SIGPIPE and
/// SIGXFSZ, and catches the signals that ask the program to end.
void prepareProcess();

/// Ends the program as a filter ends whose reader went away: by SIGPIPE, once everything is cleaned up. Comes back
/// where whoever started the program had that signal ignored.
void dieOfClosedPipe();

/// A file that is removed when a signal ends the program while this object lives. At most four live at once.
class RemovedOnInterrupt {
public:
    explicit RemovedOnInterrupt(std::string path);
    RemovedOnInterrupt(const RemovedOnInterrupt&) = delete;
    RemovedOnInterrupt& operator=(const RemovedOnInterrupt&) = delete;
    ~RemovedOnInterrupt();

private:
    std::string path_;
    int slot_;
};

/// Holds the signals back while it lives, so that a file and its entry above come and go together.
class SignalsHeldBack {
public:
    SignalsHeldBack();
    SignalsHeldBack(const SignalsHeldBack&) = delete;
    SignalsHeldBack& operator=(const SignalsHeldBack&) = delete;
    ~SignalsHeldBack();
};

} // namespace host
