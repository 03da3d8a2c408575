// Joining, and the way between an array and a host's own.
#include <kvt/string/ustring_array.h>

#include <kvt/codec/detail/string_array_adaptor.h>
#include <kvt/string/detail/instantiate.h>

namespace kvt::ex {
namespace {

// `result` is empty and has the encoding that the joined text is to carry.
template <std::uint32_t N>
UString<N> joined(const UStringArray<N>& array, UStringView<N> separator, UString<N> result) {
    for (const UString<N>& element : array) {
        if (&element != array.begin()) {
            result.append(separator);
        }
        result.append(element);
    }
    return result;
}

} // namespace

template <std::uint32_t N>
UStringArray<N>::~UStringArray() {
    // The elements go before the interface that shows them.
    this->clear();
}

template <std::uint32_t N>
std::unique_ptr<IZQTStringArray> UStringArray<N>::init() {
    return std::make_unique<detail::IZQTUStringArrayAdaptor<N>>(*this);
}

template <std::uint32_t N>
UString<N> UStringArray<N>::join(typename UString<N>::value_type separator) const {
    UString<N> result;
    if constexpr (N == Encoding::Unknown) {
        if (!this->empty()) {
            result.setEncoding(this->front().encoding());
        }
    }
    return joined(*this, UStringView<N>(&separator, 1), std::move(result));
}

template <std::uint32_t N>
UString<N> UStringArray<N>::join(const UString<N>& separator) const {
    UString<N> result;
    if constexpr (N == Encoding::Unknown) {
        result.setEncoding(separator.encoding());
    }
    return joined<N>(*this, separator, std::move(result));
}

template <std::uint32_t N>
UStringArray<N> UStringArray<N>::fromIZQTStringArray(const IZQTStringArray& array, Encoding encoding) {
    UStringArray result;
    const std::uint32_t entries = array.entries();
    result.reserve(entries);
    for (std::uint32_t i = 0; i < entries; ++i) {
        // Handing out an element is not const in the host's interface, since the element can be written to.
        result.push_back(
            UString<N>::fromIZQTString(const_cast<IZQTStringArray&>(array).element(i), encoding));
    }
    return result;
}

#define KVT_INSTANTIATE_ARRAY(N) template class UStringArray<N>;

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_ARRAY)

#undef KVT_INSTANTIATE_ARRAY

} // namespace kvt::ex
