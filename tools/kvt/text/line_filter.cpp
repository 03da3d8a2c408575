#include "text/line_filter.h"

#include "base/input.h"
#include "base/output.h"
#include "base/progress.h"
#include "text/file_options.h"
#include "text/text_writer.h"

#include <memory>
#include <optional>
#include <vector>

namespace host {

namespace {

void filterFile(LineReader& reader, LineFilter& filter, TextWriter& writer, Progress& progress) {
    TextLine line{reader.input().name(), 1, {}, {}};
    filter.beginFile(line.file);
    while (reader.readBlock()) {
        if (const std::string_view mark = reader.takeMark(); !mark.empty()) {
            filter.takeMark(mark, writer.buffer());
            writer.endLine(line);
        }
        while (reader.passOver(filter.passOver(reader.wholeLines())), reader.next(line)) {
            filter.takeLine(line, writer.buffer());
            writer.endLine(line);
        }
        writer.flush();
        progress.advance(reader.lastBlock());
    }
    filter.endFile(writer.buffer());
    writer.endLine(line);
    writer.flush();
}

} // namespace

void filterLines(const FileOptions& files, LineFilter& filter, Diagnostics& diagnostics) {
    const TextEncoding encoding = files.encoding();
    const Progress::Show show = files.progress();
    const std::vector<std::string> inputs = files.inputs();
    const std::unique_ptr<Output> output = openOutput(files.outputPath());
    std::optional<TextWriter> writer;
    {
        Progress progress(diagnostics, totalSize(inputs), show, "");
        for (const std::string& path : inputs) {
            LineReader reader(path, encoding);
            refuseInPlace(*output, reader.input());
            if (filter.asksForPlaces()) {
                reader.keepPlaces();
            }
            if (!writer) { // in the byte order of the first
                writer.emplace(*output, reader.encoding(), filter.givesText());
            }
            filterFile(reader, filter, *writer, progress);
        }
    }
    writer->finish();
}

} // namespace host
