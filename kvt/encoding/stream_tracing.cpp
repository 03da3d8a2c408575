// Converting character by character, or byte by byte, with an account of where each unit of UTF-16 comes from: for losses,
// and for who watches.
#include <kvt/encoding/detail/stream_impl.h>

#include <kvt/foundation/detail/utf.h>

#include <algorithm>

namespace kvt::ex {

using detail::icu::Progress;

// Converts character by character, or byte by byte, and reports the losses. Where nothing hangs over, it ends when the
// character that was open at the beginning is complete, or `calm` bytes behind a loss; with none at the first place.
std::size_t StreamTranscoder::Impl::convertTracing(std::string_view slice, std::size_t calm, std::string& out,
                                                   const LossHandler& onLoss, bool& foundLoss) {
    std::size_t mayEndAt = isStateless_ && (calm == 0 || !holdsNothing()) ? 0 : slice.size();
    std::size_t taken = 0;
    do {
        const std::string_view rest = slice.substr(taken);
        // What is known to be one character comes out as one, so that its bytes need not be told apart.
        const std::size_t length = canTakeCharacters_ && characterBegin_ == position_
                                       ? std::max<std::size_t>(detail::characterLength(fromSide_, rest), 1)
                                       : 1;
        const bool isAlone = canTakeCharacters_ && holdsNothing();
        const std::size_t outSize = out.size();
        convertTraced(rest.substr(0, length), false, out);
        showCharacters();
        taken += length;
        if (isAlone && losses_.size() == 1 && holdsNothing()) {
            remember(rest.substr(0, length), std::string_view(out).substr(outSize));
        }
        if (!losses_.empty()) {
            foundLoss = true;
            mayEndAt = isStateless_ ? taken + calm : mayEndAt;
        }
        if (units_.empty()) {
            report(onLoss);
        }
    } while (taken < slice.size() && !(taken >= mayEndAt && holdsNothing()));
    return taken;
}

// A character has been converted alone, and was lost.
void StreamTranscoder::Impl::remember(std::string_view character, std::string_view written) {
    const Loss& loss = losses_.front();
    if (loss.kind == Loss::NotRepresentable && loss.bytes == character &&
        detail::characterLength(fromSide_, character) == character.size()) {
        known_.add(character, loss.codePoint, written);
    }
}

void StreamTranscoder::Impl::watch(CharacterHandler handler) {
    onCharacter_ = std::move(handler);
    unseen_.clear();
    if (!units_.empty() && detail::isHighSurrogate(units_.back().unit)) {
        unseen_.push_back(units_.back());
    }
}

void StreamTranscoder::Impl::convertWatched(std::string_view block, std::string& out,
                                            const LossHandler& onLoss) {
    while (!block.empty()) {
        if (hasShortcut_ && toSide_.form == detail::Form::utf32le && holdsNothing()) {
            const std::string_view before = block;
            const std::uint64_t begin = position_;
            const std::size_t outSize = out.size();
            goShortWay(block, out);
            showPrefix(before.substr(0, before.size() - block.size()), begin, out, outSize);
        }
        const std::string_view slice = block.substr(0, sliceBytes);
        bool ignored = false;
        block.remove_prefix(slice.empty() ? 0 : convertTracing(slice, calmBytes, out, onLoss, ignored));
    }
}

// What went the short way to UTF-32: its characters stand in `out` from `at` on.
void StreamTranscoder::Impl::showPrefix(std::string_view bytes, std::uint64_t begin, const std::string& out,
                                        std::size_t at) {
    for (; at < out.size(); at += sizeof(char32_t)) {
        char32_t character = 0;
        for (std::size_t byte = sizeof(char32_t); byte-- > 0;) {
            character = character << 8 | static_cast<unsigned char>(out[at + byte]);
        }
        onCharacter_(character, begin);
        const std::size_t length = std::max<std::size_t>(detail::characterLength(fromSide_, bytes), 1);
        bytes.remove_prefix(length);
        begin += length;
    }
}

// Half a surrogate pair waits for the other half.
void StreamTranscoder::Impl::showCharacters() {
    std::size_t shown = 0;
    while (shown < unseen_.size()) {
        const Unit unit = unseen_[shown];
        const bool isHigh = detail::isHighSurrogate(unit.unit);
        if (isHigh && shown + 1 == unseen_.size()) {
            break;
        }
        const bool isPair = isHigh && detail::isLowSurrogate(unseen_[shown + 1].unit);
        onCharacter_(isPair ? detail::codePointOf(unit.unit, unseen_[shown + 1].unit) : unit.unit,
                     unit.begin);
        shown += isPair ? 2 : 1;
    }
    unseen_.erase(unseen_.begin(), unseen_.begin() + static_cast<std::ptrdiff_t>(shown));
}

// Converts one byte or character, or what is left when the stream ends, and keeps account of where each unit comes
// from.
void StreamTranscoder::Impl::convertTraced(std::string_view byte, bool flush, std::string& out) {
    isTracing_ = true;
    keepRecent(byte);
    position_ += byte.size();
    const char* source = byte.data();
    Progress progress{Progress::outputFull, 0};
    while (progress.end == Progress::outputFull) {
        attributed_ = 0;
        isReadAgain_ = false;
        progress = decode(source, byte.data() + byte.size(), flush);
        if (filled_ > attributed_) {
            attribute(filled_,
                      position_ - (fromNature_.isBehind ? lateBytes(byte.size()) : from_.heldBytes()));
        } else if (countsHeldBytes_) {
            characterBegin_ = position_ - from_.heldBytes();
        }
        encode(flush && progress.end != Progress::outputFull, out);
    }
    if (flush || !to_.holdsUnits()) {
        units_.clear();
    }
    isTracing_ = false;
}

// The last bytes of the stream are bad input, of which the source's converter says nothing.
void StreamTranscoder::Impl::loseEnd(std::size_t length, std::string& out) {
    const std::uint64_t begin = position_ - length;
    losses_.push_back({Loss::BadInput, begin, bytesOfInput(begin, position_), U'\uFFFD'});
    take({u'\uFFFD', begin, position_, true});
    buffer_[0] = u'\uFFFD';
    filled_ = 1;
    isTracing_ = true;
    encode(true, out);
    isTracing_ = false;
}

void StreamTranscoder::Impl::report(const LossHandler& onLoss) {
    if (losses_.empty()) {
        return;
    }
    // A character that was held back is known to be lost only after bad input that follows it.
    if (losses_.size() > 1) {
        std::stable_sort(losses_.begin(), losses_.end(),
                         [](const Loss& left, const Loss& right) { return left.offset < right.offset; });
    }
    if (onLoss) {
        for (const Loss& loss : losses_) {
            onLoss(loss);
        }
    }
    losses_.clear();
}

void StreamTranscoder::Impl::onBadInput(std::string_view bytes, const char16_t* target, int) noexcept {
    lossSeen_ = true;
    if (!isTracing_) {
        return;
    }
    try {
        recordBadInput(bytes, static_cast<std::size_t>(target - buffer_.data()));
    } catch (...) {
        exception_ = std::current_exception();
    }
}

// One byte can end more than one character: bytes that turn out not to belong together are read again one by one. What
// came out before the bad ones stands between the last place known and them.
void StreamTranscoder::Impl::recordBadInput(std::string_view bytes, std::size_t index) {
    isReadAgain_ = true;
    const std::optional<std::uint64_t> found = placeOfBadInput(bytes, index - attributed_);
    if (index > attributed_) {
        attribute(index, found ? *found : characterBegin_ + (index - attributed_));
    }
    const std::uint64_t begin = found ? *found : openBegin();
    const std::uint64_t end = found ? begin + bytes.size() : position_;
    losses_.push_back({Loss::BadInput, begin, bytesOfInput(begin, end), U'\uFFFD'});
    take({u'\uFFFD', begin, end, true});
    characterBegin_ = end;
    badEnd_ = end;
    attributed_ = index + 1;
}

// Where bad bytes stand: behind the last character that came out and `between` further ones, or earlier where the
// converter did not count all that it held. Nowhere when ICU does not show them, or puts together what does not stand
// together.
std::optional<std::uint64_t> StreamTranscoder::Impl::placeOfBadInput(std::string_view bytes,
                                                                     std::size_t between) const {
    if (bytes.empty()) {
        return std::nullopt;
    }
    const std::uint64_t open = std::max(characterBegin_ + between, recentBegin());
    std::size_t found = recent_.find(bytes, open - recentBegin());
    if (found == std::string::npos) {
        found = recent_.rfind(bytes);
    }
    const bool isNew = found != std::string::npos && recentBegin() + found >= badEnd_;
    return isNew ? std::optional(recentBegin() + found) : std::nullopt;
}

// Where that begins which came to nothing: a character that is open, or else the last byte, unless it was a loss
// already.
std::uint64_t StreamTranscoder::Impl::openBegin() const {
    return characterBegin_ < position_ ? characterBegin_ : std::max(badEnd_, position_ - 1);
}

// The units of the buffer up to `behind` come from the bytes up to `end`: all of them from all, unless bytes were read
// again one by one and the numbers agree.
void StreamTranscoder::Impl::attribute(std::size_t behind, std::uint64_t end) {
    const bool oneEach = isReadAgain_ && end - characterBegin_ == behind - attributed_;
    for (; attributed_ < behind; ++attributed_) {
        const std::uint64_t begin = characterBegin_;
        take({buffer_[attributed_], begin, oneEach ? begin + 1 : end, false});
        characterBegin_ += oneEach ? 1 : 0;
    }
    characterBegin_ = end;
}

void StreamTranscoder::Impl::take(const Unit& unit) {
    units_.push_back(unit);
    if (onCharacter_) {
        unseen_.push_back(unit);
    }
}

void StreamTranscoder::Impl::onNotRepresentable(char32_t codePoint, int) noexcept {
    lossSeen_ = true;
    if (!isTracing_) {
        return;
    }
    try {
        recordNotRepresentable(codePoint);
    } catch (...) {
        exception_ = std::current_exception();
    }
}

// Characters before the lost one have been converted. They, and it, are settled.
void StreamTranscoder::Impl::recordNotRepresentable(char32_t codePoint) {
    std::array<char16_t, 2> wanted = {static_cast<char16_t>(codePoint), 0};
    std::size_t length = 1;
    if (codePoint >= detail::firstSupplementary) {
        wanted = {detail::highSurrogate(codePoint), detail::lowSurrogate(codePoint)};
        length = 2;
    }
    auto found = std::search(units_.begin(), units_.end(), wanted.begin(),
                             wanted.begin() + static_cast<std::ptrdiff_t>(length),
                             [](const Unit& unit, char16_t want) { return unit.unit == want; });
    if (found == units_.end()) {
        // Some encodings map a character to another one before they find out that they lack it.
        found =
            std::find_if(units_.begin(), units_.end(), [](const Unit& unit) { return !unit.isSubstitution; });
        length = 1;
        codePoint = found != units_.end() ? found->unit : codePoint;
        if (units_.end() - found > 1 && detail::isHighSurrogate(found->unit) &&
            detail::isLowSurrogate(found[1].unit)) {
            length = 2;
            codePoint = detail::codePointOf(found->unit, found[1].unit);
        }
    }
    if (found == units_.end()) {
        losses_.push_back(
            {Loss::NotRepresentable, openBegin(), bytesOfInput(openBegin(), position_), codePoint});
        return;
    }
    const auto last = found + static_cast<std::ptrdiff_t>(length) - 1;
    if (!found->isSubstitution) {
        losses_.push_back(
            {Loss::NotRepresentable, found->begin, bytesOfInput(found->begin, last->end), codePoint});
    }
    units_.erase(units_.begin(), last + 1);
}

std::string StreamTranscoder::Impl::bytesOfInput(std::uint64_t begin, std::uint64_t end) const {
    begin = std::max(begin, recentBegin());
    return begin < end ? recent_.substr(begin - recentBegin(), end - begin) : std::string();
}

} // namespace kvt::ex
