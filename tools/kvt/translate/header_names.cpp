#include "translate/header_names.h"

#include "base/failure.h"
#include "translate/cell_text.h"
#include "translate/row_reader.h"

#include <kvt/encoding/stream_transcoder.h>

namespace host {

std::string textOf(const SourceBlock& block) {
    if (block.isDecoded) {
        return block.bytes;
    }
    std::string text;
    kvt::ex::StreamTranscoder decoder(block.encoding, kvt::ex::Encoding::Utf8);
    decoder.convert(block.bytes, text, {});
    decoder.finish(text, {});
    return text;
}

std::vector<std::string> namesOf(const SourceBlock& block, const Plan& plan) {
    const std::string text = textOf(block);
    RowReader reader(plan.in, text);
    reader.next();
    if (plan.job.input.hasHeader && reader.fault() != RowFault::None) {
        throw Failure(block.name + ": the header cannot be read, at byte " +
                      std::to_string(reader.faultPlace() - text.data()) + " of its text");
    }
    std::vector<std::string> names;
    std::string scratch;
    for (std::size_t index = 0; index < reader.cellCount(); ++index) {
        names.push_back(plan.job.input.hasHeader
                            ? std::string(textOfCell(reader.cell(index), plan.in, scratch))
                            : std::to_string(index + 1));
    }
    return names;
}

} // namespace host
