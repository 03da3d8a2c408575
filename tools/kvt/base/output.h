// Where data goes: standard output, or a file that appears whole or not at all.
//
// A file is written as a temporary beside its final place and renamed when all is there; until then, and when the
// command fails or is interrupted, what stood in that place stays as it was. Devices and pipes are written to
// directly, as a rename would replace them.
#pragma once

#include <memory>
#include <string>
#include <string_view>

namespace host {

class Output {
public:
    virtual ~Output() = default;
    /// Throws Failure, or ClosedPipe when nobody reads standard output any more.
    virtual void write(std::string_view bytes) = 0;
    /// The same; `bytes` is empty afterwards, and may have other memory.
    virtual void writeAndClear(std::string& bytes) {
        write(bytes);
        bytes.clear();
    }
    /// Sees to it that all is written, and makes a file appear. Without it, a file does not appear.
    virtual void commit() = 0;
    /// Whether `descriptor` reads the file that this output writes to in place.
    virtual bool writesInPlaceTo(int descriptor) const = 0;
};

/// "", "-" and /dev/stdout are standard output.
bool isStandardOutput(const std::string& path);

/// Whether two paths lead to the same place, whether or not there is anything.
bool isSamePlace(const std::string& left, const std::string& right);

std::unique_ptr<Output> openOutput(const std::string& path);

/// Writes `text` to standard output, or to where `path` leads.
void print(std::string_view text, const std::string& path = {});

} // namespace host
