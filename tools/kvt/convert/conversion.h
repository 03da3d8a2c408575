// `kvt convert` at work: files in, one output out, every loss accounted for.
#pragma once

#include "base/diagnostics.h"
#include "base/output.h"
#include "base/progress.h"
#include "convert/convert_options.h"
#include "convert/loss_ledger.h"
#include "convert/piece_writer.h"
#include "convert/text_reading.h"
#include "text/line_counter.h"
#include "text/place.h"
#include "text/round_trip.h"
#include "text/source.h"

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace host {

class Conversion {
public:
    Conversion(const ConvertOptions& options, const TextEncoding& from, kvt::ex::Encoding to,
               Diagnostics& diagnostics);

    /// Gives an ExitStatus; throws as a Command does.
    int run();

private:
    /// The loss at which the conversion stopped.
    struct Stopped {
        kvt::ex::Loss loss;
        Place place;
        std::optional<std::u32string> line; ///< around it, where the text is at hand
    };

    void convertFile(const std::string& path);
    void readIn(kvt::ex::Encoding from);
    void convertBlock(std::string_view block);
    void finishFile();
    void writeConverted();
    void writePiece(TextPiece piece);
    void takeLoss(const kvt::ex::Loss& loss, const std::function<Place()>& place,
                  const std::optional<std::u32string>& written);
    Place placeOf(const kvt::ex::Loss& loss);
    /// Whether each loss is reported, and not only the first of its kind listed.
    bool needsPlaces() const { return options_.onError == OnError::Report || report_ != nullptr; }
    void explainStop(const Stopped& stopped);
    void printFallbackLines() const;
    std::u32string withChanges(const std::u32string& line) const;
    std::u32string lineAtLoss();
    bool verified();

    const ConvertOptions& options_;
    TextEncoding named_;
    kvt::ex::Encoding from_; ///< the order of bytes in this file
    kvt::ex::Encoding to_;
    std::string fromName_;
    std::string toName_;
    Diagnostics& diagnostics_;
    kvt::ex::StreamTranscoder transcoder_;
    kvt::ex::StreamTranscoder::LossHandler onLoss_;
    LineCounter lines_;
    std::optional<TextReading> reading_; ///< where the text is not to stay as it is; and
    std::optional<PieceWriter> writer_;
    std::u32string before_; ///< the end of the piece before
    LossLedger ledger_;
    std::optional<RoundTrip> roundTrip_;
    std::unique_ptr<Output> output_;
    std::unique_ptr<Output> report_;
    std::string reportLines_;
    Progress progress_;
    std::optional<Source> source_;
    std::string converted_;
};

} // namespace host
