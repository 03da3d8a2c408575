// By the shell's rules for "~", as the `date` library does it: HOME, else the home folder of the user in the system's
// list.
#include <kvt/platform/downloads_folder.h>

#include <memory>
#include <stdexcept>
#include <wordexp.h>

namespace kvt::platform {

std::string downloadsFolder() {
    constexpr const char* path = "~/Downloads";
    wordexp_t words{};
    const std::unique_ptr<wordexp_t, void (*)(wordexp_t*)> hold(&words, ::wordfree);
    if (::wordexp(path, &words, WRDE_NOCMD) != 0 || words.we_wordc != 1) {
        throw std::runtime_error(std::string("Cannot expand path: ") + path);
    }
    return words.we_wordv[0];
}

} // namespace kvt::platform
