#include "text/line_counter.h"

#include "base/text.h"

#include <algorithm>
#include <cstring>

namespace host {

namespace {

using kvt::ex::Encoding;
using kvt::ex::StreamTranscoder;

// A line that is longer than this is decoded before its end is known, so that it need not be kept.
constexpr std::size_t longestCarry = 1024 * 1024;

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
    ends.count = static_cast<std::uint64_t>(std::count(bytes.begin(), bytes.end(), '\n'));
    ends.lastEnd = ends.count == 0 ? 0 : bytes.rfind('\n') + 1;
    return ends;
}

// Whether every ASCII byte is one character whatever stands around it, with line ends where ASCII has them. A text
// of all of them in a row shows escapes, shifts and multi-byte schemes below 128, as each would swallow or reject
// its neighbours. In the encodings that pass, no trailing byte of a longer character is below 32.
bool asciiBytesStandAlone(Encoding encoding) {
    std::string all;
    for (char byte = 0; byte != 127; ++byte) {
        all += byte;
    }
    all += '\x7f';
    bool clean = true;
    StreamTranscoder transcoder(encoding, Encoding::Utf32LE);
    std::string out;
    const auto onLoss = [&](const kvt::ex::Loss&) { clean = false; };
    transcoder.convert(all, out, onLoss);
    transcoder.finish(out, onLoss);
    const std::u32string text = toUtf32(out, Encoding::Utf32LE);
    return clean && text.size() == all.size() && text.find(U'\n') == 10 && text.rfind(U'\n') == 10 &&
           text.find(U'\r') == 13 && text.rfind(U'\r') == 13;
}

} // namespace

std::string describe(const Place& place) {
    return place.file + ": line " + std::to_string(place.line) + ", column " + std::to_string(place.column) +
           ", byte " + std::to_string(place.offset);
}

LineCounter::LineCounter(Encoding encoding)
    : decoder_(encoding, Encoding::Utf32LE), units_(unitsOf(encoding)) {}

LineCounter::Units LineCounter::unitsOf(Encoding encoding) {
    switch (encoding.evaluate()) {
    case Encoding::Utf16LE:
        return Units::Little16;
    case Encoding::Utf16BE:
        return Units::Big16;
    case Encoding::Utf32LE:
        return Units::Little32;
    case Encoding::Utf32BE:
        return Units::Big32;
    default:
        return asciiBytesStandAlone(encoding) ? Units::Bytes : Units::Unclear;
    }
}

void LineCounter::restart(std::uint64_t skipped) {
    std::string ignored;
    decoder_.finish(ignored, {});
    decoded_.clear();
    before_.clear();
    carry_.clear();
    block_ = {};
    blockOffset_ = counted_ = skipped;
    line_ = column_ = 1;
    afterReturn_ = decoderUsed_ = false;
}

void LineCounter::beginBlock(std::string_view block) {
    block_ = block;
}

std::size_t LineCounter::unitWidth() const {
    return units_ == Units::Little16 || units_ == Units::Big16   ? 2
           : units_ == Units::Little32 || units_ == Units::Big32 ? 4
                                                                 : 1;
}

// The bytes from counted_ to `offset`, in one piece. What it needs of the block moves over to carry_.
std::string_view LineCounter::pendingUpTo(std::uint64_t offset) {
    if (counted_ >= blockOffset_) {
        return block_.substr(counted_ - blockOffset_, offset - counted_);
    }
    if (offset > blockOffset_) {
        const std::size_t moved = offset - blockOffset_;
        carry_.append(block_.substr(0, moved));
        block_.remove_prefix(moved);
        blockOffset_ += moved;
    }
    const std::uint64_t carryOffset = blockOffset_ - carry_.size();
    return std::string_view(carry_).substr(counted_ - carryOffset, offset - counted_);
}

// Moves over the lines that end before `offset`, by their ends alone.
void LineCounter::skipLinesUpTo(std::uint64_t offset) {
    // What was carried over has been looked at and holds no line end, but it may end with a part of a unit.
    const std::uint64_t fresh = std::max(counted_, blockOffset_);
    const bool wholeUnits = offset > fresh && (fresh - counted_) % unitWidth() == 0;
    const std::uint64_t start = wholeUnits ? fresh : counted_;
    const std::string_view bytes =
        wholeUnits ? block_.substr(start - blockOffset_, offset - start) : pendingUpTo(offset);
    const LineEnds ends = findLineEnds(bytes, afterReturn_ && start == counted_);
    if (ends.lastEnd == 0) {
        return;
    }
    if (decoderUsed_) {
        std::string ignored;
        decoder_.finish(ignored, {});
        decoderUsed_ = false;
    }
    before_.clear();
    line_ += ends.count;
    column_ = 1;
    afterReturn_ = ends.afterReturn;
    counted_ = start + ends.lastEnd;
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

void LineCounter::decode(std::string_view bytes, bool toTheEnd) {
    decoder_.convert(bytes, decoded_, {});
    decoderUsed_ = true;
    counted_ += bytes.size();
    if (toTheEnd) {
        decoder_.finish(decoded_, {});
        decoderUsed_ = false;
    }
    countDecoded();
}

void LineCounter::countDecoded() {
    const bool atStart = line_ == 1 && column_ == 1 && before_.empty() && !afterReturn_;
    std::u32string text = toUtf32(decoded_, Encoding::Utf32LE);
    decoded_.clear();
    if (atStart && !text.empty() && text.front() == U'\uFEFF') {
        text.erase(0, 1);
    }
    for (const char32_t character : text) {
        if (character == U'\n' || character == U'\r') {
            line_ += character == U'\r' || !afterReturn_ ? 1 : 0;
            column_ = 1;
            before_.clear();
        } else {
            ++column_;
            before_ += character;
            if (before_.size() >= 64 * contextLength) {
                before_.erase(0, before_.size() - contextLength);
            }
        }
        afterReturn_ = character == U'\r';
    }
}

LineCounter::Position LineCounter::at(std::uint64_t offset) {
    if (offset > counted_ && units_ != Units::Unclear) {
        // The place is the start of a character, so that the decoder may be asked for all that it has; in an
        // encoding without shifts the next character is decoded the same way after that.
        skipLinesUpTo(offset);
        decode(pendingUpTo(offset), true);
    } else if (offset > counted_) {
        decode(pendingUpTo(offset), false);
    }
    return {line_, column_};
}

void LineCounter::endBlock() {
    const std::uint64_t end = blockOffset_ + block_.size();
    if (units_ == Units::Unclear) {
        decode(pendingUpTo(end), false);
    } else {
        skipLinesUpTo(end);
        if (end - counted_ > longestCarry) {
            decode(pendingUpTo(end - (end - counted_) % unitWidth()), false);
        }
    }
    if (counted_ >= blockOffset_) {
        carry_ = block_.substr(counted_ - blockOffset_);
    } else {
        carry_.erase(0, counted_ - (blockOffset_ - carry_.size()));
        carry_.append(block_);
    }
    blockOffset_ = end;
    block_ = {};
}

std::u32string LineCounter::textBefore() const {
    return before_.size() <= contextLength ? before_ : before_.substr(before_.size() - contextLength);
}

std::string_view LineCounter::rest() {
    const std::uint64_t end = blockOffset_ + block_.size();
    return counted_ < end ? pendingUpTo(end) : std::string_view();
}

std::u32string LineCounter::textAfter(std::string_view bytes) {
    std::string decoded;
    decoder_.convert(bytes, decoded, {});
    decoder_.finish(decoded, {});
    std::u32string text = toUtf32(decoded, Encoding::Utf32LE);
    text.resize(std::min({text.size(), text.find_first_of(U"\r\n"), contextLength}));
    return text;
}

} // namespace host
