#include "sort/line_feeder.h"

#include "text/line_counter.h"
#include "text/line_reader.h"
#include "text/source.h"

#include <kvt/encoding/stream_transcoder.h>

namespace host {

namespace {

using kvt::ex::Encoding;

// The blocks of a file as UTF-8; refuses what is not text. What is UTF-8 already passes as it is.
class BlockDecoder {
public:
    explicit BlockDecoder(Source& source)
        : isUtf8_(source.encoding() == Encoding(Encoding::Utf8)), decoder_(source.encoding(), Encoding::Utf8),
          places_(source.encoding()), onLoss_([this, &source](kvt::ex::Loss loss) {
              loss.offset += source.skipped();
              throw badTextFailure(source.input().name(), loss, places_,
                                   std::string(source.encoding().getName()));
          }) {
        places_.restart(source.skipped());
    }

    std::string_view take(std::string_view block) {
        decoded_.clear();
        places_.beginBlock(block);
        decoder_.convert(block, decoded_, onLoss_);
        places_.endBlock();
        return isUtf8_ ? block : decoded_;
    }

    std::string_view finish() {
        decoded_.clear();
        places_.beginBlock({});
        decoder_.finish(decoded_, onLoss_);
        places_.endBlock();
        return isUtf8_ ? std::string_view() : decoded_;
    }

private:
    bool isUtf8_;
    kvt::ex::StreamTranscoder decoder_;
    LineCounter places_;
    kvt::ex::StreamTranscoder::LossHandler onLoss_;
    std::string decoded_;
};

// Where the mark cannot be cut off as bytes, it is there when the text is decoded.
bool takeMark(std::string_view& text) {
    const std::string_view mark = byteOrderMark(Encoding::Utf8);
    const bool isThere = text.starts_with(mark);
    text.remove_prefix(isThere ? mark.size() : 0);
    return isThere;
}

} // namespace

LineFeeder::LineFeeder(const FeedRule& rule, LineSorter& sorter, Workspace& workspace)
    : rule_(rule), sorter_(sorter), workspace_(workspace), keys_(rule.key, workspace, rule.memory / 2),
      line_(workspace, rule.memory / 2) {}

void LineFeeder::read(const std::string& path, Progress& progress) {
    Source source(path, rule_.encoding, MarkPolicy::Skip);
    encoding_ = encoding_.value_or(source.encoding());
    hasMark_ = hasMark_ || source.skipped() != 0;
    file_ = source.input().name();
    linesOfFile_ = 0;
    const bool isUtf8 = source.encoding() == Encoding(Encoding::Utf8);
    std::optional<BlockDecoder> decoder;
    if (!isUtf8 || rule_.key.by == KeyRule::By::FoldedText) {
        decoder.emplace(source);
    }
    bool mayBeMarked = !isUtf8 && source.skipped() == 0;
    const auto takeDecoded = [&](std::string_view text) {
        if (mayBeMarked && !text.empty()) {
            hasMark_ = takeMark(text) || hasMark_;
            mayBeMarked = false;
        }
        takeBlock(text);
    };
    for (std::string_view block = source.next(); !block.empty(); block = source.next()) {
        takeDecoded(decoder ? decoder->take(block) : block);
        progress.advance(block.size());
    }
    if (decoder) {
        takeDecoded(decoder->finish());
    }
    if (!line_.empty()) {
        takeLine(line_.view());
        line_.clear();
    }
}

void LineFeeder::takeBlock(std::string_view block) {
    for (;;) {
        const std::size_t end = block.find('\n');
        if (end == std::string_view::npos) {
            line_.append(block);
            return;
        }
        if (line_.empty()) {
            takeLine(block.substr(0, end));
        } else {
            line_.append(block.substr(0, end));
            takeLine(line_.view());
            line_.clear();
        }
        block.remove_prefix(end + 1);
    }
}

void LineFeeder::takeLine(std::string_view line) {
    ++linesOfFile_;
    LineRecord record;
    record.key = line;
    record.place = rule_.places ? lines_ : 0;
    if (!rule_.key.takesLines()) {
        takeKeyed(line, record);
    }
    sorter_.add(record);
    ++lines_;
    size_ += line.size() + 1;
}

void LineFeeder::takeKeyed(std::string_view line, LineRecord& record) {
    record.key = keys_.of(line);
    // A line that is its own key is not kept twice.
    if (record.key.size() != line.size() || compareFrom(record.key, line, 0, workspace_) != 0) {
        record.payload = line;
    }
    if (!keys_.wasFound() && ++withoutKey_ == 1) {
        firstWithoutKey_ = file_ + ": line " + std::to_string(linesOfFile_);
    }
}

} // namespace host
