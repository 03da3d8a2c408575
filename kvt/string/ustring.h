// The string of the library: text whose encoding is part of its type.
//
// UString<N> stores the code units of encoding `N`, a value of Encoding::Type. Eight instantiations exist:
//
//     0  Utf8String     char      UTF-8               27  SystemString  char  the encoding of the locale
//     1  AsciiString    char      seven-bit text      28  BinaryString  char  bytes without a text meaning
//     2  Utf16String    char16_t  UTF-16              29  WwjdString    char  tokens in ASCII, see wwjd.h
//     3  Utf32String    char32_t  UTF-32              30  AnyString     char  bytes in an encoding that the object
//                                                                             holds at run time
//
// All other encodings live in a UString<30>. Each string can be made from each other one; that converts, and what
// cannot be converted is reported by a failure that carries the substituted text (throwable.h).
//
// Every size and position is a number of code units, never of characters; the one exception is the length of the
// constructor from bytes. A string is a value: concurrent reads are safe, a write needs the caller's exclusion. It
// must not be relocated bytewise, because it holds a pointer to itself.
#pragma once

#include <kvt/codec/string_adaptors.h>
#include <kvt/encoding/encoding.h>
#include <kvt/foundation/export.h>
#include <kvt/foundation/optional.h>
#include <kvt/foundation/vector.h>
#include <kvt/string/ustring_operators.h>
#include <kvt/string/ustring_storage.h>
#include <kvt/string/ustring_view.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <initializer_list>
#include <iosfwd>
#include <limits>
#include <string>
#include <type_traits>
#include <utility>

namespace kvt::ex {
namespace detail {

/// Tags that choose between the overloads of comparisons, searches and replacements.
struct case_sensitive_t {};
struct case_insensitive_t {};

} // namespace detail

template <std::uint32_t N>
class UStringArray;

template <std::uint32_t N>
class KVT_EXPORT UString : private detail::UStringFields<N> {
    using Fields = detail::UStringFields<N>;
    template <std::uint32_t>
    friend class UString;

    template <std::uint32_t M>
    using OnlyAny = std::enable_if_t<M == Encoding::Unknown, int>;
    template <std::uint32_t M>
    using OnlyFixed = std::enable_if_t<M != Encoding::Unknown, int>;
    template <std::uint32_t M>
    using OnlyWide = std::enable_if_t<sizeof(detail::CodeUnit<M>) != 1, int>;
    template <std::uint32_t M>
    using OnlyNarrow = std::enable_if_t<sizeof(detail::CodeUnit<M>) == 1, int>;
    // Nothing else becomes a unit on the way.
    template <typename Unit>
    using OnlyUnit = std::enable_if_t<std::is_same_v<Unit, detail::CodeUnit<N>>, int>;

public:
    /// The code unit.
    using value_type = detail::CodeUnit<N>;
    using const_iterator = const value_type*;
    using iterator = const_iterator;
    using size_type = std::size_t;

    /// The template argument.
    static constexpr std::uint32_t encodingType = N;
    /// Not found, or up to the end.
    static constexpr std::size_t npos = std::numeric_limits<std::size_t>::max();
    /// Tags to pass to comparisons and searches. Bytes without a text meaning have no case, so that both tags of
    /// UString<28> select the case-sensitive forms.
    static constexpr detail::case_sensitive_t case_sensitive{};
    static constexpr std::conditional_t<N == Encoding::Binary, detail::case_sensitive_t,
                                        detail::case_insensitive_t>
        case_insensitive{};

    /// Empty. A UString<30> carries `Unknown`, with which it cannot be converted.
    UString() = default;

    /// From zero-terminated UTF-8. A UString<28> takes the bytes, a UString<30> takes them labelled `Utf8`. Fails as
    /// the next constructor.
    UString(const char* text) : UString(text, std::char_traits<char>::length(text), Encoding::Utf8) {}
    template <typename Unit, detail::OnlyUtf8<Unit> = 0>
    UString(const Unit* text) : UString(reinterpret_cast<const char*>(text)) {}
    UString(std::nullptr_t) = delete;

    /// From `byteLength` bytes of text in `from`, which are copied without a look at them when that is this
    /// string's own encoding (an incomplete last unit is dropped), and converted otherwise. A UString<28> takes the
    /// bytes as they are; a UString<30> takes them and carries `from`.
    /// Throws what a conversion throws: UStringBadEncodingException (910002), UStringTranscodingException (910003),
    /// UStringBinaryTranscodingException (910004) from `Binary`, InvalidEncodingException (910005) from `Unknown`,
    /// std::invalid_argument from `Wwjd` with a token such as `<uzzzz>`.
    UString(const char* data, std::size_t byteLength, Encoding from = Encoding::Utf8);

    // The number of an encoding would pass for a length.
    UString(const char*, Encoding) = delete;
    UString(const char*, Encoding::Type) = delete;

    /// From a view of units of the same encoding, which are copied as they are.
    template <std::uint32_t M = N, OnlyFixed<M> = 0>
    explicit UString(UStringView<N> view) {
        this->storage_.assign(view.data(), view.size());
    }
    template <std::uint32_t M = N, OnlyAny<M> = 0>
    UString(UStringView<N> view, Encoding encoding) {
        this->storage_.assign(view.data(), view.size());
        this->encoding_ = encoding;
    }

    /// From `count` units of the same encoding, or from those up to a terminating zero, which are copied as they are.
    /// Only for UTF-16 and UTF-32.
    template <std::uint32_t M = N, OnlyWide<M> = 0>
    UString(const value_type* units, std::size_t count) {
        this->storage_.assign(units, count);
    }
    template <std::uint32_t M = N, OnlyWide<M> = 0>
    UString(const value_type* text) {
        this->storage_.assign(text);
    }

    /// Empty, in the given encoding. Only for UString<30>.
    template <std::uint32_t M = N, OnlyAny<M> = 0>
    explicit UString(Encoding encoding) {
        init(encoding);
    }

    /// From a string of another encoding, by conversion; fails as the constructor from bytes. A UString<30> takes
    /// the units as they are, together with the encoding of `other`, except that UString<28> has none to give:
    /// UStringBinaryTranscodingException (910004).
    template <std::uint32_t M, std::enable_if_t<M != N, int> = 0>
    UString(const UString<M>& other) {
        init(other);
    }

    /// Copies and moves keep the units and, for UString<30>, take over the encoding of the source; they never
    /// convert. A moved-from string is empty and a UString<30> keeps its encoding.
    UString(const UString&) = default;
    UString(UString&&) noexcept = default;
    UString& operator=(const UString&) = default;
    UString& operator=(UString&&) noexcept = default;
    ~UString() = default;

    /// Replaces the text by that of `other`, converted into this string's encoding. On a UString<30> that is the
    /// encoding which the object holds, and it keeps it, where plain assignment would take over that of the source.
    /// Fails as the constructor from bytes. The string then holds the substituted text that the failure carries; it is
    /// unchanged when no text came that far: from `Binary`, from wwjd text that cannot be decoded, to `Wwjd`, and
    /// where an encoding is unknown.
    template <std::uint32_t M>
    UString& assign(const UString<M>& other);

    /// The number of code units.
    std::size_t size() const noexcept { return this->storage_.size(); }
    bool isEmpty() const noexcept { return this->storage_.empty(); }
    /// The first code unit; a zero unit stands behind the last one. Valid until the string next changes.
    const value_type* rawData() const noexcept { return this->storage_.data(); }
    const value_type* begin() const noexcept { return this->storage_.data(); }
    const value_type* end() const noexcept { return this->storage_.data() + this->storage_.size(); }
    /// Not checked: the string must not be empty.
    value_type front() const noexcept { return *begin(); }
    value_type back() const noexcept { return *(end() - 1); }
    /// Not checked: `index` must be below size().
    value_type operator[](std::size_t index) const noexcept { return begin()[index]; }
    value_type& operator[](std::size_t index) noexcept { return this->storage_.data()[index]; }

    /// Makes the string empty; it keeps its memory and, for UString<30>, its encoding.
    void clear() noexcept { this->storage_.clear(); }

    /// The run-time encoding of a UString<30>, else the one of the type.
    Encoding encoding() const noexcept { return Fields::encoding(); }
    /// Relabels a UString<30> without converting it.
    template <std::uint32_t M = N, OnlyAny<M> = 0>
    void setEncoding(Encoding encoding) noexcept {
        this->encoding_ = encoding;
    }

    /// This string as the host's interface sees it. The reference is to a part of this object.
    IZQTString& getAsIZQTString() noexcept { return this->adaptor_; }
    const IZQTString& getAsIZQTString() const noexcept { return this->adaptor_; }

    /// Copies in other encodings; they fail as the constructor from bytes.
    UString<0> getAsUtf8() const;
    UString<2> getAsUtf16() const;
    UString<3> getAsUtf32() const;
    UString<27> getAsSystem() const;
    UString<30> getAsEncoding(Encoding encoding) const;

    /// The units; valid as a UStringView of this string is.
    operator kvt::future::basic_string_view<value_type>() const noexcept { return this->storage_; }
    /// The units of an 8-bit string.
    template <std::uint32_t M = N, OnlyNarrow<M> = 0>
    std::string toStdString() const {
        return this->storage_;
    }

    // ---- Comparison and search
    //
    // They look at code units, never at characters, and nothing in them converts. The forms with the tag
    // case_insensitive fold both sides each time (see getAsFoldedCase()) and then do the same on the folded copies:
    // a position that they take or return is one of the folded text, which may have more units than the stored one.
    // They fail as getAsFoldedCase(): always on UString<30> and, given a true case_insensitive_t, on UString<28>.
    // The others never fail, whatever the position.

    /// Negative, zero or positive as this string's units come before, equal or follow those of `other`, compared as
    /// unsigned numbers; a prefix comes first. UTF-16 is ordered by unit, not by code point.
    int compare(UStringView<N> other, detail::case_sensitive_t = {}) const noexcept;
    int compare(UStringView<N> other, detail::case_insensitive_t) const;

    /// An empty needle is contained in every string, at its beginning and at its end.
    bool beginsWith(UStringView<N> needle, detail::case_sensitive_t = {}) const noexcept;
    bool beginsWith(UStringView<N> needle, detail::case_insensitive_t) const;
    bool endsWith(UStringView<N> needle, detail::case_sensitive_t = {}) const noexcept;
    bool endsWith(UStringView<N> needle, detail::case_insensitive_t) const;
    bool contains(UStringView<N> needle, detail::case_sensitive_t = {}) const noexcept {
        return find(needle) != npos;
    }
    bool contains(UStringView<N> needle, detail::case_insensitive_t tag) const {
        return find(needle, 0, tag) != npos;
    }
    template <typename Unit, OnlyUnit<Unit> = 0>
    bool beginsWith(Unit unit) const noexcept {
        return !isEmpty() && front() == unit;
    }
    template <typename Unit, OnlyUnit<Unit> = 0>
    bool endsWith(Unit unit) const noexcept {
        return !isEmpty() && back() == unit;
    }
    template <typename Unit, OnlyUnit<Unit> = 0>
    bool contains(Unit unit) const noexcept {
        return find(unit) != npos;
    }

    /// The first position at or after `pos` where the needle begins, else npos. An empty needle is found at `pos`
    /// itself up to the size.
    std::uint64_t find(UStringView<N> needle, std::uint64_t pos = 0,
                       detail::case_sensitive_t = {}) const noexcept;
    std::uint64_t find(UStringView<N> needle, std::uint64_t pos, detail::case_insensitive_t) const;
    std::uint64_t find(value_type unit, std::uint64_t pos = 0) const noexcept;

    /// The last position at or before `pos` where the needle begins, else npos. An empty needle is found at the
    /// smaller of `pos` and the size.
    std::uint64_t rfind(UStringView<N> needle, std::uint64_t pos = npos,
                        detail::case_sensitive_t = {}) const noexcept;
    std::uint64_t rfind(UStringView<N> needle, std::uint64_t pos, detail::case_insensitive_t) const;
    std::uint64_t rfind(value_type unit, std::uint64_t pos = npos) const noexcept;

    /// The first position at or after `pos`, or the last one at or before it, whose unit is in the set; else npos.
    std::uint64_t findFirstOf(const vector<value_type>& set, std::uint64_t pos = 0) const noexcept;
    std::uint64_t findLastOf(const vector<value_type>& set, std::uint64_t pos = npos) const noexcept;

    /// The first position at or after `pos` and below the size where any of the strings begins, else npos.
    std::uint64_t findFirstOf(const UStringArray<N>& needles, std::uint64_t pos = 0) const noexcept;
    /// The last position *below* `pos` where any of the strings begins, else npos. `pos` itself is not looked at,
    /// unlike with a set of units; the match may run on past it.
    std::uint64_t findLastOf(const UStringArray<N>& needles, std::uint64_t pos = npos) const noexcept;

    /// The same for units and texts in braces, {',', ';'} and {"and", "or"}, which would fit more than one of these.
    template <typename = void>
    std::uint64_t findFirstOf(std::initializer_list<value_type> set, std::uint64_t pos = 0) const noexcept {
        return firstOfAll(set, pos);
    }
    template <typename = void>
    std::uint64_t findLastOf(std::initializer_list<value_type> set, std::uint64_t pos = npos) const noexcept {
        return lastOfAll(set, pos);
    }
    template <typename = void>
    std::uint64_t findFirstOf(std::initializer_list<UStringView<N>> needles,
                              std::uint64_t pos = 0) const noexcept {
        return pos < size() ? firstOfAll(needles, pos) : npos;
    }
    template <typename = void>
    std::uint64_t findLastOf(std::initializer_list<UStringView<N>> needles,
                             std::uint64_t pos = npos) const noexcept {
        const std::uint64_t end = std::min<std::uint64_t>(pos, size());
        return end != 0 ? lastOfAll(needles, end - 1) : npos;
    }

    /// Comparisons of the units alone: the encoding of a UString<30> takes no part.
    bool operator==(const UString& other) const noexcept { return compare(other) == 0; }
    bool operator!=(const UString& other) const noexcept { return compare(other) != 0; }
    bool operator<(const UString& other) const noexcept { return compare(other) < 0; }
    bool operator>(const UString& other) const noexcept { return compare(other) > 0; }
    bool operator<=(const UString& other) const noexcept { return compare(other) <= 0; }
    bool operator>=(const UString& other) const noexcept { return compare(other) >= 0; }

    /// 64-bit FNV-1a over the bytes of the units in memory order.
    std::uint64_t hash() const noexcept;

    // ---- Editing
    //
    // Positions and counts are code units; a multi-byte character may be cut. A view may be one of this string's own
    // text. The encoding of a UString<30> stays and what is put in is taken as it is.
    // A position beyond the size throws std::out_of_range "invalid string position", a result beyond the largest
    // size std::length_error "string too long", and lack of memory std::bad_alloc; the string is then unchanged.

    UString& append(UStringView<N> text);
    UString& operator+=(const UString& other) { return append(other); }
    UString& prepend(UStringView<N> text) { return insert(0, text); }
    UString& insert(std::uint64_t pos, UStringView<N> text);
    UString& insert(std::uint64_t pos, value_type unit);
    /// Up to `count` units from `pos`, as many as there are, go.
    UString& erase(std::uint64_t pos, std::uint64_t count = npos);
    UString& replace(std::uint64_t pos, std::uint64_t count, UStringView<N> text);
    void push_back(value_type unit);
    /// Cuts the string, or fills it up to `size` units.
    void resize(std::uint64_t size, value_type unit = value_type());

    /// A view of up to `count` units from `pos`, empty at the end when `pos` is beyond it; it never fails, and is
    /// valid until the string next changes.
    UStringView<N> substr(std::uint64_t pos, std::uint64_t count = npos) const noexcept {
        const std::size_t start = pos < size() ? pos : size();
        return {begin() + start, count < size() - start ? count : size() - start};
    }

    /// Both texts in a new string, which has the encoding of the left one.
    UString operator+(const UString& other) const;

    /// Replaces each `from`, searched from the left and behind what was put in. Nothing happens when there is none.
    /// `from` must not be empty, unless the string is: an empty one is found for ever.
    /// The case-insensitive form replaces, at the position found in the folded text, as many units as `from` has;
    /// where folding changes the number of units those are the wrong ones. Its time grows with the square of the
    /// length. On UString<28> it is the same as the case-sensitive form.
    UString& replaceAll(UStringView<N> from, UStringView<N> to, detail::case_sensitive_t = {});
    UString& replaceAll(UStringView<N> from, UStringView<N> to, detail::case_insensitive_t);
    /// Replace the first or the last `from`; unlike replaceAll() they throw std::out_of_range "invalid string
    /// position" when there is none.
    UString& replaceFirst(UStringView<N> from, UStringView<N> to, detail::case_sensitive_t = {});
    UString& replaceFirst(UStringView<N> from, UStringView<N> to, detail::case_insensitive_t);
    UString& replaceLast(UStringView<N> from, UStringView<N> to, detail::case_sensitive_t = {});
    UString& replaceLast(UStringView<N> from, UStringView<N> to, detail::case_insensitive_t);

    /// Replaces each unit that equals `from`, or that is in the set.
    UString& replaceAll(value_type from, value_type to) noexcept;
    UString& replaceAll(const vector<value_type>& set, value_type to) noexcept;
    /// Drops each unit that equals `unit`.
    UString& removeAll(value_type unit) noexcept;
    /// Drops units in the set from the front only, and from the back only.
    UString& strip(const vector<value_type>& set) noexcept;
    UString& rstrip(const vector<value_type>& set) noexcept;

    // ---- Case
    //
    // UTF-8 and UTF-16 are mapped by ICU, with its default locale for upper and lower case and full case folding;
    // UString<1> maps the ASCII letters only and never fails; 3, 27 and 29 go by way of UTF-16 and fail as that
    // conversion does. UString<28> throws UStringNotImplementedException with the member's name. UString<30> throws
    // InvalidEncodingException (910005, %0 = "unknown"), whatever its encoding: convert it first. ICU's own failures
    // come as UStringException. A failure leaves the string unchanged, and one on UTF-8 or UTF-16 carries a line with
    // the text.
    //
    // A result of UTF-8 or UTF-16 is never shorter than its source: where the mapping shrinks (the Kelvin sign folds
    // to "k"), zero units fill it up, which count as units of the text.

    void toUpperCase();
    void toLowerCase();
    void toFoldedCase();
    UString getAsUpperCase() const;
    UString getAsLowerCase() const;
    UString getAsFoldedCase() const;
    static UString getAsUpperCase(UStringView<N> text);
    static UString getAsLowerCase(UStringView<N> text);
    static UString getAsFoldedCase(UStringView<N> text);

    // ---- Split (include ustring_array.h for the result)

    /// What happens to empty pieces. Any value but 0 skips them.
    enum SplitBehaviour : std::uint32_t { KeepEmptyParts = 0, SkipEmptyParts = 1 };

    /// Cuts the string at each delimiter: a unit, any unit of a set, a string, or any string of an array. At most
    /// `maxCount` pieces are cut off, skipped ones not counted; what is left then is one more piece, whatever it
    /// holds. Of a delimiter only the first unit is consumed, also where it has more: "axyb" at "xy" gives "a" and
    /// "yb". Pieces of a UString<30> carry `Unknown`. Throws std::length_error "vector<T> too long".
    UStringArray<N> split(value_type delimiter, SplitBehaviour behaviour = KeepEmptyParts,
                          std::uint64_t maxCount = npos) const;
    UStringArray<N> split(const vector<value_type>& delimiters, SplitBehaviour behaviour = KeepEmptyParts,
                          std::uint64_t maxCount = npos) const;
    UStringArray<N> split(UStringView<N> delimiter, SplitBehaviour behaviour = KeepEmptyParts,
                          std::uint64_t maxCount = npos) const;
    UStringArray<N> split(const UStringArray<N>& delimiters, SplitBehaviour behaviour = KeepEmptyParts,
                          std::uint64_t maxCount = npos) const;
    /// The same for units and texts in braces.
    template <typename = void>
    UStringArray<N> split(std::initializer_list<value_type> delimiters,
                          SplitBehaviour behaviour = KeepEmptyParts, std::uint64_t maxCount = npos) const {
        return split(vector<value_type>(delimiters), behaviour, maxCount);
    }
    template <typename = void>
    UStringArray<N> split(std::initializer_list<UStringView<N>> delimiters,
                          SplitBehaviour behaviour = KeepEmptyParts, std::uint64_t maxCount = npos) const {
        UStringArray<N> strings;
        for (const UStringView<N> delimiter : delimiters) {
            strings.emplace_back().append(delimiter);
        }
        return split(strings, behaviour, maxCount);
    }

    // ---- Numbers

    /// The decimal text of an integer, or the shortest text of a floating-point number as float_text.h writes it.
    /// A UString<30> is labelled `UsAscii`.
    template <typename Number, std::enable_if_t<std::is_arithmetic_v<Number>, int> = 0>
    static UString fromNumber(Number number) {
        static_assert(!std::is_same_v<Number, long double>, "there is no shortest text of a long double");
        if constexpr (std::is_floating_point_v<Number>) {
            return fromNumber_helper(number);
        } else if constexpr (std::is_signed_v<Number>) {
            return fromNumber_helper(static_cast<std::int64_t>(number));
        } else {
            return fromNumber_helper(static_cast<std::uint64_t>(number));
        }
    }

    /// The integer at the beginning of the text, by the rules of strtoll and strtoull: white space and a sign before
    /// it and anything behind it are passed over, and a negative number wraps when unsigned. Empty when there is no
    /// digit or the number is out of range. Fails as getAsUtf8().
    kvt::future::optional<std::int64_t> asSigned() const { return toSigned(); }
    kvt::future::optional<std::uint64_t> asUnsigned() const { return toUnsigned(); }

    /// The text of a foreign string, converted from `encoding`; a UString<30> takes the bytes and carries
    /// `encoding`. Fails as the constructor from bytes.
    static UString fromIZQTString(const IZQTString& string, Encoding encoding) {
        return UString(string.data(), string.byteLength(), encoding);
    }

protected:
    /// The initialisers behind the constructors, for derived classes. They set up a new object: init() an empty
    /// string (on a UString<30> it does nothing), the others from units or from another string, with the rules and
    /// failures of the constructor from a string of that encoding.
    void init() noexcept {
        if constexpr (N != Encoding::Unknown) {
            this->storage_.clear();
        }
    }
    template <std::uint32_t M = N, OnlyAny<M> = 0>
    void init(Encoding encoding) noexcept {
        this->storage_.clear();
        this->encoding_ = encoding;
    }
    void init(const char16_t* data, std::size_t units);
    void init(const char32_t* data, std::size_t units);
    template <std::uint32_t M>
    void init(const UString<M>& other);

private:
    // The first or last place that find() or rfind() has for any of the needles.
    template <typename Needle>
    std::uint64_t firstOfAll(std::initializer_list<Needle> needles, std::uint64_t pos) const noexcept {
        std::uint64_t first = npos;
        for (const Needle needle : needles) {
            first = std::min(first, find(needle, pos));
        }
        return first;
    }
    template <typename Needle>
    std::uint64_t lastOfAll(std::initializer_list<Needle> needles, std::uint64_t pos) const noexcept {
        std::uint64_t behindLast = 0; // one more than the place, so that npos is the smallest
        for (const Needle needle : needles) {
            behindLast = std::max(behindLast, rfind(needle, pos) + 1);
        }
        return behindLast - 1;
    }

    static UString fromNumber_helper(std::int64_t number);
    static UString fromNumber_helper(std::uint64_t number);
    static UString fromNumber_helper(double number);
    static UString fromNumber_helper(float number);
    kvt::future::optional<std::int64_t> toSigned() const;
    kvt::future::optional<std::uint64_t> toUnsigned() const;

    template <std::uint32_t M = N, OnlyAny<M> = 0>
    Encoding lookupEncoding() const noexcept {
        return this->encoding_;
    }
};

/// Writes the text as UTF-8; the bytes of a UString<28> with everything beyond printable ASCII as `\xHH`. Fails as
/// getAsUtf8(), with nothing written.
template <std::uint32_t N>
std::ostream& operator<<(std::ostream& stream, const UString<N>& string);

using Utf8String = UString<Encoding::Utf8>;
using AsciiString = UString<Encoding::UsAscii>;
using Utf16String = UString<Encoding::Utf16LE>;
using Utf32String = UString<Encoding::Utf32LE>;
using SystemString = UString<Encoding::System>;
using BinaryString = UString<Encoding::Binary>;
using WwjdString = UString<Encoding::Wwjd>;
using AnyString = UString<Encoding::Unknown>;

extern template class KVT_EXPORT UString<0>;
extern template class KVT_EXPORT UString<1>;
extern template class KVT_EXPORT UString<2>;
extern template class KVT_EXPORT UString<3>;
extern template class KVT_EXPORT UString<27>;
extern template class KVT_EXPORT UString<28>;
extern template class KVT_EXPORT UString<29>;
extern template class KVT_EXPORT UString<30>;

} // namespace kvt::ex

template <std::uint32_t N>
struct std::hash<kvt::ex::UString<N>> {
    std::size_t operator()(const kvt::ex::UString<N>& string) const noexcept { return string.hash(); }
};
