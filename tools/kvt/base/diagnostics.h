// Everything that the program says on standard error: messages, reports, the progress bar. Text is UTF-8. A quiet
// program says only why it could not do what it was asked to.
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

    /// From now on, only fail() is heard.
    void beQuiet() { quiet_ = true; }
    bool isQuiet() const { return quiet_; }

    /// "kvt: " and the text, as a line: why the program ends with NotDone. The name is coloured on a terminal unless
    /// NO_COLOR forbids it.
    void fail(std::string_view text);
    /// The same for all else: what was lost, reports, sums.
    void say(std::string_view text);
    /// The text as a line of its own, as it stands: what goes with one of the two, such as a hint.
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
    void appendLine(std::string_view text);

    bool quiet_ = false;
    bool colour_;
    bool canDraw_;
    bool drawn_ = false;
    std::string held_;
};

} // namespace host
