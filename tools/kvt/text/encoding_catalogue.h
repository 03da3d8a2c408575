// All encodings by name: those that the library knows by heart and every converter of ICU, with all their names.
#pragma once

#include "text/byte_order_mark.h"

#include <kvt/encoding/encoding.h>

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace host {

struct EncodingEntry {
    std::string name;
    std::uint32_t id;
    bool singleByte;
    bool asciiCompatible;
    /// Every other name under which the library finds it and ICU lists it.
    std::vector<std::string> aliases;
};

class EncodingCatalogue {
public:
    EncodingCatalogue();

    /// The fixed ids first, then the others by name.
    std::vector<EncodingEntry> all() const;
    /// For an encoding that is not `Unknown`; it need not be one of all().
    EncodingEntry entry(kvt::ex::Encoding encoding) const;
    /// Every name and alias, for suggestions.
    std::vector<std::string> names() const;

private:
    struct Known {
        kvt::ex::Encoding encoding;
        std::vector<std::string> aliases;
    };
    std::vector<std::string>& aliasesFor(kvt::ex::Encoding encoding);

    std::map<std::uint32_t, Known> known_;
};

/// The encoding of that name, which must have a converter. Throws Failure with what was probably meant.
kvt::ex::Encoding textEncoding(const std::string& name);

/// The same for what is read: names that leave the order of bytes open are told apart.
TextEncoding inputEncoding(const std::string& name);

/// What to say about a name that nobody knows.
std::string unknownEncoding(const std::string& name, const EncodingCatalogue& catalogue);

/// The encoding of that name; Unknown where there is none. A comma belongs to some names, such as
/// "ibm-37_P100-1995,swaplfnl". ICU overlooks one with anything behind it, and that is a name of no encoding here.
kvt::ex::Encoding namedEncoding(const std::string& name);

/// Whether ICU reads back what it writes in the encoding, but for characters of private use, which many encodings map to
/// others that they came to have. Where it does not, a text that was converted has to be read again to know that it is
/// still the same.
bool comesBack(kvt::ex::Encoding encoding);

/// "windows-1252,KOI8-R" as two names, each of which may have a comma of its own.
std::vector<std::string> splitEncodings(const std::string& list);

} // namespace host
