// The codec of the wwjd text encoding.
//
// Both decoders know the named tokens by one table. The one to UTF-16 walks from token to token, as its failure says
// where the last one ended; the one to bytes goes byte by byte.
#include <kvt/codec/wwjd.h>

#include <kvt/encoding/detail/failure_text.h>
#include <kvt/foundation/throwable.h>
#include <kvt/platform/thread_end.h>
#include <kvt/string/ustring.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <optional>
#include <stdexcept>
#include <utility>

namespace kvt::ex::detail {
namespace {

struct Token {
    std::string_view name;
    char unit;
};

// Sorted by name as bytes.
constexpr std::array<Token, 25> tokens = {{
    {"amp", '&'},       {"apos", '\''},        {"at", '@'},         {"backslash", '\\'}, {"backspace", '\b'},
    {"bell", '\a'},     {"closebracket", ']'}, {"closecurly", '}'}, {"closeparen", ')'}, {"comma", ','},
    {"cr", '\r'},       {"dollar", '$'},       {"formfeed", '\f'},  {"gt", '>'},         {"lf", '\n'},
    {"lt", '<'},        {"openbracket", '['},  {"opencurly", '{'},  {"openparen", '('},  {"quote", '"'},
    {"semicolon", ';'}, {"solidus", '/'},      {"space", ' '},      {"tab", '\t'},       {"verttab", '\v'},
}};

constexpr bool byName(const Token& left, const Token& right) {
    return left.name < right.name;
}

static_assert(std::is_sorted(tokens.begin(), tokens.end(), byName));

constexpr std::size_t longestName = 12;
static_assert(std::all_of(tokens.begin(), tokens.end(),
                          [](const Token& token) { return token.name.size() <= longestName; }));

// Length, first and last letter tell the names apart: by these numbers, each has a place of its own.
constexpr std::size_t places = 64;
constexpr std::size_t placeOf(std::string_view name) {
    return (name.size() + static_cast<unsigned char>(name.front()) * std::size_t{10} +
            static_cast<unsigned char>(name.back()) * std::size_t{46}) %
           places;
}

constexpr std::array<Token, places> tokensByPlace() {
    std::array<Token, places> table{};
    for (const Token& token : tokens) {
        table[placeOf(token.name)] = token;
    }
    return table;
}

constexpr std::array<Token, places> tokenAt = tokensByPlace();
static_assert(std::all_of(tokens.begin(), tokens.end(), [](const Token& token) {
    return tokenAt[placeOf(token.name)].name == token.name;
}));

// The names by character, empty for a character that stands for itself.
constexpr std::array<std::string_view, 128> namesByUnit() {
    std::array<std::string_view, 128> names{};
    for (const Token& token : tokens) {
        names[static_cast<unsigned char>(token.unit)] = token.name;
    }
    return names;
}

constexpr std::array<std::string_view, 128> tokenNames = namesByUnit();

std::optional<char> unitOf(std::string_view name) {
    if (name.empty()) {
        return std::nullopt;
    }
    const Token& token = tokenAt[placeOf(name)];
    return token.name == name ? std::optional(token.unit) : std::nullopt;
}

// Finds what may be a token: a "<" and the next ">" behind it.
class Scanner {
public:
    explicit Scanner(std::string_view text) : rest_(text) {}

    bool next() {
        open_ = rest_.find('<');
        if (open_ == std::string_view::npos) {
            return false;
        }
        // The ">" found for the last "<" serves until it is passed, so that many "<" do not search the text again.
        if (close_ == nullptr || close_ < rest_.data() + open_) {
            const std::size_t close = rest_.find('>', open_ + 1);
            if (close == std::string_view::npos) {
                return false;
            }
            close_ = rest_.data() + close;
        }
        return true;
    }
    std::string_view textBefore() const { return rest_.substr(0, open_); }
    std::string_view name() const {
        const char* const first = rest_.data() + open_ + 1;
        return {first, static_cast<std::size_t>(close_ - first)};
    }
    void skipToken() { rest_.remove_prefix(open_ + name().size() + 2); }
    void skipOpening() { rest_.remove_prefix(open_ + 1); }
    /// What is not consumed yet.
    std::string_view rest() const { return rest_; }

private:
    std::string_view rest_;
    std::size_t open_ = 0;
    const char* close_ = nullptr;
};

// Reads a number in base 16 as std::stoi does: leading blanks, a sign and "0x" are allowed, and what follows the
// digits is ignored. Four characters cannot be out of its range.
char16_t hexadecimalUnit(std::string_view digits) {
    unsigned unit = 0;
    const auto isDigit = [&](char c) {
        const auto lower = static_cast<unsigned>(static_cast<unsigned char>(c)) | 0x20U;
        const unsigned digit = lower >= 'a' && lower <= 'f' ? lower - 'a' + 10
                               : c >= '0' && c <= '9'       ? lower - '0'
                                                            : 16;
        unit = unit << 4 | digit;
        return digit < 16;
    };
    if (std::all_of(digits.begin(), digits.end(), isDigit)) {
        return static_cast<char16_t>(unit);
    }
    const std::string terminated(digits);
    char* end = nullptr;
    const long value = std::strtol(terminated.c_str(), &end, 16);
    if (end == terminated.c_str()) {
        throw std::invalid_argument("invalid stoi argument");
    }
    return static_cast<char16_t>(value);
}

// Appends each byte as a unit, U+FFFD for one above 127; returns whether there was none of these.
bool appendAscii(std::string_view bytes, std::u16string& out) {
    unsigned all = 0;
    const std::size_t before = out.size();
    out.resize(before + bytes.size());
    std::transform(bytes.begin(), bytes.end(), out.begin() + static_cast<std::ptrdiff_t>(before),
                   [&](char c) {
                       const auto byte = static_cast<unsigned char>(c);
                       all |= byte;
                       return byte < 128 ? static_cast<char16_t>(byte) : u'\uFFFD';
                   });
    return all < 128;
}

} // namespace

std::string utf16ToWwjd(std::u16string_view text) {
    constexpr std::string_view digits = "0123456789abcdef";
    std::string out;
    out.reserve(text.size() * 4);
    for (const char16_t unit : text) {
        if (unit > 127) {
            out += {'<',
                    'u',
                    digits[unit >> 12],
                    digits[(unit >> 8) & 15],
                    digits[(unit >> 4) & 15],
                    digits[unit & 15],
                    '>'};
        } else if (const std::string_view name = tokenNames[unit]; !name.empty()) {
            out.append(1, '<').append(name).append(1, '>');
        } else {
            out += static_cast<char>(unit);
        }
    }
    out.shrink_to_fit();
    return out;
}

UString<2> wwjdToUtf16(std::string_view text) {
    std::u16string out;
    out.reserve(text.size());
    bool valid = true;
    Scanner scanner(text);
    while (scanner.next()) {
        valid = appendAscii(scanner.textBefore(), out) && valid;
        const std::string_view name = scanner.name();
        const bool numeric = !name.empty() && name.front() == 'u';
        if (numeric && name.size() == 1) {
            scanner.skipToken();
        } else if (numeric && name.size() == 5) {
            out += hexadecimalUnit(name.substr(1));
            scanner.skipToken();
        } else if (const auto unit = unitOf(name)) {
            out += static_cast<char16_t>(*unit);
            scanner.skipToken();
        } else {
            out += u'<';
            scanner.skipOpening();
        }
    }
    valid = appendAscii(scanner.rest(), out) && valid;
    if (!valid) {
        const std::string_view units(reinterpret_cast<const char*>(out.data()),
                                     out.size() * sizeof(char16_t));
        throw UStringBadEncodingException(UString<28>(UStringView<28>(scanner.rest())), Encoding::Wwjd,
                                          textForFailure(units, Encoding::Utf16LE), "\xEF\xBF\xBD");
    }
    return UString<2>(out.data(), out.size());
}

// Nothing here depends on where the ">" of something stands that is not a name. So a look at the bytes of the longest
// name is enough at each "<". No result is longer than its text.
std::string wwjdToBytes(std::string_view text) {
    std::string out(text.size(), '\0');
    char* target = out.data();
    const char* p = text.data();
    const char* const end = p + text.size();
    while (p != end) {
        if (*p != '<') {
            *target++ = *p++;
            continue;
        }
        const char* const name = p + 1;
        const char* const limit = name + std::min<std::ptrdiff_t>(end - name, longestName + 1);
        const char* const close = std::find(name, limit, '>');
        const auto unit =
            close != limit ? unitOf({name, static_cast<std::size_t>(close - name)}) : std::nullopt;
        *target++ = unit.value_or('<');
        p = unit ? close + 1 : name;
    }
    out.resize(static_cast<std::size_t>(target - out.data()));
    out.shrink_to_fit();
    return out;
}

namespace {

/// What the last call of wwjdDecode() on a thread gave, which its caller views.
template <typename CharT>
struct Decoded {
    std::basic_string<CharT> text;
};

} // namespace

template <typename CharT>
void wwjdDecode(kvt::future::basic_string_view<CharT, std::char_traits<CharT>> text, const CharT*& data,
                std::uint64_t& size) {
    std::basic_string<CharT>& decoded = platform::ofThisThread<Decoded<CharT>>().text;
    decoded = wwjdToBytes(text);
    data = decoded.data();
    size = decoded.size();
}

template KVT_EXPORT void wwjdDecode<char>(kvt::future::basic_string_view<char, std::char_traits<char>>,
                                          const char*&, std::uint64_t&);

} // namespace kvt::ex::detail
