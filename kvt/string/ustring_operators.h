// Operators between a string and what people put beside it: literals, std::string, views, single units, and strings
// of another encoding. ustring.h includes this header; the operators on two strings of one type are members there.
//
// Beside a UString<N>, each thing is what a constructor or an editing member makes of it:
//
//     const char*                        UTF-8, converted to the string's encoding; a UString<28> and a UString<30>
//                                        take the bytes
//     what converts to UStringView<N>    units of the string's encoding, as they are
//     UString<M>                         converted to the encoding of the string on the left
//
// Beside a UStringView<N> stand units of its encoding only. Whatever converts can fail as a conversion does.
#pragma once

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/string_view.h>
#include <kvt/string/ustring_view.h>

#include <cstdint>
#include <iosfwd>
#include <type_traits>

#ifdef __cpp_impl_three_way_comparison
#include <compare>
#endif

namespace kvt::ex {
namespace detail {

/// The `N` of strings, classes derived from them included, and of views; noEncoding for every other type.
constexpr std::uint32_t noEncoding = 0xFFFFFFFF;

template <std::uint32_t N>
std::integral_constant<std::uint32_t, N> encodingOfString(const UString<N>*);
std::integral_constant<std::uint32_t, noEncoding> encodingOfString(...);
template <typename T>
constexpr std::uint32_t stringEncoding = decltype(encodingOfString(static_cast<T*>(nullptr)))::value;
template <typename T>
constexpr bool isString = stringEncoding<T> != noEncoding;

template <typename T>
constexpr std::uint32_t viewEncoding = noEncoding;
template <std::uint32_t N>
constexpr std::uint32_t viewEncoding<UStringView<N>> = N;

/// Zero-terminated UTF-8.
template <typename T, typename Pointer = std::decay_t<const T&>>
constexpr bool isLiteral = std::is_pointer_v<Pointer> &&
                           (std::is_same_v<std::remove_cv_t<std::remove_pointer_t<Pointer>>, char> ||
                            std::is_same_v<std::remove_cv_t<std::remove_pointer_t<Pointer>>, Utf8Unit>);
/// Text that is in units of encoding `N` already.
template <std::uint32_t N, typename T>
constexpr bool isUnits = std::is_convertible_v<const T&, UStringView<N>>;
/// What can stand beside a UString<N> as text and is not a string itself.
template <std::uint32_t N, typename T>
constexpr bool isText = !isString<T> && (isLiteral<T> || isUnits<N, T>);

/// The encoding in which the operators below compare, noEncoding when they do not. Strings of one type are left to the
/// members.
template <typename L, typename R>
constexpr std::uint32_t comparedIn() {
    constexpr std::uint32_t left = isString<L> ? stringEncoding<L> : viewEncoding<L>;
    constexpr std::uint32_t right = isString<R> ? stringEncoding<R> : viewEncoding<R>;
    if constexpr (isString<L> && isString<R>) {
        return left != right ? left : noEncoding;
    } else if constexpr (isString<L>) {
        return isText<left, R> ? left : noEncoding;
    } else if constexpr (isString<R>) {
        return isText<right, L> ? right : noEncoding;
    } else if constexpr (left != noEncoding) {
        return isUnits<left, R> ? left : noEncoding;
    } else if constexpr (right != noEncoding) {
        return isUnits<right, L> ? right : noEncoding;
    } else {
        return noEncoding;
    }
}
template <typename L, typename R>
using Comparable = std::enable_if_t<comparedIn<L, R>() != noEncoding, int>;

/// The operand as text of encoding `N`: a string where it has to be converted, else a view. A literal beside a view is
/// units of that view's encoding.
template <std::uint32_t N, bool IsBesideView, typename T>
auto operandText(const T& operand) {
    constexpr bool takesBytes = N == Encoding::Utf8 || N == Encoding::Binary || N == Encoding::Unknown;
    if constexpr (isString<T> ? stringEncoding<T> != N : isLiteral<T> && !takesBytes && !IsBesideView) {
        return UString<N>(operand);
    } else {
        return UStringView<N>(operand);
    }
}

template <typename L, typename R>
int compareOperands(const L& left, const R& right) {
    constexpr std::uint32_t N = comparedIn<L, R>();
    constexpr bool areViews = !isString<L> && !isString<R>;
    const auto leftText = operandText<N, areViews>(left);
    const auto rightText = operandText<N, areViews>(right);
    using View = kvt::future::basic_string_view<CodeUnit<N>>;
    return View(leftText).compare(View(rightText));
}

/// What can be added to a UString<N>.
template <std::uint32_t N, typename T>
constexpr bool isUnit = std::is_same_v<T, CodeUnit<N>>;
template <std::uint32_t N, typename T>
using Addable = std::enable_if_t<isUnit<N, T> || isText<N, T>, int>;

/// What can be added to a UStringView<N>: what is in its units already. A UStringView<30> would make a string of no
/// encoding.
template <std::uint32_t N, typename T>
using AddableToView =
    std::enable_if_t<N != Encoding::Unknown && !isString<T> && (isUnit<N, T> || isUnits<N, T>), int>;
template <std::uint32_t N, typename T>
using AddableBeforeView = std::enable_if_t<viewEncoding<T> == noEncoding, AddableToView<N, T>>;

} // namespace detail

/// By units, as the members of UString do it.
template <typename L, typename R, detail::Comparable<L, R> = 0>
bool operator==(const L& left, const R& right) {
    return detail::compareOperands(left, right) == 0;
}
template <typename L, typename R, detail::Comparable<L, R> = 0>
bool operator!=(const L& left, const R& right) {
    return detail::compareOperands(left, right) != 0;
}
template <typename L, typename R, detail::Comparable<L, R> = 0>
bool operator<(const L& left, const R& right) {
    return detail::compareOperands(left, right) < 0;
}
template <typename L, typename R, detail::Comparable<L, R> = 0>
bool operator>(const L& left, const R& right) {
    return detail::compareOperands(left, right) > 0;
}
template <typename L, typename R, detail::Comparable<L, R> = 0>
bool operator<=(const L& left, const R& right) {
    return detail::compareOperands(left, right) <= 0;
}
template <typename L, typename R, detail::Comparable<L, R> = 0>
bool operator>=(const L& left, const R& right) {
    return detail::compareOperands(left, right) >= 0;
}

#ifdef __cpp_impl_three_way_comparison
/// The same order. Equal strings of run-time encodings need not be the same text.
template <std::uint32_t N>
auto operator<=>(const UString<N>& left, const UString<N>& right) noexcept
    -> std::conditional_t<N == Encoding::Unknown, std::weak_ordering, std::strong_ordering> {
    return left.compare(right) <=> 0;
}
#endif

/// Text or a single unit at the end of a string. The encoding of a UString<30> stays, and is the one of a sum,
/// whichever side it stands on.
template <std::uint32_t N, typename T, detail::Addable<N, T> = 0>
UString<N>& operator+=(UString<N>& string, const T& end) {
    if constexpr (detail::isUnit<N, T>) {
        string.push_back(end);
    } else {
        string.append(detail::operandText<N, false>(end));
    }
    return string;
}
template <std::uint32_t N, typename T, detail::Addable<N, T> = 0>
UString<N> operator+(const UString<N>& left, const T& right) {
    UString<N> sum(left);
    sum += right;
    return sum;
}
template <std::uint32_t N, typename T, detail::Addable<N, T> = 0>
UString<N> operator+(const T& left, const UString<N>& right) {
    UString<N> sum(right);
    if constexpr (detail::isUnit<N, T>) {
        sum.insert(0, left);
    } else {
        sum.prepend(detail::operandText<N, false>(left));
    }
    return sum;
}

/// A string of a view and of what is added to it.
template <std::uint32_t N, typename T, detail::AddableToView<N, T> = 0>
UString<N> operator+(UStringView<N> left, const T& right) {
    UString<N> sum(left);
    if constexpr (detail::isUnit<N, T>) {
        sum.push_back(right);
    } else {
        sum.append(right);
    }
    return sum;
}
template <std::uint32_t N, typename T, detail::AddableBeforeView<N, T> = 0>
UString<N> operator+(const T& left, UStringView<N> right) {
    UString<N> sum(right);
    if constexpr (detail::isUnit<N, T>) {
        sum.insert(0, left);
    } else {
        sum.prepend(left);
    }
    return sum;
}

/// Writes a view as a string of its encoding is written. A UStringView<30> has none.
template <std::uint32_t N, std::enable_if_t<N != Encoding::Unknown, int> = 0>
std::ostream& operator<<(std::ostream& stream, UStringView<N> view) {
    return stream << UString<N>(view);
}

} // namespace kvt::ex
