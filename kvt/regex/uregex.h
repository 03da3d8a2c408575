// Regular expressions on strings.
//
//     const URegex<0> date("(\\d+)-(\\d+)");
//     if (const URegexMatch<0> found = date.search("in 2020-01")) {
//         found.group(1);        // position 3, length 4
//         found.text(2);         // "01"
//     }
//
// The syntax is Perl's, as Boost.Regex reads it: case counts, "." takes every byte, line ends included, and "^" and "$"
// also stand at the line ends within a text. Pattern and subject are bytes, whatever their encoding: "." is one byte
// of a UTF-8 character and "[é]" one of its two, and all positions and lengths count bytes. What "\w", "[[:alpha:]]"
// and their like take follows the global std::locale of the moment in which the pattern is compiled; in the classic
// one, which is the one that a program starts with, that is ASCII.
//
// Failures are those of the engine, which derive from std::runtime_error; no Throwable is made of them.
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <utility>

namespace kvt::ex {

namespace detail {
template <std::uint32_t N>
class URegexImpl;
}

template <std::uint32_t N>
class URegex;

/// What applying a URegex gave. It holds a copy of the text that was searched, so that it outlives the caller's
/// string. Only URegex makes one; copies are deep.
template <std::uint32_t N>
class URegexMatch {
public:
    /// Position and length in bytes of the subject.
    using Group = std::pair<std::uint64_t, std::uint64_t>;

    /// The text that was searched, all of it.
    const UString<N>& subject() const noexcept { return subject_; }
    /// Group 0, the whole match, and then each group of the pattern in the order of the opening parentheses,
    /// whether it took part or not. Empty when nothing matched.
    const vector<Group>& groups() const noexcept { return groups_; }

    /// Whether the pattern matched.
    bool matched() const noexcept { return !groups_.empty(); }
    explicit operator bool() const noexcept { return matched(); }
    /// One more than the groups of the pattern; 0 when nothing matched.
    std::uint64_t groupCount() const noexcept { return groups_.size(); }

    /// Not checked: `index` must be below groupCount(). A group that took no part in the match has length 0 and the
    /// position one before the start of the search, modulo 2 to the 64th: npos when the search began at 0.
    const Group& group(std::uint64_t index) const noexcept { return groups_[index]; }
    /// The text of a group, empty for one that took no part. Not checked: `index` must be below groupCount(). Throws
    /// std::bad_alloc.
    UString<N> text(std::uint64_t index) const {
        return UString<N>(subject_.substr(group(index).first, group(index).second));
    }

private:
    friend class URegex<N>;
    explicit URegexMatch(const UString<N>& subject) : subject_(subject) {}

    UString<N> subject_;
    vector<Group> groups_;
};

/// A compiled regular expression on strings of encoding `N`. It exists for UTF-8, US-ASCII and bytes: 0, 1 and 28.
///
/// Once compiled it never changes. Any number of threads may match with one object or with copies of it, which share
/// the compiled program; assigning to an object takes the caller's exclusion. A moved-from URegex may be destroyed,
/// assigned to, copied and tested, and must not be used to match.
template <std::uint32_t N>
class KVT_EXPORT URegex {
    static_assert(N == Encoding::Utf8 || N == Encoding::UsAscii || N == Encoding::Binary,
                  "regular expressions are for strings that can be taken as raw bytes");

public:
    /// Matches nothing, not even the empty text.
    URegex();
    /// Compiles `pattern`. The empty pattern matches the empty text, which stands everywhere. Throws
    /// boost::regex_error, with its code, its text and the place in the pattern, when the pattern cannot be compiled;
    /// std::bad_alloc.
    URegex(const UString<N>& pattern);
    /// Copies share the compiled program. A copy of a moved-from object is as one itself. Throws std::bad_alloc;
    /// assignment does so only to a moved-from object.
    URegex(const URegex& other);
    URegex& operator=(const URegex& other);
    URegex(URegex&& other) noexcept;
    URegex& operator=(URegex&& other) noexcept;
    ~URegex();

    /// Whether a pattern was compiled: false for a default-constructed URegex. A moved-from one gives true as well.
    operator bool() const noexcept;

    /// Matches the whole of `subject`: it is not enough that a part of it does. No match when no pattern was compiled.
    ///
    /// The engine gives up on a pattern that would take too long on a subject, with boost::regex_error: of the code
    /// error_complexity when it made too many steps, of error_stack when it kept too many of them in mind.
    /// Throws std::bad_alloc.
    URegexMatch<N> match(const UString<N>& subject) const;

    /// The first match in `subject` at or after the byte `start`, and of those at the same place the one that the
    /// pattern prefers. The text before `start` cannot be seen: `^` and `\b` take `start` for the beginning, and a
    /// look behind ends there. Positions count from the beginning of the subject all the same.
    /// Not checked: `start` must be at most the size of the subject. Fails as match().
    URegexMatch<N> search(const UString<N>& subject, std::uint64_t start = 0) const;

    /// Calls `use` with each match in `subject` from left to right, none within the one before, until it returns
    /// false. All of the text can be seen: `^`, `\b` and a look behind take no match for a beginning. Where a match is
    /// empty, the next one is a longer one at that place, or stands behind it. A group that took no part has the
    /// position npos.
    ///
    /// The match that `use` gets is valid during the call; its subject is copied once for all of them. Fails as
    /// match(), and with what `use` throws.
    void searchAll(const UString<N>& subject, const std::function<bool(const URegexMatch<N>&)>& use) const;

    /// Whether search() finds a match in `text`, of which nothing is copied. Fails as match().
    bool matchesIn(UStringView<N> text) const;

    /// The place behind which every match ends that begins at `start` or behind it: in `text`, and in each part of it
    /// that is searched by itself. The size where there is none, `start` where nothing is known, as with patterns that
    /// begin with this or that number of bytes. It is found by the fixed beginning of the pattern, many bytes at once,
    /// and for many short texts in a row, such as lines, spares a search of each.
    /// Not checked: `start` must be at most the size of the text. Throws nothing.
    std::uint64_t passOver(UStringView<N> text, std::uint64_t start = 0) const noexcept;

private:
    const detail::URegexImpl<N>& d() const noexcept { return *impl_; }
    detail::URegexImpl<N>& d() noexcept { return *impl_; }

    std::unique_ptr<detail::URegexImpl<N>> impl_; ///< null only in a moved-from object
};

extern template class KVT_EXPORT URegex<0>;
extern template class KVT_EXPORT URegex<1>;
extern template class KVT_EXPORT URegex<28>;

} // namespace kvt::ex
