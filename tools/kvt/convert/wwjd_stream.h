// The wwjd codec for streams: UTF-8 to wwjd text and back, a block at a time, with the place of what goes wrong.
//
// Encoding is a matter of single UTF-16 units, so that blocks need no care. Decoding must not cut through a token:
// a '<' near the end of a block waits for what follows.
#pragma once

#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

class WwjdStream {
public:
    virtual ~WwjdStream() = default;
    /// Takes the next bytes and appends what is ready to `out`. Throws kvt::ex::Loss at the first loss, whose
    /// `offset` and `bytes` are those of the input.
    virtual void convert(std::string_view block, std::string& out) = 0;
    /// The stream ends here; another may follow.
    virtual void finish(std::string& out) = 0;
};

class WwjdEncoder : public WwjdStream {
public:
    WwjdEncoder();
    void convert(std::string_view block, std::string& out) override;
    void finish(std::string& out) override;

private:
    void encode(std::string& out);

    kvt::ex::StreamTranscoder toUtf16_;
    std::string units_;
};

class WwjdDecoder : public WwjdStream {
public:
    WwjdDecoder();
    void convert(std::string_view block, std::string& out) override;
    void finish(std::string& out) override;

private:
    void decode(std::string_view text, std::string& out);
    void decodePiece(std::string_view piece, std::string& out);

    kvt::ex::StreamTranscoder toUtf8_;
    std::string pending_;
    std::uint64_t offset_ = 0; ///< of pending_ in the stream
    // The last surrogate may turn out to be alone only when the next unit comes.
    std::uint64_t lastTokenOffset_ = 0;
    std::string lastToken_;
};

} // namespace host
