// A view of the text of a UString: a pointer and a count of code units, not owning.
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/string_view.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <type_traits>

namespace kvt::ex {

template <std::uint32_t N>
class UString;

namespace detail {

/// The code unit in which text of encoding `N` is stored.
template <std::uint32_t N>
using CodeUnit = std::conditional_t<N == Encoding::Utf16LE, char16_t,
                                    std::conditional_t<N == Encoding::Utf32LE, char32_t, char>>;

/// The unit of a literal u8"", which is a type of its own since C++20.
using Utf8Unit = std::remove_const_t<std::remove_reference_t<decltype(u8""[0])>>;
template <typename Unit, typename Stored = char>
using OnlyUtf8 = std::enable_if_t<
    std::is_same_v<Unit, Utf8Unit> && !std::is_same_v<Unit, char> && std::is_same_v<Stored, char>, int>;

} // namespace detail

/// Views text of encoding `N`. It does not keep the string alive, is not zero-terminated in general, and has no
/// encoding of its own for `N` 30: an operation that needs one takes it from the UString<30> it is called on.
template <std::uint32_t N>
class UStringView {
public:
    using value_type = detail::CodeUnit<N>;
    using const_iterator = const value_type*;
    using iterator = const_iterator;

    constexpr UStringView() noexcept = default;
    constexpr UStringView(const value_type* data, std::size_t size) noexcept : data_(data), size_(size) {}
    /// Up to the terminating zero, which is not part of the view.
    constexpr UStringView(const value_type* text)
        : UStringView(kvt::future::basic_string_view<value_type>(text)) {}
    UStringView(std::nullptr_t) = delete;
    /// The same for a literal u8"", when the units have 8 bits.
    template <typename Unit, detail::OnlyUtf8<Unit, value_type> = 0>
    UStringView(const Unit* text) : UStringView(reinterpret_cast<const char*>(text)) {}
    constexpr UStringView(kvt::future::basic_string_view<value_type> view) noexcept
        : data_(view.data()), size_(view.size()) {}
    UStringView(const std::basic_string<value_type>& string) noexcept
        : data_(string.data()), size_(string.size()) {}
    UStringView(const UString<N>& string) noexcept : data_(string.rawData()), size_(string.size()) {}

    constexpr operator kvt::future::basic_string_view<value_type>() const noexcept { return {data_, size_}; }

    /// The first code unit; may be null when the view is empty.
    constexpr const value_type* data() const noexcept { return data_; }
    /// The number of code units.
    constexpr std::size_t size() const noexcept { return size_; }
    constexpr bool isEmpty() const noexcept { return size_ == 0; }
    constexpr const_iterator begin() const noexcept { return data_; }
    constexpr const_iterator end() const noexcept { return data_ + size_; }
    /// Not checked: `index` must be below size().
    constexpr value_type operator[](std::size_t index) const noexcept { return data_[index]; }

private:
    const value_type* data_ = nullptr;
    std::size_t size_ = 0;
};

} // namespace kvt::ex
