#include "base/progress.h"

#include "base/diagnostics.h"

#include <algorithm>
#include <string>
#include <utility>

namespace host {

namespace {

constexpr auto barInterval = std::chrono::milliseconds(100);
constexpr auto lineInterval = std::chrono::seconds(2);
constexpr std::size_t barWidth = 40;

std::string amount(std::uint64_t bytes) {
    return bytes < 1024 * 1024 ? std::to_string(bytes) + " bytes"
                               : std::to_string(bytes / (1024 * 1024)) + " MiB";
}

} // namespace

Progress::Progress(Diagnostics& diagnostics, std::optional<std::uint64_t> total, Show show, std::string what)
    : diagnostics_(diagnostics), total_(total), what_(std::move(what)),
      active_(!diagnostics.isQuiet() &&
              (show == Show::Always ||
               (show != Show::Never && diagnostics.canDraw() && (!total || *total >= longInput)))),
      always_(show == Show::Always) {}

Progress::~Progress() {
    diagnostics_.clearStatus();
}

void Progress::advance(std::uint64_t bytes) {
    done_ += bytes;
    if (!active_ || (!always_ && !total_ && done_ < longInput)) {
        return;
    }
    const auto now = std::chrono::steady_clock::now();
    if (now >= next_) {
        next_ = now + (diagnostics_.canDraw() ? barInterval : std::chrono::milliseconds(lineInterval));
        draw();
    }
}

void Progress::draw() {
    std::string text = what_;
    if (!text.empty()) {
        text.push_back(' ');
    }
    // A file may grow while it is read.
    const std::uint64_t done = total_ ? std::min(done_, *total_) : done_;
    if (total_) {
        if (diagnostics_.canDraw()) {
            const std::size_t filled = static_cast<std::size_t>(done / (*total_ / barWidth + 1));
            text.append("[").append(filled, '#').append(barWidth - filled, '.').append("] ");
        }
        const std::uint64_t percent = *total_ == 0 ? 100 : done * 100 / *total_;
        text.append(std::to_string(percent)).append("% of ").append(amount(*total_));
    } else {
        text.append(amount(done));
    }
    if (diagnostics_.canDraw()) {
        diagnostics_.drawStatus(text);
    } else {
        diagnostics_.say(text);
        diagnostics_.flush();
    }
}

} // namespace host
