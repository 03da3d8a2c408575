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
    /// Reads the beginning. Throws Failure when the file cannot be read, or its mark is not one of the encoding.
    Source(const std::string& path, const TextEncoding& from, MarkPolicy policy);

    /// The next block, empty at the end of the file.
    std::string_view next();

    Input& input() { return input_; }
    /// In which order of bytes, too.
    kvt::ex::Encoding encoding() const { return encoding_; }
    /// Bytes of the mark that was dropped.
    std::uint64_t skipped() const { return skipped_; }

private:
    Input input_;
    std::string_view first_; ///< the first block, until next() takes it
    kvt::ex::Encoding encoding_;
    std::uint64_t skipped_ = 0;
    bool started_ = false;
};

} // namespace host
