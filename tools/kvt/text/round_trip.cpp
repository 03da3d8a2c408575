#include "text/round_trip.h"

#include "base/text.h"

#include <algorithm>
#include <cstring>

namespace host {

namespace {

constexpr std::size_t width = sizeof(char32_t);

std::optional<char32_t> characterAt(const std::string& text, std::size_t index) {
    if ((index + 1) * width > text.size()) {
        return std::nullopt;
    }
    char32_t character = 0;
    std::memcpy(&character, text.data() + index * width, width);
    return character;
}

std::string shown(std::optional<char32_t> character) {
    return character ? codePointName(*character) : "the end of the text";
}

} // namespace

std::string describe(const RoundTrip::Difference& difference) {
    return "the output does not convert back to the same text: at character " +
           std::to_string(difference.character + 1) + ", " + shown(difference.before) + " comes back as " +
           shown(difference.after);
}

RoundTrip::RoundTrip(kvt::ex::Encoding from, kvt::ex::Encoding to)
    : decodeInput_(from, kvt::ex::Encoding::Utf32LE), decodeOutput_(to, kvt::ex::Encoding::Utf32LE) {}

void RoundTrip::readIn(kvt::ex::Encoding from) {
    decodeInput_ = kvt::ex::StreamTranscoder(from, kvt::ex::Encoding::Utf32LE);
}

void RoundTrip::addInput(std::string_view bytes) {
    if (!difference_) {
        decodeInput_.convert(bytes, input_, {});
    }
}

void RoundTrip::addOutput(std::string_view bytes) {
    if (!difference_) {
        decodeOutput_.convert(bytes, output_, {});
        compare();
    }
}

void RoundTrip::finish() {
    if (difference_) {
        return;
    }
    decodeInput_.finish(input_, {});
    decodeOutput_.finish(output_, {});
    compare();
    if (!difference_ && input_.size() != output_.size()) {
        difference_ = Difference{same_, characterAt(input_, 0), characterAt(output_, 0)};
    }
}

void RoundTrip::compare() {
    const std::size_t common = std::min(input_.size(), output_.size()) / width * width;
    if (std::memcmp(input_.data(), output_.data(), common) == 0) {
        same_ += common / width;
        input_.erase(0, common);
        output_.erase(0, common);
        return;
    }
    std::size_t index = 0;
    while (characterAt(input_, index) == characterAt(output_, index)) {
        ++index;
    }
    difference_ = Difference{same_ + index, characterAt(input_, index), characterAt(output_, index)};
}

} // namespace host
