#include "base/background_output.h"

#include "base/interrupt.h"

#include <system_error>
#include <utility>

namespace host {

namespace {

constexpr std::size_t mostPieces = 4;

} // namespace

BackgroundOutput::BackgroundOutput(std::unique_ptr<Output> output) : output_(std::move(output)) {
    // A signal ends the program on the thread that makes files and removes them.
    SignalsHeldBack inWriter;
    try {
        writer_ = std::thread([this] { work(); });
    } catch (const std::system_error&) {
        // There may be no more threads. What is written is written at once then.
    }
}

BackgroundOutput::~BackgroundOutput() {
    finish();
}

void BackgroundOutput::write(std::string_view bytes) {
    std::string piece(bytes);
    writeAndClear(piece);
}

void BackgroundOutput::writeAndClear(std::string& bytes) {
    if (!writer_.joinable()) {
        output_->writeAndClear(bytes);
        return;
    }
    {
        std::unique_lock lock(state_);
        hasChanged_.wait(lock, [&] { return failure_ || pieces_.size() < mostPieces; });
        if (failure_) {
            std::rethrow_exception(failure_);
        }
        pieces_.push_back(std::move(bytes));
        bytes.clear();
        if (!spares_.empty()) {
            bytes.swap(spares_.back());
            spares_.pop_back();
        }
    }
    hasChanged_.notify_one();
}

void BackgroundOutput::commit() {
    finish();
    if (failure_) {
        std::rethrow_exception(failure_);
    }
    output_->commit();
}

void BackgroundOutput::work() {
    std::unique_lock lock(state_);
    for (;;) {
        hasChanged_.wait(lock, [&] { return isOver_ || !pieces_.empty(); });
        if (pieces_.empty()) {
            return;
        }
        std::string piece = std::move(pieces_.front());
        lock.unlock();
        std::exception_ptr failure;
        try {
            output_->write(piece);
        } catch (...) {
            failure = std::current_exception();
        }
        lock.lock();
        pieces_.pop_front();
        piece.clear();
        spares_.push_back(std::move(piece));
        hasChanged_.notify_one();
        if (failure) {
            failure_ = failure;
            return;
        }
    }
}

void BackgroundOutput::finish() {
    if (writer_.joinable()) {
        {
            const std::lock_guard lock(state_);
            isOver_ = true;
        }
        hasChanged_.notify_one();
        writer_.join();
    }
}

} // namespace host
