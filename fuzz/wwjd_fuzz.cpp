// The wwjd codec: the three decoders and the encoder against the slow ones of the tests, and the way there and back.
//
// Input: the encoded text; the encoder gets the same bytes as UTF-16 units.
#include <fuzzing.h>
#include <reference/wwjd_reference.h>

#include <kvt/codec/wwjd.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>

#include <optional>
#include <stdexcept>

using namespace kvt::ex;
using namespace kvt::fuzz;
namespace reference = kvt::test::reference;

namespace {

std::string bytesOf(std::u16string_view text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * 2};
}

/// What a decoder to UTF-16 does, in one word.
struct Decoded {
    std::string text; ///< the units' bytes; nothing when the decoder threw
    std::string failure;

    friend bool operator==(const Decoded&, const Decoded&) = default;
    friend std::ostream& operator<<(std::ostream& stream, const Decoded& decoded) {
        return stream << Hex{decoded.text} << " failure " << decoded.failure;
    }
};

Decoded decodeAsLibrary(std::string_view in) {
    try {
        const UString<2> text = detail::wwjdToUtf16(in);
        return {bytesOf({text.rawData(), text.size()}), ""};
    } catch (const UStringBadEncodingException& failure) {
        Decoded decoded{"", "bad"};
        failure.processInfo({}, {}, {}, [&](unsigned long number, const UStringArray<0>& parameters) {
            decoded.failure += std::to_string(number);
            for (const UString<0>& parameter : parameters) {
                decoded.failure += " " + parameter.toStdString();
            }
        });
        return decoded;
    } catch (const std::invalid_argument& failure) {
        return {"", failure.what()};
    }
}

Decoded decodeAsReference(std::string_view in) {
    try {
        const reference::WwjdDecoded decoded = reference::wwjdDecoded(in);
        if (decoded.bad) {
            return {"", "bad910002 " + kvt::test::escaped(decoded.tail) + " zqt-wwjd"};
        }
        return {bytesOf(decoded.text), ""};
    } catch (const std::invalid_argument& failure) {
        return {"", failure.what()};
    }
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view in(reinterpret_cast<const char*>(data), size);
    requireEqual(decodeAsLibrary(in), decodeAsReference(in), "to UTF-16: ", Hex{in});

    const std::string bytes = reference::wwjdDecodedBytes(in);
    requireEqual(detail::wwjdToBytes(in), bytes, "to bytes: ", Hex{in});
    const char* decoded = nullptr;
    std::uint64_t length = 0;
    detail::wwjdDecode<char>(kvt::future::string_view(in), decoded, length);
    requireEqual(std::string_view(decoded, length), std::string_view(bytes), "to a thread's bytes");

    std::u16string units(size / 2, u'\0');
    in.copy(reinterpret_cast<char*>(units.data()), units.size() * 2);
    const std::string encoded = detail::utf16ToWwjd(units);
    requireEqual(encoded, reference::wwjdEncoded(units), "encoded: ", Hex{bytesOf(units)});
    const UString<2> back = detail::wwjdToUtf16(encoded);
    require(std::u16string_view(back.rawData(), back.size()) == units, "there and back");
    return 0;
}
