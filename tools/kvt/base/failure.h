// How a command ends early. A Failure is a sentence for the user and ends the program with status 2; a ClosedPipe
// ends it as well, but without a word: who read our output has seen enough.
#pragma once

#include <stdexcept>
#include <string>

namespace host {

/// The command cannot do what it was asked to. The text is printed behind "kvt: ".
class Failure : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// Nobody reads our standard output any more.
struct ClosedPipe {};

/// "what: the system's text for `errorNumber`".
Failure systemFailure(const std::string& what, int errorNumber);

} // namespace host
