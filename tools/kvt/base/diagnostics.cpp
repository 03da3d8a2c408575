#include "base/diagnostics.h"

#include <cerrno>
#include <cstdlib>
#include <unistd.h>

namespace host {

namespace {

constexpr std::size_t heldBytes = 64 * 1024;

void writeQuietly(std::string_view text) {
    while (!text.empty()) {
        const ssize_t written = ::write(STDERR_FILENO, text.data(), text.size());
        if (written < 0 && errno == EINTR) {
            continue;
        }
        if (written <= 0) {
            return;
        }
        text.remove_prefix(static_cast<std::size_t>(written));
    }
}

bool isSmartTerminal() {
    const char* kind = std::getenv("TERM");
    return ::isatty(STDERR_FILENO) == 1 && kind != nullptr && std::string_view(kind) != "dumb";
}

bool colourIsForbidden() {
    const char* value = std::getenv("NO_COLOR");
    return value != nullptr && *value != '\0';
}

} // namespace

Diagnostics::Diagnostics()
    : colour_(isSmartTerminal() && !colourIsForbidden()), canDraw_(isSmartTerminal()) {}

Diagnostics::~Diagnostics() {
    clearStatus();
    flush();
}

void Diagnostics::fail(std::string_view text) {
    held_ += colour_ ? "\x1b[1;31mkvt:\x1b[0m " : "kvt: ";
    appendLine(text);
}

void Diagnostics::say(std::string_view text) {
    if (!quiet_) {
        fail(text);
    }
}

void Diagnostics::line(std::string_view text) {
    if (!quiet_) {
        appendLine(text);
    }
}

void Diagnostics::appendLine(std::string_view text) {
    held_.append(text) += '\n';
    if (held_.size() >= heldBytes) {
        flush();
    }
}

void Diagnostics::flush() {
    if (held_.empty()) {
        return;
    }
    clearStatus();
    writeQuietly(held_);
    held_.clear();
}

void Diagnostics::drawStatus(std::string_view text) {
    flush();
    std::string redrawn = "\r";
    redrawn.append(text).append("\x1b[K");
    writeQuietly(redrawn);
    drawn_ = true;
}

void Diagnostics::clearStatus() {
    if (drawn_) {
        writeQuietly("\r\x1b[K");
        drawn_ = false;
    }
}

} // namespace host
