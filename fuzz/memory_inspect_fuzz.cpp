// inspectMemoryFile: whatever is in a file, reading stays within it, ends, and gives a report that adds up or a
// Failure.
//
// Input: a byte that says whether and how a size for the header segment is given, then the file. The corpus begins with
// real files whose segments are small; damage to them is what reaches the table and the lists.
#include <fuzzing.h>

#include <base/failure.h>
#include <memory/memory_file.h>

#include <optional>

using namespace kvt::fuzz;

namespace {

class ViewBytes : public host::ByteSource {
public:
    explicit ViewBytes(std::string_view bytes) : bytes_(bytes) {}

    std::uint64_t size() const override { return bytes_.size(); }
    void read(std::uint64_t offset, char* out, std::size_t count) const override {
        require(offset <= bytes_.size() && count <= bytes_.size() - offset, "reading stays within the file");
        bytes_.copy(out, count, offset);
    }

private:
    std::string_view bytes_;
};

void checkReport(const host::MemoryFileReport& report, std::uint64_t size) {
    requireEqual(report.fileSize, size, "the size of the file");
    require(report.header.size <= size, "the header segment lies in the file");
    std::uint64_t end = report.header.size;
    std::uint64_t covered = report.header.size;
    for (const host::SegmentReport& segment : report.segments) {
        if (segment.state == host::SegmentState::NotMade) {
            continue;
        }
        require(segment.offset >= end, "segments follow one another");
        end = segment.offset + segment.size;
        if (segment.state == host::SegmentState::CutOff) {
            require(end > size, "what is cut off reaches beyond the end");
            covered += size - std::min(segment.offset, size);
            continue;
        }
        require(end <= size, "a segment lies in the file");
        covered += segment.size;
        if (segment.state == host::SegmentState::Heap) {
            require(segment.allocated + segment.free < segment.size, "a heap is part of its segment");
        }
    }
    requireEqual(covered + report.unaccounted, size, "each byte is accounted for once");
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::optional<std::uint64_t> sizes[] = {std::nullopt, 4096, 8192, 0};
    Input input(data, size);
    const std::optional<std::uint64_t> segmentSize = input.pick(sizes);
    const ViewBytes bytes(input.rest());
    try {
        checkReport(host::inspectMemoryFile(bytes, segmentSize), bytes.size());
    } catch (const host::Failure& failure) {
        require(!std::string_view(failure.what()).empty(), "a failure says something");
    }
    return 0;
}
