#include "base/text.h"

#include "base/failure.h"
#include "base/text_units.h"
#include "base/unicode_data.h"

#include <kvt/encoding/stream_transcoder.h>

#include <algorithm>
#include <cstring>

namespace host {

namespace {

using kvt::ex::Encoding;

std::string hexadecimal(std::uint32_t value, std::size_t digits) {
    static const char* const all = "0123456789ABCDEF";
    std::string text;
    for (; value != 0 || text.size() < digits; value >>= 4) {
        text.insert(text.begin(), all[value & 15]);
    }
    return text;
}

std::string_view bytesOf(std::u32string_view text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * sizeof(char32_t)};
}

std::u32string unitsOf(std::string_view bytes) {
    std::u32string text(bytes.size() / sizeof(char32_t), U'\0');
    std::memcpy(text.data(), bytes.data(), text.size() * sizeof(char32_t));
    return text;
}

std::string convertWhole(std::string_view bytes, Encoding from, Encoding to,
                         const kvt::ex::StreamTranscoder::LossHandler& onLoss) {
    kvt::ex::StreamTranscoder transcoder(from, to);
    std::string out;
    transcoder.convert(bytes, out, onLoss);
    transcoder.finish(out, onLoss);
    return out;
}

void appendPrintable(std::string& out, char32_t character) {
    if (isPrintable(character)) {
        out += toUtf8({&character, 1});
    } else if (character < 0x100) {
        out += "\\x";
        out += hexadecimal(character, 2);
    } else {
        out += "\\u{";
        out += hexadecimal(character, 4) + "}";
    }
}

} // namespace

std::string hexBytes(std::string_view bytes) {
    std::string text;
    for (const char byte : bytes) {
        text += text.empty() ? "" : " ";
        text += hexadecimal(static_cast<unsigned char>(byte), 2);
    }
    return text;
}

std::string codePointName(char32_t character) {
    std::string text = "U+";
    text += hexadecimal(character, 4);
    return text;
}

std::string printable(std::string_view utf8) {
    // Most of what is shown is this, and converters are not quickly made.
    if (std::all_of(utf8.begin(), utf8.end(), [](char byte) { return byte >= ' ' && byte <= '~'; })) {
        return std::string(utf8);
    }
    // The library reports where a loss was, and there bytes are shown instead of a character.
    std::string out;
    std::uint64_t shown = 0;
    const auto showUpTo = [&](std::uint64_t offset) {
        for (const char32_t character : toUtf32(utf8.substr(shown, offset - shown), Encoding::Utf8)) {
            appendPrintable(out, character);
        }
    };
    convertWhole(utf8, Encoding::Utf8, Encoding::Utf32LE, [&](const kvt::ex::Loss& loss) {
        showUpTo(loss.offset);
        for (const char byte : loss.bytes) {
            out += "\\x";
            out += hexadecimal(static_cast<unsigned char>(byte), 2);
        }
        shown = loss.offset + loss.bytes.size();
    });
    showUpTo(utf8.size());
    return out;
}

std::string printable(std::u32string_view text) {
    std::string out;
    for (const char32_t character : text) {
        appendPrintable(out, character);
    }
    return out;
}

void requireUtf8(const std::string& what, std::string_view text) {
    if (std::all_of(text.begin(), text.end(), isAscii)) {
        return;
    }
    convertWhole(text, Encoding::Utf8, Encoding::Utf32LE, [&](const kvt::ex::Loss& loss) {
        throw Failure(what + " is not UTF-8: \"" +
                      printable(text.substr(0, loss.offset + loss.bytes.size())) + "\" ends in " +
                      (loss.bytes.size() == 1 ? "a byte" : "bytes") + " of no character");
    });
}

std::string toUtf8(std::u32string_view text) {
    return convertWhole(bytesOf(text), Encoding::Utf32LE, Encoding::Utf8, {});
}

std::u32string toUtf32(std::string_view bytes, Encoding from) {
    return unitsOf(convertWhole(bytes, from, Encoding::Utf32LE, {}));
}

std::u32string through(std::u32string_view text, Encoding encoding) {
    return toUtf32(convertWhole(bytesOf(text), Encoding::Utf32LE, encoding, {}), encoding);
}

std::string counted(std::uint64_t count, const std::string& one, const std::string& many) {
    return std::to_string(count) + " " + (count == 1 ? one : many);
}

} // namespace host
