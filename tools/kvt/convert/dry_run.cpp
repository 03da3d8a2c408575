#include "convert/dry_run.h"

#include "base/diagnostics.h"
#include "base/output.h"
#include "base/progress.h"
#include "base/table.h"
#include "base/text.h"
#include "base/unicode_data.h"
#include "cli/exit_status.h"
#include "convert/loss_ledger.h"
#include "convert/piece_writer.h"
#include "convert/text_reading.h"
#include "text/encoding_catalogue.h"
#include "text/round_trip.h"
#include "text/source.h"

#include <kvt/encoding/stream_transcoder.h>

#include <algorithm>
#include <optional>
#include <tuple>

namespace host {

namespace {

using kvt::ex::Encoding;
using kvt::ex::Loss;

struct Target {
    std::string name;
    Encoding from;
    Encoding to;
    kvt::ex::StreamTranscoder transcoder;
    std::optional<PieceWriter> writer;  ///< where the text is not to stay as it is
    std::optional<RoundTrip> roundTrip; ///< where not all that is written can be read
    LossLedger ledger;
    std::uint64_t bytes = 0;

    Target(Encoding source, Encoding target, bool changesText)
        : name(target.getName()), from(source), to(target), transcoder(from, to) {
        if (changesText) {
            writer.emplace(to, PieceWriter::Lost::IsSubstituted);
        }
        if (!comesBack(to)) {
            roundTrip.emplace(from, to);
        }
    }

    // Files that are named alike may differ in the order of bytes.
    void readIn(Encoding source) {
        if (source != from) {
            from = source;
            transcoder = kvt::ex::StreamTranscoder(from, to);
            if (roundTrip) {
                roundTrip->readIn(from);
            }
        }
    }

    // `block` is null at the end of a file.
    void convert(const std::string_view* block) {
        const auto onLoss = [&](const Loss& loss) { ledger.add(loss, [] { return Place(); }); };
        std::string converted;
        if (block != nullptr) {
            transcoder.convert(*block, converted, onLoss);
        } else {
            transcoder.finish(converted, onLoss);
        }
        count(block != nullptr ? *block : std::string_view(), converted);
        if (block == nullptr && roundTrip) {
            roundTrip->finish();
        }
    }

    void write(TextPiece& piece, bool isLast) {
        std::string converted;
        for (const PieceWriter::Change& change : writer->changes(piece)) {
            ledger.add(change.loss, [] { return Place(); });
        }
        writer->write(piece.text, converted);
        if (isLast) {
            writer->finish(converted);
        }
        count(utf32Bytes(piece.text), converted);
        if (isLast && roundTrip) {
            roundTrip->finish();
        }
    }

    void count(std::string_view input, std::string_view converted) {
        bytes += converted.size();
        if (roundTrip) {
            roundTrip->addInput(input);
            roundTrip->addOutput(converted);
        }
    }

    // Behind the first difference the texts have parted, so that it is the only one that is known.
    void countDifference() {
        if (roundTrip && roundTrip->difference() && ledger.isEmpty()) {
            const char32_t before = roundTrip->difference()->before.value_or(U'\uFFFD');
            ledger.add({Loss::NotRepresentable, 0, {}, before}, [] { return Place(); });
        }
    }

    auto rank() const { return std::tuple(ledger.total(), ledger.entryCount(), bytes); }
};

std::string shownLosses(const LossLedger& ledger) {
    constexpr std::size_t mostShown = 8;
    std::string text;
    std::size_t shown = 0;
    for (const LossLedger::Entry& entry : ledger.entries()) {
        if (shown++ == mostShown) {
            return text + " ...";
        }
        text += text.empty() ? "" : " ";
        const char32_t character = entry.first.codePoint;
        if (entry.first.kind == Loss::BadInput) {
            text.append("<").append(hexBytes(entry.first.bytes)).append(">");
        } else {
            text += isPrintable(character) ? printable(std::u32string_view(&character, 1))
                                           : codePointName(character);
        }
    }
    return text;
}

std::string tableOf(const std::vector<Target>& targets) {
    std::vector<std::vector<std::string>> rows = {{"", "encoding", "losses", "different", "bytes", "lost"}};
    for (const Target& target : targets) {
        const LossLedger& ledger = target.ledger;
        rows.push_back({std::to_string(rows.size()), target.name, std::to_string(ledger.total()),
                        std::to_string(ledger.entryCount()) + (ledger.unlisted() == 0 ? "" : "+"),
                        std::to_string(target.bytes), shownLosses(ledger)});
    }
    return formatTable({Align::Right, Align::Left, Align::Right, Align::Right, Align::Right, Align::Left},
                       rows);
}

void convert(Source& source, std::vector<Target>& targets, Progress& progress) {
    for (Target& target : targets) {
        target.readIn(source.encoding());
    }
    for (std::string_view block = source.next(); !block.empty(); block = source.next()) {
        for (Target& target : targets) {
            target.convert(&block);
        }
        progress.advance(block.size());
    }
    for (Target& target : targets) {
        target.convert(nullptr);
    }
}

void convertChanged(Source& source, const ReadingRule& rule, std::vector<Target>& targets,
                    Progress& progress) {
    TextReading reading(source.encoding(), rule);
    const auto write = [&](TextPiece piece, bool isLast) {
        for (Target& target : targets) {
            target.write(piece, isLast);
        }
    };
    std::string_view block = source.next();
    reading.begin(source.encoding(), source.skipped());
    for (; !block.empty(); block = source.next()) {
        write(reading.take(block), false);
        progress.advance(block.size());
    }
    write(reading.finish(), true);
}

} // namespace

int dryRun(const ConvertOptions& options, const TextEncoding& from, const std::vector<Encoding>& encodings,
           Diagnostics& diagnostics) {
    checkMark(options.mark, from.encoding);
    std::vector<Target> targets;
    targets.reserve(encodings.size());
    for (const Encoding to : encodings) {
        targets.emplace_back(options.changesText() ? Encoding(Encoding::Utf32LE) : from.encoding, to,
                             options.changesText());
    }
    {
        Progress progress(diagnostics, totalSize(options.inputs), options.progress, "");
        for (const std::string& path : options.inputs) {
            Source source(path, from, options.mark);
            if (options.changesText()) {
                convertChanged(source, options.reading, targets, progress);
            } else {
                convert(source, targets, progress);
            }
        }
    }
    for (Target& target : targets) {
        target.countDifference();
    }
    std::stable_sort(targets.begin(), targets.end(),
                     [](const Target& left, const Target& right) { return left.rank() < right.rank(); });
    print(tableOf(targets));
    return targets.front().ledger.isEmpty() ? Done : DoneWithLosses;
}

} // namespace host
