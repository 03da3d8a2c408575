// A bar on standard error while a long input is read, if that is a terminal; on demand, lines if it is not.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

namespace host {

class Diagnostics;

class Progress {
public:
    enum class Show {
        Never,
        LongOnTerminal, ///< a bar, if it is a terminal and the input is long
        Always,         ///< a bar on a terminal, else a line now and then
    };

    /// `total` is the number of bytes to come, if that is known; `what` is said before the bar.
    Progress(Diagnostics& diagnostics, std::optional<std::uint64_t> total, Show show, std::string what);
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;
    /// Takes the bar away.
    ~Progress();

    /// So many more bytes have been read.
    void advance(std::uint64_t bytes);

    /// Shorter inputs have no bar.
    static constexpr std::uint64_t longInput = 8 * 1024 * 1024;

private:
    void draw();

    Diagnostics& diagnostics_;
    std::optional<std::uint64_t> total_;
    std::string what_;
    bool active_;
    bool always_;
    std::uint64_t done_ = 0;
    std::chrono::steady_clock::time_point next_;
};

} // namespace host
