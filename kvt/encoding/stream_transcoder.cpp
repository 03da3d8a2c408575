// A stream conversion that knows where each loss stands.
//
// Text without losses goes fast: the short way where there is one, else through two ICU converters by way of UTF-16,
// a slice of input at a time. ICU reports that a slice loses something, but not where, since its offsets do not reach
// across calls. Such a slice is done again from its beginning, byte by byte: what comes out after a byte is the
// character that ended with it. So each unit of UTF-16 is known with the bytes that it comes from.
//
// The caller's blocks must not show in the result. So nothing rests on where a slice ended, and a slice is taken back
// by copies of the converters that were made before it, or by a reset where that comes to the same.
#include <kvt/encoding/stream_transcoder.h>

#include <kvt/encoding/detail/icu.h>
#include <kvt/encoding/detail/known_losses.h>
#include <kvt/encoding/detail/shortcut.h>
#include <kvt/foundation/detail/utf.h>
#include <kvt/foundation/throwable.h>

#include <algorithm>
#include <array>
#include <exception>
#include <optional>
#include <utility>
#include <vector>

namespace kvt::ex {
namespace {

using detail::Form;
using detail::icu::Converter;
using detail::icu::Progress;

// Bytes of one slice: long enough that its fixed cost does not count, short enough to be done twice.
constexpr std::size_t sliceBytes = 512;
constexpr std::size_t bufferUnits = 1024;
// Losses come in clusters: the bytes without one after which the next slice is tried as a whole.
constexpr std::size_t calmBytes = 32;
// Bytes of earlier input that are kept, to show what a character was that began with them.
constexpr std::size_t recentBytes = 64;

Converter open(Encoding encoding) {
    const std::uint32_t id = encoding.evaluate();
    if (id == Encoding::Unknown || id == Encoding::Binary || id == Encoding::Wwjd) {
        throw InvalidEncodingException("unknown");
    }
    Converter converter(encoding);
    if (!converter.isOpen()) {
        throw InvalidEncodingException(UString<0>(UStringView<0>(encoding.getName())));
    }
    return converter;
}

void requireSuccess(const Progress& progress) {
    if (progress.end == Progress::failed) {
        const std::string text = "conversion failed: " + std::string(detail::icu::errorName(progress.error));
        throw UStringException(UString<0>(UStringView<0>(text)));
    }
}

constexpr std::size_t longestKnown = detail::KnownLosses::longestCharacter;
/// A unit of UTF-16 and the bytes of the stream that it comes from.
struct Unit {
    char16_t unit;
    std::uint64_t begin;
    std::uint64_t end;
    bool isSubstitution; ///< for bad input, which is a loss already
};

} // namespace

class StreamTranscoder::Impl final : private detail::icu::LossListener {
public:
    Impl(Encoding from, Encoding to)
        : from_(open(from)), to_(open(to)), fromSide_(detail::sideOf(from)), toSide_(detail::sideOf(to)),
          hasShortcut_(fromSide_.form != Form::other && toSide_.form != Form::other &&
                       (from != to || detail::unicodeForm(from) != Form::other)),
          fromNature_(from_.nature()), isStateless_(fromNature_.isStateless && to_.nature().isStateless),
          countsHeldBytes_(from_.countsHeldBytes() && !fromNature_.isBehind),
          canTakeCharacters_(hasShortcut_ && isStateless_ && countsHeldBytes_),
          substitution_(to_.substitution()) {
        from_.setListener(*this);
        to_.setListener(*this);
    }
    Impl(const Impl&) = delete;
    Impl& operator=(const Impl&) = delete;

    void convert(std::string_view block, std::string& out, const LossHandler& onLoss) {
        if (onCharacter_) {
            convertWatched(block, out, onLoss);
            return;
        }
        bool canGoOn = false;
        bool isFirst = true;
        bool expectsLoss = true;
        while (!block.empty()) {
            if (hasShortcut_ && holdsNothing()) {
                goShortWay(block, out);
                if (!block.empty() && std::exchange(isFirst, false) &&
                    detail::canGoOn(fromSide_, toSide_, block.size())) {
                    // It may be the tables that were missing.
                    goShortWay(block, out);
                    canGoOn = canTakeCharacters_;
                }
            }
            if (block.empty()) {
                return;
            }
            if (canGoOn && holdsNothing() && loseKnown(block, out, onLoss)) {
                continue;
            }
            const std::string_view slice = block.substr(0, sliceBytes);
            if (canGoOn && expectsLoss) {
                // Where the short way ends there is a loss, or else a stretch of text that is not for it.
                expectsLoss = false;
                block.remove_prefix(convertTracing(slice, 0, out, onLoss, expectsLoss));
                continue;
            }
            bool ignored = false;
            block.remove_prefix(convertFast(slice, out)
                                    ? slice.size()
                                    : convertTracing(slice, calmBytes, out, onLoss, ignored));
            expectsLoss = true;
        }
    }

    void finish(std::string& out, const LossHandler& onLoss) {
        if (const std::size_t forgotten = from_.forgottenBytes(); forgotten != 0) {
            loseEnd(forgotten, out);
        } else {
            convertTraced("", true, out);
        }
        showCharacters();
        report(onLoss);
        from_.reset();
        to_.reset();
        units_.clear();
        unseen_.clear();
        recent_.clear();
        position_ = 0;
        characterBegin_ = 0;
        badEnd_ = 0;
    }

    void watch(CharacterHandler handler) {
        onCharacter_ = std::move(handler);
        unseen_.clear();
        if (!units_.empty() && detail::isHighSurrogate(units_.back().unit)) {
            unseen_.push_back(units_.back());
        }
    }

    std::uint64_t position() const { return position_; }
    std::string_view substitution() const { return substitution_; }

private:
    bool holdsNothing() const { return characterBegin_ == position_ && !to_.holdsUnits(); }

    void goShortWay(std::string_view& block, std::string& out) {
        const std::size_t taken = detail::convertPrefix(fromSide_, toSide_, block, out);
        passOver(block.substr(0, taken));
        block.remove_prefix(taken);
    }
    bool convertFast(std::string_view slice, std::string& out);
    std::size_t convertTracing(std::string_view slice, std::size_t calm, std::string& out,
                               const LossHandler& onLoss, bool& foundLoss);
    bool loseKnown(std::string_view& block, std::string& out, const LossHandler& onLoss);
    void remember(std::string_view character, std::string_view written);
    void convertWatched(std::string_view block, std::string& out, const LossHandler& onLoss);
    void convertTraced(std::string_view byte, bool flush, std::string& out);
    void showCharacters();
    void showPrefix(std::string_view bytes, std::uint64_t begin, const std::string& out, std::size_t at);
    void loseEnd(std::size_t length, std::string& out);
    Progress decode(const char*& source, const char* sourceEnd, bool flush);
    void encode(bool flush, std::string& out);
    void passOver(std::string_view bytes);
    void keepRecent(std::string_view bytes);
    void report(const LossHandler& onLoss);

    void onBadInput(std::string_view bytes, const char16_t* target, int error) noexcept override;
    void onNotRepresentable(char32_t codePoint, int error) noexcept override;
    void recordBadInput(std::string_view bytes, std::size_t index);
    void recordNotRepresentable(char32_t codePoint);
    std::optional<std::uint64_t> placeOfBadInput(std::string_view bytes, std::size_t between) const;
    std::uint64_t openBegin() const;
    void attribute(std::size_t behind, std::uint64_t end);
    void take(const Unit& unit);
    std::uint64_t lateBytes(std::uint64_t justRead) const {
        return fromNature_.isBehind && position_ - justRead > characterBegin_ ? justRead : 0;
    }
    std::uint64_t recentBegin() const { return position_ - recent_.size(); }
    std::string bytesOfInput(std::uint64_t begin, std::uint64_t end) const;

    Converter from_;
    Converter to_;
    detail::Side fromSide_;
    detail::Side toSide_;
    bool hasShortcut_;
    Converter::Nature fromNature_;
    bool isStateless_;
    bool countsHeldBytes_;
    bool canTakeCharacters_;
    std::string substitution_;

    std::uint64_t position_ = 0;
    std::uint64_t characterBegin_ = 0; // where the bytes held by the source's converter begin
    std::uint64_t badEnd_ = 0;         // behind the last bad input
    std::string recent_;               // the last bytes before position_

    std::array<char16_t, bufferUnits> buffer_{};
    std::size_t filled_ = 0;

    bool isTracing_ = false;
    bool lossSeen_ = false;
    std::size_t attributed_ = 0;   // units of the buffer whose bytes are known
    bool isReadAgain_ = false;     // Bad input was met in the byte under way.
    std::vector<Unit> units_;      // which the target's converter has not settled yet
    CharacterHandler onCharacter_; // empty but while it is watched
    std::vector<Unit> unseen_;     // of which it has not heard
    detail::KnownLosses known_;
    std::vector<Loss> losses_;     // which have not been reported yet
    std::exception_ptr exception_; // that a callback could not throw through ICU
};

// Converts a slice whole. When something is lost in it, all is as it was before, and the answer is false. So it is
// where it could not be known afterwards, or not be taken back, what the converters hold.
bool StreamTranscoder::Impl::convertFast(std::string_view slice, std::string& out) {
    if (!countsHeldBytes_ || !units_.empty() || (isStateless_ && !holdsNothing())) {
        return false;
    }
    Converter savedFrom;
    Converter savedTo;
    if (!isStateless_) {
        savedFrom = from_.clone();
        savedTo = to_.clone();
        if (!savedFrom.isOpen() || !savedTo.isOpen()) {
            return false;
        }
    }
    const std::size_t outSize = out.size();
    const char* source = slice.data();
    const char* const sourceEnd = source + slice.size();
    lossSeen_ = false;
    Progress progress{Progress::outputFull, 0};
    while (progress.end == Progress::outputFull && !lossSeen_) {
        progress = decode(source, sourceEnd, false);
        encode(false, out);
    }
    const bool isSettled = !lossSeen_ && !to_.holdsUnits();
    if (isSettled) {
        passOver(slice);
        characterBegin_ = position_ - from_.heldBytes();
        return true;
    }
    out.resize(outSize);
    if (isStateless_) {
        from_.reset();
        to_.reset();
    } else {
        from_ = std::move(savedFrom);
        to_ = std::move(savedTo);
    }
    return false;
}

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

// Characters in front that the target is known to lack. What is stateless loses a character that stands alone in the same
// way each time, so that ICU need not be asked again.
bool StreamTranscoder::Impl::loseKnown(std::string_view& block, std::string& out, const LossHandler& onLoss) {
    const std::size_t size = block.size();
    while (!known_.isEmpty()) {
        // What is known is whole, and the same bytes are the same character.
        const std::size_t length = fromSide_.form == Form::utf8 && !block.empty()
                                       ? detail::utf8Length(block.front())
                                       : detail::characterLength(fromSide_, block.substr(0, longestKnown));
        const std::string_view character = block.substr(0, length);
        const detail::KnownLosses::Row* const row = known_.find(character);
        if (row == nullptr) {
            break;
        }
        const Loss loss{Loss::NotRepresentable, position_, std::string(character), row->codePoint};
        out += row->written;
        passOver(character);
        block.remove_prefix(length);
        if (onLoss) {
            onLoss(loss);
        }
    }
    return block.size() < size;
}

// A character has been converted alone, and was lost.
void StreamTranscoder::Impl::remember(std::string_view character, std::string_view written) {
    const Loss& loss = losses_.front();
    if (loss.kind == Loss::NotRepresentable && loss.bytes == character &&
        detail::characterLength(fromSide_, character) == character.size()) {
        known_.add(character, loss.codePoint, written);
    }
}

void StreamTranscoder::Impl::convertWatched(std::string_view block, std::string& out,
                                            const LossHandler& onLoss) {
    while (!block.empty()) {
        if (hasShortcut_ && toSide_.form == Form::utf32le && holdsNothing()) {
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
        const std::size_t length =
            std::max<std::size_t>(detail::characterLength(fromSide_, bytes.substr(0, longestKnown)), 1);
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

// From bytes to the buffer of UTF-16.
Progress StreamTranscoder::Impl::decode(const char*& source, const char* sourceEnd, bool flush) {
    char16_t* target = buffer_.data();
    const Progress progress =
        from_.toUnicode(source, sourceEnd, target, buffer_.data() + buffer_.size(), flush);
    if (exception_) {
        std::rethrow_exception(exception_);
    }
    requireSuccess(progress);
    filled_ = static_cast<std::size_t>(target - buffer_.data());
    return progress;
}

// From the buffer of UTF-16 to bytes.
void StreamTranscoder::Impl::encode(bool flush, std::string& out) {
    const char16_t* source = buffer_.data();
    const char16_t* const sourceEnd = source + filled_;
    Progress progress{Progress::outputFull, 0};
    while (progress.end == Progress::outputFull) {
        std::array<char, bufferUnits * 4> bytes;
        char* target = bytes.data();
        progress = to_.fromUnicode(source, sourceEnd, target, bytes.data() + bytes.size(), flush);
        out.append(bytes.data(), static_cast<std::size_t>(target - bytes.data()));
        if (exception_) {
            std::rethrow_exception(exception_);
        }
        requireSuccess(progress);
    }
}

void StreamTranscoder::Impl::passOver(std::string_view bytes) {
    keepRecent(bytes);
    position_ += bytes.size();
    characterBegin_ = position_;
}

void StreamTranscoder::Impl::keepRecent(std::string_view bytes) {
    if (bytes.size() >= recentBytes) {
        recent_ = bytes.substr(bytes.size() - recentBytes);
        return;
    }
    if (recent_.size() >= 2 * recentBytes) {
        recent_.erase(0, recent_.size() - recentBytes);
    }
    recent_ += bytes;
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

StreamTranscoder::StreamTranscoder(Encoding from, Encoding to) : impl_(std::make_unique<Impl>(from, to)) {}
StreamTranscoder::StreamTranscoder(StreamTranscoder&&) noexcept = default;
StreamTranscoder& StreamTranscoder::operator=(StreamTranscoder&&) noexcept = default;
StreamTranscoder::~StreamTranscoder() = default;

void StreamTranscoder::convert(kvt::future::string_view block, std::string& out, const LossHandler& onLoss) {
    impl_->convert(block, out, onLoss);
}

void StreamTranscoder::finish(std::string& out, const LossHandler& onLoss) {
    impl_->finish(out, onLoss);
}

void StreamTranscoder::watch(CharacterHandler handler) {
    impl_->watch(std::move(handler));
}

std::uint64_t StreamTranscoder::position() const noexcept {
    return impl_->position();
}

kvt::future::string_view StreamTranscoder::substitution() const noexcept {
    return impl_->substitution();
}

} // namespace kvt::ex
