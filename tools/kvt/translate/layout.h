// The columns of a table while a job goes through it: what they are called, and in which slot of a row their cells are.
//
// The cells of the input have the first slots, in order. Steps look slots up once, by name; columns that are dropped,
// kept, renamed or moved cost nothing when rows come.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace host {

class Layout {
public:
    struct Column {
        std::string name;
        std::size_t slot;
    };

    /// `names` are those of the header.
    explicit Layout(const std::vector<std::string>& names);

    const std::vector<Column>& columns() const { return columns_; }
    std::size_t inputCount() const { return inputCount_; }
    std::size_t slotCount() const { return slotCount_; }
    /// Whether a step may change the cells of the slot.
    bool isChanging(std::size_t slot) const { return slot >= inputCount_ || changing_[slot]; }

    // `column` is a name, or the number of a column of the input, from 1. All throw Failure where there is none, or
    // where the name is that of several.

    /// To read the cells.
    const Column& at(const std::string& column) const;
    /// To change them, too.
    const Column& toChange(const std::string& column);
    void drop(const std::string& column);
    /// Only these stay, in this order.
    void keep(const std::vector<std::string>& columns);
    void rename(const std::string& column, const std::string& name);

    // For steps that know the slot of a column, whatever others are called by now.

    /// A new column before that of the slot `before`. Gives its slot.
    std::size_t add(const std::string& name, std::size_t before);
    void dropSlot(std::size_t slot);

private:
    std::size_t indexOf(const std::string& column) const;

    std::vector<Column> columns_;
    std::size_t inputCount_;
    std::size_t slotCount_;
    std::vector<bool> changing_;
};

} // namespace host
