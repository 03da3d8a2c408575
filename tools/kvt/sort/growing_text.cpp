#include "sort/growing_text.h"

#include <algorithm>
#include <cstring>
#include <utility>

namespace host {

std::string_view GrowingText::view() const {
    return long_ ? std::string_view(long_->data(), size_) : std::string_view(short_);
}

void GrowingText::clear() {
    short_.clear();
    long_.reset();
    size_ = 0;
}

void GrowingText::append(std::string_view bytes) {
    if (!long_ && size_ + bytes.size() <= most_) {
        short_.append(bytes);
        size_ += bytes.size();
        return;
    }
    if (!long_ || size_ + bytes.size() > long_->size()) {
        moveTo(workspace_.allocate(std::max(size_ + bytes.size(), most_) * 4));
    }
    forEachPiece(workspace_, bytes, [this](std::string_view piece) { write(piece); });
}

void GrowingText::moveTo(std::unique_ptr<Stretch> stretch) {
    const std::unique_ptr<Stretch> before = std::exchange(long_, std::move(stretch));
    const std::string_view text = before ? std::string_view(before->data(), size_) : std::string_view(short_);
    size_ = 0;
    forEachPiece(workspace_, text, [this](std::string_view piece) { write(piece); });
    short_ = {};
}

void GrowingText::write(std::string_view bytes) {
    constexpr std::uint64_t window = 1024 * 1024;
    long_->reserve(size_ + bytes.size());
    std::memcpy(long_->data() + size_, bytes.data(), bytes.size());
    const std::uint64_t windows = size_ / window;
    size_ += bytes.size();
    if (size_ / window != windows) {
        workspace_.letGo({long_->data() + windows * window, size_ - windows * window});
    }
}

} // namespace host
