// What a string is made of, as hosts rely on it.
#include <kvt/string/ustring.h>

namespace kvt::ex::detail {

namespace {

constexpr std::size_t machineWord = sizeof(void*);

// Four words of standard string, the table's pointer to its functions and its pointer to the storage.
static_assert(sizeof(UString<0>) == 6 * machineWord);
static_assert(sizeof(UString<2>) == 6 * machineWord);
static_assert(sizeof(UString<3>) == 6 * machineWord);
// One more word, for the encoding.
static_assert(sizeof(UString<30>) == 7 * machineWord);

} // namespace

std::size_t actualUStringSize() noexcept {
    return sizeof(UString<0>);
}

} // namespace kvt::ex::detail
