// The engine behind the patterns of format(): writes an instant by a pattern.
#pragma once

#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/nano_count.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// Text in the making: in place as long as it is short, which saves an allocation for nearly every value.
class PatternText {
public:
    void put(std::string_view text);
    void put(char c) { put(std::string_view(&c, 1)); }
    /// In decimal, with leading zeros up to `width`, at most 20 digits.
    void putNumber(std::uint64_t number, unsigned width);

    std::string_view view() const noexcept {
        return long_.empty() ? std::string_view(short_.data(), size_) : std::string_view(long_);
    }

private:
    std::array<char, 256> short_;
    std::size_t size_ = 0; ///< of short_, as long as long_ is empty
    std::string long_;
};

/// Writes the wall clock `count` by a pattern all of whose flags are known; what is no flag is copied. Fails by
/// FormatFlag where a flag asks for an offset that is not there, or for none, and by FormatStringBadCombo.
std::optional<Failure> renderFields(PatternText& out, std::string_view format, const NanoCount& count,
                                    std::optional<std::int32_t> offsetMinutes);

} // namespace kvt::ex::datetime::detail
