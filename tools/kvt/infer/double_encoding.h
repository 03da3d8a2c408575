// Text that has gone through the wrong encoding once: UTF-8 that somebody read as windows-1252 and wrote as UTF-8 again,
// so that "ü" has become "Ã¼".
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

class DoubleEncoding {
public:
    /// Looks at the text of a cell.
    void add(std::string_view utf8);

    /// Cells in which all that is beyond ASCII reads as UTF-8 when it is windows-1252 again.
    std::uint64_t cells() const { return cells_; }
    /// One of them, and what it was.
    const std::string& example() const { return example_; }
    const std::string& meant() const { return meant_; }

private:
    std::uint64_t cells_ = 0;
    std::string example_;
    std::string meant_;
};

} // namespace host
