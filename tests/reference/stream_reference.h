// Holds StreamTranscoder to ICU: for a whole text, and for the same text in blocks.
#pragma once

#include <kvt/encoding/stream_transcoder.h>

#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {

/// What is wrong with a stream from `from` to `to` (canonical names, different ones), in words; empty when nothing is.
/// The text goes through whole and then, for each of `cuts`, in blocks of that length and with one border there.
std::string differenceInStream(const std::string& from, const std::string& to, std::string_view text,
                               const std::vector<std::size_t>& cuts);

} // namespace kvt::test
