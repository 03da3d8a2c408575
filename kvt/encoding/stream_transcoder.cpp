// A stream conversion that knows where in the input each unit of its UTF-16 pivot comes from.
//
// Text without losses goes the short way where there is one. The rest goes through two ICU converters, a slice of
// input at a time: from bytes to the pivot, with the offset of each unit's character, and from the pivot to bytes. A
// loss in the first step is at hand with its bytes; a loss in the second is traced back through the offsets.
#include <kvt/encoding/stream_transcoder.h>

#include <kvt/encoding/detail/icu.h>
#include <kvt/encoding/detail/shortcut.h>
#include <kvt/foundation/throwable.h>

#include <algorithm>
#include <array>
#include <exception>
#include <functional>
#include <vector>

namespace kvt::ex {
namespace {

using detail::Form;
using detail::icu::Progress;

// Bytes of one step. The pivot holds eight units for each, which no converter needs, so that a step fills it once.
constexpr std::size_t stepBytes = 512;
constexpr std::size_t pivotUnits = stepBytes * 8;
// Units of earlier steps that are kept. A converter may hold a few back to see what follows them, and report them
// later; ICU's tables join at most 19.
constexpr std::size_t historyUnits = 32;
// Bytes of earlier steps that are kept, to show what a character was that they began.
constexpr std::size_t recentBytesKept = 64;

void requireConverter(const detail::icu::Converter& converter, Encoding encoding) {
    if (!converter.isOpen()) {
        throw InvalidEncodingException(UString<0>(UStringView<0>(encoding.getName())));
    }
}

Encoding withConverter(Encoding encoding) {
    const std::uint32_t id = encoding.evaluate();
    if (id == Encoding::Unknown || id == Encoding::Binary || id == Encoding::Wwjd) {
        throw InvalidEncodingException("unknown");
    }
    return encoding;
}

void requireSuccess(const Progress& progress) {
    if (progress.end == Progress::failed) {
        throw UStringException(UString<0>(
            UStringView<0>("conversion failed: " + std::string(detail::icu::errorName(progress.error)))));
    }
}

} // namespace

class StreamTranscoder::Impl final : private detail::icu::LossListener {
public:
    Impl(Encoding from, Encoding to)
        : from_(withConverter(from)), to_(withConverter(to)), fromForm_(from_.form()), toForm_(to_.form()),
          hasShortcut_(fromForm_ != Form::other && toForm_ != Form::other && from != to) {
        requireConverter(from_, from);
        requireConverter(to_, to);
        substitution_ = to_.substitution();
        from_.setListener(*this);
        to_.setListener(*this);
    }
    Impl(const Impl&) = delete;
    Impl& operator=(const Impl&) = delete;

    void convert(std::string_view block, std::string& out, const LossHandler& onLoss) {
        while (!block.empty()) {
            if (hasShortcut_ && holdsNothing()) {
                const std::size_t taken = detail::convertPrefix(fromForm_, toForm_, block, out);
                position_ += taken;
                block.remove_prefix(taken);
            }
            std::size_t slice = std::min(block.size(), stepBytes);
            // Behind the slice single bytes complete an open character, so that the short way can be taken again.
            while (slice > 0) {
                step(block.substr(0, slice), false, out, onLoss);
                block.remove_prefix(slice);
                slice = hasShortcut_ && !holdsNothing() ? std::min<std::size_t>(block.size(), 1) : 0;
            }
        }
    }

    void finish(std::string& out, const LossHandler& onLoss) {
        step("", true, out, onLoss);
        from_.reset();
        to_.reset();
        position_ = 0;
        recent_.clear();
        filled_ = 0;
        searchFrom_ = 0;
    }

    std::uint64_t position() const { return position_; }
    std::string_view substitution() const { return substitution_; }

private:
    bool holdsNothing() const { return !from_.holdsBytes() && !to_.holdsUnits(); }

    void step(std::string_view bytes, bool flush, std::string& out, const LossHandler& onLoss);
    void keepRecent(std::string_view bytes);
    bool fillPivot(const char*& source, const char* sourceEnd, bool flush);
    void drainPivot(bool flush, std::string& out);
    void report(bool all, const LossHandler& onLoss);

    void onBadInput(std::string_view bytes, const char* behind, int error) noexcept override;
    void onNotRepresentable(char32_t codePoint, const char16_t* behind, int error) noexcept override;
    std::uint64_t offsetOf(std::string_view bytes, const char* behind) const;
    std::size_t pivotIndexOf(char32_t codePoint, const char16_t* behind) const;
    std::uint64_t endOfCharacterAt(std::size_t index) const;
    std::string recentBytes(std::uint64_t begin, std::uint64_t end) const;

    detail::icu::Converter from_;
    detail::icu::Converter to_;
    Form fromForm_;
    Form toForm_;
    bool hasShortcut_;
    std::string substitution_;
    std::uint64_t position_ = 0;

    // The input of the present step and some bytes before it, which begin at recentBegin_ in the stream.
    std::string recent_;
    std::uint64_t recentBegin_ = 0;

    // The pivot: historyUnits of earlier steps, then filled_ units of the present one; and for each unit the offset
    // in the stream of the character that it comes from.
    std::array<char16_t, historyUnits + pivotUnits> units_{};
    std::array<std::uint64_t, historyUnits + pivotUnits> origins_{};
    std::size_t filled_ = 0;
    std::size_t searchFrom_ = 0; // Lost characters come in order: the next one is not before this index.

    // The input of the call to ICU under way, which begins at callBegin_ in the stream, and the end of the last
    // character of the pivot.
    std::string_view callInput_;
    std::uint64_t callBegin_ = 0;
    std::uint64_t pivotEndsAt_ = 0;

    std::vector<Loss> losses_;
    std::vector<std::uint64_t> badOffsets_;
    std::exception_ptr failure_; // What a callback could not throw through ICU.
};

// Converts all of `bytes` and tells of the losses.
void StreamTranscoder::Impl::step(std::string_view bytes, bool flush, std::string& out, const LossHandler& onLoss) {
    keepRecent(bytes);
    const char* source = bytes.data();
    const char* const sourceEnd = source + bytes.size();
    bool more = true;
    while (more) {
        more = fillPivot(source, sourceEnd, flush);
        drainPivot(flush && !more, out);
    }
    report(flush || !to_.holdsUnits(), onLoss);
}

void StreamTranscoder::Impl::keepRecent(std::string_view bytes) {
    if (recentBegin_ + recent_.size() != position_) {
        recent_.clear(); // The short way was taken, with nothing held back before it.
        recentBegin_ = position_;
    } else if (recent_.size() > recentBytesKept) {
        recentBegin_ += recent_.size() - recentBytesKept;
        recent_.erase(0, recent_.size() - recentBytesKept);
    }
    recent_ += bytes;
}

// From bytes to the pivot; says whether it was full before all was taken.
bool StreamTranscoder::Impl::fillPivot(const char*& source, const char* sourceEnd, bool flush) {
    if (filled_ > 0) { // Units of the last filling become history.
        std::copy_n(units_.begin() + static_cast<std::ptrdiff_t>(filled_), historyUnits, units_.begin());
        std::copy_n(origins_.begin() + static_cast<std::ptrdiff_t>(filled_), historyUnits, origins_.begin());
        searchFrom_ -= std::min(searchFrom_, filled_);
    }

    callInput_ = {source, static_cast<std::size_t>(sourceEnd - source)};
    callBegin_ = position_;
    const std::size_t held = from_.heldBytes();
    std::array<std::int32_t, pivotUnits> offsets;
    char16_t* target = units_.data() + historyUnits;
    const Progress progress =
        from_.toUnicode(source, sourceEnd, target, units_.data() + units_.size(), offsets.data(), flush);
    position_ += callInput_.size() - static_cast<std::size_t>(sourceEnd - source);
    if (failure_) {
        std::rethrow_exception(failure_);
    }
    requireSuccess(progress);

    filled_ = static_cast<std::size_t>(target - units_.data()) - historyUnits;
    // Units of a character that an earlier call began. Some converters give them the offset -1, others 0.
    const bool pairFirst = filled_ > 1 && (units_[historyUnits] & 0xFC00) == 0xD800;
    const std::size_t openUnits = held == 0 ? 0 : pairFirst ? 2 : 1;
    for (std::size_t i = 0; i < filled_; ++i) {
        origins_[historyUnits + i] = i < openUnits || offsets[i] < 0
                                         ? callBegin_ - held
                                         : callBegin_ + static_cast<std::uint64_t>(offsets[i]);
    }
    pivotEndsAt_ = position_ - from_.heldBytes();
    return progress.end == Progress::outputFull;
}

// From the pivot to bytes.
void StreamTranscoder::Impl::drainPivot(bool flush, std::string& out) {
    const char16_t* source = units_.data() + historyUnits;
    const char16_t* const sourceEnd = source + filled_;
    Progress progress{Progress::outputFull, 0};
    while (progress.end == Progress::outputFull) {
        std::array<char, pivotUnits> buffer;
        char* target = buffer.data();
        progress = to_.fromUnicode(source, sourceEnd, target, buffer.data() + buffer.size(), flush);
        out.append(buffer.data(), static_cast<std::size_t>(target - buffer.data()));
        if (failure_) {
            std::rethrow_exception(failure_);
        }
        requireSuccess(progress);
    }
}

// Hands the losses over in the order of the input, unless a character is held back that may precede one of them.
void StreamTranscoder::Impl::report(bool all, const LossHandler& onLoss) {
    if (!all || losses_.empty()) {
        return;
    }
    std::vector<Loss> losses;
    losses.swap(losses_);
    badOffsets_.clear();
    std::stable_sort(losses.begin(), losses.end(),
                     [](const Loss& left, const Loss& right) { return left.offset < right.offset; });
    if (onLoss) {
        std::for_each(losses.begin(), losses.end(), onLoss);
    }
}

void StreamTranscoder::Impl::onBadInput(std::string_view bytes, const char* behind, int) noexcept {
    try {
        const std::uint64_t offset = offsetOf(bytes, behind);
        badOffsets_.push_back(offset);
        losses_.push_back({Loss::BadInput, offset, std::string(bytes), U'\uFFFD'});
    } catch (...) {
        failure_ = std::current_exception();
    }
}

void StreamTranscoder::Impl::onNotRepresentable(char32_t codePoint, const char16_t* behind, int) noexcept {
    try {
        const std::size_t index = pivotIndexOf(codePoint, behind);
        searchFrom_ = index + 1;
        const std::uint64_t offset = origins_[index];
        // The substitution for bad input may itself have no form in the target; that is one loss, not two.
        if (!std::binary_search(badOffsets_.begin(), badOffsets_.end(), offset)) {
            losses_.push_back(
                {Loss::NotRepresentable, offset, recentBytes(offset, endOfCharacterAt(index)), codePoint});
        }
    } catch (...) {
        failure_ = std::current_exception();
    }
}

// Where bad bytes stand that end at `behind`. ICU may be reading a copy of what it held back; then they are the next
// such bytes behind the last bad ones.
std::uint64_t StreamTranscoder::Impl::offsetOf(std::string_view bytes, const char* behind) const {
    const std::less_equal<> notAfter;
    if (notAfter(callInput_.data(), behind) && notAfter(behind, callInput_.data() + callInput_.size())) {
        return callBegin_ + static_cast<std::uint64_t>(behind - callInput_.data()) - bytes.size();
    }
    const std::uint64_t searchFrom = badOffsets_.empty() ? recentBegin_ : badOffsets_.back() + 1;
    const std::size_t found = recent_.find(bytes, static_cast<std::size_t>(searchFrom - recentBegin_));
    return found != std::string::npos ? recentBegin_ + found : callBegin_;
}

// Where in the pivot a character stands that ends at `behind`, with the same caution.
std::size_t StreamTranscoder::Impl::pivotIndexOf(char32_t codePoint, const char16_t* behind) const {
    const std::array<char16_t, 2> pair = {static_cast<char16_t>(0xD7C0 + (codePoint >> 10)),
                                          static_cast<char16_t>(0xDC00 + (codePoint & 0x3FF))};
    const std::array<char16_t, 1> single = {static_cast<char16_t>(codePoint)};
    const std::u16string_view wanted = codePoint > 0xFFFF ? std::u16string_view(pair.data(), pair.size())
                                                          : std::u16string_view(single.data(), single.size());
    const std::u16string_view pivot(units_.data(), historyUnits + filled_);
    const std::less_equal<> notAfter;
    if (notAfter(pivot.data() + wanted.size(), behind) && notAfter(behind, pivot.data() + pivot.size())) {
        const std::size_t index = static_cast<std::size_t>(behind - pivot.data()) - wanted.size();
        if (pivot.substr(index, wanted.size()) == wanted) {
            return index;
        }
    }
    const std::size_t found = pivot.find(wanted, searchFrom_);
    return found != std::u16string_view::npos ? found : std::min(searchFrom_, pivot.size() - 1);
}

std::uint64_t StreamTranscoder::Impl::endOfCharacterAt(std::size_t index) const {
    for (std::size_t i = index + 1; i < historyUnits + filled_; ++i) {
        if (origins_[i] > origins_[index]) {
            return origins_[i];
        }
    }
    return pivotEndsAt_;
}

std::string StreamTranscoder::Impl::recentBytes(std::uint64_t begin, std::uint64_t end) const {
    if (begin < recentBegin_ || begin >= end) {
        return {};
    }
    return recent_.substr(static_cast<std::size_t>(begin - recentBegin_), static_cast<std::size_t>(end - begin));
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

std::uint64_t StreamTranscoder::position() const noexcept {
    return impl_->position();
}

kvt::future::string_view StreamTranscoder::substitution() const noexcept {
    return impl_->substitution();
}

} // namespace kvt::ex
