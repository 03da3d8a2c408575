// Input files as text: block after block, the byte order mark dropped where that is wanted.
#pragma once

#include "base/input.h"
#include "text/byte_order_mark.h"

#include <kvt/encoding/encoding.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

/// Throws Failure when the mark of the encoding cannot be dropped.
void checkMark(MarkPolicy policy, kvt::ex::Encoding from);

class Source {
public:
    Source(const std::string& path, kvt::ex::Encoding from, MarkPolicy policy);

    /// The next block, empty at the end of the file.
    std::string_view next();

    Input& input() { return input_; }
    /// Bytes of the mark that was dropped.
    std::uint64_t skipped() const { return skipped_; }

private:
    Input input_;
    std::string_view mark_;
    std::uint64_t skipped_ = 0;
    bool started_ = false;
};

} // namespace host
