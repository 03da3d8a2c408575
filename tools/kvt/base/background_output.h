// Writing while the next piece is worked out: an output whose data a thread of its own writes. To put hundreds of megabytes
// into a file takes longer than to convert them.
#pragma once

#include "base/output.h"

#include <condition_variable>
#include <deque>
#include <exception>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

namespace host {

/// Writes to another output in the order in which it is written to. What goes wrong there is thrown by one of the next
/// calls, by commit() at the latest.
class BackgroundOutput : public Output {
public:
    explicit BackgroundOutput(std::unique_ptr<Output> output);
    BackgroundOutput(const BackgroundOutput&) = delete;
    BackgroundOutput& operator=(const BackgroundOutput&) = delete;
    /// All that was written until now is written out.
    ~BackgroundOutput() override;

    void write(std::string_view bytes) override;
    void writeAndClear(std::string& bytes) override;
    void commit() override;
    bool writesInPlaceTo(int descriptor) const override { return output_->writesInPlaceTo(descriptor); }

private:
    void work();
    void finish();

    std::unique_ptr<Output> output_;
    std::mutex state_;
    std::condition_variable hasChanged_;
    std::deque<std::string> pieces_;  ///< to be written
    std::vector<std::string> spares_; ///< for the next ones
    bool isOver_ = false;
    std::exception_ptr failure_;
    std::thread writer_;
};

} // namespace host
