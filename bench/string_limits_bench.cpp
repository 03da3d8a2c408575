// What splitting, searching, hashing and case mapping must reach beside the plain way to do each: the standard
// library's strings, a loop over the bytes, and ICU's own calls.
#include "limits.h"
#include "texts.h"

#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <unicode/ucasemap.h>
#include <unicode/ustring.h>

#include <cstring>
#include <memory>
#include <string>
#include <vector>

namespace {

using namespace kvt::ex;
using kvt::bench::Bound;
using kvt::bench::Limits;
using kvt::bench::way;

constexpr std::size_t mebibyte = 1 << 20;

UString<0> string(const std::string& text) {
    return UString<0>(UStringView<0>(text));
}

// ---- Splitting ----------------------------------------------------------------------------------------------------

std::vector<std::string> splitPlainly(const std::string& text) {
    std::vector<std::string> pieces;
    std::size_t start = 0;
    for (std::size_t end = 0; (end = text.find(',', start)) != std::string::npos; start = end + 1) {
        pieces.push_back(text.substr(start, end - start));
    }
    pieces.push_back(text.substr(start));
    return pieces;
}

void holdSplit(Limits& limits, std::size_t length, double limit) {
    const std::string name = "split, fields of " + std::to_string(length);
    const std::string text = kvt::bench::fields(length, mebibyte);
    limits.add(name, way([string = string(text)] { return string.split(','); }));
    limits.add(name + ": find and push_back", way([text] { return splitPlainly(text); }));
    limits.hold({name, name + ": find and push_back", Bound::atLeast, limit});
}

// ---- Searching ----------------------------------------------------------------------------------------------------

/// The first byte by the C library, and then all of them.
std::size_t findPlainly(const std::string& text, const std::string& needle) {
    const char* place = text.data();
    const char* const last = text.data() + (text.size() - needle.size() + 1);
    while (place < last) {
        place = static_cast<const char*>(
            std::memchr(place, needle.front(), static_cast<std::size_t>(last - place)));
        if (place == nullptr) {
            break;
        }
        if (std::memcmp(place, needle.data(), needle.size()) == 0) {
            return static_cast<std::size_t>(place - text.data());
        }
        ++place;
    }
    return std::string::npos;
}

void holdFind(Limits& limits, const std::string& name, std::size_t size, const std::string& needle,
              bool isPlain, Bound bound, double limit) {
    const std::string text = kvt::bench::prose(size);
    limits.add(name, way([text = string(text), needle = string(needle)] { return text.find(needle); }));
    const std::string other = name + (isPlain ? ": memchr and memcmp" : ": std::string::find");
    limits.add(other, way([text, needle, isPlain] {
                   return isPlain ? findPlainly(text, needle) : text.find(needle);
               }));
    limits.hold({name, other, bound, limit});
}

// ---- What is shown beside the standard library ----------------------------------------------------------------------

template <std::uint32_t N>
UString<N> stringOf(const std::string& ascii) {
    using Units = std::basic_string<typename UString<N>::value_type>;
    return UString<N>(UStringView<N>(Units(ascii.begin(), ascii.end())));
}

// What is usually written in place of a replaceAll(); the tail moves at each replacement that changes the length.
template <typename Text>
void replacePlainly(Text& text, const Text& from, const Text& to) {
    for (std::size_t pos = 0; (pos = text.find(from, pos)) != Text::npos; pos += to.size()) {
        text.replace(pos, from.size(), to);
    }
}

template <std::uint32_t N>
void showOthers(Limits& limits, const std::string& unit) {
    using Text = std::basic_string<typename UString<N>::value_type>;
    constexpr std::size_t size = 100'000;
    const UString<N> text = stringOf<N>(kvt::bench::prose(size));
    const UString<N> needle = stringOf<N>("animal kingdom");
    const UString<N> from = stringOf<N>("animals");
    const UString<N> to = stringOf<N>("creatures");
    const UString<N> units = stringOf<N>("QZ!?");
    const auto plain = [](const UString<N>& string) { return Text(string.begin(), string.end()); };
    const auto show = [&](const std::string& name, auto work, auto beside) {
        limits.add(name + unit, way(work));
        limits.add(name + unit + ": standard", way(beside));
        limits.hold({name + unit, name + unit + ": standard"});
    };
    show(
        "find", [=] { return text.find(needle); },
        [text = plain(text), needle = plain(needle)] { return text.find(needle); });
    show(
        "rfind", [=] { return text.rfind(needle); },
        [text = plain(text), needle = plain(needle)] { return text.rfind(needle); });
    show(
        "find any of four",
        [text, set = vector<typename UString<N>::value_type>(units.begin(), units.end())] {
            return text.findFirstOf(set);
        },
        [text = plain(text), set = plain(units)] { return text.find_first_of(set); });
    show(
        "compare", [text, other = UString<N>(text)] { return text.compare(other); },
        [text = plain(text), other = plain(text)] { return text.compare(other); });
    show(
        "replace all", [=] { return UString<N>(text).replaceAll(from, to).size(); },
        [text = plain(text), from = plain(from), to = plain(to)] {
            Text copy(text);
            replacePlainly(copy, from, to);
            return copy.size();
        });
}

// ---- Hashing ------------------------------------------------------------------------------------------------------

[[gnu::noinline]] std::uint64_t hashPlainly(const std::string& text) {
    std::uint64_t hash = 0xcbf29ce484222325;
    for (const char byte : text) {
        hash = (hash ^ static_cast<unsigned char>(byte)) * 0x100000001b3;
    }
    return hash;
}

void holdHash(Limits& limits, const std::string& name, std::size_t size, double limit) {
    const std::string text = kvt::bench::prose(size);
    limits.add(name, way([text = string(text)] { return text.hash(); }));
    limits.add(name + ": a loop over the bytes", way([text] { return hashPlainly(text); }));
    limits.hold({name, name + ": a loop over the bytes", Bound::atLeast, limit});
}

// ---- Case mapping -------------------------------------------------------------------------------------------------

using CaseFunction = std::int32_t (*)(const UCaseMap*, char*, std::int32_t, const char*, std::int32_t,
                                      UErrorCode*);

std::string mapPlainly(CaseFunction function, const UCaseMap* map, const std::string& text) {
    std::string result(text.size(), '\0');
    for (;;) {
        UErrorCode status = U_ZERO_ERROR;
        const std::int32_t needed = function(map, result.data(), static_cast<std::int32_t>(result.size()),
                                             text.data(), static_cast<std::int32_t>(text.size()), &status);
        if (static_cast<std::size_t>(needed) <= result.size()) {
            return result;
        }
        result.resize(static_cast<std::size_t>(needed));
    }
}

void holdCase(Limits& limits) {
    struct Text {
        const char* name;
        const char* sentence;
        Bound bound;
        double limit;
    };
    const Text texts[] = {
        {"ASCII", "The quick brown Fox jumps over the lazy Dog, and the dog does not mind it.",
         Bound::atLeast, 20},
        {"Latin", "Größere Brücken führen über die Flüsse; l'été, déjà, où l'élève rêve à côté.",
         Bound::atLeast, 6},
        {"Japanese",
         "いろはにほへと ちりぬるを わかよたれそ 常ならむ、 有為の奥山 今日越えて 浅き夢見じ 酔ひもせず。",
         Bound::atLeast, 1.7},
        {"Cyrillic", "Съешь же ещё этих мягких французских булок, да выпей чаю.", Bound::shown, 0},
        {"Greek", "Ξεσκεπάζω την ψυχοφθόρα ΒΔΕΛΥΓΜΙΑΣ σας.", Bound::shown, 0},
    };
    struct Mapping {
        const char* name;
        CaseFunction function;
        UString<0> (UString<0>::*member)() const;
    };
    const Mapping mappings[] = {
        {"fold", ucasemap_utf8FoldCase, &UString<0>::getAsFoldedCase},
        {"upper", ucasemap_utf8ToUpper, &UString<0>::getAsUpperCase},
        {"lower", ucasemap_utf8ToLower, &UString<0>::getAsLowerCase},
    };
    UErrorCode status = U_ZERO_ERROR;
    const std::shared_ptr<UCaseMap> map(ucasemap_open("", 0, &status), &ucasemap_close);
    const UString<2> wide(string(kvt::bench::shuffled(texts[1].sentence, mebibyte)));
    limits.add("fold UTF-16, Latin", way([wide] { return wide.getAsFoldedCase(); }));
    limits.add("fold UTF-16, Latin: u_strFoldCase", way([wide] {
                   std::u16string result(wide.size() * 2, u'\0');
                   UErrorCode error = U_ZERO_ERROR;
                   result.resize(static_cast<std::size_t>(
                       u_strFoldCase(result.data(), static_cast<std::int32_t>(result.size()), wide.rawData(),
                                     static_cast<std::int32_t>(wide.size()), U_FOLD_CASE_DEFAULT, &error)));
                   return result;
               }));
    limits.hold({"fold UTF-16, Latin", "fold UTF-16, Latin: u_strFoldCase"});
    for (const Mapping& mapping : mappings) {
        for (const Text& row : texts) {
            const std::string name = std::string(mapping.name) + ", " + row.name;
            const std::string text = kvt::bench::shuffled(row.sentence, mebibyte);
            limits.add(name,
                       way([string = string(text), member = mapping.member] { return (string.*member)(); }));
            limits.add(name + ": ucasemap", way([map, function = mapping.function, text] {
                           return mapPlainly(function, map.get(), text);
                       }));
            limits.hold({name, name + ": ucasemap", row.bound, row.limit});
        }
    }
}

} // namespace

int main(int argc, char** argv) {
    Limits large(31, 3);
    holdSplit(large, 8, 2);
    holdSplit(large, 32, 1.2);
    holdFind(large, "find in 1 MiB, frequent first byte", mebibyte, "animal kingdom", true, Bound::atLeast,
             8);
    holdHash(large, "hash of 1 MiB", mebibyte, 1.5);
    holdCase(large);
    showOthers<0>(large, ", 8 bits");
    showOthers<2>(large, ", 16 bits");
    showOthers<3>(large, ", 32 bits");
    Limits small(101, 20'000);
    holdFind(small, "find in 64 bytes", 64, "looked in", false, Bound::atLeast, 1);
    holdFind(small, "find in 64 bytes, rare first byte", 64, "quick", false, Bound::atLeast, 1);
    holdFind(small, "find in 24 bytes", 24, "anima", false, Bound::shown, 1);
    holdHash(small, "hash of 16 bytes", 16, 1);
    const bool isLargeWithin = large.run(argc, argv) == 0;
    return small.run(argc, argv) == 0 && isLargeWithin ? 0 : 1;
}
