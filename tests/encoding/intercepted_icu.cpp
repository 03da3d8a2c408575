#include <encoding/intercepted_icu.h>

#include <dlfcn.h>
#include <unicode/ucnv.h>

#include <utility>

// ICU's headers rename each function to one with the version in its name.
#define KVT_TEXT_OF(name) #name
#define KVT_NAME_OF(name) KVT_TEXT_OF(name)

namespace kvt::test {
namespace {

thread_local std::size_t calls = 0;
thread_local std::string refused;

} // namespace

std::size_t openCalls() noexcept {
    return calls;
}

RefusedConverter::RefusedConverter(std::string name) {
    refused = std::move(name);
}

RefusedConverter::~RefusedConverter() {
    refused.clear();
}

} // namespace kvt::test

extern "C" __attribute__((visibility("default"))) UConverter* ucnv_open(const char* name, UErrorCode* error) {
    using Open = UConverter* (*)(const char*, UErrorCode*);
    static const auto real = reinterpret_cast<Open>(dlsym(RTLD_NEXT, KVT_NAME_OF(ucnv_open)));
    ++kvt::test::calls;
    if (!kvt::test::refused.empty() && kvt::test::refused == name) {
        *error = U_FILE_ACCESS_ERROR;
        return nullptr;
    }
    return real(name, error);
}
