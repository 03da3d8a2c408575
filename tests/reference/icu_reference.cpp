#include <reference/icu_reference.h>

#include <unicode/ucnv.h>
#include <unicode/ucnv_cb.h>
#include <unicode/uset.h>

#include <algorithm>
#include <map>
#include <memory>
#include <random>
#include <set>

namespace kvt::test {
namespace {

struct Close {
    void operator()(UConverter* converter) const { ucnv_close(converter); }
    void operator()(USet* set) const { uset_close(set); }
};
using ConverterPtr = std::unique_ptr<UConverter, Close>;

const std::set<std::string> unicodeForms = {"UTF-8", "UTF-16LE", "UTF-16BE", "UTF-32LE", "UTF-32BE"};

struct Notes {
    std::string substitution;
    int error = 0;
    int calls = 0;
};

void noteFromUnicode(const void* context, UConverterFromUnicodeArgs* args, const UChar* units, int32_t length,
                     UChar32 codePoint, UConverterCallbackReason reason, UErrorCode* error) {
    if (reason <= UCNV_IRREGULAR) {
        auto& notes = *static_cast<Notes*>(const_cast<void*>(context));
        ++notes.calls;
        if (notes.error == 0 && *error != U_BUFFER_OVERFLOW_ERROR && codePoint != 0xFFFD) {
            notes.error = *error;
        }
    }
    UCNV_FROM_U_CALLBACK_SUBSTITUTE(nullptr, args, units, length, codePoint, reason, error);
}

void noteToUnicode(const void* context, UConverterToUnicodeArgs* args, const char* bytes, int32_t length,
                   UConverterCallbackReason reason, UErrorCode* error) {
    if (reason <= UCNV_IRREGULAR) {
        auto& notes = *static_cast<Notes*>(const_cast<void*>(context));
        ++notes.calls;
        const std::string_view bad(bytes, static_cast<std::size_t>(length));
        if (*error != U_BUFFER_OVERFLOW_ERROR && bad != notes.substitution) {
            notes.error = *error;
        }
    }
    UCNV_TO_U_CALLBACK_SUBSTITUTE(nullptr, args, bytes, length, reason, error);
}

ConverterPtr open(const std::string& name) {
    UErrorCode error = U_ZERO_ERROR;
    ConverterPtr converter(ucnv_open(name.c_str(), &error));
    return U_SUCCESS(error) ? std::move(converter) : nullptr;
}

/// A converter as the library is to set it up.
ConverterPtr prepare(const std::string& name, Notes& notes) {
    ConverterPtr converter = open(name);
    UErrorCode error = U_ZERO_ERROR;
    // ICU 72 frees the substitution of this one twice.
    if (!unicodeForms.contains(name) && name != "x11-compound-text") {
        const UChar mark = u'?';
        ucnv_setSubstString(converter.get(), &mark, 1, &error);
    }
    // Where ICU refuses "?", its own stays.
    error = U_ZERO_ERROR;
    char buffer[20];
    int8_t length = sizeof buffer;
    ucnv_getSubstChars(converter.get(), buffer, &length, &error);
    if (U_SUCCESS(error)) {
        notes.substitution.assign(buffer, static_cast<std::size_t>(length));
    }
    error = U_ZERO_ERROR;
    ucnv_setFromUCallBack(converter.get(), noteFromUnicode, &notes, nullptr, nullptr, &error);
    ucnv_setToUCallBack(converter.get(), noteToUnicode, &notes, nullptr, nullptr, &error);
    return converter;
}

/// A few of ICU's converters (in ICU 72 those of ISCII, ISO-2022-KR, LMBCS and SCSU) give other bytes when the output
/// is full in between. For them the size of the library's buffers decides what comes out.
Raw convertAsTheLibrary(const std::string& from, const std::string& to, std::string_view bytes) {
    static const std::set<std::string> forgetful = {"ISO-2022-KR", "LMBCS-1", "SCSU"};
    const bool matters = bytes.size() > 256 && (to.starts_with("ISCII") || forgetful.contains(to));
    return convertWithIcu(from, to, bytes, matters ? Buffers{1024, 4096} : Buffers{});
}

/// The text in UTF-8 for the parameters of a failure: what ICU gives, losses or not.
std::string readable(const std::string& name, std::string_view bytes) {
    if (name == "UTF-8" || name == "US-ASCII") {
        return std::string(bytes);
    }
    return convertAsTheLibrary(name, "UTF-8", bytes).bytes;
}

std::string substitutionOf(const std::string& name) {
    Notes notes;
    prepare(name, notes);
    return notes.substitution;
}

Outcome badEncoding(std::string output, std::string_view bytes, const std::string& from,
                    const std::string& lossy, const std::string& substitution) {
    return {std::move(output),
            910002,
            {escaped(bytes), from},
            {{"substituted_conversion", lossy}, {"substitution_characters", substitution}}};
}

Outcome lostCharacter(std::string output, std::string_view bytes, const std::string& from,
                      const std::string& to, const std::string& lossy, const std::string& substitution) {
    return {std::move(output),
            910003,
            {readable(from, bytes), from, to},
            {{"substituted_conversion", lossy}, {"substitution_characters", substitution}}};
}

const std::set<std::string> sevenBit = {
    "UTF-8",        "US-ASCII",     "ISO-8859-1",   "ISO-8859-2",   "ISO-8859-3",   "ISO-8859-4",
    "ISO-8859-5",   "ISO-8859-6",   "ISO-8859-7",   "ISO-8859-8",   "ISO-8859-9",   "iso-8859-11-2001",
    "ISO-8859-13",  "ISO-8859-15",  "windows-1250", "windows-1251", "windows-1252", "windows-1253",
    "windows-1254", "windows-1255", "windows-1256", "windows-1257", "windows-1258"};

bool keepsAscii(const std::string& name) {
    static const std::set<std::string> names = [] {
        std::set<std::string> all = sevenBit;
        for (const char* other :
             {"ibm-5471_P100-2006", "windows-874-2000", "GBK", "KSC_5601", "Big5", "macintosh", "x-mac-greek",
              "x-mac-cyrillic", "x-mac-centraleurroman", "EUC-JP", "EUC-KR", "KOI8-R"}) {
            all.insert(canonicalName(other));
        }
        return all;
    }();
    return names.contains(name);
}

/// UTF-8 to ASCII: one SUB for each character, and for each byte that has no place in one.
Outcome utf8ToAscii(std::string_view bytes) {
    std::string text;
    bool malformed = false;
    bool beyond = false;
    for (std::size_t i = 0; i < bytes.size();) {
        const auto lead = static_cast<unsigned char>(bytes[i++]);
        if (lead < 0x80) {
            text += static_cast<char>(lead);
            continue;
        }
        beyond = true;
        text += '\x1A';
        std::size_t trails = 0;
        if ((lead & 0xE0) == 0xC0) {
            trails = 1;
        } else if ((lead & 0xF0) == 0xE0) {
            trails = 2;
        } else if ((lead & 0xF8) == 0xF0) {
            trails = 3;
        } else if ((lead & 0xFC) == 0xF8) {
            trails = 4;
        } else {
            malformed = true;
        }
        for (; trails > 0; --trails, ++i) {
            if (i == bytes.size()) {
                malformed = true;
                break;
            }
            if ((static_cast<unsigned char>(bytes[i]) & 0xC0) != 0x80) {
                malformed = true;
                text += '\x1A';
            }
        }
    }
    if (malformed) {
        return badEncoding(text, bytes, "UTF-8", text, "\x1A");
    }
    if (beyond) {
        return lostCharacter(text, bytes, "UTF-8", "US-ASCII", text, "\x1A");
    }
    return {text, 0, {}, {}};
}

Outcome singleByteToAscii(const std::string& from, std::string_view bytes) {
    std::string text(bytes);
    std::replace_if(
        text.begin(), text.end(), [](char c) { return static_cast<unsigned char>(c) > 127; }, '\x1A');
    if (text == bytes) {
        return {text, 0, {}, {}};
    }
    return lostCharacter(text, bytes, from, "US-ASCII", text, "\x1A");
}

} // namespace

std::ostream& operator<<(std::ostream& stream, const Outcome& outcome) {
    stream << outcome.bytes.size() << " bytes " << hex(outcome.bytes) << ", failure " << outcome.number;
    for (const std::string& parameter : outcome.parameters) {
        stream << "\n  %" << parameter.size() << " bytes " << hex(parameter) << " \""
               << parameter.substr(0, 80) << '"';
    }
    for (const auto& [name, value] : outcome.pairs) {
        stream << "\n  " << name << '=' << value.size() << " bytes " << hex(value);
    }
    return stream;
}

std::vector<std::string> availableConverters() {
    std::vector<std::string> names;
    for (int32_t i = 0; i < ucnv_countAvailable(); ++i) {
        names.emplace_back(ucnv_getAvailableName(i));
    }
    return names;
}

std::string canonicalName(const std::string& name) {
    const ConverterPtr converter = open(name);
    if (!converter) {
        return {};
    }
    UErrorCode error = U_ZERO_ERROR;
    const char* const internal = ucnv_getName(converter.get(), &error);
    const char* standard = nullptr;
    for (const char* authority : {"MIME", "IANA"}) {
        if (standard == nullptr) {
            error = U_ZERO_ERROR;
            standard = ucnv_getStandardName(internal, authority, &error);
        }
    }
    const std::string result = standard != nullptr ? standard : internal;
    return result == "UTF-16" || result == "UTF-32" ? result + "LE" : result;
}

Raw convertWithIcu(const std::string& from, const std::string& to, std::string_view bytes, Buffers buffers) {
    Notes fromNotes;
    Notes toNotes;
    const ConverterPtr source = prepare(from, fromNotes);
    const ConverterPtr target = prepare(to, toNotes);
    // Escapes, shifts and substitutions stay below this many bytes for each byte of the input.
    std::string out(buffers.outputBytes != 0 ? buffers.outputBytes : bytes.size() * 16 + 64, '\0');
    std::u16string pivot(buffers.pivotUnits != 0 ? buffers.pivotUnits : bytes.size() * 8 + 64, u'\0');
    UChar* pivotSource = pivot.data();
    UChar* pivotTarget = pivot.data();
    const char* inPosition = bytes.data();
    UErrorCode error = U_BUFFER_OVERFLOW_ERROR;
    Raw raw;
    for (bool first = true; error == U_BUFFER_OVERFLOW_ERROR; first = false) {
        char* outPosition = out.data();
        error = U_ZERO_ERROR;
        ucnv_convertEx(target.get(), source.get(), &outPosition, out.data() + out.size(), &inPosition,
                       bytes.data() + bytes.size(), pivot.data(), &pivotSource, &pivotTarget,
                       pivot.data() + pivot.size(), first, true, &error);
        if (U_SUCCESS(error) || error == U_BUFFER_OVERFLOW_ERROR) {
            raw.bytes.append(out.data(), outPosition);
        }
    }
    raw.badInput = fromNotes.error;
    raw.notRepresentable = toNotes.error;
    raw.calls = fromNotes.calls + toNotes.calls;
    raw.status = U_SUCCESS(error) ? 0 : error;
    return raw;
}

Losses lossesOfIcu(const std::string& from, const std::string& to, std::string_view bytes) {
    Notes unused;
    const ConverterPtr source = prepare(from, unused);
    const ConverterPtr target = prepare(to, unused);
    Losses losses;

    std::u16string text(bytes.size() * 8 + 64, u'\0');
    struct Bad {
        const UChar* begin;
        std::vector<std::string>& bytes;
        std::vector<std::size_t> places; // of the substitutions, in the text
    } bad{text.data(), losses.badInput, {}};
    const auto noteBad = [](const void* context, UConverterToUnicodeArgs* args, const char* lost,
                            int32_t length, UConverterCallbackReason reason, UErrorCode* error) {
        if (reason <= UCNV_IRREGULAR) {
            auto& notes = *static_cast<Bad*>(const_cast<void*>(context));
            notes.bytes.emplace_back(lost, static_cast<std::size_t>(length));
            notes.places.push_back(static_cast<std::size_t>(args->target - notes.begin));
        }
        UCNV_TO_U_CALLBACK_SUBSTITUTE(nullptr, args, lost, length, reason, error);
    };
    UErrorCode error = U_ZERO_ERROR;
    ucnv_setToUCallBack(source.get(), noteBad, &bad, nullptr, nullptr, &error);
    UChar* textEnd = text.data();
    const char* in = bytes.data();
    ucnv_toUnicode(source.get(), &textEnd, text.data() + text.size(), &in, bytes.data() + bytes.size(),
                   nullptr, 1, &error);
    text.resize(static_cast<std::size_t>(textEnd - text.data()));

    const auto noteLost = [](const void* context, UConverterFromUnicodeArgs* args, const UChar* units,
                             int32_t length, UChar32 codePoint, UConverterCallbackReason reason,
                             UErrorCode* code) {
        if (reason <= UCNV_IRREGULAR) {
            static_cast<std::vector<char32_t>*>(const_cast<void*>(context))
                ->push_back(static_cast<char32_t>(codePoint));
        }
        UCNV_FROM_U_CALLBACK_SUBSTITUTE(nullptr, args, units, length, codePoint, reason, code);
    };
    std::vector<char32_t> lost;
    ucnv_setFromUCallBack(target.get(), noteLost, &lost, nullptr, nullptr, &error);
    losses.bytes.resize(text.size() * 16 + 64);
    char* out = losses.bytes.data();
    const UChar* position = text.data();
    ucnv_fromUnicode(target.get(), &out, losses.bytes.data() + losses.bytes.size(), &position,
                     text.data() + text.size(), nullptr, 1, &error);
    losses.bytes.resize(static_cast<std::size_t>(out - losses.bytes.data()));

    // A target without U+FFFD loses each one; those that stand for bad input have been counted as that.
    std::size_t place = 0;
    for (const char32_t c : lost) {
        if (c == 0xFFFD) {
            place = text.find(u'\uFFFD', place);
            if (std::binary_search(bad.places.begin(), bad.places.end(), place++)) {
                continue;
            }
        }
        losses.characters.push_back(c);
    }
    return losses;
}

Outcome expectedTranscode(const std::string& from, const std::string& to, std::string_view bytes) {
    if (from == to || bytes.empty()) {
        return {std::string(bytes), 0, {}, {}};
    }
    const Raw raw = convertAsTheLibrary(from, to, bytes);
    if (raw.badInput == 0 && raw.notRepresentable == 0) {
        return {raw.bytes, 0, {}, {}};
    }
    const std::string lossy = readable(to, raw.bytes);
    const std::string substitution = readable(to, substitutionOf(to));
    return raw.badInput != 0 ? badEncoding(raw.bytes, bytes, from, lossy, substitution)
                             : lostCharacter(raw.bytes, bytes, from, to, lossy, substitution);
}

Outcome expectedAssign(const std::string& from, const std::string& to, std::string_view bytes) {
    if (from == to) {
        return {std::string(bytes), 0, {}, {}};
    }
    if (from == "US-ASCII" && keepsAscii(to)) {
        return {std::string(bytes), 0, {}, {}};
    }
    if (from != "US-ASCII" && to == "US-ASCII") {
        if (from == "UTF-8") {
            return utf8ToAscii(bytes);
        }
        const ConverterPtr source = open(from);
        if (keepsAscii(from) && ucnv_getMaxCharSize(source.get()) == 1) {
            return singleByteToAscii(from, bytes);
        }
    }
    return expectedTranscode(from, to, bytes);
}

std::string escaped(std::string_view bytes) {
    std::string text;
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte >= 32 && byte < 128) {
            text += c;
        } else {
            text += "\\x";
            text += "0123456789ABCDEF"[byte >> 4];
            text += "0123456789ABCDEF"[byte & 15];
        }
    }
    return text;
}

std::string hex(std::string_view bytes, std::size_t limit) {
    std::string text;
    for (const char c : bytes.substr(0, limit)) {
        const auto byte = static_cast<unsigned char>(c);
        text += "0123456789abcdef"[byte >> 4];
        text += "0123456789abcdef"[byte & 15];
    }
    return bytes.size() > limit ? text + "..." : text;
}

std::u16string ownText(const std::string& name, std::size_t count, std::uint64_t seed) {
    static std::map<std::string, std::vector<UChar32>> sets;
    auto [entry, isNew] = sets.try_emplace(name);
    if (isNew) {
        const ConverterPtr converter = open(name);
        const std::unique_ptr<USet, Close> set(uset_openEmpty());
        UErrorCode error = U_ZERO_ERROR;
        ucnv_getUnicodeSet(converter.get(), set.get(), UCNV_ROUNDTRIP_SET, &error);
        // Not all of a large set: every 61st character from it is enough, and from each range the ends.
        for (int32_t i = 0; i < uset_getItemCount(set.get()); ++i) {
            UChar32 first = 0;
            UChar32 last = 0;
            UChar text[16];
            error = U_ZERO_ERROR;
            if (uset_getItem(set.get(), i, &first, &last, text, 16, &error) != 0) {
                continue;
            }
            for (UChar32 c = first; c < last; c += 61) {
                entry->second.push_back(c);
            }
            entry->second.push_back(last);
        }
        std::erase_if(entry->second, [](UChar32 c) { return U_IS_SURROGATE(c) != 0; });
    }
    const std::vector<UChar32>& characters = entry->second;
    std::mt19937_64 random(seed);
    std::u16string text;
    for (std::size_t i = 0; i < count && !characters.empty(); ++i) {
        UChar32 c = characters[random() % characters.size()];
        if (random() % 4 == 0) {
            c = static_cast<UChar32>(' ' + random() % 95);
        }
        if (c >= 0x10000) {
            text += static_cast<char16_t>(U16_LEAD(c));
            text += static_cast<char16_t>(U16_TRAIL(c));
        } else {
            text += static_cast<char16_t>(c);
        }
    }
    return text;
}

std::string encodeWithIcu(const std::string& name, std::u16string_view text) {
    const std::string_view bytes(reinterpret_cast<const char*>(text.data()), text.size() * 2);
    return convertWithIcu("UTF-16LE", name, bytes).bytes;
}

} // namespace kvt::test
