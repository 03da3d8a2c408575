// An array of strings of one encoding.
#pragma once

#include <kvt/codec/string_adaptors.h>
#include <kvt/foundation/export.h>
#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>

#include <cstdint>
#include <memory>
#include <utility>

namespace kvt::ex {

/// A kvt::ex::vector of UString<N>, with its constructors, that a host can reach through its own interface.
template <std::uint32_t N>
class KVT_EXPORT UStringArray : public vector<UString<N>> {
    using Base = vector<UString<N>>;

public:
    using Base::Base;

    UStringArray() = default;
    UStringArray(const UStringArray& other) : Base(other) {}
    /// Takes the elements; the source is left empty. Allocates the new array's interface, so that it may throw
    /// std::bad_alloc; `other` is unchanged then.
    UStringArray(UStringArray&& other) : Base() { Base::swap(other); }
    UStringArray& operator=(const UStringArray& other) {
        Base::operator=(other);
        return *this;
    }
    UStringArray& operator=(UStringArray&& other) noexcept {
        Base::operator=(std::move(other));
        return *this;
    }
    ~UStringArray() override;

    /// The elements in order with the separator between them, their units copied as they are. The result of joining
    /// strings of run-time encodings carries the encoding of the first element, `Unknown` when there is none, or,
    /// with a string as separator, always that of the separator.
    UString<N> join(typename UString<N>::value_type separator) const;
    UString<N> join(const UString<N>& separator) const;

    /// The strings of a foreign array, each as UString<N>::fromIZQTString() takes it. Fails as that.
    static UStringArray fromIZQTStringArray(const IZQTStringArray& array, Encoding encoding);

    /// This array as the host's interface sees it; the reference is valid as long as the array lives.
    IZQTStringArray& getAsIZQTStringArray() noexcept { return *adaptor_; }
    const IZQTStringArray& getAsIZQTStringArray() const noexcept { return *adaptor_; }

private:
    // Makes the interface for this array.
    std::unique_ptr<IZQTStringArray> init();

    std::unique_ptr<IZQTStringArray> adaptor_ = init();
};

extern template class KVT_EXPORT UStringArray<0>;
extern template class KVT_EXPORT UStringArray<1>;
extern template class KVT_EXPORT UStringArray<2>;
extern template class KVT_EXPORT UStringArray<3>;
extern template class KVT_EXPORT UStringArray<27>;
extern template class KVT_EXPORT UStringArray<28>;
extern template class KVT_EXPORT UStringArray<29>;
extern template class KVT_EXPORT UStringArray<30>;

} // namespace kvt::ex
