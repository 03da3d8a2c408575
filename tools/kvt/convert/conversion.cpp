#include "convert/conversion.h"

#include "base/background_output.h"
#include "base/failure.h"
#include "base/messages.h"
#include "base/text.h"
#include "base/text_units.h"
#include "cli/exit_status.h"
#include "convert/loss_report.h"
#include "text/encoding_catalogue.h"
#include "text/file_options.h"

#include <algorithm>
#include <filesystem>
#include <unistd.h>
#include <utility>

namespace host {

namespace {

using kvt::ex::Encoding;
using kvt::ex::Loss;

// Bytes for which it pays to have a thread for the writing.
constexpr std::uint64_t muchInput = 16 * 1024 * 1024;

// A report that replaces an input or is replaced by the output would be lost work.
std::unique_ptr<Output> openReport(const ConvertOptions& options) {
    if (options.report.empty()) {
        return nullptr;
    }
    if (isStandardOutput(options.report)) {
        throw Failure("the report goes to a file or, without --report, to standard error");
    }
    bool taken = !isStandardOutput(options.output) && isSamePlace(options.output, options.report);
    for (const std::string& input : options.inputs) {
        taken = taken || (input != "-" && isSamePlace(input, options.report));
    }
    if (taken && !std::filesystem::is_character_file(options.report)) {
        throw Failure("the report needs a file of its own: " + printable(options.report));
    }
    return openOutput(options.report);
}

// At most LineCounter::contextLength characters on each side.
std::u32string lineAround(std::u32string_view text, std::size_t index) {
    const std::size_t start = text.find_last_of(U"\r\n", index == 0 ? 0 : index - 1);
    const std::size_t lineBegin = start == text.npos || start >= index ? 0 : start + 1;
    const std::size_t begin = std::max(lineBegin, index - std::min(index, LineCounter::contextLength));
    const std::size_t end = std::min(text.find_first_of(U"\r\n", index), index + LineCounter::contextLength);
    return std::u32string(text.substr(begin, end - begin));
}

} // namespace

Conversion::Conversion(const ConvertOptions& options, const TextEncoding& from, Encoding to,
                       Diagnostics& diagnostics)
    : options_(options), named_(from), from_(from.encoding), to_(to), fromName_(from_.getName()),
      toName_(to.getName()), diagnostics_(diagnostics), transcoder_(from_, to),
      onLoss_([this](const Loss& reported) {
          if (!needsPlaces() && ledger_.addAgain(reported)) {
              return;
          }
          Loss loss = reported;
          loss.offset += source_->skipped();
          takeLoss(
              loss, [&] { return placeOf(loss); }, std::nullopt);
      }),
      lines_(from_), progress_(diagnostics, totalSize(options.inputs), options.progress, "") {
    if (options.verify || !comesBack(to_)) {
        roundTrip_.emplace(options.changesText() ? Encoding(Encoding::Utf32LE) : from_, to);
    }
    if (options.changesText()) {
        reading_.emplace(from_, options.reading);
        writer_.emplace(to, options.onError == OnError::Transliterate ? PieceWriter::Lost::IsTransliterated
                                                                      : PieceWriter::Lost::IsSubstituted);
    }
}

int Conversion::run() {
    checkMark(options_.mark, from_);
    const std::string_view mark = byteOrderMark(to_);
    if (options_.mark == MarkPolicy::Add && mark.empty()) {
        throw Failure("--bom add: " + toName_ + " has no byte order mark");
    }
    output_ = openOutput(options_.output);
    if (totalSize(options_.inputs).value_or(0) >= muchInput) {
        output_ = std::make_unique<BackgroundOutput>(std::move(output_));
    }
    report_ = openReport(options_);
    if (options_.mark == MarkPolicy::Add) {
        output_->write(mark);
    }
    try {
        for (const std::string& path : options_.inputs) {
            convertFile(path);
        }
    } catch (const Stopped& stopped) {
        explainStop(stopped);
        return NotDone;
    }
    const bool same = verified();
    if (!same && options_.onError == OnError::Stop) {
        return NotDone;
    }
    output_->commit();
    if (report_) {
        report_->commit();
    }
    if (!ledger_.isEmpty()) {
        printLedger(ledger_, fromName_, toName_, diagnostics_);
    }
    printFallbackLines();
    return same && ledger_.isEmpty() ? Done : DoneWithLosses;
}

void Conversion::convertFile(const std::string& path) {
    source_.emplace(path, named_, options_.mark);
    refuseInPlace(*output_, source_->input());
    readIn(source_->encoding());
    std::string_view block = source_->next();
    lines_.restart(source_->skipped());
    if (reading_) {
        reading_->begin(source_->encoding(), source_->skipped());
        before_.clear();
    }
    if (source_->skipped() != 0) {
        progress_.advance(source_->skipped());
    }
    for (; !block.empty(); block = source_->next()) {
        convertBlock(block);
        progress_.advance(block.size());
    }
    finishFile();
}

// Files that are named alike may differ in the order of bytes.
void Conversion::readIn(Encoding from) {
    if (from == from_) {
        return;
    }
    from_ = from;
    fromName_ = from.getName();
    transcoder_ = kvt::ex::StreamTranscoder(from, to_);
    lines_ = LineCounter(from);
    if (roundTrip_ && !reading_) {
        roundTrip_->readIn(from);
    }
}

void Conversion::convertBlock(std::string_view block) {
    if (reading_) {
        writePiece(reading_->take(block));
        return;
    }
    lines_.beginBlock(block);
    transcoder_.convert(block, converted_, onLoss_);
    lines_.endBlock();
    if (roundTrip_) {
        roundTrip_->addInput(block);
    }
    writeConverted();
}

void Conversion::finishFile() {
    if (reading_) {
        writePiece(reading_->finish());
        writer_->finish(converted_);
    } else {
        lines_.beginBlock({});
        transcoder_.finish(converted_, onLoss_);
    }
    writeConverted();
    if (roundTrip_) {
        roundTrip_->finish();
    }
}

void Conversion::writeConverted() {
    if (roundTrip_) {
        roundTrip_->addOutput(converted_);
    }
    output_->writeAndClear(converted_);
    if (!reportLines_.empty()) {
        report_->write(reportLines_);
        reportLines_.clear();
    }
}

// Nothing of the piece is written when it has the loss at which the conversion stops.
void Conversion::writePiece(TextPiece piece) {
    if (roundTrip_) {
        roundTrip_->addInput(utf32Bytes(piece.text));
    }
    TextPosition position = piece.start;
    std::size_t passed = 0;
    for (const PieceWriter::Change& change : writer_->changes(piece)) {
        for (; passed < change.source; ++passed) {
            position.pass(piece.source.text[passed]);
        }
        const auto place = [&] {
            return Place{source_->input().name(), change.loss.offset, position.line, position.column};
        };
        if (options_.onError == OnError::Stop) {
            throw Stopped{change.loss, place(),
                          lineAround(before_ + piece.source.text, before_.size() + change.source)};
        }
        takeLoss(change.loss, place, change.written);
    }
    if (piece.firstFallback) {
        piece.firstFallback->file = source_->input().name();
        ledger_.addFallbackLines(piece.fallbackLines, *piece.firstFallback);
    }
    before_ += piece.source.text;
    before_.erase(0, before_.size() - std::min(before_.size(), LineCounter::contextLength));
    writer_->write(piece.text, converted_);
    writeConverted();
}

void Conversion::takeLoss(const Loss& loss, const std::function<Place()>& placeOfIt,
                          const std::optional<std::u32string>& written) {
    if (options_.onError == OnError::Stop) {
        throw Stopped{loss, placeOfIt(), std::nullopt};
    }
    std::optional<Place> place;
    if (needsPlaces()) {
        place = placeOfIt();
    }
    if (report_) {
        reportLines_ += lossAsJson(loss, *place, fromName_, toName_, written);
    } else if (needsPlaces()) {
        diagnostics_.say(describeLoss(loss, *place, fromName_, toName_));
    }
    ledger_.add(
        loss, [&] { return place ? *place : placeOfIt(); }, written);
}

Place Conversion::placeOf(const Loss& loss) {
    const LineCounter::Position position = lines_.at(loss.offset);
    return {source_->input().name(), loss.offset, position.line, position.column};
}

void Conversion::explainStop(const Stopped& stopped) {
    const Loss& loss = stopped.loss;
    const bool bad = loss.kind == Loss::BadInput;
    const std::string sentence =
        bad ? describe(910002, {escapedBytes(loss.bytes), fromName_})
            : describe(910003, {printable(std::u32string_view(&loss.codePoint, 1)), fromName_, toName_});
    diagnostics_.fail(describe(stopped.place) + ": " + sentence);
    diagnostics_.line("     lost:        " + describeLost(loss));
    diagnostics_.line("     would read:  " +
                      printable(through(stopped.line ? withChanges(*stopped.line) : lineAtLoss(), to_)));
    if (loss.codePoint == U'\uFEFF' && loss.offset == 0) {
        diagnostics_.line("     This is a byte order mark, which is left out without '--bom keep'.");
    }
    diagnostics_.line(isStandardOutput(options_.output)
                          ? "     What was written to standard output ends before the loss."
                          : "     Nothing was written.");
    ledger_.add(loss, [&] { return stopped.place; });
    printLedger(ledger_, fromName_, toName_, diagnostics_);
}

std::u32string Conversion::withChanges(const std::u32string& line) const {
    const Normalization form = options_.reading.normalization;
    return form == Normalization::None ? line : Normalizer(form).normalized(line);
}

// The line around the loss at which the transcoder stopped.
std::u32string Conversion::lineAtLoss() {
    const std::u32string before = lines_.textBefore();
    std::string bytes(lines_.rest());
    // A pipe might keep us waiting for what is only a courtesy.
    if (bytes.size() < Input::blockSize / 2 && source_->input().remaining()) {
        bytes += source_->next();
    }
    return before + lines_.textAfter(bytes);
}

void Conversion::printFallbackLines() const {
    if (ledger_.fallbackLines() != 0) {
        const bool isOne = ledger_.fallbackLines() == 1;
        diagnostics_.say(counted(ledger_.fallbackLines(), "line", "lines") + (isOne ? " is" : " are") +
                         " not valid " + fromName_ + " and " + (isOne ? "was" : "were") + " read in " +
                         std::string(options_.reading.fallback->getName()) + "; first in " +
                         describe(ledger_.firstFallback()));
    }
}

bool Conversion::verified() {
    if (!roundTrip_) {
        return true;
    }
    if (const auto& difference = roundTrip_->difference()) {
        diagnostics_.say("verify: " + describe(*difference));
        if (!options_.verify) {
            diagnostics_.line("     " + toName_ +
                              " is always verified: not all that is written in it can be read.");
        }
        return false;
    }
    if (!options_.verify) {
        return true;
    }
    diagnostics_.say(
        ledger_.isEmpty()
            ? "verify: nothing was lost: the output converts back to the same text"
            : "verify: the output converts back to the same text, in which bad bytes were replaced");
    return true;
}

} // namespace host
