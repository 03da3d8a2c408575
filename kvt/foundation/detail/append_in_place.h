// Appending to a string what is written straight into it.
#pragma once

#include <kvt/platform/new_pages.h>

#include <cstddef>
#include <string>

namespace kvt::ex::detail {

/// Appends up to `room` units that `write` puts at the pointer it is given; it returns how many it wrote, and may use
/// all the room in between. The units are not filled first where the standard library can do without that.
template <typename CharT, typename Write>
void appendInPlace(std::basic_string<CharT>& text, std::size_t room, Write write) {
    const std::size_t size = text.size();
#if defined(__cpp_lib_string_resize_and_overwrite)
    text.resize_and_overwrite(size + room, [&](CharT* units, std::size_t) {
        if (room >= platform::manyNewBytes / sizeof(CharT)) {
            platform::fetchPages(units + size, room * sizeof(CharT));
        }
        return size + write(units + size);
    });
#else
    text.resize(size + room);
    text.resize(size + write(text.data() + size));
#endif
}

} // namespace kvt::ex::detail
