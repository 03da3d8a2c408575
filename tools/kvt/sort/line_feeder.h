// The lines of files on their way into a sorter.
//
// A line ends with LF, which does not belong to it; the last one of a file need not end so. Lines are of any length,
// and UTF-8, into which other encodings are decoded. Bytes that are not text are refused with their place, but for UTF-8
// whose lines are compared as they are: there they are bytes as any others.
#pragma once

#include "base/progress.h"
#include "sort/growing_text.h"
#include "sort/line_key.h"
#include "sort/line_sorter.h"
#include "sort/workspace.h"
#include "text/byte_order_mark.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace host {

struct FeedRule {
    KeyRule key;
    TextEncoding encoding = kvt::ex::Encoding::Utf8;
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
    /// That of the first file, in which order of bytes, too.
    kvt::ex::Encoding encoding() const { return encoding_.value_or(kvt::ex::Encoding::Utf8); }

    /// Lines without the number or the date that was to be their key.
    std::uint64_t withoutKey() const { return withoutKey_; }
    /// "FILE: line 3" for the first of them.
    const std::string& firstWithoutKey() const { return firstWithoutKey_; }

private:
    void takeBlock(std::string_view block);
    void takeLine(std::string_view line);
    void takeKeyed(std::string_view line, LineRecord& record);

    FeedRule rule_;
    LineSorter& sorter_;
    Workspace& workspace_;
    LineKeys keys_;
    GrowingText line_; ///< the beginning of a line that goes on in the next block
    std::optional<kvt::ex::Encoding> encoding_;
    std::string file_;
    std::uint64_t linesOfFile_ = 0;
    std::uint64_t lines_ = 0;
    std::uint64_t size_ = 0;
    std::uint64_t withoutKey_ = 0;
    std::string firstWithoutKey_;
    bool hasMark_ = false;
};

} // namespace host
