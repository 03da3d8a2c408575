// The lines of files on their way into a sorter.
//
// A line ends with LF, which does not belong to it; the last one of a file need not end so. Lines are bytes, of any
// length. Where lines are folded, files are UTF-8, and what is not is refused with its place.
#pragma once

#include "base/progress.h"
#include "sort/growing_text.h"
#include "sort/line_sorter.h"
#include "sort/workspace.h"
#include "text/line_counter.h"

#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

struct FeedRule {
    bool fold = false;        ///< lines that differ in case only have equal keys
    bool places = false;      ///< records know their places
    std::uint64_t memory = 0; ///< bytes, for what is kept of a line until it is whole
};

class LineFeeder {
public:
    LineFeeder(const FeedRule& rule, LineSorter& sorter, Workspace& workspace);

    /// Adds the lines of a file. Throws Failure.
    void read(const std::string& path, Progress& progress);
    /// Bytes of all lines, their ends included.
    std::uint64_t size() const { return size_; }
    /// Whether a file began with a byte order mark, which belongs to no line.
    bool hasMark() const { return hasMark_; }

private:
    void takeBlock(std::string_view block);
    void takeLine(std::string_view line);
    void makeKey(std::string_view line);

    FeedRule rule_;
    LineSorter& sorter_;
    Workspace& workspace_;
    GrowingText line_; ///< the beginning of a line that goes on in the next block
    GrowingText key_;
    std::string folded_;
    std::uint64_t lines_ = 0;
    std::uint64_t size_ = 0;
    bool hasMark_ = false;
};

} // namespace host
