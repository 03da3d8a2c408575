#include "convert/piece_writer.h"

#include <algorithm>
#include <utility>

namespace host {

namespace {

using kvt::ex::Encoding;
using kvt::ex::Loss;

// Of characters that were looked up; most texts have fewer.
constexpr std::size_t mostReplacements = 64 * 1024;

} // namespace

std::string_view utf32Bytes(const std::u32string& text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * sizeof(char32_t)};
}

PieceWriter::PieceWriter(Encoding to, Lost lost)
    : trial_(Encoding::Utf32LE, to), encoder_(Encoding::Utf32LE, to) {
    if (lost == Lost::IsTransliterated) {
        transliteration_.emplace();
    }
}

std::vector<PieceWriter::Change> PieceWriter::changes(TextPiece& piece) {
    std::vector<Change> changes;
    if (piece.source.text.empty()) {
        return changes;
    }
    const auto sourceAt = [&](std::uint64_t offset) {
        const auto& begins = piece.source.begins;
        return static_cast<std::size_t>(std::lower_bound(begins.begin(), begins.end(), offset) -
                                        begins.begin());
    };
    std::vector<std::uint64_t> badOffsets;
    for (const Loss& loss : piece.bad) {
        badOffsets.push_back(loss.offset);
        changes.push_back(
            {loss, std::min(sourceAt(loss.offset), piece.source.text.size() - 1), std::nullopt});
    }
    std::u32string text;
    std::size_t done = 0;
    for (const std::size_t index : lostIn(piece.text)) {
        const std::size_t source = piece.originOf(index);
        const std::uint64_t offset = piece.source.begins[source];
        const char32_t character = piece.text[index];
        const bool isBad =
            character == U'\uFFFD' && std::binary_search(badOffsets.begin(), badOffsets.end(), offset);
        if (isBad) {
            continue;
        }
        Change change{
            {Loss::NotRepresentable, offset, piece.bytesOf(source), character}, source, std::nullopt};
        if (transliteration_) {
            change.written = replacementOf(character);
        }
        if (change.written) {
            text.append(piece.text, done, index - done).append(*change.written);
            done = index + 1;
        }
        changes.push_back(std::move(change));
    }
    if (done != 0) {
        piece.text = text.append(piece.text, done);
    }
    std::stable_sort(changes.begin(), changes.end(), [](const Change& left, const Change& right) {
        return left.loss.offset < right.loss.offset;
    });
    return changes;
}

// The characters that the encoding lacks, by their place in the text.
std::vector<std::size_t> PieceWriter::lostIn(const std::u32string& text) {
    std::vector<std::size_t> lost;
    const auto onLoss = [&](const Loss& loss) { lost.push_back(loss.offset / sizeof(char32_t)); };
    trial_.convert(utf32Bytes(text), scratch_, onLoss);
    trial_.finish(scratch_, onLoss);
    scratch_.clear();
    return lost;
}

// What the encoding has in place of a character; nothing where it lacks that, too.
const std::optional<std::u32string>& PieceWriter::replacementOf(char32_t character) {
    const auto known = replacements_.find(character);
    if (known != replacements_.end()) {
        return known->second;
    }
    if (replacements_.size() == mostReplacements) {
        replacements_.clear();
    }
    std::optional<std::u32string> text = transliteration_->of(character);
    if (!lostIn(*text).empty()) {
        text.reset();
    }
    return replacements_.emplace(character, std::move(text)).first->second;
}

void PieceWriter::write(const std::u32string& text, std::string& out) {
    encoder_.convert(utf32Bytes(text), out, {});
}

void PieceWriter::finish(std::string& out) {
    encoder_.finish(out, {});
}

} // namespace host
