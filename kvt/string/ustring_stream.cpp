// Strings as text for people: the text itself, and its output to a standard stream.
#include <kvt/string/detail/instantiate.h>
#include <kvt/string/ustring_output.h>

#include <kvt/foundation/detail/escape.h>

#include <ostream>

namespace kvt::ex {

template <std::uint32_t N>
std::string detail::outputText(const UString<N>& string) {
    if constexpr (N == Encoding::Binary) {
        return escapeBytes(string);
    } else {
        return string.getAsUtf8().toStdString();
    }
}

template <std::uint32_t N>
std::ostream& operator<<(std::ostream& stream, const UString<N>& string) {
    const detail::OutputText<N> text(string);
    return stream << std::string_view(text);
}

#define KVT_INSTANTIATE(N)                                                                                   \
    template KVT_EXPORT std::string detail::outputText(const UString<N>&);                                   \
    template KVT_EXPORT std::ostream& operator<<(std::ostream&, const UString<N>&);

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE)

#undef KVT_INSTANTIATE

} // namespace kvt::ex
