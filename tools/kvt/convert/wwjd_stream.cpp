#include "convert/wwjd_stream.h"

#include "base/text_units.h"

#include <kvt/codec/wwjd.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>

#include <algorithm>
#include <cstring>
#include <stdexcept>

namespace host {

namespace {

using kvt::ex::Encoding;
using kvt::ex::Loss;

// "<closebracket>" without its ends.
constexpr std::size_t longestToken = 12;

[[noreturn]] void fail(const Loss& loss) {
    throw loss;
}

// How much of `text` can be decoded without knowing what follows: up to a '<' that may still become a token.
std::size_t decodableLength(std::string_view text) {
    const std::size_t behindTokens = text.rfind('>') + 1;
    const std::size_t tail = text.size() - std::min(text.size(), longestToken + 1);
    return std::min(text.find('<', std::max(behindTokens, tail)), text.size());
}

} // namespace

WwjdEncoder::WwjdEncoder() : toUtf16_(Encoding::Utf8, Encoding::Utf16LE) {}

void WwjdEncoder::convert(std::string_view block, std::string& out) {
    toUtf16_.convert(block, units_, fail);
    encode(out);
}

void WwjdEncoder::finish(std::string& out) {
    toUtf16_.finish(units_, fail);
    encode(out);
}

void WwjdEncoder::encode(std::string& out) {
    std::u16string text(units_.size() / sizeof(char16_t), u'\0');
    std::memcpy(text.data(), units_.data(), units_.size());
    units_.clear();
    out += kvt::ex::detail::utf16ToWwjd(text);
}

WwjdDecoder::WwjdDecoder() : toUtf8_(Encoding::Utf16LE, Encoding::Utf8) {}

void WwjdDecoder::convert(std::string_view block, std::string& out) {
    pending_.append(block);
    const std::size_t length = decodableLength(pending_);
    decode(std::string_view(pending_).substr(0, length), out);
    pending_.erase(0, length);
}

void WwjdDecoder::finish(std::string& out) {
    decode(pending_, out);
    pending_.clear();
    toUtf8_.finish(out, [&](const Loss&) {
        throw Loss{Loss::BadInput, lastTokenOffset_, lastToken_, U'\uFFFD'};
    });
    offset_ = 0;
}

// Piece by piece, each ending behind a '>', so that at most one token ends a piece and a failure has a place.
void WwjdDecoder::decode(std::string_view text, std::string& out) {
    while (!text.empty()) {
        const std::string_view piece = text.substr(0, std::min(text.find('>'), text.size() - 1) + 1);
        decodePiece(piece, out);
        offset_ += piece.size();
        text.remove_prefix(piece.size());
    }
}

void WwjdDecoder::decodePiece(std::string_view piece, std::string& out) {
    const std::size_t open = std::min(piece.rfind('<'), piece.size());
    const auto loseToken = [&] {
        throw Loss{Loss::BadInput, offset_ + open, std::string(piece.substr(open)), U'\uFFFD'};
    };
    kvt::ex::UString<2> units;
    try {
        units = kvt::ex::detail::wwjdToUtf16(piece);
    } catch (const kvt::ex::UStringBadEncodingException&) {
        // The token cannot be at fault for a byte that is not ASCII, so that the first one stands before it.
        const auto foreign = std::find_if_not(piece.begin(), piece.end(), isAscii);
        const auto index = static_cast<std::size_t>(foreign - piece.begin());
        throw Loss{Loss::BadInput, offset_ + index, std::string(1, *foreign), U'\uFFFD'};
    } catch (const std::logic_error&) {
        loseToken();
    }
    const std::string_view bytes(reinterpret_cast<const char*>(units.rawData()),
                                 units.size() * sizeof(char16_t));
    const std::uint64_t before = toUtf8_.position();
    toUtf8_.convert(bytes, out, [&](const Loss& loss) {
        if (loss.offset < before) {
            throw Loss{Loss::BadInput, lastTokenOffset_, lastToken_, U'\uFFFD'};
        }
        loseToken();
    });
    lastTokenOffset_ = offset_ + open;
    lastToken_ = piece.substr(open);
}

} // namespace host
