// A file that can be read more than once. Standard input and pipes cannot: they are copied to a file without a name,
// which goes away with the object.
#pragma once

#include <string>

namespace host {

class TwiceRead {
public:
    /// Reads nothing of a plain file. Throws Failure.
    explicit TwiceRead(const std::string& path);
    TwiceRead(const TwiceRead&) = delete;
    TwiceRead& operator=(const TwiceRead&) = delete;
    ~TwiceRead();

    /// To be opened, any number of times.
    const std::string& path() const { return path_; }
    /// For people.
    const std::string& name() const { return name_; }

private:
    std::string path_;
    std::string name_;
    int copy_ = -1;
};

} // namespace host
