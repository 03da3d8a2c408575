// Signals. An interrupted program leaves no temporary file behind, and a reader that goes away is an error of
// write() and not a sudden death.
#pragma once

#include <string>

namespace host {

/// Called once, before anything else: sees to it that the descriptors 0 to 2 are taken, ignores SIGPIPE and
/// SIGXFSZ, and catches the signals that ask the program to end.
void prepareProcess();

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
