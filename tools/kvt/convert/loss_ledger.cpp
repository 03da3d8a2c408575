#include "convert/loss_ledger.h"

#include "base/diagnostics.h"
#include "base/text.h"
#include "convert/loss_report.h"

#include <algorithm>

namespace host {

// 0 for bad bytes that are too many.
std::uint64_t LossLedger::numberOf(const kvt::ex::Loss& loss) {
    constexpr std::size_t mostBytes = 6;
    if (loss.kind == kvt::ex::Loss::NotRepresentable) {
        return std::uint64_t{1} << 56 | loss.codePoint;
    }
    if (loss.bytes.size() > mostBytes) {
        return 0;
    }
    std::uint64_t number = 2 + loss.bytes.size();
    for (const char byte : loss.bytes) {
        number = number << 8 | static_cast<unsigned char>(byte);
    }
    return number << 8;
}

bool LossLedger::addAgain(const kvt::ex::Loss& loss) {
    const std::uint64_t number = numberOf(loss);
    const Known& known = knownOf(number);
    if (number == 0 || known.number != number) {
        return false;
    }
    ++total_;
    ++known.entry->count;
    return true;
}

void LossLedger::add(const kvt::ex::Loss& loss, const std::function<Place()>& place,
                     const std::optional<std::u32string>& written) {
    if (addAgain(loss)) {
        return;
    }
    ++total_;
    Key key(loss.codePoint, loss.kind == kvt::ex::Loss::BadInput ? loss.bytes : std::string());
    auto found = entries_.find(key);
    if (found == entries_.end()) {
        if (entries_.size() == mostEntries) {
            ++unlisted_;
            return;
        }
        found = entries_.emplace(std::move(key), Entry{loss, place(), 0, entries_.size(), written}).first;
    }
    ++found->second.count;
    const std::uint64_t number = numberOf(loss);
    knownOf(number) = {number, &found->second};
}

void LossLedger::addFallbackLines(std::uint64_t count, const Place& first) {
    if (fallbackLines_ == 0) {
        firstFallback_ = first;
    }
    fallbackLines_ += count;
}

std::vector<LossLedger::Entry> LossLedger::entries() const {
    std::vector<Entry> list;
    for (const auto& [key, entry] : entries_) {
        list.push_back(entry);
    }
    std::sort(list.begin(), list.end(), [](const Entry& left, const Entry& right) {
        return left.count != right.count ? left.count > right.count : left.order < right.order;
    });
    return list;
}

void printLedger(const LossLedger& ledger, const std::string& from, const std::string& to,
                 Diagnostics& diagnostics) {
    const std::string different = ledger.unlisted() == 0 ? std::to_string(ledger.entryCount())
                                                         : "more than " + std::to_string(ledger.entryCount());
    diagnostics.say(counted(ledger.total(), "loss", "losses") + " from " + from + " to " + to + ", " +
                    different + " different:");
    for (const LossLedger::Entry& entry : ledger.entries()) {
        std::string count = std::to_string(entry.count);
        count.insert(0, count.size() < 8 ? 8 - count.size() : 0, ' ');
        diagnostics.line(count + "  " + describeLost(entry.first) + describeWritten(entry.written) +
                         "; first in " + describe(entry.place));
    }
    if (ledger.unlisted() != 0) {
        diagnostics.line("     and  " + counted(ledger.unlisted(), "loss", "losses") +
                         " of characters or bytes that are not listed");
    }
}

} // namespace host
