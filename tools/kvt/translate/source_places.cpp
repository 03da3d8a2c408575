#include "translate/source_places.h"

#include <algorithm>

namespace host {

SourcePlaces::SourcePlaces(kvt::ex::Encoding from) : decoder_(from, kvt::ex::Encoding::Utf8) {}

void SourcePlaces::add(std::string_view source) {
    pending_.erase(0, taken_);
    taken_ = 0;
    pending_ += source;
}

std::uint64_t SourcePlaces::at(std::uint64_t decoded) {
    // No byte of any encoding gives more than this.
    constexpr std::uint64_t mostDecoded = 16;
    while (decoded_ < decoded && taken_ < pending_.size()) {
        const std::size_t count = static_cast<std::size_t>(
            std::clamp<std::uint64_t>((decoded - decoded_) / mostDecoded, 1, pending_.size() - taken_));
        scratch_.clear();
        decoder_.convert(std::string_view(pending_).substr(taken_, count), scratch_, {});
        decoded_ += scratch_.size();
        taken_ += count;
        source_ += count;
    }
    return source_;
}

} // namespace host
