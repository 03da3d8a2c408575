// The host's table of operations on the storage of a string.
#include <kvt/codec/string_adaptors.h>

#include <kvt/foundation/throwable.h>

#include <cstddef>
#include <cstring>

IZQTString::~IZQTString() = default;
IZQTStringArray::~IZQTStringArray() = default;

namespace kvt::ex::detail {

template <typename T>
void IZQTUStringAdaptor<T>::assignText(const char* text) {
    // A copy first: the text may be this string's own.
    *owner_ = std::basic_string<T>(reinterpret_cast<const T*>(text));
}

template <typename T>
const char* IZQTUStringAdaptor<T>::text() const {
    return data();
}

template <typename T>
void IZQTUStringAdaptor<T>::assignBytes(const char* data, std::uint32_t byteLength) {
    std::basic_string<T> units(byteLength / sizeof(T), T());
    if (!units.empty()) { // No bytes may come as a null pointer.
        std::memcpy(units.data(), data, units.size() * sizeof(T));
    }
    *owner_ = std::move(units);
}

template <typename T>
const char* IZQTUStringAdaptor<T>::data() const {
    return reinterpret_cast<const char*>(owner_->data());
}

template <typename T>
std::uint32_t IZQTUStringAdaptor<T>::byteLength() const {
    return static_cast<std::uint32_t>(owner_->size() * sizeof(T));
}

template <typename T>
void IZQTUStringAdaptor<T>::encodeToZQTParsableText() {
    throw UStringNotImplementedException("encodeToZQTParsableText");
}

template <typename T>
void IZQTUStringAdaptor<T>::decodeFromZQTParsableText() {
    throw UStringNotImplementedException("decodeFromZQTParsableText");
}

template <typename T>
void IZQTUStringAdaptor<T>::encodeUtf8ToZQTParsableText() {
    throw UStringNotImplementedException("encodeUtf8ToZQTParsableText");
}

template <typename T>
void IZQTUStringAdaptor<T>::decodeUtf8FromZQTParsableText() {
    throw UStringNotImplementedException("decodeUtf8FromZQTParsableText");
}

template <typename T>
IZQTUStringAdaptor<T>::~IZQTUStringAdaptor() = default;

template class IZQTUStringAdaptor<char>;
template class IZQTUStringAdaptor<char16_t>;
template class IZQTUStringAdaptor<char32_t>;

} // namespace kvt::ex::detail
