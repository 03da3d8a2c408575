#include "progress.h"

#include "diagnostics.h"

#include <algorithm>
#include <string>

namespace host {

namespace {

constexpr auto interval = std::chrono::milliseconds(100);
constexpr std::size_t barWidth = 40;

std::string mebibytes(std::uint64_t bytes) {
    return std::to_string(bytes / (1024 * 1024)) + " MiB";
}

} // namespace

Progress::Progress(Diagnostics& diagnostics, std::optional<std::uint64_t> total, bool allowed)
    : diagnostics_(diagnostics), total_(total),
      active_(allowed && diagnostics.canDraw() && (!total || *total >= longInput)) {}

Progress::~Progress() {
    diagnostics_.clearStatus();
}

void Progress::advance(std::uint64_t bytes) {
    done_ += bytes;
    if (!active_ || (!total_ && done_ < longInput)) {
        return;
    }
    const auto now = std::chrono::steady_clock::now();
    if (now >= next_) {
        next_ = now + interval;
        draw();
    }
}

void Progress::draw() {
    if (!total_) {
        diagnostics_.drawStatus(mebibytes(done_));
        return;
    }
    // A file may grow while it is read.
    const std::uint64_t done = std::min(done_, *total_);
    const std::size_t filled = static_cast<std::size_t>(done / (*total_ / barWidth + 1));
    const std::uint64_t percent = done * 100 / *total_;
    std::string bar = "[";
    bar.append(filled, '#').append(barWidth - filled, '.').append("] ");
    bar.append(std::to_string(percent)).append("% of ").append(mebibytes(*total_));
    diagnostics_.drawStatus(bar);
}

} // namespace host
