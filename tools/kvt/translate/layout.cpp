#include "translate/layout.h"

#include "base/failure.h"
#include "base/text.h"
#include "cli/suggest.h"

#include <algorithm>
#include <charconv>

namespace host {

Layout::Layout(const std::vector<std::string>& names)
    : inputCount_(names.size()), slotCount_(names.size()), changing_(names.size()) {
    for (const std::string& name : names) {
        columns_.push_back({name, columns_.size()});
    }
}

std::size_t Layout::indexOf(const std::string& column) const {
    const auto isNamed = [&](const Column& other) { return other.name == column; };
    const auto named = std::find_if(columns_.begin(), columns_.end(), isNamed);
    if (named != columns_.end()) {
        if (std::count_if(columns_.begin(), columns_.end(), isNamed) > 1) {
            throw Failure("several columns are called '" + printable(column) + "'; say which by its number");
        }
        return static_cast<std::size_t>(named - columns_.begin());
    }
    std::size_t number = 0;
    const char* const end = column.data() + column.size();
    const auto [stop, error] = std::from_chars(column.data(), end, number);
    if (error == std::errc() && stop == end && number >= 1 && number <= inputCount_) {
        const auto numbered = std::find_if(columns_.begin(), columns_.end(),
                                           [&](const Column& other) { return other.slot == number - 1; });
        if (numbered != columns_.end()) {
            return static_cast<std::size_t>(numbered - columns_.begin());
        }
    }
    std::vector<std::string> names;
    for (const Column& other : columns_) {
        names.push_back(other.name);
    }
    throw Failure("there is no column '" + printable(column) + "'." + didYouMean(column, names));
}

const Layout::Column& Layout::at(const std::string& column) const {
    return columns_[indexOf(column)];
}

const Layout::Column& Layout::toChange(const std::string& column) {
    const Column& found = columns_[indexOf(column)];
    if (found.slot < inputCount_) {
        changing_[found.slot] = true;
    }
    return found;
}

void Layout::drop(const std::string& column) {
    columns_.erase(columns_.begin() + static_cast<std::ptrdiff_t>(indexOf(column)));
}

void Layout::keep(const std::vector<std::string>& columns) {
    std::vector<Column> kept;
    for (const std::string& column : columns) {
        kept.push_back(at(column));
    }
    columns_ = std::move(kept);
}

void Layout::rename(const std::string& column, const std::string& name) {
    columns_[indexOf(column)].name = name;
}

std::size_t Layout::add(const std::string& name, std::size_t before) {
    const auto place = std::find_if(columns_.begin(), columns_.end(),
                                    [&](const Column& other) { return other.slot == before; });
    columns_.insert(place, Column{name, slotCount_});
    return slotCount_++;
}

void Layout::dropSlot(std::size_t slot) {
    std::erase_if(columns_, [&](const Column& other) { return other.slot == slot; });
}

} // namespace host
