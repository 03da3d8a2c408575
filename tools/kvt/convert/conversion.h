// `kvt convert` at work: files in, one output out, every loss accounted for.
#pragma once

#include "base/diagnostics.h"
#include "base/output.h"
#include "base/progress.h"
#include "convert/convert_options.h"
#include "convert/loss_ledger.h"
#include "text/line_counter.h"
#include "text/place.h"
#include "text/round_trip.h"
#include "text/source.h"

#include <kvt/encoding/encoding.h>
#include <kvt/encoding/stream_transcoder.h>

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
    };

    void convertFile(const std::string& path);
    void readIn(kvt::ex::Encoding from);
    void convertBlock(std::string_view block);
    void finishFile();
    void writeConverted();
    void takeLoss(const kvt::ex::Loss& loss);
    Place placeOf(const kvt::ex::Loss& loss);
    void explainStop(const Stopped& stopped);
    std::string lossyLine();
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
