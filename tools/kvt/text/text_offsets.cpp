#include "text/text_offsets.h"

#include <algorithm>

namespace host {

namespace {

// More bytes of UTF-8 than one byte of any encoding stands for.
constexpr std::uint64_t mostExpansion = 16;
// Bytes that are decoded character by character at a time.
constexpr std::size_t stride = 16;

constexpr unsigned char utf8Length(char32_t character) {
    return character < 0x80 ? 1 : character < 0x800 ? 2 : character < 0x10000 ? 3 : 4;
}

} // namespace

TextOffsets::TextOffsets(kvt::ex::Encoding encoding) : decoder_(encoding, kvt::ex::Encoding::Utf8) {}

void TextOffsets::add(std::string_view block) {
    forgetTaken();
    bytes_.append(block);
    end_ += block.size();
    ended_ = block.empty();
}

void TextOffsets::forgetTaken() {
    bytes_.erase(0, taken_);
    taken_ = 0;
}

void TextOffsets::passTo(std::uint64_t position) {
    for (; passed_ < position && !ahead_.empty(); ahead_.pop_front()) {
        passed_ += ahead_.front().length;
    }
    while (passed_ < position) {
        const std::size_t sure =
            std::min<std::uint64_t>((position - passed_) / mostExpansion, bytes_.size() - taken_);
        if (sure < stride) {
            break;
        }
        decoder_.convert(std::string_view(bytes_).substr(taken_, sure), decoded_, {});
        taken_ += sure;
        passed_ += decoded_.size();
        decoded_.clear();
    }
    while (passed_ < position) {
        if (ahead_.empty()) {
            decodeSome();
        }
        if (ahead_.empty()) {
            return;
        }
        passed_ += ahead_.front().length;
        ahead_.pop_front();
    }
}

std::uint64_t TextOffsets::offsetOf(std::size_t characters) {
    while (ahead_.size() <= characters) {
        const std::size_t before = ahead_.size();
        decodeSome();
        if (ahead_.size() == before) {
            return end_;
        }
    }
    return ahead_[characters].begin;
}

// At least one character more, if there is one.
void TextOffsets::decodeSome() {
    const std::size_t before = ahead_.size();
    decoder_.watch([this](char32_t character, std::uint64_t begin) {
        ahead_.push_back({begin, utf8Length(character)});
    });
    while (ahead_.size() == before && taken_ < bytes_.size()) {
        const std::string_view piece = std::string_view(bytes_).substr(taken_, stride);
        decoder_.convert(piece, decoded_, {});
        taken_ += piece.size();
    }
    if (ahead_.size() == before && ended_ && decoder_.position() != 0) {
        decoder_.finish(decoded_, {});
    }
    decoder_.watch({});
    decoded_.clear();
}

} // namespace host
