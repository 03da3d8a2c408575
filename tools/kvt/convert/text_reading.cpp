#include "convert/text_reading.h"

#include <algorithm>
#include <utility>

namespace host {

namespace {

using kvt::ex::Encoding;
using kvt::ex::Loss;
using kvt::ex::StreamTranscoder;

// Below this, every form of normalization leaves a character as it is where none joins it;
constexpr char32_t firstChangeable = 0xA0;
// below this, none joins the one before.
constexpr char32_t firstOpen = 0x300;

bool isLineEnd(char32_t character) {
    return character == U'\n' || character == U'\r';
}

// Losses that lie before `end`, taken from the front.
void moveBefore(std::uint64_t end, std::vector<Loss>& from, std::vector<Loss>& to) {
    const auto last =
        std::find_if(from.begin(), from.end(), [&](const Loss& loss) { return loss.offset >= end; });
    to.insert(to.end(), std::make_move_iterator(from.begin()), std::make_move_iterator(last));
    from.erase(from.begin(), last);
}

} // namespace

void ReadCharacters::append(const ReadCharacters& other, std::size_t first, std::size_t last) {
    text.append(other.text, first, last - first);
    begins.insert(begins.end(), other.begins.begin() + static_cast<std::ptrdiff_t>(first),
                  other.begins.begin() + static_cast<std::ptrdiff_t>(last));
}

void ReadCharacters::dropFront(std::size_t count) {
    text.erase(0, count);
    begins.erase(begins.begin(), begins.begin() + static_cast<std::ptrdiff_t>(count));
}

std::string TextPiece::bytesOf(std::size_t sourceIndex) const {
    const std::uint64_t begin = source.begins[sourceIndex];
    // Several characters of one sequence of bytes begin alike.
    std::uint64_t behind = end;
    for (std::size_t next = sourceIndex + 1; next < source.begins.size(); ++next) {
        if (source.begins[next] > begin) {
            behind = source.begins[next];
            break;
        }
    }
    return bytes.substr(begin - source.begins.front(), behind - begin);
}

TextReading::TextReading(Encoding from, const ReadingRule& rule) : rule_(rule), from_(from) {
    open(from);
    if (rule.fallback) {
        fallback_.emplace(*rule.fallback, Encoding::Utf32LE);
        fallback_->watch([this](char32_t character, std::uint64_t begin) {
            reread_.text += character;
            reread_.begins.push_back(begin);
        });
    }
    if (rule.normalization != Normalization::None) {
        normalizer_.emplace(rule.normalization);
    }
}

void TextReading::open(Encoding from) {
    from_ = from;
    decoder_.emplace(from, Encoding::Utf32LE);
    decoder_->watch([this](char32_t character, std::uint64_t begin) {
        undecided_.text += character;
        undecided_.begins.push_back(skipped_ + begin);
    });
}

void TextReading::begin(Encoding from, std::uint64_t skipped) {
    if (from != from_) {
        open(from);
    }
    skipped_ = bytesBegin_ = skipped;
    position_ = lines_ = {};
}

TextPiece TextReading::take(std::string_view block) {
    bytes_.append(block);
    decoder_->convert(block, scratch_, [this](const Loss& loss) {
        undecidedBad_.push_back(loss);
        undecidedBad_.back().offset += skipped_;
    });
    scratch_.clear();
    return settle(false);
}

TextPiece TextReading::finish() {
    decoder_->finish(scratch_, [this](const Loss& loss) {
        undecidedBad_.push_back(loss);
        undecidedBad_.back().offset += skipped_;
    });
    scratch_.clear();
    TextPiece piece = settle(true);
    bytes_.clear();
    isLong_ = false;
    return piece;
}

TextPiece TextReading::settle(bool isLast) {
    TextPiece piece;
    decideLines(isLast, piece);
    const std::size_t count = settledCount(isLast);
    if (count == 0) {
        return piece;
    }
    piece.source.append(decided_, 0, count);
    piece.end = count < decided_.begins.size() ? decided_.begins[count]
                : !undecided_.begins.empty()   ? undecided_.begins.front()
                                               : bytesBegin_ + bytes_.size();
    moveBefore(isLast ? ~std::uint64_t{0} : piece.end, bad_, piece.bad);
    piece.bytes =
        bytes_.substr(piece.source.begins.front() - bytesBegin_, piece.end - piece.source.begins.front());
    piece.start = position_;
    for (const char32_t character : piece.source.text) {
        position_.pass(character);
    }
    decided_.dropFront(count);
    bytes_.erase(0, piece.end - bytesBegin_);
    bytesBegin_ = piece.end;
    normalize(piece);
    return piece;
}

// Moves whole lines over to decided_. The last character waits for the next one, which says where it ends.
void TextReading::decideLines(bool isLast, TextPiece& piece) {
    const std::size_t size = undecided_.text.size();
    const std::size_t known = isLast || size == 0 ? size : size - 1;
    const auto endAt = [&](std::size_t index) {
        return index < size ? undecided_.begins[index] : bytesBegin_ + bytes_.size();
    };
    std::size_t first = 0;
    for (std::size_t index = fallback_ ? searched_ : known; index < known; ++index) {
        if (isLineEnd(undecided_.text[index])) {
            decideLine(first, index, endAt(index), piece);
            decided_.append(undecided_, index, index + 1);
            lines_.pass(undecided_.text[index]);
            first = index + 1;
            isLong_ = false;
        }
    }
    isLong_ =
        isLong_ || !fallback_ || (first < known && endAt(known) - undecided_.begins[first] > longestLine);
    if (first < known && (isLast || isLong_)) {
        decideLine(first, known, endAt(known), piece);
        first = known;
    }
    moveBefore(isLast ? ~std::uint64_t{0} : endAt(first), undecidedBad_, bad_);
    searched_ = known - first;
    undecided_.dropFront(first);
}

void TextReading::decideLine(std::size_t first, std::size_t last, std::uint64_t end, TextPiece& piece) {
    if (first == last) {
        return;
    }
    if (isLong_ || !isRead(first, end, piece)) {
        decided_.append(undecided_, first, last);
    }
    lines_.afterReturn = false;
}

// Whether a line was read in the other encoding, in which it is valid.
bool TextReading::isRead(std::size_t first, std::uint64_t end, TextPiece& piece) {
    const std::uint64_t begin = undecided_.begins[first];
    if (undecidedBad_.empty() || undecidedBad_.front().offset >= end) {
        return false;
    }
    reread_ = {};
    bool isValid = true;
    const auto onLoss = [&](const Loss&) { isValid = false; };
    fallback_->convert(std::string_view(bytes_).substr(begin - bytesBegin_, end - begin), scratch_, onLoss);
    fallback_->finish(scratch_, onLoss);
    scratch_.clear();
    if (!isValid) {
        return false;
    }
    std::vector<Loss> overruled;
    moveBefore(end, undecidedBad_, overruled);
    for (std::uint64_t& offset : reread_.begins) {
        offset += begin;
    }
    decided_.append(reread_, 0, reread_.text.size());
    ++piece.fallbackLines;
    if (!piece.firstFallback) {
        piece.firstFallback = Place{{}, begin, lines_.line, 1};
    }
    return true;
}

// How many of decided_ nothing changes that is still to come.
std::size_t TextReading::settledCount(bool isLast) const {
    const std::size_t size = decided_.text.size();
    if (isLast || !normalizer_ || size == 0) {
        return size;
    }
    std::size_t count = size - 1;
    while (count > 0 && !normalizer_->hasBoundaryBefore(decided_.text[count])) {
        --count;
    }
    return count == 0 && size > longestSequence ? size : count;
}

// Stretch by stretch: what belongs together, and does not change by what stands around it.
void TextReading::normalize(TextPiece& piece) const {
    const std::u32string& source = piece.source.text;
    if (!normalizer_) {
        piece.text = source;
        return;
    }
    const auto isOpen = [&](std::size_t index) {
        return index < source.size() && source[index] >= firstOpen &&
               !normalizer_->hasBoundaryBefore(source[index]);
    };
    for (std::size_t begin = 0; begin < source.size();) {
        std::size_t end = begin + 1;
        while (isOpen(end)) {
            ++end;
        }
        if (end == begin + 1 && (source[begin] < firstChangeable || normalizer_->isInert(source[begin]))) {
            piece.text += source[begin];
            piece.origins.push_back(begin);
        } else {
            const std::u32string stretch = source.substr(begin, end - begin);
            const std::u32string text = normalizer_->normalized(stretch);
            for (std::size_t index = 0; index < text.size(); ++index) {
                piece.origins.push_back(text == stretch ? begin + index : begin);
            }
            piece.text += text;
        }
        begin = end;
    }
}

} // namespace host
