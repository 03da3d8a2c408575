// The text of a cell that a step made. Most are short, as dates and numbers are, and are copied without a call.
#pragma once

#include <array>
#include <cstddef>
#include <cstring>
#include <string>
#include <string_view>

namespace host {

/// The same as memcpy. Of a short text, the same bytes may be written twice.
inline void copyText(char* to, std::string_view from) {
    const std::size_t size = from.size();
    if (size >= 8 && size <= 16) {
        std::memcpy(to, from.data(), 8);
        std::memcpy(to + size - 8, from.data() + size - 8, 8);
    } else if (size >= 4 && size < 8) {
        std::memcpy(to, from.data(), 4);
        std::memcpy(to + size - 4, from.data() + size - 4, 4);
    } else if (size != 0) {
        std::memcpy(to, from.data(), size);
    }
}

class CellValue {
public:
    /// `text` may be of this value.
    void assign(std::string_view text) {
        if (text.size() <= near_.size() && !isOf(text)) {
            copyText(near_.data(), text);
            size_ = text.size();
            isFar_ = false;
        } else {
            far_.assign(text);
            isFar_ = true;
        }
    }
    std::string_view text() const {
        return isFar_ ? std::string_view(far_) : std::string_view(near_.data(), size_);
    }

private:
    bool isOf(std::string_view text) const {
        return text.data() >= near_.data() && text.data() < near_.data() + near_.size();
    }

    std::array<char, 16> near_{};
    std::size_t size_ = 0;
    bool isFar_ = false;
    std::string far_;
};

} // namespace host
