// What the object of a UString holds: the units, the table of a host's interface, and for a UString<30> the encoding.
#pragma once

#include <kvt/codec/string_adaptors.h>
#include <kvt/encoding/encoding.h>
#include <kvt/foundation/export.h>
#include <kvt/string/ustring_view.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <utility>

namespace kvt::ex::detail {

/// What every string of unit `T` is made of: the units and, by value, the table through which a host reaches them.
/// The table of an object always stands for the storage of that object and is never copied.
template <typename T>
class UStringStorage {
public:
    UStringStorage() : adaptor_(storage_) {}
    UStringStorage(const UStringStorage& other) : storage_(other.storage_), adaptor_(storage_) {}
    UStringStorage(UStringStorage&& other) noexcept
        : storage_(std::move(other.storage_)), adaptor_(storage_) {
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

} // namespace kvt::ex::detail
