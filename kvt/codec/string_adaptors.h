// How a host's own string interface reaches a UString.
//
// The host speaks to strings through an abstract table of operations with plain pointers and 32-bit lengths. Every
// UString carries such a table for its own text, so it can be handed over without a copy. The order of the virtual
// functions is fixed: hosts call them by slot.
#pragma once

#include <kvt/foundation/export.h>

#include <cstdint>
#include <string>

/// The host's view of one string. Texts are pointers to code units as bytes, whatever the width of the unit; lengths
/// are counts of bytes. Pointers handed out are valid until the string next changes.
class KVT_EXPORT IZQTString {
public:
    /// Slot 1: sets the string to the zero-terminated text, taken unit by unit as it stands.
    virtual void assignText(const char* text) = 0;
    /// Slot 2: the text, zero-terminated; the same as data().
    virtual const char* text() const = 0;
    /// Slot 3: sets the string to `byteLength` bytes of units as they stand; an incomplete last unit is dropped.
    virtual void assignBytes(const char* data, std::uint32_t byteLength) = 0;
    /// Slot 4: the first unit.
    virtual const char* data() const = 0;
    /// Slot 5: the length in bytes, without the terminating zero.
    virtual std::uint32_t byteLength() const = 0;
    /// Slots 6 to 9: text in parsable form, which the strings of this library do not offer: each throws
    /// UStringNotImplementedException with the function's name. The wwjd encoding serves that purpose here.
    virtual void encodeToZQTParsableText() = 0;
    virtual void decodeFromZQTParsableText() = 0;
    virtual void encodeUtf8ToZQTParsableText() = 0;
    virtual void decodeUtf8FromZQTParsableText() = 0;
    /// Slot 10.
    virtual ~IZQTString();
};

/// The host's view of an array of strings. Indexes and counts are 32 bits. Arrays of UTF-16 and UTF-32 do not take
/// zero-terminated bytes: slots 2, 9 and 13 throw UStringNotImplementedException with the function's name on them.
class KVT_EXPORT IZQTStringArray {
public:
    /// Slots 1 and 2: add a last element with the given units as they stand; in an array of strings of run-time
    /// encodings it carries `Unknown`.
    virtual void append(const IZQTString& string) = 0;
    virtual void append(const char* text) = 0;
    /// Slot 3: the first unit of an element. The index is not checked.
    virtual const char* elementText(std::uint32_t index) const = 0;
    /// Slot 4: copies an element into `target` and returns 0; returns 1, and does nothing, when there is no such
    /// element.
    virtual int getElement(std::uint32_t index, IZQTString& target) const = 0;
    /// Slot 5: sets an element to the units of `source` and returns 0, or 1 as above.
    virtual int setElement(std::uint32_t index, const IZQTString& source) = 0;
    /// Slot 6: the number of elements.
    virtual std::uint32_t entries() const = 0;
    /// Slot 7: removes all elements.
    virtual void clear() = 0;
    /// Slots 8 and 9: whether an element has just these units.
    virtual bool contains(const IZQTString& string) const = 0;
    virtual bool contains(const char* text) const = 0;
    /// Slots 10 and 11, which the arrays of this library do not offer: they throw UStringNotImplementedException
    /// with the function's name.
    virtual void appendCSVString(const char* text) = 0;
    virtual void appendTokenizeString(const char* text, const char* delimiters) = 0;
    /// Slots 12 and 13: remove every element with just these units and return how many there were.
    virtual std::uint32_t removeAll(const IZQTString& string) = 0;
    virtual std::uint32_t removeAll(const char* text) = 0;
    /// Slot 14: an element. The index is not checked.
    virtual IZQTString& element(std::uint32_t index) = 0;
    /// Slot 15.
    virtual ~IZQTStringArray();
};

namespace kvt::ex::detail {

/// The table for a string of unit `T`: it stands for the storage it is constructed with, of which it owns nothing.
/// It cannot be copied, because a copy would stand for the storage of another string.
template <typename T>
class KVT_EXPORT IZQTUStringAdaptor final : public IZQTString {
public:
    explicit IZQTUStringAdaptor(std::basic_string<T>& owner) noexcept : owner_(&owner) {}
    IZQTUStringAdaptor(const IZQTUStringAdaptor&) = delete;
    IZQTUStringAdaptor& operator=(const IZQTUStringAdaptor&) = delete;

    void assignText(const char* text) override;
    const char* text() const override;
    void assignBytes(const char* data, std::uint32_t byteLength) override;
    const char* data() const override;
    std::uint32_t byteLength() const override;
    void encodeToZQTParsableText() override;
    void decodeFromZQTParsableText() override;
    void encodeUtf8ToZQTParsableText() override;
    void decodeUtf8FromZQTParsableText() override;
    ~IZQTUStringAdaptor() override;

private:
    std::basic_string<T>* owner_;
};

extern template class KVT_EXPORT IZQTUStringAdaptor<char>;
extern template class KVT_EXPORT IZQTUStringAdaptor<char16_t>;
extern template class KVT_EXPORT IZQTUStringAdaptor<char32_t>;

} // namespace kvt::ex::detail
