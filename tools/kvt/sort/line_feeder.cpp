#include "sort/line_feeder.h"

#include "base/text_units.h"
#include "text/line_reader.h"
#include "text/source.h"
#include "text/text_operation.h"

#include <algorithm>

namespace host {

namespace {

using kvt::ex::Encoding;

// The folded form of a piece of valid UTF-8.
void fold(std::string_view text, std::string& out) {
    if (!std::all_of(text.begin(), text.end(), isAscii)) {
        appendFolded(text, out);
        return;
    }
    std::transform(text.begin(), text.end(), std::back_inserter(out), asciiLower);
}

// Bytes at the front of `text` that are whole characters, at most `most` of them.
std::size_t wholeCharacters(std::string_view text, std::size_t most) {
    if (text.size() <= most) {
        return text.size();
    }
    std::size_t size = most;
    while (isContinuation(text[size])) {
        --size;
    }
    return size;
}

// Looks whether a file is UTF-8, block by block, and refuses it when it is not.
class Utf8Check {
public:
    /// `skipped` bytes of the file precede what is looked at.
    Utf8Check(const std::string& file, std::uint64_t skipped)
        : decoder_(Encoding::Utf8, Encoding::Utf8), places_(Encoding::Utf8),
          onLoss_([this, file, skipped](kvt::ex::Loss loss) {
              loss.offset += skipped;
              throw badTextFailure(file, loss, places_, std::string(Encoding(Encoding::Utf8).getName()));
          }) {
        places_.restart(skipped);
    }

    void take(std::string_view block) {
        places_.beginBlock(block);
        decoder_.convert(block, decoded_, onLoss_);
        places_.endBlock();
        decoded_.clear();
    }

    void finish() {
        places_.beginBlock({});
        decoder_.finish(decoded_, onLoss_);
        places_.endBlock();
    }

private:
    kvt::ex::StreamTranscoder decoder_;
    LineCounter places_;
    kvt::ex::StreamTranscoder::LossHandler onLoss_;
    std::string decoded_;
};

} // namespace

LineFeeder::LineFeeder(const FeedRule& rule, LineSorter& sorter, Workspace& workspace)
    : rule_(rule), sorter_(sorter), workspace_(workspace), line_(workspace, rule.memory / 2),
      key_(workspace, rule.memory / 2) {}

void LineFeeder::read(const std::string& path, Progress& progress) {
    Source source(path, Encoding::Utf8, MarkPolicy::Skip);
    hasMark_ = hasMark_ || source.skipped() != 0;
    std::optional<Utf8Check> check;
    if (rule_.fold) {
        check.emplace(source.input().name(), source.skipped());
    }
    for (std::string_view block = source.next(); !block.empty(); block = source.next()) {
        if (check) {
            check->take(block);
        }
        takeBlock(block);
        progress.advance(block.size());
    }
    if (check) {
        check->finish();
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
    LineRecord record;
    record.key = line;
    record.place = rule_.places ? lines_ : 0;
    if (rule_.fold) {
        makeKey(line);
        record.key = key_.view();
        // A line that is its own key is not kept twice.
        if (record.key.size() != line.size() || compareFrom(record.key, line, 0, workspace_) != 0) {
            record.payload = line;
        }
    }
    sorter_.add(record);
    ++lines_;
    size_ += line.size() + 1;
}

void LineFeeder::makeKey(std::string_view line) {
    constexpr std::size_t foldedAtOnce = 64 * 1024;
    key_.clear();
    while (!line.empty()) {
        const std::size_t size = wholeCharacters(line, foldedAtOnce);
        folded_.clear();
        fold(line.substr(0, size), folded_);
        key_.append(folded_);
        workspace_.letGo(line.substr(0, size));
        line.remove_prefix(size);
    }
}

} // namespace host
