// The process-wide table behind Encoding: names to ids and ids to names.
//
// The names known by heart are answered from a table that never changes, without a lock. Any other name goes through
// ICU once, to find its canonical form, and is remembered: so an id exists for every encoding that ICU can open, and
// two spellings of one encoding have one id. A name that ICU does not know is remembered too, as `Unknown`.
#pragma once

#include <kvt/encoding/detail/name_table.h>
#include <kvt/encoding/detail/stable_array.h>
#include <kvt/encoding/encoding.h>

#include <array>
#include <atomic>
#include <cstdint>
#include <deque>
#include <mutex>
#include <string>
#include <string_view>

namespace kvt::ex::detail {

class EncodingRegistry {
public:
    /// The first id that is handed out at run time. Ids are dense and never reused.
    static constexpr std::uint32_t firstDynamic = 31;

    /// Built at the first call, which also finds the system encoding and so sets the process's LC_CTYPE locale.
    static EncodingRegistry& instance();

    /// The id of a name, matched with case; `Unknown` when ICU does not know it. Never throws for an unknown name.
    std::uint32_t lookupId(std::string_view name);

    /// The canonical name of an id, zero-terminated and valid as long as the registry; an empty view for an id that
    /// was never handed out.
    std::string_view nameOf(std::uint32_t id);

    /// The canonical name that ICU gives for `name`: MIME, else IANA, else ICU's own; empty when it knows none.
    /// UTF-16 and UTF-32 without a byte order are little-endian.
    static std::string normaliseName(std::string_view name);

    EncodingRegistry(const EncodingRegistry&) = delete;
    EncodingRegistry& operator=(const EncodingRegistry&) = delete;

private:
    EncodingRegistry();

    const std::string systemName_;
    const NameTable staticIds_;
    const std::array<std::string_view, firstDynamic> typeNames_;

    // Held while the members below are written, also across the calls into ICU for a new name, so that two threads with
    // one new name cannot be given two ids. Nothing that runs under it takes another lock of the library. What is in
    // the members never changes or moves, and is read without it.
    std::mutex mutex_;
    NameTable dynamicIds_;
    std::deque<std::string> dynamicNames_; // for writers, and for debuggers
    // The same names for all others: as many as the count says, which is set before an id can be found.
    StableArray<std::string_view> dynamicViews_;
    std::atomic<std::uint32_t> dynamicCount_{0};
};

} // namespace kvt::ex::detail
