// What a pattern takes from a value, field by field, and how the fields make a value. The pattern reader fills them;
// here is which of them go together, what stands for those that are not given, and what is wrong when they do not make
// up a value.
#pragma once

#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/pattern_failure.h>
#include <kvt/datetime/detail/pattern_table.h>

#include <array>
#include <cstdint>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// The fields as they were read.
class PatternFields {
public:
    bool has(Field field) const noexcept { return (given_ >> static_cast<unsigned>(field) & 1) != 0; }
    /// What stands for it where it is not given, too.
    std::int32_t get(Field field) const noexcept { return numbers_[static_cast<std::size_t>(field)]; }
    void set(Field field, std::int32_t number) noexcept {
        numbers_[static_cast<std::size_t>(field)] = number;
        given_ = static_cast<std::uint8_t>(given_ | 1u << static_cast<unsigned>(field));
    }

    /// A bit for each field that is given.
    std::uint8_t given() const noexcept { return given_; }

    bool isEpoch() const noexcept { return !epochFlag.empty(); }

    std::int64_t nanoseconds = 0;  ///< to be added; up to 1,000,000,000, and negative where `epochSeconds` is
    std::int64_t epochSeconds = 0; ///< since 1970, with an epoch flag
    std::string_view epochFlag;    ///< "%s" or "%Es" when one was read
    char meridiem = '\0';          ///< 'a' or 'p'
    bool hasOffset = false;
    std::int32_t offsetMinutes = 0;

private:
    std::array<std::int32_t, fieldCount> numbers_ = {1970, 1, 1, 0, 0, 0, 0};
    std::uint8_t given_ = 0;
};

/// What a pattern has read, with everything that it did not ask for filled in.
struct PatternReading {
    Parts parts = noPart;           ///< that the result has
    DateTimeFields fields;          ///< of the wall clock, or of UTC where seconds since 1970 were read
    std::int32_t offsetMinutes = 0; ///< as `%z` or `%Ez` read it
};

/// Makes up the value of the fields, of which a pattern asks for the parts that `reading` has; one that is to have an
/// offset needs a time. What is wrong, if anything is: FormatStringBadCombo or ParseValidation.
std::optional<PatternFailure> makeUp(PatternReading& reading, const PatternFields& fields, bool lenient);

} // namespace kvt::ex::datetime::detail
