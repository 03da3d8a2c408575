#include "translate/source_blocks.h"

#include "base/failure.h"
#include "base/text.h"
#include "text/file_options.h"
#include "translate/icu_data.h"

#include <algorithm>
#include <array>
#include <limits>

namespace host {

using kvt::ex::Encoding;

// Tried out: each of the bytes alone, and behind each byte that may begin a longer character.
bool isCutUndecoded(Encoding encoding, const RowForm& form) {
    if (encoding.evaluate() == Encoding::Utf8 || unitsOf(encoding).width != 1) {
        return true;
    }
    const std::string name(encoding.getName());
    if (!isStateless(name)) {
        return false;
    }
    kvt::ex::StreamTranscoder decoder(encoding, Encoding::Utf8);
    std::string out;
    const auto decoded = [&](std::string_view bytes) -> const std::string& {
        out.clear();
        decoder.convert(bytes, out, {});
        decoder.finish(out, {});
        return out;
    };
    for (const char byte : {form.delimiter, form.quote, '\n', '\r'}) {
        if (decoded({&byte, 1}) != std::string(1, byte)) {
            return false;
        }
        for (int lead = 0x80; lead <= 0xFF && !encoding.isSingleByte(); ++lead) {
            const std::array<char, 2> pair = {static_cast<char>(lead), byte};
            if (!decoded({pair.data(), pair.size()}).ends_with(byte)) {
                return false;
            }
        }
    }
    return true;
}

Units unitsOf(Encoding encoding) {
    switch (encoding.evaluate()) {
    case Encoding::Utf16LE:
        return {2, 0};
    case Encoding::Utf16BE:
        return {2, 1};
    case Encoding::Utf32LE:
        return {4, 0};
    case Encoding::Utf32BE:
        return {4, 3};
    default:
        return {1, 0};
    }
}

SourceBlocks::SourceBlocks(const Plan& plan, std::vector<std::string> paths, const std::optional<Part>& part,
                           const Output* output)
    : plan_(plan), paths_(std::move(paths)), part_(part), output_(output), encoding_(plan.from.encoding) {
    if (part_ && (paths_.size() != 1 || paths_.front() == "-")) {
        throw Failure("--part takes one FILE, which is not standard input");
    }
}

bool SourceBlocks::open() {
    if (opened_ == paths_.size()) {
        return false;
    }
    const std::string& path = paths_[opened_++];
    source_.reset();
    source_.emplace(path, plan_.from, MarkPolicy::Skip);
    name_ = source_->input().name();
    if (output_ != nullptr) {
        refuseInPlace(*output_, source_->input());
    }
    encoding_ = source_->encoding();
    const std::uint64_t size = part_ ? totalSize({path}).value_or(0) : 0;
    units_ = unitsOf(encoding_);
    borders_.emplace(plan_.in);
    partOfUnit_.clear();
    decoder_.reset();
    if (!isCutUndecoded(encoding_, plan_.in)) {
        decoder_.emplace(encoding_, Encoding::Utf8);
    }
    skipped_ = begin_ = taken_ = 0;
    isAtEnd_ = false;
    undecoded_.clear();
    if (part_) {
        const std::string name(encoding_.getName());
        if (decoder_) {
            throw Failure(
                "--part: a text in " + name +
                " cannot be begun in the middle, since what its bytes mean depends on those before them");
        }
        if (size == 0) {
            throw Failure("--part takes a file that has a size, which " + printable(path) + " has not");
        }
        // Without overflow for files of any size.
        const auto cut = [&](std::uint64_t number) {
            return size / part_->count * number + size % part_->count * number / part_->count;
        };
        partBegin_ = cut(part_->number - 1);
        partEnd_ = cut(part_->number);
        for (const std::uint64_t limit : {partBegin_, partEnd_}) {
            borders_->watch((limit + units_.width - 1) / units_.width);
        }
    }
    return true;
}

void SourceBlocks::take(std::string_view bytes) {
    if (!decoder_) {
        text_ += bytes;
        seekBorders(bytes);
        return;
    }
    const std::size_t before = text_.size();
    if (bytes.empty()) {
        decode({});
    }
    // In small steps, so that it is known where in the text a loss is.
    constexpr std::size_t step = 64;
    for (std::size_t at = 0; at < bytes.size(); at += step) {
        decode(bytes.substr(at, step));
    }
    undecoded_ += bytes;
    borders_->add(std::string_view(text_).substr(before));
}

// Of wider units, a byte is enough: what is not ASCII is none of the characters that count.
void SourceBlocks::seekBorders(std::string_view bytes) {
    if (units_.width == 1) {
        borders_->add(bytes);
        return;
    }
    partOfUnit_ += bytes;
    unitBytes_.clear();
    std::size_t at = 0;
    for (; at + units_.width <= partOfUnit_.size(); at += units_.width) {
        char low = partOfUnit_[at + units_.lowest];
        for (std::size_t index = 0; index < units_.width; ++index) {
            low = index != units_.lowest && partOfUnit_[at + index] != '\0' ? '\xFF' : low;
        }
        unitBytes_ += low;
    }
    partOfUnit_.erase(0, at);
    borders_->add(unitBytes_);
}

// The first border there; none yet is beyond everything. No border is counted at 0, where a row begins.
std::uint64_t SourceBlocks::borderBehind(std::uint64_t limit) const {
    const auto border = borders_->firstBehind((limit + units_.width - 1) / units_.width);
    return limit == 0 ? 0 : border ? *border * units_.width : std::numeric_limits<std::uint64_t>::max();
}

// Nothing is the end of the file.
void SourceBlocks::decode(std::string_view bytes) {
    std::size_t place = text_.size();
    const std::size_t firstLoss = losses_.size();
    const auto onLoss = [this](const kvt::ex::Loss& loss) { losses_.push_back({loss, 0}); };
    if (bytes.empty()) {
        decoder_->finish(text_, onLoss);
    } else {
        decoder_->convert(bytes, text_, onLoss);
    }
    for (std::size_t index = firstLoss; index < losses_.size(); ++index) {
        place = std::min(text_.find("\xEF\xBF\xBD", place), text_.size());
        losses_[index].place = begin_ + place++;
    }
}

// Reads on until there is a block, or the end.
void SourceBlocks::fill() {
    for (;;) {
        if (isAtEnd_ || (border() > begin_ && text_.size() >= blockSize)) {
            return;
        }
        if (text_.size() > longestRow + 2 * blockSize) {
            refuseLongRow();
        }
        const std::string_view bytes = source_->next();
        skipped_ = source_->skipped();
        taken_ += bytes.size();
        isAtEnd_ = bytes.empty();
        take(bytes);
        if (border() > begin_ && bytes.size() < Input::blockSize) {
            return; // somebody may be typing
        }
    }
}

void SourceBlocks::refuseLongRow() const {
    const std::string limit = std::to_string(longestRow / 1024 / 1024) + " MiB";
    if (borders_->isWithinQuotes()) {
        throw Failure(name_ + ": the quote that opens at byte " +
                      std::to_string(skipped_ + borders_->openQuote() * units_.width) +
                      " is not closed within " + limit);
    }
    throw Failure(name_ + ": the row that begins at byte " + std::to_string(skipped_ + begin_) +
                  " is longer than " + limit);
}

// The text up to `end` becomes the block; what is behind stays.
void SourceBlocks::give(SourceBlock& block, std::uint64_t end) {
    const auto length = static_cast<std::size_t>(end - begin_);
    block.name = name_;
    block.encoding = encoding_;
    block.isOfFirstFile = opened_ == 1;
    block.isMoreToCome = opened_ < paths_.size();
    block.offset = begin_ + (decoder_ ? 0 : skipped_);
    block.isDecoded = decoder_.has_value();
    block.markSize = skipped_;
    block.beginsFile = begin_ == 0;
    block.taken = taken_;
    taken_ = 0;
    block.source.clear();
    block.source.swap(undecoded_);
    block.losses.clear();
    const auto later = std::find_if(losses_.begin(), losses_.end(),
                                    [&](const PlacedLoss& loss) { return loss.place >= end; });
    for (auto loss = losses_.begin(); loss != later; ++loss) {
        block.losses.push_back({loss->loss, loss->place - begin_});
    }
    losses_.erase(losses_.begin(), later);
    block.bytes.swap(text_);
    text_.assign(block.bytes, length, std::string::npos);
    block.bytes.resize(length);
    begin_ = end;
}

bool SourceBlocks::next(SourceBlock& block) {
    for (;;) {
        if (!source_) {
            if (!open()) {
                return false;
            }
        }
        fill();
        std::uint64_t end = isAtEnd_ ? begin_ + text_.size() : border();
        block.isOutside = false;
        if (part_) {
            // Borders are counted from behind the mark, and so the limits may be.
            const std::uint64_t first = borderBehind(partBegin_);
            const std::uint64_t last = borderBehind(partEnd_);
            block.isOutside = begin_ < first;
            if (!block.isOutside && begin_ >= last) {
                source_.reset();
                return false;
            }
            end = std::min(end, block.isOutside ? first : last);
        }
        if (end != begin_) {
            give(block, end);
            return true;
        }
        if (isAtEnd_) {
            source_.reset();
            if (part_) {
                return false;
            }
        }
    }
}

} // namespace host
