#include "convert/loss_ledger.h"

#include "base/diagnostics.h"
#include "base/text.h"
#include "convert/loss_report.h"

#include <algorithm>

namespace host {

void LossLedger::add(const kvt::ex::Loss& loss, const std::function<Place()>& place,
                     const std::optional<std::u32string>& written) {
    ++total_;
    Key key(loss.codePoint, loss.kind == kvt::ex::Loss::BadInput ? loss.bytes : std::string());
    const auto found = entries_.find(key);
    if (found != entries_.end()) {
        ++found->second.count;
    } else if (entries_.size() < mostEntries) {
        entries_.emplace(std::move(key), Entry{loss, place(), 1, entries_.size(), written});
    } else {
        ++unlisted_;
    }
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
