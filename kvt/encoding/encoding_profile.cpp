// The profiles of all encodings that text was converted from or to, and when their tables are built.
#include <kvt/encoding/detail/encoding_profile.h>

namespace kvt::ex::detail {
namespace {

// To ask ICU for a table of one and two bytes takes it about as long as half a mebibyte of text takes it more than the
// table. So much has to come together first, in one text or in many: then a table never costs more than double. A table
// of single bytes costs no more than some short texts.
constexpr std::size_t repaidBy = std::size_t{512} << 10;
// What a text costs ICU before its first byte, in bytes of text, so that short texts come to have tables, too.
constexpr std::size_t perText = 64;

bool hasSingleBytes(Form form) {
    return form == Form::singleByte || form == Form::asciiSingleByte;
}

} // namespace

constinit Profiles profiles;

Encoding EncodingProfile::itself() const {
    return static_cast<Encoding::Type>(id_.load(std::memory_order_relaxed));
}

Form EncodingProfile::findForm() {
    // Whoever comes first asks; others who come meanwhile ask too and find the same.
    const Form form = icu::Converter(itself()).form();
    form_.store(form, std::memory_order_relaxed);
    return form;
}

icu::Converter::Nature EncodingProfile::nature() {
    if (!isNatureKnown_.load(std::memory_order_acquire)) {
        const icu::Converter::Nature found = icu::Converter(itself()).nature();
        isStateless_.store(found.isStateless, std::memory_order_relaxed);
        isBehind_.store(found.isBehind, std::memory_order_relaxed);
        isNatureKnown_.store(true, std::memory_order_release);
    }
    return {isStateless_.load(std::memory_order_relaxed), isBehind_.load(std::memory_order_relaxed)};
}

template <typename Table>
bool EncodingProfile::build(Lazy<Table>& lazy, std::size_t bytes) {
    if (lazy.table.load(std::memory_order_acquire) != nullptr) {
        return true;
    }
    const std::size_t cost = bytes + perText;
    const std::size_t missed = lazy.missed.fetch_add(cost, std::memory_order_relaxed) + cost;
    if (missed < repaidBy && !hasSingleBytes(form())) {
        return false;
    }
    // Who finds another thread building does not wait for it, and leaves this text to ICU as well.
    const std::unique_lock lock(building_, std::try_to_lock);
    if (!lock.owns_lock()) {
        return false;
    }
    if (lazy.table.load(std::memory_order_relaxed) == nullptr) {
        lazy.table.store(new Table(itself()), std::memory_order_release);
    }
    return true;
}

template bool EncodingProfile::build(Lazy<DecodingTable>&, std::size_t);
template bool EncodingProfile::build(Lazy<EncodingTable>&, std::size_t);

EncodingProfile& makeProfile(Encoding encoding) {
    static auto& making = *new std::mutex();
    static auto& ofNobody = *new EncodingProfile();
    const std::uint32_t id = encoding.evaluate();
    // An id that was never handed out has no name. A place for each of these would be more than there is room for.
    if (id == Encoding::Unknown || encoding.getName().empty()) {
        return ofNobody;
    }
    const std::lock_guard lock(making);
    EncodingProfile& made = profiles.byId.make(id);
    made.id_.store(id, std::memory_order_relaxed);
    return made;
}

} // namespace kvt::ex::detail
