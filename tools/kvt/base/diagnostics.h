// Everything that the program says on standard error: messages, reports, the progress bar. Text is UTF-8.
//
// Failures to write here are ignored: there is no other place to complain to.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

class Diagnostics {
public:
    Diagnostics();
    Diagnostics(const Diagnostics&) = delete;
    Diagnostics& operator=(const Diagnostics&) = delete;
    ~Diagnostics();

    /// "kvt: " and the text, as a line. The name is coloured on a terminal unless NO_COLOR forbids it.
    void say(std::string_view text);
    /// The text as a line of its own, as it stands.
    void line(std::string_view text);
    /// Writes what lines are still held back. Many lines in a row are written together.
    void flush();

    /// Draws `text` as the last line of the screen, in place of the one that was drawn before.
    void drawStatus(std::string_view text);
    /// Takes it away again.
    void clearStatus();
    /// Whether standard error is a terminal on which a line can be redrawn.
    bool canDraw() const { return canDraw_; }

private:
    void append(std::string_view text);

    bool colour_;
    bool canDraw_;
    bool drawn_ = false;
    std::string held_;
};

} // namespace host
