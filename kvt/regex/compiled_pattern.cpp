// A search scans for the prefix and has the engine try the pattern at such a place only. It goes back to the plain
// search from the start where the scan does not pay, and where the engine might have given up on its way.
#include <kvt/regex/detail/compiled_pattern.h>

#include <memory>
#include <utility>

namespace kvt::ex::detail {
namespace {

// The number of the calling thread, modulo `count`.
std::size_t numberOfThread(std::size_t count) {
    static std::atomic<std::size_t> threads{0};
    thread_local constinit std::size_t number = 0;
    if (number == 0) {
        number = threads.fetch_add(1, std::memory_order_relaxed) + 1;
    }
    return number % count;
}

// Whether prefixes stand so close that trying the pattern at each place costs no more.
bool areClose(std::size_t tries, std::size_t distance) {
    return tries > 4 && distance / tries < 64;
}

} // namespace

CompiledPattern::CompiledPattern(std::string_view pattern)
    : engine_(pattern.data(), pattern.data() + pattern.size(), boost::regex_constants::normal),
      owner_(numberOfThread(programs)), prefix_(fixedPrefix(engine_)), scan_(std::move(prefix_.sets)) {}

CompiledPattern::~CompiledPattern() {
    for (const auto& other : others_) {
        delete other.load(std::memory_order_relaxed);
    }
}

const Engine& CompiledPattern::engine() const {
    const std::size_t number = numberOfThread(programs);
    if (number == owner_) {
        return engine_;
    }
    std::atomic<const Engine*>& place = others_[number];
    const Engine* own = place.load(std::memory_order_acquire);
    if (own == nullptr) {
        auto made =
            std::make_unique<Engine>(engine_); // for its locale, which may not be the global one any more
        made->assign(engine_.expression(), engine_.expression() + engine_.size(),
                     boost::regex_constants::normal);
        if (place.compare_exchange_strong(own, made.get(), std::memory_order_acq_rel)) {
            own = made.release();
        }
    }
    return *own;
}

bool CompiledPattern::match(std::string_view text, boost::cmatch& result) const {
    return boost::regex_match(text.data(), text.data() + text.size(), result, engine());
}

bool CompiledPattern::search(std::string_view text, std::size_t start, boost::cmatch& result) const {
    const char* const begin = text.data() + start;
    return searchIn({begin, begin, text.data() + text.size()}, boost::regex_constants::match_default, result);
}

bool CompiledPattern::matchesIn(std::string_view text) const {
    // The engine, too, would find what the scan finds, if it does not give up before.
    if (prefix_.isWholePattern && prefix_.isSureToEnd(engine_.size(), text.size(), prefix_.statesOfWay)) {
        return scan_.find(text.data(), text.size(), 0) != text.size();
    }
    boost::cmatch result;
    return search(text, 0, result);
}

std::size_t CompiledPattern::passOver(std::string_view text, std::size_t start) const {
    // What is sure to end without a try is so in each part of the text.
    return scan_ && prefix_.isSureToEnd(engine_.size(), text.size() - start, 0)
               ? scan_.find(text.data(), text.size(), start)
               : start;
}

bool CompiledPattern::searchOn(std::string_view text, std::size_t start, bool mayBeEmpty,
                               boost::cmatch& result) const {
    return searchIn({text.data(), text.data() + start, text.data() + text.size()},
                    mayBeEmpty ? boost::regex_constants::match_default
                               : boost::regex_constants::match_not_initial_null,
                    result);
}

bool CompiledPattern::searchIn(const Range& range, boost::match_flag_type flags,
                               boost::cmatch& result) const {
    if (scan_ && flags == boost::regex_constants::match_default) {
        if (const std::optional<bool> found = searchByPrefix(range, result)) {
            return *found;
        }
    }
    return boost::regex_search(range.begin, range.end, result, engine(), flags, range.base);
}

std::optional<bool> CompiledPattern::searchByPrefix(const Range& range, boost::cmatch& result) const {
    const char* const begin = range.begin;
    const auto size = static_cast<std::size_t>(range.end - begin);
    double visited = 0; // states, by the tries
    std::size_t place = scan_.find(begin, size, 0);
    for (std::size_t tries = 1;; ++tries) {
        const std::size_t first = place != size ? prefix_.beginOfTry({begin, size}, place) : size;
        visited += place != size ? prefix_.statesOfTry({begin, size}, first) : 0;
        if (!prefix_.isSureToEnd(engine_.size(), size, visited) || areClose(tries, place)) {
            return {};
        }
        if (place == size) {
            return false;
        }
        try {
            // All that looks back sees what it would see in the plain search, and not the beginning of the try.
            if (boost::regex_search(begin + first, range.end, result, engine(), boost::match_continuous,
                                    range.base)) {
                return true;
            }
        } catch (const boost::regex_error&) {
            return {};
        }
        place = scan_.find(begin, size, place + 1);
    }
}

} // namespace kvt::ex::detail
