#include "infer/double_encoding.h"

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <optional>

namespace host {

namespace {

using kvt::ex::Encoding;
using kvt::ex::StreamTranscoder;

std::optional<std::string> convertedWhole(std::string_view text, StreamTranscoder& transcoder) {
    std::string out;
    bool isWhole = true;
    const auto onLoss = [&](const kvt::ex::Loss&) { isWhole = false; };
    transcoder.convert({text.data(), text.size()}, out, onLoss);
    transcoder.finish(out, onLoss);
    return isWhole ? std::optional(out) : std::nullopt;
}

// The characters U+00C2 to U+00F4, with which all characters of more than one byte begin then, have these bytes.
bool mayBeDouble(std::string_view utf8) {
    for (std::size_t at = 0; at + 3 < utf8.size(); ++at) {
        const auto lead = static_cast<unsigned char>(utf8[at]);
        const auto behind = static_cast<unsigned char>(utf8[at + 1]);
        if (lead == 0xC3 && behind >= 0x82 && behind <= 0xB4 &&
            static_cast<unsigned char>(utf8[at + 2]) >= 0xC2) {
            return true;
        }
    }
    return false;
}

} // namespace

void DoubleEncoding::add(std::string_view utf8) {
    if (!mayBeDouble(utf8)) {
        return;
    }
    static thread_local StreamTranscoder back(Encoding::Utf8, Encoding("windows-1252"));
    static thread_local StreamTranscoder check(Encoding::Utf8, Encoding::Utf8);
    const std::optional<std::string> bytes = convertedWhole(utf8, back);
    if (!bytes || !convertedWhole(*bytes, check)) {
        return;
    }
    if (++cells_ == 1) {
        example_ = utf8;
        meant_ = *bytes;
    }
}

} // namespace host
