// Where in a file stands what was found in the decoded text: from bytes of UTF-8 back to bytes of the source, by
// decoding it once more in small steps.
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

class SourcePlaces {
public:
    explicit SourcePlaces(kvt::ex::Encoding from);

    /// The text goes on with these bytes.
    void add(std::string_view source);

    /// How many bytes of the source make up the first `decoded` bytes of UTF-8, of which there must be so many. Not fewer
    /// than were asked for before.
    std::uint64_t at(std::uint64_t decoded);

private:
    kvt::ex::StreamTranscoder decoder_;
    std::string pending_;      ///< bytes that are not decoded yet
    std::size_t taken_ = 0;    ///< of these
    std::uint64_t source_ = 0; ///< bytes decoded
    std::uint64_t decoded_ = 0;
    std::string scratch_;
};

} // namespace host
