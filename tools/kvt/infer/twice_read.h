// A file that is read twice. Standard input and pipes can be read once only: what comes from them is copied meanwhile to a
// file without a name, which goes away with the object.
#pragma once

#include "base/input.h"

#include <string>
#include <string_view>

namespace host {

class TwiceRead {
public:
    /// Throws Failure when it cannot be opened.
    explicit TwiceRead(const std::string& path);
    TwiceRead(const TwiceRead&) = delete;
    TwiceRead& operator=(const TwiceRead&) = delete;
    ~TwiceRead();

    /// The next bytes of the first reading, valid until the next call, or none at the end. Throws Failure.
    std::string_view next();
    /// To be opened for the second reading, once the first one has come to the end.
    const std::string& path() const { return path_; }
    /// For people.
    const std::string& name() const { return input_.name(); }

private:
    Input input_;
    std::string path_;
    int copy_ = -1;
};

} // namespace host
