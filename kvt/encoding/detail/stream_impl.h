// The state of a StreamTranscoder, and its ways through a text: stream_transcoder.cpp has the fast ones, stream_tracing.cpp
// the one that knows where each character comes from.
#pragma once

#include <kvt/encoding/detail/icu.h>
#include <kvt/encoding/detail/known_losses.h>
#include <kvt/encoding/detail/shortcut.h>
#include <kvt/encoding/stream_transcoder.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <exception>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::ex {

class StreamTranscoder::Impl final : private detail::icu::LossListener {
public:
    Impl(Encoding from, Encoding to);
    Impl(const Impl&) = delete;
    Impl& operator=(const Impl&) = delete;

    void convert(std::string_view block, std::string& out, const LossHandler& onLoss);
    void finish(std::string& out, const LossHandler& onLoss);
    void watch(CharacterHandler handler);
    std::uint64_t position() const { return position_; }
    std::string_view substitution() const { return substitution_; }

private:
    // Bytes of one slice: long enough that its fixed cost does not count, short enough to be done twice.
    static constexpr std::size_t sliceBytes = 512;
    static constexpr std::size_t bufferUnits = 1024;
    // Losses come in clusters: the bytes without one after which the next slice is tried as a whole.
    static constexpr std::size_t calmBytes = 32;
    // Bytes of earlier input that are kept, to show what a character was that began with them.
    static constexpr std::size_t recentBytes = 64;

    /// A unit of UTF-16 and the bytes of the stream that it comes from.
    struct Unit {
        char16_t unit;
        std::uint64_t begin;
        std::uint64_t end;
        bool isSubstitution; ///< for bad input, which is a loss already
    };

    bool holdsNothing() const { return characterBegin_ == position_ && !to_.holdsUnits(); }

    void goShortWay(std::string_view& block, std::string& out);
    void goOn(std::string_view& block, std::string& out, const LossHandler& onLoss);
    std::size_t convertLossy(std::string_view block, std::string& out, const LossHandler& onLoss);
    bool loseMalformed(std::string_view& block, std::string& out, const LossHandler& onLoss);
    const std::string& writtenForBadInput();
    bool convertFast(std::string_view slice, std::string& out);
    std::size_t convertTracing(std::string_view slice, std::size_t calm, std::string& out,
                               const LossHandler& onLoss, bool& foundLoss);
    void remember(std::string_view character, std::string_view written);
    void convertWatched(std::string_view block, std::string& out, const LossHandler& onLoss);
    void convertTraced(std::string_view byte, bool flush, std::string& out);
    void showCharacters();
    void showPrefix(std::string_view bytes, std::uint64_t begin, const std::string& out, std::size_t at);
    void loseEnd(std::size_t length, std::string& out);
    detail::icu::Progress decode(const char*& source, const char* sourceEnd, bool flush);
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

    detail::icu::Converter from_;
    detail::icu::Converter to_;
    detail::Side fromSide_;
    detail::Side toSide_;
    bool hasShortcut_;
    detail::icu::Converter::Nature fromNature_;
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
    std::optional<std::string> badWritten_; // what the target has for bad input, once it was asked
    std::vector<Loss> losses_;              // which have not been reported yet
    std::exception_ptr exception_;          // that a callback could not throw through ICU
};

} // namespace kvt::ex
