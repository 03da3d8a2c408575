#include "translate/byte_decoder.h"

#include "base/text_units.h"

#include <kvt/encoding/stream_transcoder.h>

#include <algorithm>
#include <bit>
#include <cstring>

#ifdef __SSE2__
#include <emmintrin.h>
#endif

namespace host {

namespace {

using kvt::ex::Encoding;

constexpr std::ptrdiff_t step = 16;

// How many of 16 bytes are ASCII before the first that is not.
inline std::ptrdiff_t asciiBefore(const char* bytes) {
#ifdef __SSE2__
    const auto others =
        static_cast<unsigned>(_mm_movemask_epi8(_mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes))));
    return std::countr_zero(others | 0x10000U);
#else
    return std::find_if_not(bytes, bytes + step, isAscii) - bytes;
#endif
}

// Nothing where something is lost.
std::optional<std::string> decoded(Encoding encoding, std::string_view bytes) {
    bool isWhole = true;
    std::string out;
    kvt::ex::StreamTranscoder decoder(encoding, Encoding::Utf8);
    const auto onLoss = [&](const kvt::ex::Loss&) { isWhole = false; };
    decoder.convert(bytes, out, onLoss);
    decoder.finish(out, onLoss);
    return isWhole ? std::optional(out) : std::nullopt;
}

} // namespace

std::optional<ByteDecoder> ByteDecoder::of(Encoding encoding) {
    if (encoding.evaluate() == Encoding::Utf8 || !encoding.isSingleByte()) {
        return std::nullopt;
    }
    std::string ascii(128, '\0');
    for (std::size_t byte = 0; byte < ascii.size(); ++byte) {
        ascii[byte] = static_cast<char>(byte);
    }
    if (decoded(encoding, ascii) != ascii) {
        return std::nullopt;
    }
    ByteDecoder decoder;
    std::string all = ascii;
    for (std::size_t index = 0; index < decoder.rows_.size(); ++index) {
        const char byte = static_cast<char>(0x80 + index);
        const auto character = decoded(encoding, {&byte, 1});
        Row& row = decoder.rows_[index];
        if (character && !character->empty() && character->size() <= row.utf8.size()) {
            std::copy(character->begin(), character->end(), row.utf8.begin());
            row.size = static_cast<std::uint8_t>(character->size());
            all += byte;
        }
    }
    // A few encodings have characters of two bytes all the same. Then one of all pairs shows it.
    std::string pairs;
    for (const char first : all) {
        for (const char second : all) {
            pairs.append({first, second});
        }
    }
    std::string room;
    const auto text = decoder.decode(pairs, room);
    return text && decoded(encoding, pairs) == *text ? std::optional(decoder) : std::nullopt;
}

std::optional<std::string_view> ByteDecoder::decode(std::string_view bytes, std::string& room) const {
    constexpr std::size_t mostBytes = sizeof(Row::utf8);
    if (room.size() < bytes.size() * mostBytes + step) {
        room.resize(bytes.size() * mostBytes + step);
    }
    const char* from = bytes.data();
    const char* const end = from + bytes.size();
    char* to = room.data();
    while (from != end) {
        if (end - from >= step) {
            const std::ptrdiff_t count = asciiBefore(from);
            std::memcpy(to, from, step); // what is too much is written over
            from += count;
            to += count;
            if (count == step) {
                continue;
            }
        } else if (isAscii(*from)) {
            *to++ = *from++;
            continue;
        }
        const Row& row = rows_[static_cast<unsigned char>(*from++) - 0x80U];
        if (row.size == 0) {
            return std::nullopt;
        }
        std::memcpy(to, &row, sizeof row);
        to += row.size;
    }
    return std::string_view(room.data(), static_cast<std::size_t>(to - room.data()));
}

} // namespace host
