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
#include <kvt/string/ustring_view.h>

#include <cstddef>
#include <cstdint>
#include <functional>
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

/// What every string of unit `T` is made of: the units and, by value, the table through which a host reaches them.
/// The table of an object always stands for the storage of that object and is never copied.
template <typename T>
class UStringStorage {
public:
    UStringStorage() : adaptor_(storage_) {}
    UStringStorage(const UStringStorage& other) : storage_(other.storage_), adaptor_(storage_) {}
    UStringStorage(UStringStorage&& other) noexcept : storage_(std::move(other.storage_)), adaptor_(storage_) {
        other.storage_.clear();
    }
    UStringStorage& operator=(const UStringStorage& other) {
        storage_ = other.storage_;
        return *this;
    }
    UStringStorage& operator=(UStringStorage&& other) noexcept {
        if (this != &other) {
            storage_ = std::move(other.storage_);
            other.storage_.clear();
        }
        return *this;
    }
    ~UStringStorage() = default;

    std::basic_string<T> storage_;
    IZQTUStringAdaptor<T> adaptor_;
};

/// The fields of a UString<N>: only N = 30 holds an encoding, the others have it in their type.
template <std::uint32_t N>
class UStringFields : public UStringStorage<CodeUnit<N>> {
public:
    Encoding encoding() const noexcept { return static_cast<Encoding::Type>(N); }
};

template <>
class UStringFields<30> : public UStringStorage<char> {
public:
    Encoding encoding() const noexcept { return encoding_; }

    Encoding encoding_ = Encoding::Unknown;
};

/// The size in bytes of a UString with a fixed encoding as the library was compiled, for a host that wants to be
/// sure that both sides see the same object.
KVT_EXPORT std::size_t actualUStringSize() noexcept;

} // namespace detail

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
    static constexpr std::conditional_t<N == Encoding::Binary, detail::case_sensitive_t, detail::case_insensitive_t>
        case_insensitive{};

    /// Empty. A UString<30> carries `Unknown`, with which it cannot be converted.
    UString() = default;

    /// From zero-terminated UTF-8. A UString<28> takes the bytes, a UString<30> takes them labelled `Utf8`. Fails as
    /// the next constructor.
    UString(const char* text) : UString(text, std::char_traits<char>::length(text), Encoding::Utf8) {}

    /// From `byteLength` bytes of text in `from`, which are copied without a look at them when that is this
    /// string's own encoding (an incomplete last unit is dropped), and converted otherwise. A UString<28> takes the
    /// bytes as they are; a UString<30> takes them and carries `from`.
    /// Throws what a conversion throws: UStringBadEncodingException (910002), UStringTranscodingException (910003),
    /// UStringBinaryTranscodingException (910004) from `Binary`, InvalidEncodingException (910005) from `Unknown`.
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

    /// From `count` units of the same encoding, which are copied as they are. Only for UTF-16 and UTF-32.
    template <std::uint32_t M = N, OnlyWide<M> = 0>
    UString(const value_type* units, std::size_t count) {
        this->storage_.assign(units, count);
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
    /// Fails as the constructor from bytes; the string then holds the substituted text.
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

    /// The units of an 8-bit string.
    template <std::uint32_t M = N, OnlyNarrow<M> = 0>
    std::string toStdString() const {
        return this->storage_;
    }

    /// Negative, zero or positive as this string's units come before, equal or follow those of `other`, compared as
    /// unsigned numbers; a prefix comes first. UTF-16 is ordered by unit, not by code point.
    int compare(UStringView<N> other, detail::case_sensitive_t = {}) const noexcept;

    /// Comparisons of the units alone: the encoding of a UString<30> takes no part.
    bool operator==(const UString& other) const noexcept { return compare(other) == 0; }
    bool operator!=(const UString& other) const noexcept { return compare(other) != 0; }
    bool operator<(const UString& other) const noexcept { return compare(other) < 0; }
    bool operator>(const UString& other) const noexcept { return compare(other) > 0; }
    bool operator<=(const UString& other) const noexcept { return compare(other) <= 0; }
    bool operator>=(const UString& other) const noexcept { return compare(other) >= 0; }

    /// 64-bit FNV-1a over the bytes of the units in memory order.
    std::uint64_t hash() const noexcept;

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
