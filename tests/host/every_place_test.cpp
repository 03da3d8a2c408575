// Line and column of each loss, in every encoding that ICU lists, however the text is cut into blocks: held to a count of
// what ICU makes of the whole text, with the offset that it gives for each character.

#include "text/line_counter.h"

#include <reference/icu_reference.h>

#include <kvt/encoding/stream_transcoder.h>

#include <gtest/gtest.h>
#include <unicode/ucnv.h>

#include <random>

namespace kvt::test {

namespace {

using kvt::ex::Encoding;
using kvt::ex::Loss;
using kvt::ex::StreamTranscoder;

struct Found {
    std::uint64_t offset;
    std::uint64_t line;
    std::uint64_t column;
    friend bool operator==(const Found&, const Found&) = default;
    friend std::ostream& operator<<(std::ostream& out, const Found& found) {
        return out << "byte " << found.offset << ", line " << found.line << ", column " << found.column;
    }
};

struct Decoded {
    std::u16string units;
    std::vector<std::int32_t> offsets;
};

Decoded decodedByIcu(const std::string& name, const std::string& text) {
    UErrorCode error = U_ZERO_ERROR;
    const std::unique_ptr<UConverter, decltype(&ucnv_close)> converter(ucnv_open(name.c_str(), &error),
                                                                       &ucnv_close);
    Decoded decoded{std::u16string(text.size() * 8 + 64, u'\0'), {}};
    decoded.offsets.resize(decoded.units.size());
    char16_t* target = decoded.units.data();
    const char* source = text.data();
    ucnv_toUnicode(converter.get(), &target, target + decoded.units.size(), &source, source + text.size(),
                   decoded.offsets.data(), 1, &error);
    EXPECT_TRUE(U_SUCCESS(error)) << name;
    decoded.units.resize(static_cast<std::size_t>(target - decoded.units.data()));
    // Some are those of the byte that completed a character. None begins behind the next one.
    for (std::size_t index = decoded.units.size(); index-- > 1;) {
        decoded.offsets[index - 1] = std::min(decoded.offsets[index - 1], decoded.offsets[index]);
    }
    return decoded;
}

/// Where the character at `offset` stands: behind all that begin before it.
Found expectedPlace(const Decoded& decoded, std::uint64_t offset) {
    Found place{offset, 1, 1};
    char16_t before = 0;
    for (std::size_t index = 0; index < decoded.units.size(); ++index) {
        const char16_t unit = decoded.units[index];
        if (decoded.offsets[index] >= static_cast<std::int64_t>(offset)) {
            break;
        }
        const bool isMark = index == 0 && unit == u'\uFEFF';
        const bool isSecond = (unit & 0xFC00) == 0xDC00 && (before & 0xFC00) == 0xD800;
        if (unit == u'\n' || unit == u'\r') {
            place.line += unit == u'\n' && before == u'\r' ? 0 : 1;
            place.column = 1;
        } else if (!isMark && !isSecond) {
            ++place.column;
        }
        before = unit;
    }
    return place;
}

/// The offsets that ICU gives for these are beside the characters, or none at all.
bool hasOffsets(const std::string& name) {
    return name != "gsm-03.38-2009" && name != "SCSU" && name != "BOCU-1" && name != "x11-compound-text";
}

/// What came before the place, as a text of its own: right where it ends with a whole character.
Found placeByPrefix(const std::string& name, const std::string& text, std::uint64_t offset) {
    Found place = expectedPlace(decodedByIcu(name, text.substr(0, offset)), text.size());
    place.offset = offset;
    return place;
}

/// As the command finds them, with the text in blocks of one length.
std::vector<Found> foundPlaces(Encoding from, Encoding to, const std::string& text, std::size_t length) {
    StreamTranscoder stream(from, to);
    host::LineCounter places(from);
    places.restart(0);
    std::vector<Found> found;
    std::string out;
    const auto onLoss = [&](const Loss& loss) {
        const host::LineCounter::Position position = places.at(loss.offset);
        found.push_back({loss.offset, position.line, position.column});
    };
    for (std::size_t begin = 0; begin < text.size(); begin += length) {
        const std::string block = text.substr(begin, length);
        places.beginBlock(block);
        stream.convert(block, out, onLoss);
        places.endBlock();
    }
    places.beginBlock({});
    stream.finish(out, onLoss);
    return found;
}

std::string noise(std::size_t most, std::mt19937_64& random) {
    std::string bytes(random() % most, '\0');
    std::generate(bytes.begin(), bytes.end(), [&] { return static_cast<char>(random()); });
    return bytes;
}

std::string sampleText(const std::string& name, std::mt19937_64& random) {
    // Broken escape sequences mean to ICU what the end of a call makes of them, or have the offset of their end.
    const bool isDamaged = name != "x11-compound-text" && !name.starts_with("ISCII");
    const char16_t* const ends[] = {u"\n", u"\r", u"\r\n", u"\n\n"};
    std::string text;
    for (auto lines = 1 + random() % 5; lines > 0; --lines) {
        std::string line = encodeWithIcu(name, ownText(name, random() % 12, random()));
        if (isDamaged && !line.empty() && random() % 2 == 0) {
            line[random() % line.size()] = static_cast<char>(random());
        }
        text += line + (isDamaged && random() % 3 == 0 ? noise(6, random) : "") +
                encodeWithIcu(name, ends[random() % 4]);
    }
    return text + (isDamaged ? noise(4, random) : "");
}

void expectPlaces(const std::string& name, const std::string& text, std::size_t length) {
    const Decoded decoded = decodedByIcu(name, text);
    for (const Encoding to : {Encoding(Encoding::Utf32LE), Encoding(Encoding::UsAscii)}) {
        const std::vector<Found> found = foundPlaces(Encoding(name), to, text, length);
        std::vector<Found> expected;
        for (const Found& place : found) {
            expected.push_back(hasOffsets(name) ? expectedPlace(decoded, place.offset)
                                                : placeByPrefix(name, text, place.offset));
        }
        EXPECT_EQ(found, expected) << name << ", in blocks of " << length << ": " << hex(text, 400);
    }
}

} // namespace

TEST(EveryPlace, IsThatOfTheDecodedText) {
    std::size_t tried = 0;
    for (const std::string& listed : availableConverters()) {
        const std::string name = canonicalName(listed);
        if (name.empty()) {
            continue;
        }
        std::mt19937_64 random(++tried);
        for (int round = 0; round < 40; ++round) {
            const std::string text = sampleText(name, random);
            expectPlaces(name, text, text.size() + 1);
            expectPlaces(name, text, 1 + random() % 7);
        }
    }
    EXPECT_GT(tried, 200u);
}

} // namespace kvt::test
