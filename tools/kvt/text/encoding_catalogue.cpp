#include "text/encoding_catalogue.h"

#include "base/failure.h"
#include "base/messages.h"
#include "base/text.h"
#include "base/text_units.h"
#include "base/unicode_data.h"
#include "cli/suggest.h"

#include <algorithm>
#include <array>
#include <set>

namespace host {

namespace {

using kvt::ex::Encoding;

std::string nameOf(Encoding encoding) {
    return std::string(encoding.getUnevaluatedName());
}

// The library's own converterless encoding of text has characters of many bytes.
bool isSingleByte(Encoding encoding) {
    return encoding.id() != Encoding::Wwjd && encoding.isSingleByte();
}

// As ICU compares names: by letters and digits, in any case.
std::string comparedForm(std::string_view name) {
    std::string form;
    for (const char byte : name) {
        if (byte != '-' && byte != '_' && byte != ' ') {
            form += asciiLower(byte);
        }
    }
    return form;
}

// A converter that forgets which set of characters it is in; seven scripts of India in one code, which join signs to
// letters; and one that writes U+FFFE and U+FFFF, and takes them for bad input. A test tries all encodings.
constexpr std::array<std::string_view, 11> notComingBack = {
    "x11-compound-text", "ISCII,version=0", "ISCII,version=1", "ISCII,version=2",
    "ISCII,version=3",   "ISCII,version=4", "ISCII,version=5", "ISCII,version=6",
    "ISCII,version=7",   "ISCII,version=8", "LMBCS-1",
};

bool isKnown(const std::string& name) {
    return namedEncoding(name).id() != Encoding::Unknown;
}

} // namespace

EncodingCatalogue::EncodingCatalogue() {
    for (std::uint32_t id = 0; id < Encoding::Unknown; ++id) {
        aliasesFor(static_cast<Encoding::Type>(id));
    }
    aliasesFor(Encoding::System) = {"ANSI", "SYSTEM", "system"};
    aliasesFor(Encoding::Binary) = {"BINARY", "binary"};
    for (const std::string& converter : converterNames()) {
        std::vector<std::string> names = aliasesOf(converter);
        names.insert(names.begin(), converter);
        for (const std::string& name : names) {
            // By what the library makes of each name: it may differ from ICU's view of "UTF-16", for one.
            const Encoding encoding(name, kvt::ex::nothrow);
            if (encoding.id() == Encoding::Unknown) {
                continue;
            }
            std::vector<std::string>& aliases = aliasesFor(encoding);
            if (name != nameOf(encoding) &&
                std::find(aliases.begin(), aliases.end(), name) == aliases.end()) {
                aliases.push_back(name);
            }
        }
    }
}

std::vector<std::string>& EncodingCatalogue::aliasesFor(Encoding encoding) {
    return known_.try_emplace(encoding.id(), Known{encoding, {}}).first->second.aliases;
}

EncodingEntry EncodingCatalogue::entry(Encoding encoding) const {
    EncodingEntry entry{
        nameOf(encoding), encoding.id(), isSingleByte(encoding), encoding.supports7BitASCII(), {}};
    if (const auto known = known_.find(encoding.id()); known != known_.end()) {
        entry.aliases = known->second.aliases;
    }
    return entry;
}

std::vector<EncodingEntry> EncodingCatalogue::all() const {
    std::vector<EncodingEntry> entries;
    for (const auto& [id, known] : known_) {
        entries.push_back(entry(known.encoding));
    }
    // Ids above the fixed ones only say which name was asked for first.
    const auto firstOther = std::find_if(entries.begin(), entries.end(), [](const EncodingEntry& entry) {
        return entry.id > Encoding::Unknown;
    });
    std::sort(firstOther, entries.end(),
              [](const EncodingEntry& left, const EncodingEntry& right) { return left.name < right.name; });
    return entries;
}

std::vector<std::string> EncodingCatalogue::names() const {
    std::set<std::string> names;
    for (const EncodingEntry& entry : all()) {
        names.insert(entry.name);
        names.insert(entry.aliases.begin(), entry.aliases.end());
    }
    return {names.begin(), names.end()};
}

std::vector<std::string> splitEncodings(const std::string& list) {
    std::vector<std::string> names;
    for (std::size_t begin = 0; begin <= list.size();) {
        const std::size_t end = std::min(list.find(',', begin), list.size());
        const std::string piece = list.substr(begin, end - begin);
        const bool isOption = piece.find('=') != std::string::npos || piece == "swaplfnl";
        if (isOption && !names.empty()) {
            names.back() += "," + piece;
        } else {
            names.push_back(piece);
        }
        begin = end + 1;
    }
    return names;
}

Encoding namedEncoding(const std::string& name) {
    const Encoding encoding(name, kvt::ex::nothrow);
    if (name.find(',') == std::string::npos || encoding.id() == Encoding::Unknown) {
        return encoding;
    }
    const std::vector<std::string> names = EncodingCatalogue().names();
    const bool isName = std::any_of(names.begin(), names.end(), [&](const std::string& known) {
        return comparedForm(known) == comparedForm(name);
    });
    return isName ? encoding : Encoding(Encoding::Unknown);
}

bool comesBack(Encoding encoding) {
    return std::none_of(notComingBack.begin(), notComingBack.end(),
                        [&](std::string_view name) { return encoding == Encoding(name, kvt::ex::nothrow); });
}

std::string unknownEncoding(const std::string& name, const EncodingCatalogue& catalogue) {
    const std::string unknown = describe(910005, {printable(name)});
    const std::vector<std::string> pieces = splitEncodings(name);
    if (pieces.size() > 1 && std::all_of(pieces.begin(), pieces.end(), isKnown)) {
        return unknown + " Several encodings go with 'kvt convert --dry-run' only.";
    }
    const std::string first = name.substr(0, name.find(','));
    return unknown + (first.size() < name.size() && isKnown(first)
                          ? " Did you mean '" + printable(first) + "'?"
                          : didYouMean(name, catalogue.names()));
}

Encoding textEncoding(const std::string& name) {
    const Encoding encoding = namedEncoding(name);
    switch (encoding.id()) {
    case Encoding::Unknown:
        throw Failure(unknownEncoding(name, EncodingCatalogue()));
    case Encoding::Binary:
        throw Failure(describe(910005, {printable(name)}) + " It stands for bytes that are no text.");
    case Encoding::Wwjd:
        throw Failure(describe(910005, {printable(name)}) + " For this one there is 'kvt wwjd'.");
    default:
        return encoding;
    }
}

TextEncoding inputEncoding(const std::string& name) {
    return {textEncoding(name), leavesByteOrderOpen(name)};
}

} // namespace host
