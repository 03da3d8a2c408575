// Encodings of one byte a character are decoded by a table, with what the transcoder gives.

#include <translate/byte_decoder.h>

#include <kvt/encoding/stream_transcoder.h>

#include <gtest/gtest.h>

#include <random>
#include <string>

namespace kvt::test {

using ex::Encoding;

TEST(ByteDecoder, GivesWhatTheTranscoderGives) {
    std::mt19937 random(5);
    for (const char* name : {"windows-1252", "ISO-8859-1", "KOI8-R", "windows-1255", "windows-874",
                             "windows-1251", "macintosh", "ISO-8859-8", "US-ASCII"}) {
        const Encoding encoding(name);
        const auto decoder = host::ByteDecoder::of(encoding);
        ASSERT_TRUE(decoder) << name;
        std::string room;
        for (int round = 0; round < 2000; ++round) {
            std::string bytes;
            for (std::size_t i = 0, length = random() % 100, others = random() % 20; i < length; ++i) {
                bytes += static_cast<char>(random() % 20 < others ? random() % 256 : random() % 128);
            }
            std::string expected;
            bool isWhole = true;
            ex::StreamTranscoder transcoder(encoding, Encoding::Utf8);
            transcoder.convert(bytes, expected, [&](const ex::Loss&) { isWhole = false; });
            const auto text = decoder->decode(bytes, room);
            ASSERT_EQ(text.has_value(), isWhole) << name;
            if (text) {
                ASSERT_EQ(*text, expected) << name;
            }
        }
    }
}

TEST(ByteDecoder, IsForNoOtherEncodings) {
    for (const char* name :
         {"UTF-8", "UTF-16LE", "Shift_JIS", "IBM037", "IBM437", "IBM437", "UTF-7", "ISO-2022-JP"}) {
        EXPECT_FALSE(host::ByteDecoder::of(Encoding(name))) << name;
    }
}

} // namespace kvt::test
