// A bar on standard error while a long input is read, when that is a terminal.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>

namespace host {

class Diagnostics;

class Progress {
public:
    /// `total` is the number of bytes to come, if that is known. Nothing is drawn when `allowed` is false.
    Progress(Diagnostics& diagnostics, std::optional<std::uint64_t> total, bool allowed);
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
    bool active_;
    std::uint64_t done_ = 0;
    std::chrono::steady_clock::time_point next_;
};

} // namespace host
