// The engine behind the patterns of parse(): reads a value by a pattern, on bytes, element by element. readAll() reads
// all of it; to see what each element takes, call readNext().
#pragma once

#include <kvt/datetime/detail/pattern_failure.h>
#include <kvt/datetime/detail/pattern_fields.h>
#include <kvt/datetime/detail/pattern_table.h>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// The first element of a format that is not empty: a flag, a "*" with what its word has to end in, else one byte.
std::string_view elementOf(std::string_view format) noexcept;

/// Why an element did not read what stood before it.
enum class StopReason : std::uint8_t {
    None,
    EndOfValue,
    OtherCharacter,
    ValueGoesOn,
    FormatGoesOn, ///< behind a "$"
    NotANumber,
    TooFewDigits,
    OutOfBounds,
    UnknownName,
    NotAnOffset,
    WordEndsOtherwise,
    NextIsFuzzyToo,
    UnknownFlag,
    SecondsOutOfRange,
};

class PatternReader {
public:
    /// Both texts stay the caller's.
    PatternReader(std::string_view value, std::string_view format, bool lenient) noexcept
        : at_(value.data()), valueBegin_(value.data()), valueEnd_(value.data() + value.size()),
          next_(format.data()), formatBegin_(format.data()), formatEnd_(format.data() + format.size()),
          lenient_(lenient) {}

    /// Whether all elements have been read.
    bool isDone() const noexcept { return next_ == formatEnd_; }
    /// Reads the next element; false where it does not fit, and then it is still the next one.
    bool readNext();

    /// Reads all that are left, as far as the format asks for the value, and makes up `reading`; what is wrong, if
    /// anything is: ParseMismatch, ParseUnknownFlag, ParseEpochTimeRange, FormatStringBadCombo or ParseValidation.
    std::optional<PatternFailure> readAll(PatternReading& reading);

    /// Goes on by another format where a "$" has stopped this one, and both are alike up to there; else false, and
    /// nothing is done.
    bool goOnBy(std::string_view format) noexcept;

    /// Where the next element begins, in the format.
    std::size_t formatPlace() const noexcept { return static_cast<std::size_t>(next_ - formatBegin_); }
    /// What has been read of the value; behind a failure, also what the element took that failed.
    std::size_t valuePlace() const noexcept { return static_cast<std::size_t>(at_ - valueBegin_); }

    /// Only behind a failure.
    StopReason stopReason() const noexcept { return stopReason_; }

    const PatternFields& fields() const noexcept { return fields_; }
    /// The parts that a result has by the elements read so far.
    Parts parts() const noexcept;

private:
    void readPlainRun() noexcept;
    bool readSpecial(const PatternRow& row);
    bool readWord(std::string_view tail);

    bool read(const PatternRow& row);
    bool readNumber(const ReadRule& rule, bool isInRow);
    bool readSeconds(const ReadRule& rule, bool isInRow);
    bool readTime(bool isInRow);
    bool readShortMonth();
    bool readFullMonth();
    bool readMeridiem();
    bool readEpochSeconds(std::string_view flag);
    bool readOffset();

    bool isAtEnd() const noexcept { return at_ == valueEnd_; }
    std::string_view restOfFormat() const noexcept {
        return {next_, static_cast<std::size_t>(formatEnd_ - next_)};
    }
    bool take(char c) noexcept;
    std::string_view takeBytes(std::size_t count) noexcept;
    template <typename Predicate>
    std::string_view takeWhile(Predicate predicate) noexcept;
    std::int32_t takeNumber(unsigned width, bool exactWidth) noexcept;
    std::int64_t takeFraction() noexcept;
    void readFraction() noexcept;

    bool stop(StopReason reason) noexcept;
    // Made in its place in what is returned.
    std::optional<PatternFailure> failure() const;
    bool stopAtCharacter() noexcept;

    const char* at_; ///< the next byte of the value
    const char* valueBegin_;
    const char* valueEnd_;
    const char* next_; ///< the next element of the format
    const char* formatBegin_;
    const char* formatEnd_;
    bool lenient_;
    bool afterNumber_ = false;
    bool hidesFlags_ = false; ///< a word or a pair was read, which flags of the format may stand in
    Parts parts_ = noPart;    ///< of the flags that were read
    StopReason stopReason_ = StopReason::None;
    std::string_view culprit_; ///< the flag that is unknown, or the seconds that are out of range
    PatternFields fields_;
};

} // namespace kvt::ex::datetime::detail
