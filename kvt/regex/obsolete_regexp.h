// Patterns in the dialect of old translations, in which the characters { } ( ) | are ordinary text, and so is $ but
// at the end of the pattern. All else means what it means to URegex: . * + ? [...] ^ and classes such as \d. There are
// no groups, no alternatives and no counted repetitions.
//
//     const ObsoleteRegexp call("f(x)$");
//     std::uint64_t length = 0;
//     call.index("y=f(x)", 6, &length, 0);  // 2, and length is 4
//
// A backslash before one of those characters changes nothing: "\(" is a parenthesis as "(" is, and a final "\$" is a
// dollar. Only the one character before is looked at, so that in "\\(" the first backslash escapes the second for the
// engine, and the parenthesis counts as escaped too and opens a group: that pattern cannot be compiled.
//
// Texts are bytes. A compiled object never changes, and any number of threads may search with it.
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/foundation/pimpl.h>

#include <cstdint>
#include <limits>
#include <type_traits>

static_assert(std::is_same_v<std::uint64_t, unsigned long>, "or the two forms of index() are one");

class ObsoleteRegexpImpl;

namespace kvt::ex::detail {
extern template class PimplBase<ObsoleteRegexpImpl>; // whose members stay in the library
}

/// A compiled pattern. Copies share the compiled program; a moved-from object may only be destroyed or assigned to.
class KVT_EXPORT ObsoleteRegexp : public kvt::ex::detail::PimplBase<ObsoleteRegexpImpl> {
public:
    /// What index() returns when there is no match: all bits set.
    static constexpr std::uint64_t npos = std::numeric_limits<std::uint64_t>::max();

    /// Compiles a zero-terminated pattern. Throws boost::regex_error, which derives from std::runtime_error, when the
    /// pattern cannot be compiled ("[a"): its text and its place are about the pattern as the engine got it, with
    /// backslashes before what is ordinary text here. Throws std::bad_alloc.
    ObsoleteRegexp(const char* pattern);
    /// The same for `length` bytes, among which there may be zeros. `pattern` may be null when `length` is 0.
    ObsoleteRegexp(const char* pattern, std::uint64_t length);
    /// Shares the compiled program of `other`. Throws std::bad_alloc.
    ObsoleteRegexp(const ObsoleteRegexp& other);
    /// Takes over the pattern of `other`.
    ObsoleteRegexp(ObsoleteRegexp&& other) noexcept;
    /// Shares the compiled program of `other`. Throws std::bad_alloc, and is then unchanged.
    ObsoleteRegexp& operator=(const ObsoleteRegexp& other);
    /// Takes over the pattern of `other`.
    ObsoleteRegexp& operator=(ObsoleteRegexp&& other) noexcept;
    ~ObsoleteRegexp();

    /// Looks for the first match in the `length` bytes of `text`, at or after the byte `start`, before which the
    /// pattern sees nothing. Returns its position, counted from `text`, and sets `*matchLength` to its length in bytes.
    /// Without a match, and whenever `start` is not below `length`, it returns npos and sets `*matchLength` to 0: even
    /// a pattern that matches the empty text is not found at the end of the text, unless the search began before it.
    ///
    /// `matchLength` must not be null. Throws boost::regex_error when the engine gives up on a search that takes too
    /// long, and leaves `*matchLength` as it was; std::bad_alloc.
    std::uint64_t index(const char* text, std::uint64_t length, std::uint64_t* matchLength,
                        std::uint64_t start) const;
    /// The same, for hosts that count in `unsigned long long`, which is another type of the same 64 bits here.
    std::uint64_t index(const char* text, std::uint64_t length, unsigned long long* matchLength,
                        std::uint64_t start) const {
        std::uint64_t found = 0;
        const std::uint64_t position = index(text, length, &found, start);
        *matchLength = found;
        return position;
    }
};
