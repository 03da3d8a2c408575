// As many records as memory may hold, and the sorting of them.
//
// Records are filled in from the front of one block of memory, and an Entry for each from its back, until the two
// meet. Only entries move. An entry holds the first bytes of its key, so that most comparisons look at nothing
// else; where many keys begin alike, the entries are filled anew from behind what the keys share. Equal keys stay
// in the order in which they were added, in a reverse order as well.
#pragma once

#include "base/memory_pages.h"
#include "sort/line_record.h"

#include <cstdint>

namespace host {

enum class LineOrder { Ascending, Descending };

class LineChunk {
public:
    /// `capacity` in bytes, entries included.
    LineChunk(std::uint64_t capacity, LineOrder order, const Workspace& workspace);

    /// False when there is no room for it.
    bool add(const LineRecord& record);
    bool empty() const { return last_ == first_; }
    /// Bytes of all records.
    std::uint64_t size() const { return filled_; }

    void sort();
    /// Of equal records, which are neighbours now, the first stays and counts for all. Afterwards the records may
    /// be sorted by place only.
    void dropEqual();
    /// Sorts by where the records were added.
    void sortByPlace();

    /// Calls use(record) for each.
    template <typename Use>
    void forEach(const Use& use) const {
        for (const Entry* entry = first_; entry != last_; ++entry) {
            if (last_ - entry > fetchedAhead) {
                __builtin_prefetch(block_.get() + entry[fetchedAhead].offset);
            }
            LineRecord record;
            decode(block_.get() + entry->offset, record);
            if (dropped_) {
                record.count = entry->prefix;
            }
            use(record);
        }
    }

    void clear();
    /// Gives the memory of a chunk without records back until there are some.
    void giveBack();

private:
    struct Entry {
        std::uint64_t prefix; ///< after dropEqual(), the count
        std::uint64_t offset; ///< of the record; ascends in the order in which records were added
    };
    static constexpr std::ptrdiff_t fetchedAhead = 8;

    std::string_view keyOf(const Entry& entry) const;
    std::uint64_t ordered(std::uint64_t prefix) const {
        return order_ == LineOrder::Descending ? ~prefix : prefix;
    }
    void sortFrom(Entry* begin, Entry* end, std::size_t depth, int level);
    void sortAlike(Entry* begin, Entry* end, std::size_t depth, int level);

    LineOrder order_;
    const Workspace& workspace_;
    std::uint64_t capacity_;
    MemoryBlock block_;
    std::uint64_t filled_ = 0;
    Entry* first_;
    Entry* last_; ///< but for dropEqual(), the end of the block
    bool dropped_ = false;
};

} // namespace host
