// An array of strings of one encoding.
#pragma once

#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>

namespace kvt::ex {

/// A kvt::ex::vector of UString<N> with its constructors.
template <std::uint32_t N>
class KVT_EXPORT UStringArray : public vector<UString<N>> {
public:
    using vector<UString<N>>::vector;

    UStringArray() = default;
    UStringArray(const UStringArray&) = default;
    UStringArray(UStringArray&&) noexcept = default;
    UStringArray& operator=(const UStringArray&) = default;
    UStringArray& operator=(UStringArray&&) noexcept = default;
    ~UStringArray() override = default;
};

} // namespace kvt::ex
