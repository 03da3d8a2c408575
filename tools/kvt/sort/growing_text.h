// A text that is put together piece by piece and may become as long as a file. It stays in memory while it is short,
// and goes on in the workspace when it is not.
#pragma once

#include "sort/workspace.h"

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

namespace host {

class GrowingText {
public:
    /// Up to `most` bytes stay in memory.
    GrowingText(Workspace& workspace, std::uint64_t most) : workspace_(workspace), most_(most) {}

    void append(std::string_view bytes);
    std::string_view view() const;
    bool empty() const { return size_ == 0; }
    void clear();

private:
    void moveTo(std::unique_ptr<Stretch> stretch);
    void write(std::string_view bytes);

    Workspace& workspace_;
    std::uint64_t most_;
    std::string short_;
    std::unique_ptr<Stretch> long_;
    std::uint64_t size_ = 0;
};

} // namespace host
