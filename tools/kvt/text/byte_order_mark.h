// The mark U+FEFF at the start of a text: which bytes it is in which encoding, and what to do about it.
#pragma once

#include "base/input.h"

#include <kvt/encoding/encoding.h>

#include <string>
#include <string_view>

namespace host {

enum class MarkPolicy {
    Skip,  ///< every file's mark is dropped where it can be cut off
    Keep,  ///< it is a character like any other
    Strip, ///< as Skip, but an encoding where it cannot be cut off is refused
    Add,   ///< as Strip, and the output begins with one
};

/// The encoding of texts as it was named. "UTF-16" and "UTF-32" leave the order of bytes to each text: its mark says
/// which it is, and without one it is little-endian.
struct TextEncoding {
    kvt::ex::Encoding encoding;
    bool markDecides = false;

    TextEncoding(kvt::ex::Encoding known, bool open = false) : encoding(known), markDecides(open) {}
    TextEncoding(kvt::ex::Encoding::Type known) : encoding(known) {}

    /// The first block of a text: as much as there is at once, but enough to know whether it begins with a mark.
    std::string_view firstBlock(Input& input) const;

    /// The encoding of a text in `file` that begins with the block `start`. Throws Failure where the mark is that of
    /// the other order; it names the encoding that would fit.
    kvt::ex::Encoding of(std::string_view start, const std::string& file) const;
};

/// The bytes of the mark. Empty for encodings that have none.
std::string_view byteOrderMark(kvt::ex::Encoding encoding);

/// Whether U+FEFF exists in the encoding but not as bytes that could be cut off: they melt with those behind.
bool hasInseparableMark(kvt::ex::Encoding encoding);

} // namespace host
