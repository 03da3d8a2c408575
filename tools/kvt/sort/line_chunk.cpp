#include "sort/line_chunk.h"

#include <algorithm>

namespace host {

namespace {

// Fewer alike entries than this are sorted by comparing their keys.
constexpr std::ptrdiff_t fewEntries = 16;
// As are those that are still alike after so many rounds, lest the recursion becomes as deep as keys are long.
constexpr int deepestLevel = 32;

} // namespace

LineChunk::LineChunk(std::uint64_t capacity, LineOrder order, const Workspace& workspace)
    : order_(order), workspace_(workspace), capacity_(capacity / sizeof(Entry) * sizeof(Entry)),
      block_(capacity_) {
    clear();
}

void LineChunk::clear() {
    filled_ = 0;
    first_ = last_ = reinterpret_cast<Entry*>(block_.get() + capacity_);
    dropped_ = false;
}

void LineChunk::giveBack() {
    block_.giveBack();
}

bool LineChunk::add(const LineRecord& record) {
    const std::uint64_t entries = static_cast<std::uint64_t>(last_ - first_) + 1;
    if (filled_ + encodedSize(record) + entries * sizeof(Entry) > capacity_) {
        return false;
    }
    *--first_ = {ordered(prefixOf(record.key)), filled_};
    char* out = encodeHeader(block_.get() + filled_, record);
    out = std::copy(record.key.begin(), record.key.end(), out);
    if (record.payload) {
        out = std::copy(record.payload->begin(), record.payload->end(), out);
    }
    filled_ = static_cast<std::uint64_t>(out - block_.get());
    return true;
}

std::string_view LineChunk::keyOf(const Entry& entry) const {
    LineRecord record;
    decode(block_.get() + entry.offset, record);
    return record.key;
}

void LineChunk::sort() {
    sortFrom(first_, last_, 0, 0);
}

// The keys agree in their first `depth` bytes, and the prefixes are those from there on.
void LineChunk::sortFrom(Entry* begin, Entry* end, std::size_t depth, int level) {
    std::sort(begin, end, [](const Entry& left, const Entry& right) {
        return left.prefix != right.prefix ? left.prefix < right.prefix : left.offset < right.offset;
    });
    while (begin != end) {
        Entry* const alike = begin++;
        while (begin != end && begin->prefix == alike->prefix) {
            ++begin;
        }
        if (begin - alike > 1 && isOpen(ordered(alike->prefix))) {
            sortAlike(alike, begin, depth + 7, level);
        }
    }
}

void LineChunk::sortAlike(Entry* begin, Entry* end, std::size_t depth, int level) {
    if (end - begin < fewEntries || level == deepestLevel) {
        std::sort(begin, end, [&](const Entry& left, const Entry& right) {
            const int order = compareFrom(keyOf(left), keyOf(right), depth, workspace_);
            return order == 0                        ? left.offset < right.offset
                   : order_ == LineOrder::Descending ? order > 0
                                                     : order < 0;
        });
        return;
    }
    const std::string_view first = keyOf(*begin);
    std::size_t shared = first.size();
    for (const Entry* entry = begin + 1; entry != end; ++entry) {
        const std::string_view key = keyOf(*entry).substr(0, shared);
        shared = static_cast<std::size_t>(std::mismatch(key.begin() + static_cast<std::ptrdiff_t>(depth),
                                                        key.end(),
                                                        first.begin() + static_cast<std::ptrdiff_t>(depth))
                                              .first -
                                          key.begin());
    }
    for (Entry* entry = begin; entry != end; ++entry) {
        entry->prefix = ordered(prefixOf(keyOf(*entry), shared));
    }
    sortFrom(begin, end, shared, level + 1);
}

void LineChunk::dropEqual() {
    Entry* kept = first_;
    for (const Entry* entry = first_; entry != last_;) {
        LineRecord record;
        decode(block_.get() + entry->offset, record);
        Entry merged{record.count, entry->offset};
        for (++entry; entry != last_; ++entry) {
            LineRecord next;
            decode(block_.get() + entry->offset, next);
            if (next.key != record.key) {
                break;
            }
            merged.prefix += next.count;
        }
        *kept++ = merged;
    }
    last_ = kept;
    dropped_ = true;
}

void LineChunk::sortByPlace() {
    std::sort(first_, last_,
              [](const Entry& left, const Entry& right) { return left.offset < right.offset; });
}

} // namespace host
