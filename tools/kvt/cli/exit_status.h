// The three statuses with which the program ends.
#pragma once

namespace host {

enum ExitStatus {
    Done = 0,           ///< all was done and nothing was lost
    DoneWithLosses = 1, ///< all was done, and the output does not hold everything that the input said
    NotDone = 2,        ///< it could not be done, or the command line was wrong
};

} // namespace host
