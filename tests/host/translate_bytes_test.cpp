// What looks at many bytes at once gives what is given one by one: encodings of one byte a character, whether a text is
// UTF-8, and whether it has one of a few bytes.

#include <translate/byte_decoder.h>
#include <translate/special_bytes.h>
#include <translate/utf8_check.h>

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

namespace {

bool isUtf8ByTranscoder(const std::string& text) {
    bool isWhole = true;
    std::string ignored;
    const auto onLoss = [&](const ex::Loss&) { isWhole = false; };
    ex::StreamTranscoder transcoder(Encoding::Utf8, Encoding::Utf16LE);
    transcoder.convert(text, ignored, onLoss);
    transcoder.finish(ignored, onLoss);
    return isWhole;
}

} // namespace

TEST(Utf8Check, IsOfOneMindWithTheTranscoderOnEachSequenceAtEachPlace) {
    std::vector<std::string> sequences;
    for (int first = 0x80; first <= 0xFF; ++first) {
        for (const int second : {0x61, 0x7F, 0x80, 0x8F, 0x90, 0x9F, 0xA0, 0xBF, 0xC0, 0xC2, 0xE1, 0xFF}) {
            for (const char* rest :
                 {"", "z", "\x80", "\xBF", "\x80\x80", "\xBF\xBF", "\x80\x80\x80", "\xC3"}) {
                sequences.push_back({static_cast<char>(first), static_cast<char>(second)});
                sequences.back() += rest;
            }
        }
    }
    for (const std::string& sequence : sequences) {
        const bool isWhole = isUtf8ByTranscoder(sequence + "x");
        const bool isWholeAtEnd = isUtf8ByTranscoder(sequence);
        for (const std::size_t before : {0U, 1U, 3U, 62U, 63U, 64U, 66U, 79U, 80U, 130U}) {
            const std::string text = std::string(before, 'a') + sequence;
            ASSERT_EQ(host::isUtf8(text), isWholeAtEnd) << testing::PrintToString(text);
            ASSERT_EQ(host::isUtf8(text + std::string(100, 'b')), isWhole) << testing::PrintToString(text);
        }
    }
}

TEST(Utf8Check, IsOfOneMindWithTheTranscoderOnRandomText) {
    std::mt19937 random(7);
    const std::string pieces[] = {
        "a", "bcdefgh", "\xC3\xBC", "\xE2\x82\xAC", "\xF0\x9F\x98\x80", "\xCE\xB1\xCE\xB2"};
    for (int round = 0; round < 20000; ++round) {
        std::string text;
        for (std::size_t i = 0, count = random() % 120; i < count; ++i) {
            text += pieces[random() % std::size(pieces)];
        }
        if (!text.empty() && random() % 2 == 0) {
            text[random() % text.size()] = static_cast<char>(random());
        }
        if (random() % 4 == 0) {
            text.resize(text.size() - std::min<std::size_t>(text.size(), random() % 3));
        }
        ASSERT_EQ(host::isUtf8(text), isUtf8ByTranscoder(text)) << testing::PrintToString(text);
    }
}

TEST(SpecialBytes, AreFoundWhereverTheyAre) {
    const host::SpecialBytes<4> special({';', '"', '\n', '\r'});
    for (std::size_t length = 0; length <= 70; ++length) {
        const std::string plain(length, 'x');
        EXPECT_FALSE(special.isIn(plain)) << length;
        for (std::size_t at = 0; at < length; ++at) {
            for (const char byte : {';', '"', '\n', '\r'}) {
                std::string text = plain;
                text[at] = byte;
                EXPECT_TRUE(special.isIn(text)) << length << " " << at;
            }
        }
    }
}

} // namespace kvt::test
