// Comparison and hash: of the units as they are stored, never of characters.
#include <kvt/string/detail/hash_vectors.h>
#include <kvt/string/detail/instantiate.h>
#include <kvt/string/detail/unit_search.h>

#include <kvt/foundation/detail/fnv.h>

#include <algorithm>
#include <cstring>
#include <string_view>

namespace kvt::ex {
namespace {

int compareUnits(const char* left, const char* right, std::size_t count) {
    return count == 0 ? 0 : std::memcmp(left, right, count);
}

template <typename CharT>
int compareUnits(const CharT* left, const CharT* right, std::size_t count) {
    // Equal parts are passed over as bytes; the order of bytes is not that of units.
    constexpr std::size_t block = 64;
    for (; count > block && detail::sameUnits(left, right, block); count -= block) {
        left += block;
        right += block;
    }
    const auto [l, r] = std::mismatch(left, left + count, right);
    return l == left + count ? 0 : *l < *r ? -1 : 1;
}

} // namespace

template <std::uint32_t N>
int UString<N>::compare(UStringView<N> other, detail::case_sensitive_t) const noexcept {
    if (const int difference = compareUnits(rawData(), other.data(), std::min(size(), other.size()))) {
        return difference;
    }
    return size() == other.size() ? 0 : size() < other.size() ? -1 : 1;
}

template <std::uint32_t N>
std::uint64_t UString<N>::hash() const noexcept {
    const std::string_view bytes(reinterpret_cast<const char*>(rawData()), size() * sizeof(value_type));
    constexpr std::size_t few = 128; // bytes that do not repay the choice of an instruction set
    return bytes.size() < few ? detail::fnv1a(bytes)
                              : detail::vectors::fnv1a(detail::fnv1a({}), bytes.data(), bytes.size());
}

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_USTRING)

} // namespace kvt::ex
