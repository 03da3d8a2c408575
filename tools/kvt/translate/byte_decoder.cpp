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

constexpr std::ptrdiff_t step = 64;

// A bit for each of 64 bytes that is not ASCII.
inline std::uint64_t othersIn(const char* bytes) {
    std::uint64_t others = 0;
#ifdef __SSE2__
    for (unsigned part = 0; part < step; part += 16) {
        const __m128i block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes + part));
        others |= std::uint64_t{static_cast<unsigned>(_mm_movemask_epi8(block))} << part;
    }
#else
    for (unsigned index = 0; index < step; ++index) {
        others |= std::uint64_t{!isAscii(bytes[index])} << index;
    }
#endif
    return others;
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

// Where the next 64 bytes begin does not depend on what is in these, so that the processor looks at them ahead.
std::optional<std::string_view> ByteDecoder::decode(std::string_view bytes, std::string& room) const {
    constexpr std::size_t mostBytes = sizeof(Row::utf8);
    if (room.size() < bytes.size() * mostBytes + step) {
        room.resize(bytes.size() * mostBytes + step);
    }
    const char* from = bytes.data();
    const char* const end = from + bytes.size();
    char* to = room.data();
    bool isWhole = true;
    const auto putRow = [&](char byte) {
        const Row& row = rows_[static_cast<unsigned char>(byte) - 0x80U];
        isWhole = isWhole && row.size != 0;
        std::memcpy(to, &row, sizeof row);
        to += row.size;
    };
    for (; end - from >= 2 * step; from += step) {
        const char* rest = from;
        for (std::uint64_t others = othersIn(from); others != 0; others &= others - 1) {
            const char* const other = from + std::countr_zero(others);
            std::memcpy(to, rest, step); // what is too much is written over
            to += other - rest;
            putRow(*other);
            rest = other + 1;
        }
        std::memcpy(to, rest, step);
        to += from + step - rest;
    }
    for (; from != end; ++from) {
        if (isAscii(*from)) {
            *to++ = *from;
        } else {
            putRow(*from);
        }
    }
    if (!isWhole) {
        return std::nullopt;
    }
    return std::string_view(room.data(), static_cast<std::size_t>(to - room.data()));
}

} // namespace host
