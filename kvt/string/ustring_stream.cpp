// Output of strings to a standard stream.
#include <kvt/string/detail/instantiate.h>

#include <kvt/foundation/detail/escape.h>

#include <ostream>

namespace kvt::ex {

template <std::uint32_t N>
std::ostream& operator<<(std::ostream& stream, const UString<N>& string) {
    if constexpr (N == Encoding::Binary) {
        return stream << detail::escapeBytes({string.rawData(), string.size()});
    } else {
        const UString<0> text = string.getAsUtf8();
        return stream << std::string_view(text.rawData(), text.size());
    }
}

#define KVT_INSTANTIATE(N) template KVT_EXPORT std::ostream& operator<<(std::ostream&, const UString<N>&);

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE)

#undef KVT_INSTANTIATE

} // namespace kvt::ex
