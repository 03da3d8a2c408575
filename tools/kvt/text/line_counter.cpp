#include "text/line_counter.h"

#include "text/byte_count.h"

#include <algorithm>
#include <cstring>
#include <utility>

namespace host {

namespace {

using kvt::ex::Encoding;
using kvt::ex::StreamTranscoder;

// A line that is longer than this is decoded before its end is known, so that it need not be kept.
constexpr std::size_t longestCarry = 1024 * 1024;

// Up to here, the text behind a block may yet decide what bytes of the block are.
constexpr std::size_t longestCharacter = 64;

std::u32string unitsIn(const std::string& utf32) {
    std::u32string text(utf32.size() / sizeof(char32_t), U'\0');
    std::memcpy(text.data(), utf32.data(), text.size() * sizeof(char32_t));
    return text;
}

template <std::size_t Width, bool BigEndian>
std::uint32_t unitAt(const char* bytes) {
    std::uint32_t unit = 0;
    for (std::size_t index = 0; index < Width; ++index) {
        const std::size_t place = BigEndian ? index : Width - 1 - index;
        unit = unit << 8 | static_cast<unsigned char>(bytes[place]);
    }
    return unit;
}

template <std::size_t Width, bool BigEndian>
LineEnds findUnitLineEnds(std::string_view bytes, bool afterReturn) {
    LineEnds ends;
    const std::size_t whole = bytes.size() - bytes.size() % Width;
    for (std::size_t index = 0; index < whole; index += Width) {
        const std::uint32_t unit = unitAt<Width, BigEndian>(bytes.data() + index);
        if (unit == U'\n' || unit == U'\r') {
            ends.count += unit == U'\r' || !afterReturn ? 1 : 0;
            ends.lastEnd = index + Width;
        }
        afterReturn = unit == U'\r';
    }
    ends.afterReturn = afterReturn;
    return ends;
}

// Most text has no CR, and then all that matters is how many LF there are and where the last one is.
LineEnds findByteLineEnds(std::string_view bytes, bool afterReturn) {
    if (bytes.empty() || afterReturn || std::memchr(bytes.data(), '\r', bytes.size()) != nullptr) {
        return findUnitLineEnds<1, false>(bytes, afterReturn);
    }
    LineEnds ends;
    ends.count = countOf(bytes, '\n');
    ends.lastEnd = ends.count == 0 ? 0 : bytes.rfind('\n') + 1;
    return ends;
}

// Whether line ends are where ASCII has them, and nowhere else. A text of all ASCII bytes in a row shows escapes, shifts
// and multi-byte schemes below 128, as each would swallow or reject its neighbours; the line ends behind each byte show
// characters that have one of them for their second byte.
bool lineEndsStandAlone(Encoding encoding) {
    std::string all;
    for (char byte = 0; byte != 127; ++byte) {
        all += byte;
    }
    all += '\x7f';
    StreamTranscoder transcoder(encoding, Encoding::Utf32LE);
    bool clean = true;
    const auto decoded = [&](const std::string& bytes) {
        std::string out;
        const auto onLoss = [&](const kvt::ex::Loss&) { clean = false; };
        transcoder.convert(bytes, out, onLoss);
        transcoder.finish(out, onLoss);
        return unitsIn(out);
    };
    const std::u32string text = decoded(all);
    if (!clean || text.size() != all.size()) {
        return false;
    }
    for (const char end : {'\n', '\r'}) {
        std::string ends;
        for (int byte = 0; byte < 256; ++byte) {
            ends += static_cast<char>(byte);
            ends += end;
        }
        const auto character = static_cast<char32_t>(end);
        const std::u32string lines = decoded(ends);
        if (text.find(character) != static_cast<std::size_t>(end) ||
            text.rfind(character) != text.find(character) ||
            std::count(lines.begin(), lines.end(), character) != 257) {
            return false;
        }
    }
    return true;
}

} // namespace

LineCounter::LineCounter(Encoding encoding)
    : decoder_(encoding, Encoding::Utf32LE), units_(unitsOf(encoding)) {}

LineCounter::Units LineCounter::unitsOf(Encoding encoding) {
    switch (encoding.evaluate()) {
    case Encoding::Utf8:
        return Units::Bytes;
    case Encoding::Utf16LE:
        return Units::Little16;
    case Encoding::Utf16BE:
        return Units::Big16;
    case Encoding::Utf32LE:
        return Units::Little32;
    case Encoding::Utf32BE:
        return Units::Big32;
    default:
        return lineEndsStandAlone(encoding) ? Units::Bytes : Units::Unclear;
    }
}

void LineCounter::restart(std::uint64_t skipped) {
    endDecoding();
    before_.clear();
    carry_.clear();
    block_ = {};
    inBlock_ = false;
    blockOffset_ = taken_ = skipped;
    position_ = {};
}

void LineCounter::beginBlock(std::string_view block) {
    block_ = block;
    inBlock_ = !block.empty();
}

std::size_t LineCounter::unitWidth() const {
    return units_ == Units::Little16 || units_ == Units::Big16   ? 2
           : units_ == Units::Little32 || units_ == Units::Big32 ? 4
                                                                 : 1;
}

// The bytes from taken_ to `offset`, in one piece. What it needs of the block moves over to carry_.
std::string_view LineCounter::pendingUpTo(std::uint64_t offset) {
    if (taken_ >= blockOffset_) {
        return block_.substr(taken_ - blockOffset_, offset - taken_);
    }
    if (offset > blockOffset_) {
        const std::size_t moved = offset - blockOffset_;
        carry_.append(block_.substr(0, moved));
        block_.remove_prefix(moved);
        blockOffset_ += moved;
    }
    const std::uint64_t carryOffset = blockOffset_ - carry_.size();
    return std::string_view(carry_).substr(taken_ - carryOffset, offset - taken_);
}

// Moves over the lines that end before `offset`, by their ends alone.
void LineCounter::skipLinesUpTo(std::uint64_t offset) {
    // What was carried over has been looked at and holds no line end, but it may end with a part of a unit.
    const std::uint64_t fresh = std::max(taken_, blockOffset_);
    const bool wholeUnits = offset > fresh && (fresh - taken_) % unitWidth() == 0;
    const std::uint64_t start = wholeUnits ? fresh : taken_;
    const std::string_view bytes =
        wholeUnits ? block_.substr(start - blockOffset_, offset - start) : pendingUpTo(offset);
    const bool afterReturn = ahead_.empty() ? position_.afterReturn : ahead_.back().character == U'\r';
    const LineEnds ends = findLineEnds(bytes, afterReturn && start == taken_);
    if (ends.lastEnd == 0) {
        return;
    }
    passAhead(taken_);
    endDecoding();
    before_.clear();
    position_ = {position_.line + ends.count, 1, ends.afterReturn, false};
    taken_ = start + ends.lastEnd;
}

LineEnds LineCounter::findLineEnds(std::string_view bytes, bool afterReturn) const {
    switch (units_) {
    case Units::Little16:
        return findUnitLineEnds<2, false>(bytes, afterReturn);
    case Units::Big16:
        return findUnitLineEnds<2, true>(bytes, afterReturn);
    case Units::Little32:
        return findUnitLineEnds<4, false>(bytes, afterReturn);
    case Units::Big32:
        return findUnitLineEnds<4, true>(bytes, afterReturn);
    default:
        return findByteLineEnds(bytes, afterReturn);
    }
}

void LineCounter::decodeUpTo(std::uint64_t offset) {
    passAhead(taken_);
    if (decoder_.position() == 0) {
        decoderBegin_ = taken_;
    }
    decoder_.convert(pendingUpTo(offset), decoded_, {});
    taken_ = offset;
    for (const char32_t character : unitsIn(decoded_)) {
        count(character);
    }
    decoded_.clear();
}

// Decodes, unit by unit, until there is a character that begins at `offset`, or behind it.
void LineCounter::lookAhead(std::uint64_t offset) {
    if (decoder_.position() == 0) {
        decoderBegin_ = taken_;
    }
    decoder_.watch([this](char32_t character, std::uint64_t begin) {
        ahead_.push_back({character, decoderBegin_ + begin});
    });
    const std::uint64_t end = blockOffset_ + block_.size();
    for (const std::size_t width = unitWidth(); ahead_.empty() && end - taken_ >= width; taken_ += width) {
        decoder_.convert(pendingUpTo(taken_ + width), decoded_, {});
        passAhead(offset);
    }
    if (ahead_.empty() && !inBlock_) {
        decoder_.convert(pendingUpTo(end), decoded_, {});
        taken_ = end;
        decoder_.finish(decoded_, {});
        passAhead(offset);
    }
    decoder_.watch({});
    decoded_.clear();
}

// Counts the characters that begin before `offset`.
void LineCounter::passAhead(std::uint64_t offset) {
    for (; !ahead_.empty() && ahead_.front().begin < offset; ahead_.pop_front()) {
        count(ahead_.front().character);
    }
}

void LineCounter::count(char32_t character) {
    if (position_.pass(character)) {
        before_.clear();
        return;
    }
    before_ += character;
    if (before_.size() >= 64 * contextLength) {
        before_.erase(0, before_.size() - contextLength);
    }
}

void LineCounter::endDecoding() {
    if (decoder_.position() != 0) {
        decoder_.finish(decoded_, {});
        decoded_.clear();
    }
    ahead_.clear();
}

LineCounter::Position LineCounter::at(std::uint64_t offset) {
    if (offset > taken_) {
        if (units_ != Units::Unclear) {
            skipLinesUpTo(offset);
        }
        decodeUpTo(offset);
    }
    passAhead(offset);
    if (ahead_.empty()) {
        lookAhead(offset);
    }
    return {position_.line, position_.column};
}

void LineCounter::endBlock() {
    const std::uint64_t end = blockOffset_ + block_.size();
    if (units_ != Units::Unclear) {
        skipLinesUpTo(end);
    }
    const std::size_t keep = units_ == Units::Unclear ? longestCharacter : longestCarry;
    if (end - taken_ > keep) {
        const std::uint64_t settled = end - longestCharacter;
        decodeUpTo(settled - (settled - taken_) % unitWidth());
    }
    if (taken_ >= blockOffset_) {
        carry_ = block_.substr(taken_ - blockOffset_);
    } else {
        carry_.erase(0, taken_ - (blockOffset_ - carry_.size()));
        carry_.append(block_);
    }
    blockOffset_ = end;
    block_ = {};
    inBlock_ = false;
}

std::u32string LineCounter::textBefore() const {
    return before_.size() <= contextLength ? before_ : before_.substr(before_.size() - contextLength);
}

std::string_view LineCounter::rest() {
    const std::uint64_t end = blockOffset_ + block_.size();
    return taken_ < end ? pendingUpTo(end) : std::string_view();
}

std::u32string LineCounter::textAfter(std::string_view rest) {
    std::u32string text;
    for (const Character& character : ahead_) {
        text += character.character;
    }
    std::string decoded;
    decoder_.convert(rest, decoded, {});
    decoder_.finish(decoded, {});
    text += unitsIn(decoded);
    text.resize(std::min({text.size(), text.find_first_of(U"\r\n"), contextLength}));
    return text;
}

} // namespace host
