#include "text/line_reader.h"

#include "base/messages.h"
#include "base/text_units.h"
#include "text/byte_count.h"
#include "text/byte_order_mark.h"

#include <kvt/string/ustring.h>

#include <algorithm>
#include <cstring>
#include <sstream>
#include <utility>

namespace host {

namespace {

using kvt::ex::Encoding;

// With everything beyond printable ASCII as "\xHH", which is how the library writes bytes that are not text.
std::string shownBytes(const std::string& bytes) {
    std::ostringstream out;
    out << kvt::ex::BinaryString(bytes.data(), bytes.size());
    return out.str();
}

bool isLineEnd(char byte) {
    return byte == '\n' || byte == '\r';
}

} // namespace

Failure badTextFailure(const std::string& file, const kvt::ex::Loss& loss, LineCounter& places,
                       const std::string& encodingName) {
    const LineCounter::Position position = places.at(loss.offset);
    const Place place{file, loss.offset, position.line, position.column};
    return Failure(describe(place) + ": " + describe(910002, {shownBytes(loss.bytes), encodingName}));
}

LineReader::LineReader(const std::string& path, const TextEncoding& encoding, BadText badText)
    : input_(path), first_(encoding.firstBlock(input_)), encoding_(encoding.of(first_, input_.name())),
      encodingName_(encoding_.getName()),
      isDecoded_(badText == BadText::EndsIt || encoding_.evaluate() != Encoding::Utf8),
      decoder_(encoding_, Encoding::Utf8), onLoss_([this](const kvt::ex::Loss& loss) { refuse(loss); }),
      places_(encoding_) {}

void LineReader::refuse(const kvt::ex::Loss& loss) {
    throw badTextFailure(input_.name(), loss, places_, encodingName_);
}

bool LineReader::readBlock() {
    if (ended_) {
        return false;
    }
    decoded_.erase(0, taken_);
    decodedBegin_ += taken_;
    searched_ -= taken_;
    taken_ = whole_ = 0;
    feed_.reset();
    return_.reset();
    const std::string_view block = std::exchange(started_, true) ? input_.read() : first_;
    lastBlock_ = block.size();
    ended_ = block.empty();
    if (offsets_) {
        offsets_->passTo(decodedBegin_);
        offsets_->add(block);
    }
    const std::size_t before = decoded_.size();
    if (isDecoded_) {
        decode(block);
    } else {
        decoded_ += block;
    }
    findMark();
    findLastEnd(before);
    return true;
}

void LineReader::decode(std::string_view block) {
    places_.beginBlock(block);
    if (ended_) {
        decoder_.finish(decoded_, onLoss_);
    } else {
        decoder_.convert(block, decoded_, onLoss_);
    }
    places_.endBlock();
}

// The first block holds a mark whole, and the decoder gives whole characters only, so that
// it is there as soon as there is anything.
void LineReader::findMark() {
    if (markSought_ || decoded_.empty()) {
        return;
    }
    markSought_ = true;
    const std::string_view mark = byteOrderMark(Encoding::Utf8);
    if (decoded_.starts_with(mark)) {
        marked_ = true;
        taken_ = searched_ = mark.size();
    }
}

// A CR at the very end may yet turn out to be the first half of a CRLF, as one before what is `fresh` has by now.
void LineReader::findLastEnd(std::size_t fresh) {
    const std::size_t first = fresh == 0 ? 0 : fresh - 1;
    std::size_t end = decoded_.ends_with('\r') ? decoded_.size() - 1 : decoded_.size();
    while (end > first && !isLineEnd(decoded_[end - 1])) {
        --end;
    }
    whole_ = end > first ? end : taken_;
}

std::string_view LineReader::takeMark() {
    return std::exchange(marked_, false) ? byteOrderMark(Encoding::Utf8) : std::string_view();
}

void LineReader::keepPlaces() {
    if (encoding_.evaluate() != Encoding::Utf8) {
        offsets_.emplace(encoding_);
    }
}

Place LineReader::placeOf(const TextLine& line, std::size_t position) {
    const auto before = static_cast<std::size_t>(line.text.data() - decoded_.data());
    const std::string_view start = line.text.substr(0, position);
    const std::size_t characters =
        start.size() - static_cast<std::size_t>(std::count_if(start.begin(), start.end(), isContinuation));
    std::uint64_t offset = decodedBegin_ + before + position;
    if (offsets_) {
        offsets_->passTo(decodedBegin_ + before);
        offset = offsets_->offsetOf(characters);
    }
    return {input_.name(), offset, line.number, characters + 1};
}

Place TextLine::placeOf(std::size_t position) const {
    return reader->placeOf(*this, position);
}

// Each of the two is looked for behind the one before only, also where the text has none.
std::size_t LineReader::nextOf(char byte, std::optional<std::size_t>& known) const {
    if (!known || *known < searched_) {
        known = std::min(decoded_.find(byte, searched_), decoded_.size());
    }
    return *known;
}

void LineReader::passOver(std::size_t length) {
    if (length == 0) {
        return;
    }
    const std::string_view all = decoded_;
    std::size_t end = std::min(taken_ + length, whole_ - 1) + 1; // behind where a line ends, or its CR
    const bool hasReturns = nextOf('\r', return_) < end;
    if (hasReturns) {
        while (end > taken_ && !isLineEnd(all[end - 1])) {
            --end;
        }
    } else {
        const void* const last = ::memrchr(all.data() + taken_, '\n', end - taken_);
        end = last == nullptr ? taken_
                              : static_cast<std::size_t>(static_cast<const char*>(last) - all.data()) + 1;
    }
    if (end == taken_) {
        return;
    }
    if (all[end - 1] == '\r' && all.substr(end).starts_with('\n')) {
        ++end;
    }
    const std::string_view passed = all.substr(taken_, end - taken_);
    number_ += countOf(passed, '\n');
    if (hasReturns) {
        number_ += countWhere(passed.size(), [bytes = passed.data()](std::size_t index) {
            const char byte = bytes[index];
            const char next = bytes[index + 1]; // behind the last one stands a zero
            return byte == '\r' && next != '\n';
        });
    }
    taken_ = searched_ = end;
}

bool LineReader::next(TextLine& line) {
    const std::size_t end = std::min(nextOf('\n', feed_), nextOf('\r', return_));
    const std::string_view all = decoded_;
    const bool openEnd = end == all.size() || (all[end] == '\r' && end + 1 == all.size());
    if (openEnd && !ended_) {
        // A CR may yet turn out to be the first half of a CRLF.
        searched_ = end;
        if (end - taken_ > longestLine) {
            throw Failure(input_.name() + ": line " + std::to_string(number_ + 1) + " is longer than " +
                          std::to_string(longestLine / 1024 / 1024) + " MiB");
        }
        return false;
    }
    if (taken_ == all.size()) {
        return false;
    }
    const std::size_t endLength = all.substr(end, 2) == "\r\n" ? 2 : end == all.size() ? 0 : 1;
    line = {input_.name(), ++number_, all.substr(taken_, end - taken_), all.substr(end, endLength), this};
    taken_ = searched_ = end + endLength;
    return true;
}

} // namespace host
