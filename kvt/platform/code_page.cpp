// The character set by setlocale and nl_langinfo.
#include <kvt/platform/code_page.h>

#include <langinfo.h>

#include <charconv>
#include <clocale>
#include <string_view>
#include <system_error>

namespace kvt::platform {
namespace {

constexpr std::uint32_t utf8CodePage = 65001;

// The number in a name like CP1252, IBM850 or WINDOWS-1252, 0 for any other name.
std::uint32_t codePageNumber(std::string_view name) {
    for (const std::string_view prefix : {"CP", "IBM", "WINDOWS-"}) {
        if (name.substr(0, prefix.size()) == prefix) {
            const std::string_view digits = name.substr(prefix.size());
            const char* const end = digits.data() + digits.size();
            std::uint32_t number = 0;
            const auto [stop, error] = std::from_chars(digits.data(), end, number);
            return error == std::errc() && stop == end ? number : 0;
        }
    }
    return 0;
}

} // namespace

CodeSet processCodeSet() {
    std::setlocale(LC_CTYPE, "");
    const char* const current = std::setlocale(LC_CTYPE, nullptr);
    const std::string_view locale = current != nullptr ? current : "C";
    if (locale == "C" || locale == "POSIX") {
        std::setlocale(LC_CTYPE, "C.UTF-8");
        return {utf8CodePage, "UTF-8"};
    }
    std::string name = nl_langinfo(CODESET);
    const std::uint32_t codePage = codePageNumber(name);
    return {codePage, std::move(name)};
}

} // namespace kvt::platform
