// Streams of text in blocks, and what became of them; for the tests of StreamTranscoder.
#pragma once

#include <kvt/encoding/icu_transcoder.h>
#include <kvt/encoding/stream_transcoder.h>
#include <kvt/foundation/throwable.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::ex {

inline bool operator==(const Loss& left, const Loss& right) {
    return left.kind == right.kind && left.offset == right.offset && left.bytes == right.bytes &&
           left.codePoint == right.codePoint;
}

inline void PrintTo(const Loss& loss, std::ostream* stream) {
    *stream << (loss.kind == Loss::BadInput ? "bad" : "lost") << " at " << loss.offset << " ["
            << kvt::test::printable(loss.bytes) << "] U+" << std::hex
            << static_cast<std::uint32_t>(loss.codePoint) << std::dec;
}

} // namespace kvt::ex

namespace kvt::test {

using kvt::ex::Encoding;
using kvt::ex::ICUTranscoder;
using kvt::ex::Loss;
using kvt::ex::StreamTranscoder;

struct Streamed {
    std::string out;
    std::vector<Loss> losses;
    std::uint64_t taken = 0;
};

/// Runs one stream, in blocks of the sizes given; the last size is used until the text ends.
inline Streamed streamed(StreamTranscoder& stream, std::string_view text,
                         const std::vector<std::size_t>& sizes) {
    Streamed result;
    const auto note = [&](const Loss& loss) { result.losses.push_back(loss); };
    for (std::size_t block = 0; !text.empty(); ++block) {
        const std::string_view piece = text.substr(0, sizes[std::min(block, sizes.size() - 1)]);
        // A copy of its own, so that reading beyond the block is noticed.
        stream.convert(std::string(piece), result.out, note);
        text.remove_prefix(piece.size());
        result.taken += piece.size();
        EXPECT_EQ(stream.position(), result.taken);
    }
    stream.finish(result.out, note);
    return result;
}

inline Streamed streamed(const char* from, const char* to, std::string_view text) {
    StreamTranscoder stream{Encoding(from), Encoding(to)};
    return streamed(stream, text, {text.size() + 1});
}

/// What ICUTranscoder makes of the whole text, substitutions included.
inline std::string transcodedWhole(const char* from, const char* to, std::string_view text) {
    std::string out;
    try {
        ICUTranscoder(Encoding(from), Encoding(to)).transcode<char, char>(text, out);
    } catch (const kvt::ex::UStringException&) {
        // The substituted text is in `out`.
    }
    return out;
}

/// All blocks that can be told apart: one border at each place, and blocks of equal sizes.
inline void expectTheSameForAllBlocks(const char* from, const char* to, std::string_view text) {
    SCOPED_TRACE(std::string(from) + " to " + to + ": " + printable(text.substr(0, 80)));
    StreamTranscoder stream{Encoding(from), Encoding(to)};
    const Streamed whole = streamed(stream, text, {text.size() + 1});
    if (!(Encoding(from) == Encoding(to))) {
        // ICU leaves out the announcement of this encoding where a conversion begins with a reset.
        const std::string announcement = std::string_view(to) == "ISO-2022-KR" ? "\x1B$)C" : "";
        ASSERT_EQ(printable(whole.out), printable(announcement + transcodedWhole(from, to, text)));
    }
    // A compressor looks ahead and may choose other bytes for the same text.
    const bool compressed = std::string_view(to) == "SCSU";
    const auto readable = [&](const std::string& out) {
        return printable(compressed ? transcodedWhole(to, "UTF-8", out) : out);
    };
    const auto check = [&](const std::vector<std::size_t>& sizes) {
        const Streamed split = streamed(stream, text, sizes);
        ASSERT_EQ(readable(split.out), readable(whole.out)) << "first block " << sizes[0];
        ASSERT_EQ(split.losses, whole.losses) << "first block " << sizes[0];
    };
    for (std::size_t border = 1; border < text.size() && !testing::Test::HasFatalFailure(); ++border) {
        check({border, text.size()});
    }
    for (const std::size_t size : {1u, 2u, 3u, 5u, 7u}) {
        check({size});
    }
}

inline Loss bad(std::uint64_t offset, std::string_view bytes) {
    return {Loss::BadInput, offset, std::string(bytes), 0xFFFD};
}
inline Loss lost(std::uint64_t offset, std::string_view bytes, char32_t codePoint) {
    return {Loss::NotRepresentable, offset, std::string(bytes), codePoint};
}

} // namespace kvt::test
