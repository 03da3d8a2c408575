// The passes over the bytes, and the failures at their ends.
#include <kvt/string/detail/ascii_check.h>

#include <kvt/encoding/detail/failure_text.h>
#include <kvt/foundation/detail/ascii.h>
#include <kvt/foundation/detail/utf.h>
#include <kvt/foundation/throwable.h>

#include <algorithm>
#include <cstddef>

namespace kvt::ex::detail {
namespace {

constexpr char substitute = '\x1A';

// The trailing bytes that a lead byte announces; 0 for a byte that is not one.
std::size_t trailingBytes(char byte) {
    const auto lead = static_cast<unsigned char>(byte);
    return (lead & 0xE0) == 0xC0   ? 1
           : (lead & 0xF0) == 0xE0 ? 2
           : (lead & 0xF8) == 0xF0 ? 3
           : (lead & 0xFC) == 0xF8 ? 4
                                   : 0;
}

UString<0> utf8(std::string_view text) {
    return UString<0>(UStringView<0>(text));
}

UString<0> substitution() {
    return utf8({&substitute, 1});
}

// Appends `bytes`, which begin beyond ASCII, with each character replaced; returns whether they are well-formed.
bool appendSubstituted(std::string_view bytes, std::string& out) {
    bool wellFormed = true;
    while (!bytes.empty()) {
        if (isAscii(bytes.front())) {
            const auto* const end = std::find_if_not(bytes.begin(), bytes.end(), isAscii);
            out.append(bytes.begin(), end);
            bytes.remove_prefix(static_cast<std::size_t>(end - bytes.begin()));
            continue;
        }
        const std::size_t announced = trailingBytes(bytes.front());
        bytes.remove_prefix(1);
        const std::string_view trailing = bytes.substr(0, announced);
        bytes.remove_prefix(trailing.size());
        // One SUB for the character, and one for each byte that is none of its own.
        const auto own =
            static_cast<std::size_t>(std::count_if(trailing.begin(), trailing.end(), isContinuation));
        out.append(1 + trailing.size() - own, substitute);
        wellFormed = wellFormed && announced != 0 && own == announced;
    }
    return wellFormed;
}

} // namespace

void utf8ToAscii(std::string_view bytes, std::string& out) {
    const auto* const beyond = std::find_if_not(bytes.begin(), bytes.end(), isAscii);
    out.assign(bytes.begin(), beyond);
    if (beyond == bytes.end()) {
        return;
    }
    if (appendSubstituted(bytes.substr(out.size()), out)) {
        throw UStringTranscodingException(utf8(bytes), Encoding::Utf8, Encoding::UsAscii, utf8(out),
                                          substitution());
    }
    throw UStringBadEncodingException(UString<28>(UStringView<28>(bytes)), Encoding::Utf8, utf8(out),
                                      substitution());
}

void singleByteToAscii(Encoding from, std::string_view bytes, std::string& out) {
    out = bytes;
    const auto first = std::find_if_not(out.begin(), out.end(), isAscii);
    if (first == out.end()) {
        return;
    }
    std::replace_if(
        first, out.end(), [](char byte) { return !isAscii(byte); }, substitute);
    throw UStringTranscodingException(textForFailure(bytes, from), from, Encoding::UsAscii, utf8(out),
                                      substitution());
}

} // namespace kvt::ex::detail
