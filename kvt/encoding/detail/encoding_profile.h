// What is known of an encoding for converting its text without ICU: its form and, for code pages, tables.
//
// There is one object for each encoding in the process. What it knows is found out by asking ICU once, does not change
// after that, and is read without a lock.
#pragma once

#include <kvt/encoding/detail/conversion_tables.h>
#include <kvt/encoding/detail/icu.h>
#include <kvt/encoding/detail/shortcut.h>
#include <kvt/encoding/detail/stable_array.h>
#include <kvt/encoding/encoding.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <mutex>

namespace kvt::ex::detail {

class EncodingProfile {
public:
    EncodingProfile() = default;
    EncodingProfile(const EncodingProfile&) = delete;
    EncodingProfile& operator=(const EncodingProfile&) = delete;

    /// Found out at the first call; `other` when ICU cannot open the encoding.
    Form form() {
        const Form form = form_.load(std::memory_order_relaxed);
        return form != unknownForm ? form : findForm();
    }
    /// Found out at the first call, which takes as long as some hundred short texts. ICU can open the encoding. Throws
    /// std::bad_alloc.
    icu::Converter::Nature nature();

    /// Null as long as they are not built.
    const DecodingTable* decoding() const { return decoding_.table.load(std::memory_order_acquire); }
    const EncodingTable* encoding() const { return encoding_.table.load(std::memory_order_acquire); }

    /// Notes that so many bytes are left to ICU for want of a table, and builds the table when all that was left so far
    /// would have repaid it. Returns whether there is one now. The form is one that has tables. Throws std::bad_alloc.
    bool buildDecoding(std::size_t bytes) { return build(decoding_, bytes); }
    bool buildEncoding(std::size_t bytes) { return build(encoding_, bytes); }

private:
    friend EncodingProfile& profileOf(Encoding encoding);
    friend EncodingProfile& makeProfile(Encoding encoding);

    template <typename Table>
    struct Lazy {
        std::atomic<const Table*> table{nullptr};
        std::atomic<std::size_t> missed{0}; // bytes that it would have converted
    };
    template <typename Table>
    bool build(Lazy<Table>& lazy, std::size_t bytes);

    Encoding itself() const;
    Form findForm();

    // `Unknown` until the object is somebody's.
    std::atomic<std::uint32_t> id_{Encoding::Unknown};
    static constexpr auto unknownForm = static_cast<Form>(0xFF);
    std::atomic<Form> form_{unknownForm};
    std::atomic<bool> isNatureKnown_{false};
    std::atomic<bool> isStateless_{false};
    std::atomic<bool> isBehind_{false};
    std::mutex building_;
    Lazy<DecodingTable> decoding_;
    Lazy<EncodingTable> encoding_;
};

/// Never destroyed: destructors of static objects convert text, too.
union Profiles {
    constexpr Profiles() : byId() {}
    ~Profiles() {}

    StableArray<EncodingProfile> byId;
};
extern Profiles profiles;

/// For an encoding that is not among them yet.
EncodingProfile& makeProfile(Encoding encoding);

/// The object of an encoding, which lives as long as the process. Throws std::bad_alloc.
inline EncodingProfile& profileOf(Encoding encoding) {
    const std::uint32_t id = encoding.evaluate();
    EncodingProfile* const known = profiles.byId.find(id);
    return known != nullptr && known->id_.load(std::memory_order_relaxed) == id ? *known
                                                                                : makeProfile(encoding);
}

/// An encoding as the source or the target of a conversion. Throws std::bad_alloc.
inline Side sideOf(Encoding encoding) {
    if (const Form form = unicodeForm(encoding); form != Form::other) {
        return {form};
    }
    EncodingProfile& profile = profileOf(encoding);
    return {profile.form(), &profile};
}

} // namespace kvt::ex::detail
