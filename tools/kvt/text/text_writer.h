// Lines on their way out, in the encoding in which they came.
#pragma once

#include "base/output.h"
#include "text/line_reader.h"
#include "text/round_trip.h"

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <optional>
#include <string>

namespace host {

class TextWriter {
public:
    /// What is written is UTF-8 on its way to `encoding`; it stays UTF-8 where it is not to be `encoded`.
    TextWriter(Output& output, kvt::ex::Encoding encoding, bool encoded);

    /// Where to append to, as UTF-8.
    std::string& buffer() { return encoder_ ? pending_ : ready_; }

    /// What is in the buffer became of `line`, which is to blame for what cannot be written. Throws Failure.
    void endLine(const TextLine& line);

    /// Writes what is complete.
    void flush();

    /// Writes the rest; an encoding with shifts returns to its initial state. The output is committed.
    void finish();

private:
    void requireSameText() const;

    Output& output_;
    std::string encodingName_;
    std::optional<kvt::ex::StreamTranscoder> encoder_;
    std::optional<RoundTrip> roundTrip_; ///< where not all that is written can be read
    std::string pending_;
    std::string ready_;
};

} // namespace host
