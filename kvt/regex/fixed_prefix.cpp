// The compiled program is read, not the pattern, so that classes and escapes are what the engine takes them for. It is
// a chain of states in the order of the pattern. A kind of state that is not in the tables below ends the matter: then
// nothing is passed over.
#include <kvt/regex/detail/fixed_prefix.h>

#include <algorithm>
#include <bit>
#include <cstdint>
#include <limits>

namespace kvt::ex::detail {
namespace {

namespace states = boost::BOOST_REGEX_DETAIL_NS;

constexpr std::size_t longestPrefix = 16; // bytes

template <typename State>
const State& as(const states::re_syntax_base* state) {
    return *static_cast<const State*>(state);
}

const char* textOf(const states::re_syntax_base* literal) {
    return reinterpret_cast<const char*>(&as<states::re_literal>(literal) + 1);
}

/// Which of eight bytes are not 0, the first one's bit lowest.
unsigned bitsOf(const unsigned char* bytes) {
    constexpr std::uint64_t low7 = 0x7F7F7F7F7F7F7F7F;
    std::uint64_t word = 0;
    for (unsigned i = 0; i < 8; ++i) {
        word |= static_cast<std::uint64_t>(bytes[i]) << (8 * i);
    }
    word = (((word & low7) + low7) | word) >> 7U & 0x0101010101010101; // 1 in each byte that was not 0
    return static_cast<unsigned>(word * 0x0102040810204080 >> 56U);
}

ByteSet only(char byte) {
    ByteSet set;
    set.add(static_cast<unsigned char>(byte));
    return set;
}

/// The bytes that a state of one byte takes, or that might be taken.
ByteSet bytesOf(const states::re_syntax_base* state) {
    ByteSet set;
    if (state->type == states::syntax_element_literal) {
        return only(*textOf(state));
    }
    if (state->type == states::syntax_element_set) {
        const auto* map = as<states::re_set>(state)._map;
        for (std::uint16_t& row : set.rows) {
            row = static_cast<std::uint16_t>(bitsOf(map) | bitsOf(map + 8) << 8U);
            map += 16;
        }
        return set;
    }
    set.rows.fill(0xFFFF);
    return set;
}

/// Reads the parts and counts the states. Returns false where the engine could visit more of them than can be told
/// beforehand: groups that are repeated, looks ahead and behind, references and their like.
bool readParts(const Engine& engine, FixedPrefix& prefix) {
    double states = 0;
    double ways = 1;
    for (const auto* state = engine.get_first_state(); state != nullptr; state = state->next.p) {
        ++states;
        switch (state->type) {
        case states::syntax_element_startmark:
        case states::syntax_element_endmark:
            if (as<states::re_brace>(state).index < 0) {
                return false;
            }
            break;
        case states::syntax_element_literal:
            prefix.parts.push_back({{}, as<states::re_literal>(state).length, 0});
            break;
        case states::syntax_element_set:
        case states::syntax_element_wild:
            prefix.parts.push_back({{}, 1, 0});
            break;
        case states::syntax_element_dot_rep:
        case states::syntax_element_char_rep:
        case states::syntax_element_short_set_rep: {
            const auto& repeat = as<states::re_repeat>(state);
            FixedPrefix::Part part{{}, repeat.min, repeat.max};
            if (repeat.min != repeat.max) {
                part.set = bytesOf(state->next.p);
                part.takesAll = part.set.count() == 256;
            }
            prefix.parts.push_back(part);
            state = state->next.p; // what is repeated
            break;
        }
        case states::syntax_element_rep:
            if (as<states::re_repeat>(state).max > 1) {
                return false;
            }
            [[fallthrough]];
        case states::syntax_element_alt:
            prefix.hasAlternatives = true;
            ways *= 2;
            break;
        case states::syntax_element_start_line:
        case states::syntax_element_end_line:
        case states::syntax_element_word_boundary:
        case states::syntax_element_within_word:
        case states::syntax_element_word_start:
        case states::syntax_element_word_end:
        case states::syntax_element_buffer_start:
        case states::syntax_element_buffer_end:
        case states::syntax_element_jump:
        case states::syntax_element_match:
            break;
        default:
            return false;
        }
    }
    // Each way may begin with a step back.
    prefix.statesOfWay = 2 * (states + 1) * ways;
    return true;
}

/// Reads what comes first in a program, and counts the states in it.
class PrefixReader {
public:
    explicit PrefixReader(FixedPrefix& prefix) : prefix_(prefix) {}

    void read(const Engine& engine) {
        prefix_.sets = setsFrom(engine.get_first_state(), longestPrefix, true);
    }

private:
    static constexpr double mostStates = 256; // of alternatives that begin with more, nothing is said

    /// Whether a repeat at the very beginning takes all bytes of a set that there are in a row. Where the engine fails
    /// behind such a run it goes on behind it, too.
    static bool isRun(const states::re_repeat& repeat) {
        return repeat.type != states::syntax_element_dot_rep && repeat.leading && repeat.greedy &&
               repeat.min >= 1 && repeat.max == std::numeric_limits<std::size_t>::max();
    }

    /// The sets of at most `longest` bytes from a state on, up to the first state that may take this or that number of
    /// bytes.
    std::vector<ByteSet> setsFrom(const states::re_syntax_base* state, std::size_t longest, bool mayBeRun) {
        std::vector<ByteSet> sets;
        sets.reserve(longest);
        while (sets.size() < longest && ++prefix_.statesOfPrefix < mostStates) {
            switch (state->type) {
            case states::syntax_element_startmark:
            case states::syntax_element_endmark:
                break;
            case states::syntax_element_start_line:
            case states::syntax_element_word_boundary:
            case states::syntax_element_within_word:
            case states::syntax_element_word_start:
            case states::syntax_element_word_end:
                mayBeRun = false; // what may not stand where the run begins may stand within it
                break;
            case states::syntax_element_literal:
                for (std::size_t i = 0; i < as<states::re_literal>(state).length && sets.size() < longest;
                     ++i) {
                    sets.push_back(only(textOf(state)[i]));
                }
                break;
            case states::syntax_element_set:
            case states::syntax_element_wild:
                sets.push_back(bytesOf(state));
                break;
            case states::syntax_element_dot_rep:
            case states::syntax_element_char_rep:
            case states::syntax_element_short_set_rep: {
                const auto& repeat = as<states::re_repeat>(state);
                const ByteSet repeated = bytesOf(state->next.p);
                if (mayBeRun && sets.empty() && isRun(repeat)) {
                    prefix_.run = repeated;
                    sets.push_back(repeated);
                    // One more for each byte of the run, which the engine gives back in vain.
                    ++prefix_.statesOfPrefix;
                } else {
                    sets.insert(sets.end(), std::min(repeat.min, longest - sets.size()), repeated);
                    if (repeat.min != repeat.max) {
                        return sets;
                    }
                }
                state = repeat.alt.p;
                continue;
            }
            case states::syntax_element_jump: // behind an alternative
                state = as<states::re_jump>(state).alt.p;
                continue;
            case states::syntax_element_alt: {
                const std::size_t left = longest - sets.size();
                const auto either = unionOf(setsFrom(state->next.p, left, false),
                                            setsFrom(as<states::re_alt>(state).alt.p, left, false));
                sets.insert(sets.end(), either.begin(), either.end());
                return sets;
            }
            default:
                return sets;
            }
            state = state->next.p;
        }
        return sets;
    }

    /// Where both have a set.
    static std::vector<ByteSet> unionOf(std::vector<ByteSet> left, const std::vector<ByteSet>& right) {
        left.resize(std::min(left.size(), right.size()));
        for (std::size_t i = 0; i < left.size(); ++i) {
            left[i].add(right[i]);
        }
        return left;
    }

    FixedPrefix& prefix_;
};

/// How many bytes each match has, where the pattern says of each of them alone which it may be.
std::optional<std::size_t> sizeOfPlainPattern(const Engine& engine) {
    std::size_t size = 0;
    for (const auto* state = engine.get_first_state();;) {
        switch (state->type) {
        case states::syntax_element_startmark:
        case states::syntax_element_endmark:
            break;
        case states::syntax_element_literal:
            size += as<states::re_literal>(state).length;
            break;
        case states::syntax_element_set:
            ++size;
            break;
        case states::syntax_element_char_rep:
        case states::syntax_element_short_set_rep: {
            const auto& repeat = as<states::re_repeat>(state);
            if (repeat.min != repeat.max || repeat.max > longestPrefix) {
                return std::nullopt;
            }
            size += repeat.min;
            state = repeat.alt.p;
            continue;
        }
        case states::syntax_element_match:
            return size;
        default:
            return std::nullopt;
        }
        state = state->next.p;
    }
}

bool haveCommonByte(const ByteSet& left, const ByteSet& right) {
    for (std::size_t i = 0; i < left.rows.size(); ++i) {
        if ((left.rows[i] & right.rows[i]) != 0) {
            return true;
        }
    }
    return false;
}

// Whether a place in so many is expected to have the prefix that looking for it pays.
bool isRare(const std::vector<ByteSet>& sets) {
    double frequency = 1;
    for (const ByteSet& set : sets) {
        frequency *= set.frequency();
    }
    return frequency < 1.0 / 50;
}

} // namespace

FixedPrefix fixedPrefix(const Engine& engine) {
    FixedPrefix prefix;
    if (readParts(engine, prefix)) {
        PrefixReader(prefix).read(engine);
        while (!prefix.sets.empty() && prefix.sets.back().count() == 256) {
            prefix.sets.pop_back();
        }
        // Behind a run stands something else, so that nothing but a whole run is one.
        const bool isRunOpen =
            prefix.run && (prefix.sets.size() < 2 || haveCommonByte(*prefix.run, prefix.sets[1]));
        if (isRunOpen || !isRare(prefix.sets)) {
            prefix.sets.clear();
        }
        prefix.isWholePattern = !prefix.sets.empty() && sizeOfPlainPattern(engine) == prefix.sets.size();
    }
    return prefix;
}

std::size_t FixedPrefix::beginOfTry(std::string_view text, std::size_t place) const {
    while (run && place > 0 && run->contains(static_cast<unsigned char>(text[place - 1]))) {
        --place;
    }
    return place;
}

// Each part lies between two places, the nearest and the farthest that it may get to; a repeat gives as many ways more
// as there are places for its end.
double FixedPrefix::statesOfTry(std::string_view text, std::size_t place) const {
    std::size_t nearest = place;
    std::size_t farthest = place;
    double visited = statesOfWay;
    for (const Part& part : parts) {
        // At least so many bytes, which are not looked at.
        const std::size_t begin = std::min(text.size(), farthest);
        farthest = part.least < text.size() - begin ? begin + part.least : text.size();
        if (part.most > part.least) {
            // A run that goes past the farthest place so far is the one that goes on there.
            const std::size_t more = std::min(part.most - part.least, text.size() - farthest);
            const std::size_t end = farthest + more;
            if (part.takesAll) {
                farthest = end;
            } else {
                while (farthest != end && part.set.contains(static_cast<unsigned char>(text[farthest]))) {
                    ++farthest;
                }
            }
            visited *= static_cast<double>(std::min(part.most - part.least, farthest - nearest) + 1);
        }
        // Of alternatives not all parts are taken.
        nearest =
            hasAlternatives ? place : std::min(nearest + std::min(part.least, text.size()), text.size());
    }
    return visited;
}

// The engine gives up when it has visited more states, in all tries together, than the greater of the two products and
// k, of which it caps the second.
bool FixedPrefix::isSureToEnd(std::size_t patternSize, std::size_t places, double visited) const {
    constexpr double k = 100000;
    const auto n = static_cast<double>(places);
    visited += n * statesOfPrefix;
    if (visited <= k) {
        return true;
    }
    const auto size = static_cast<double>(patternSize);
    return visited <= std::max(n * size * size, std::min<double>(n * n, BOOST_REGEX_MAX_STATE_COUNT)) + k;
}

} // namespace kvt::ex::detail
