#include "text/text_writer.h"

#include "base/failure.h"
#include "base/messages.h"
#include "base/text.h"
#include "text/encoding_catalogue.h"

#include <string_view>

namespace host {

TextWriter::TextWriter(Output& output, kvt::ex::Encoding encoding, bool encoded)
    : output_(output), encodingName_(encoding.getName()) {
    // What the operations make of valid UTF-8 is valid UTF-8.
    if (encoded && encoding != kvt::ex::Encoding(kvt::ex::Encoding::Utf8)) {
        encoder_.emplace(kvt::ex::Encoding::Utf8, encoding);
        if (!comesBack(encoding)) {
            roundTrip_.emplace(kvt::ex::Encoding::Utf8, encoding);
        }
    }
}

void TextWriter::endLine(const TextLine& line) {
    if (!encoder_) {
        return;
    }
    encoder_->convert(pending_, ready_, [&](const kvt::ex::Loss& loss) {
        const std::string lost = printable(std::u32string_view(&loss.codePoint, 1));
        throw Failure(std::string(line.file) + ": line " + std::to_string(line.number) +
                      ": the result cannot be written. " + describe(910003, {lost, "UTF-8", encodingName_}));
    });
    if (roundTrip_) {
        roundTrip_->addInput(pending_);
    }
    pending_.clear();
}

void TextWriter::requireSameText() const {
    if (roundTrip_ && roundTrip_->difference()) {
        throw Failure("the result cannot be written in " + encodingName_ + ": " +
                      describe(*roundTrip_->difference()));
    }
}

void TextWriter::flush() {
    if (roundTrip_) {
        roundTrip_->addOutput(ready_);
        requireSameText();
    }
    output_.write(ready_);
    ready_.clear();
}

void TextWriter::finish() {
    if (encoder_) {
        encoder_->finish(ready_, {});
    }
    flush();
    if (roundTrip_) {
        roundTrip_->finish();
        requireSameText();
    }
    output_.commit();
}

} // namespace host
