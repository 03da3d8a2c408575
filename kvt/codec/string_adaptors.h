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
