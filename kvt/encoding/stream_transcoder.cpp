// A stream conversion that knows where each loss stands.
//
// Text without losses goes fast: the short way where there is one, else through two ICU converters by way of UTF-16,
// a slice of input at a time. ICU reports that a slice loses something, but not where, since its offsets do not reach
// across calls. Such a slice is done again from its beginning, byte by byte: what comes out after a byte is the
// character that ended with it. So each unit of UTF-16 is known with the bytes that it comes from.
//
// The caller's blocks must not show in the result. So nothing rests on where a slice ended, and a slice is taken back
// by copies of the converters that were made before it, or by a reset where that comes to the same.
#include <kvt/encoding/detail/encoding_profile.h>
#include <kvt/encoding/detail/stream_impl.h>

#include <kvt/encoding/detail/encoding_profile.h>
#include <kvt/foundation/throwable.h>

#include <algorithm>
#include <utility>

namespace kvt::ex {
namespace {

using detail::Form;
using detail::icu::Converter;
using detail::icu::Progress;

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

} // namespace

StreamTranscoder::Impl::Impl(Encoding from, Encoding to)
    : from_(open(from)), to_(open(to)), fromSide_(detail::sideOf(from)), toSide_(detail::sideOf(to)),
      hasShortcut_(fromSide_.form != Form::other && toSide_.form != Form::other &&
                   (from != to || detail::unicodeForm(from) != Form::other)),
      fromNature_(detail::profileOf(from).nature()),
      isStateless_(fromNature_.isStateless && detail::profileOf(to).nature().isStateless),
      countsHeldBytes_(from_.countsHeldBytes() && !fromNature_.isBehind),
      canTakeCharacters_(hasShortcut_ && isStateless_ && countsHeldBytes_),
      substitution_(to_.substitution()) {
    from_.setListener(*this);
    to_.setListener(*this);
}

void StreamTranscoder::Impl::convert(std::string_view block, std::string& out, const LossHandler& onLoss) {
    if (onCharacter_) {
        convertWatched(block, out, onLoss);
        return;
    }
    bool canGoOn = false;
    bool isFirst = true;
    bool expectsLoss = true;
    while (!block.empty()) {
        if (hasShortcut_ && holdsNothing()) {
            if (canGoOn) {
                goOn(block, out, onLoss);
            } else {
                goShortWay(block, out);
            }
            if (!block.empty() && std::exchange(isFirst, false) &&
                detail::canGoOn(fromSide_, toSide_, block.size())) {
                // It may be the tables that were missing.
                canGoOn = canTakeCharacters_;
                continue;
            }
        }
        if (block.empty()) {
            return;
        }
        const std::string_view slice = block.substr(0, sliceBytes);
        if (canGoOn && expectsLoss) {
            // Where the short way ends there is a loss, or else a stretch of text that is not for it.
            expectsLoss = false;
            block.remove_prefix(convertTracing(slice, 0, out, onLoss, expectsLoss));
            continue;
        }
        bool ignored = false;
        block.remove_prefix(convertFast(slice, out) ? slice.size()
                                                    : convertTracing(slice, calmBytes, out, onLoss, ignored));
        expectsLoss = true;
    }
}

void StreamTranscoder::Impl::finish(std::string& out, const LossHandler& onLoss) {
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

void StreamTranscoder::Impl::goShortWay(std::string_view& block, std::string& out) {
    const std::size_t taken = detail::convertPrefix(fromSide_, toSide_, block, out);
    passOver(block.substr(0, taken));
    block.remove_prefix(taken);
}

// As far as ICU need not be asked, for losses either.
void StreamTranscoder::Impl::goOn(std::string_view& block, std::string& out, const LossHandler& onLoss) {
    const std::string_view before = block;
    const auto take = [&](std::size_t bytes) {
        position_ += bytes;
        block.remove_prefix(bytes);
    };
    for (bool isBehindLoss = false;; isBehindLoss = true) {
        // Losses come in clusters.
        if (isBehindLoss) {
            take(detail::convertFew(fromSide_, toSide_, block, out));
        }
        if (loseMalformed(block, out, onLoss)) {
            continue;
        }
        take(detail::isUnicode(toSide_.form) ? detail::convertPrefix(fromSide_, toSide_, block, out)
                                             : convertLossy(block, out, onLoss));
        if (!loseMalformed(block, out, onLoss)) {
            break;
        }
    }
    keepRecent(before.substr(0, before.size() - block.size()));
    characterBegin_ = position_;
}

// What is stateless loses a character that stands alone in the same way each time.
std::size_t StreamTranscoder::Impl::convertLossy(std::string_view block, std::string& out,
                                                 const LossHandler& onLoss) {
    const auto lose = [&](std::string_view character, std::size_t offset) -> const std::string* {
        const detail::KnownLosses::Row* const row = known_.isEmpty() ? nullptr : known_.find(character);
        if (row == nullptr) {
            return nullptr;
        }
        if (onLoss) {
            onLoss({Loss::NotRepresentable, position_ + offset, std::string(character), row->codePoint});
        }
        return &row->written;
    };
    return detail::convertLossy(fromSide_, toSide_, block, out, lose);
}

// Bad input in front of a block, which is known to be bad whatever stood before it.
bool StreamTranscoder::Impl::loseMalformed(std::string_view& block, std::string& out,
                                           const LossHandler& onLoss) {
    const std::size_t length = detail::malformedLength(fromSide_, block);
    if (length == 0) {
        return false;
    }
    out += writtenForBadInput();
    if (onLoss) {
        onLoss({Loss::BadInput, position_, std::string(block.substr(0, length)), U'\uFFFD'});
    }
    position_ += length;
    badEnd_ = position_;
    block.remove_prefix(length);
    return true;
}

// Of a target that is stateless, so that it is the same each time.
const std::string& StreamTranscoder::Impl::writtenForBadInput() {
    if (!badWritten_) {
        std::string written;
        buffer_[0] = u'\uFFFD';
        filled_ = 1;
        encode(true, written);
        badWritten_ = std::move(written);
    }
    return *badWritten_;
}

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
