// `kvt memory inspect`: what a persistent file of segments holds.

#include "base/failure.h"
#include "base/memory_pages.h"
#include "base/output.h"
#include "base/table.h"
#include "base/text.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "cli/output_option.h"
#include "cli/sizes.h"
#include "memory/memory_file.h"

#include <nlohmann/json.hpp>

#include <cerrno>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace host {

namespace {

constexpr const char* examples = R"(kvt memory inspect work.mem
kvt memory inspect --json work.mem | jq '.segments[].free')";

constexpr const char* inspectNotes =
    R"(For the header segment and each other one: its index, where it lies in the file,
its bytes, how many of them its heap has allocated, the management of the blocks
included, and how many are free. A segment is

  heap      in use
  unused    created and never loaded: it has no heap
  not made  in the table, but the file could not grow for it
  cut off   beyond the end of the file
  damaged   without a heap, but not empty

The file is read and nothing else: it is not opened by the library, which trusts
what is in it. A file that is being changed meanwhile may be seen half changed.
--segment-size is what the file was made with; it need not be given, but is
compared when it is.

Exit status:
  0  done
  1  done, and a segment is cut off or damaged
  2  not done: it is no such file, or its header is damaged)";

constexpr const char* notes = R"(Exit status:
  0  done
  1  done, and something is damaged
  2  not done)";

class FileBytes : public ByteSource {
public:
    // Opening a pipe must not wait for a writer.
    explicit FileBytes(const std::string& path)
        : descriptor_(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY | O_NONBLOCK)) {
        struct stat file {};
        if (descriptor_ < 0 || ::fstat(descriptor_, &file) != 0) {
            const int error = errno;
            close();
            throw systemFailure("cannot read " + printable(path), error);
        }
        if (!S_ISREG(file.st_mode)) {
            close();
            throw Failure(printable(path) + ": it is no regular file");
        }
        size_ = static_cast<std::uint64_t>(file.st_size);
    }

    FileBytes(const FileBytes&) = delete;
    FileBytes& operator=(const FileBytes&) = delete;
    ~FileBytes() override { close(); }

    std::uint64_t size() const override { return size_; }

    void read(std::uint64_t offset, char* out, std::size_t count) const override {
        while (count > 0) {
            const ssize_t done = ::pread(descriptor_, out, count, static_cast<off_t>(offset));
            if (done > 0) {
                out += done;
                offset += static_cast<std::uint64_t>(done);
                count -= static_cast<std::size_t>(done);
            } else if (done == 0) {
                throw Failure("it became shorter while it was read");
            } else if (errno != EINTR) {
                throw systemFailure("it cannot be read", errno);
            }
        }
    }

private:
    void close() const {
        if (descriptor_ >= 0) {
            ::close(descriptor_);
        }
    }

    int descriptor_;
    std::uint64_t size_ = 0;
};

const char* stateName(SegmentState state) {
    switch (state) {
    case SegmentState::Heap:
        return "heap";
    case SegmentState::Unused:
        return "unused";
    case SegmentState::NotMade:
        return "not made";
    case SegmentState::CutOff:
        return "cut off";
    default:
        return "damaged";
    }
}

std::vector<std::string> asRow(const std::string& name, const SegmentReport& segment) {
    const bool heap = segment.state == SegmentState::Heap;
    return {name,
            segment.state == SegmentState::NotMade ? "-" : std::to_string(segment.offset),
            std::to_string(segment.size),
            heap ? std::to_string(segment.allocated) : "-",
            heap ? std::to_string(segment.free) : "-",
            stateName(segment.state)};
}

std::string asText(const MemoryFileReport& report) {
    std::vector<std::vector<std::string>> rows = {
        {"segment", "offset", "size", "allocated", "free", "state"}};
    rows.push_back(asRow("header", report.header));
    for (std::size_t index = 0; index < report.segments.size(); ++index) {
        rows.push_back(asRow(std::to_string(index), report.segments[index]));
    }
    constexpr Align left = Align::Left;
    constexpr Align right = Align::Right;
    std::string text = formatTable({left, right, right, right, right, left}, rows) +
                       counted(report.savedVectors, "saved vector", "saved vectors") + " of " +
                       counted(report.savedWords, "word", "words") + " in all\n";
    if (report.unaccounted != 0) {
        text += counted(report.unaccounted, "byte", "bytes") + " of the file in no segment\n";
    }
    return text;
}

nlohmann::ordered_json asJson(const SegmentReport& segment) {
    nlohmann::ordered_json object;
    if (segment.state == SegmentState::NotMade) {
        object["offset"] = nullptr;
    } else {
        object["offset"] = segment.offset;
    }
    object["size"] = segment.size;
    object["state"] = stateName(segment.state);
    if (segment.state == SegmentState::Heap) {
        object["allocated"] = segment.allocated;
        object["free"] = segment.free;
    } else {
        object["allocated"] = nullptr;
        object["free"] = nullptr;
    }
    return object;
}

std::string asJson(const std::string& path, const MemoryFileReport& report) {
    nlohmann::ordered_json object;
    object["file"] = printable(path);
    object["size"] = report.fileSize;
    object["header"] = asJson(report.header);
    object["segments"] = nlohmann::ordered_json::array();
    for (const SegmentReport& segment : report.segments) {
        nlohmann::ordered_json row;
        row["index"] = object["segments"].size();
        row.update(asJson(segment));
        object["segments"].push_back(row);
    }
    object["savedVectors"] = report.savedVectors;
    object["savedWords"] = report.savedWords;
    object["unaccounted"] = report.unaccounted;
    return object.dump(2) + "\n";
}

class MemoryCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        Syntax& inspect = syntax.subcommand("inspect", "List the segments of a persistent file");
        inspect.flag("--json", json_, "Print a JSON object");
        inspect.option("--segment-size", segmentSize_, "SIZE",
                       "Bytes of a segment that the file was made with");
        declareOutput(inspect, output_);
        inspect.operand("FILE", path_, "The file").required();
        inspect.setHelp(examples, inspectNotes);
    }

    int run(Diagnostics& diagnostics) override {
        const FileBytes bytes(path_);
        const MemoryFileReport report = inspect(bytes);
        print(json_ ? asJson(path_, report) : asText(report), output_);
        int status = Done;
        for (std::size_t index = 0; index < report.segments.size(); ++index) {
            const SegmentState state = report.segments[index].state;
            if (state == SegmentState::CutOff || state == SegmentState::Damaged) {
                diagnostics.say(printable(path_) + ": segment " + std::to_string(index) + " is " +
                                stateName(state));
                status = DoneWithLosses;
            }
        }
        return status;
    }

private:
    MemoryFileReport inspect(const ByteSource& bytes) const {
        std::optional<std::uint64_t> size;
        if (!segmentSize_.empty()) {
            // As the library rounds it when it makes the file.
            const std::uint64_t page = systemPageSize();
            size = ((parseSize("--segment-size", segmentSize_) - 1) / page + 1) * page;
        }
        try {
            return inspectMemoryFile(bytes, size);
        } catch (const Failure& failure) {
            throw Failure(printable(path_) + ": " + failure.what());
        }
    }

    std::string path_;
    std::string segmentSize_;
    std::string output_;
    bool json_ = false;
};

} // namespace

CommandInfo memoryCommand() {
    return {"memory", "Look into files of segments", examples, notes, std::make_unique<MemoryCommand>()};
}

} // namespace host
