#include "intercepted_case_mapping.h"

#include <dlfcn.h>
#include <langinfo.h>
#include <unicode/ucasemap.h>
#include <unicode/ustring.h>

#include <atomic>
#include <cstdio>
#include <mutex>
#include <utility>

// ICU's headers rename each function to one with the version in its name.
#define KVT_TEXT_OF(name) #name
#define KVT_NAME_OF(name) KVT_TEXT_OF(name)
#define KVT_REAL(name) (reinterpret_cast<decltype(&(name))>(dlsym(RTLD_NEXT, KVT_NAME_OF(name))))

namespace kvt::test {
namespace {

thread_local InterceptedCaseMapping* current = nullptr;

std::atomic<int> opened = 0;
std::atomic<int> closed = 0;
std::atomic<const void*> lastMap = nullptr;
std::atomic<int> openStatus = 0;
std::atomic<bool> announcing = false;
std::atomic<const char*> codeSet = nullptr;
std::mutex argumentsMutex;
std::string arguments;

// Records `call` and lets the queued answer stand in for `real`.
template <typename Real>
std::int32_t mapped(CaseCall call, UErrorCode* status, Real real) {
    if (current == nullptr) {
        return real();
    }
    call.status = *status;
    current->calls.push_back(std::move(call));
    if (current->answers.empty()) {
        return real();
    }
    const auto answer = std::move(current->answers.front());
    current->answers.pop_front();
    return answer(status);
}

CaseCall utf8Call(const char* function, const void* caseMap, std::int32_t capacity, std::int32_t length) {
    if (current == nullptr) {
        return {};
    }
    return {function, capacity, length, 0, "none", 0, caseMap};
}

CaseCall utf16Call(const char* function, std::int32_t capacity, std::int32_t length, const char* locale) {
    if (current == nullptr) {
        return {};
    }
    return {function, capacity, length, 0, locale == nullptr ? "null" : locale, 0, nullptr};
}

} // namespace

InterceptedCaseMapping::InterceptedCaseMapping() {
    current = this;
}

InterceptedCaseMapping::~InterceptedCaseMapping() {
    current = nullptr;
}

void InterceptedCaseMapping::answer(std::int32_t needed, int status) {
    answers.push_back([=](UErrorCode* left) {
        *left = static_cast<UErrorCode>(status);
        return needed;
    });
}

void InterceptedCaseMapping::fail(std::function<void()> action) {
    answers.push_back([action = std::move(action)](UErrorCode*) {
        action();
        return 0;
    });
}

int openedCaseMaps() noexcept {
    return opened;
}

int closedCaseMaps() noexcept {
    return closed;
}

const void* lastCaseMap() noexcept {
    return lastMap;
}

std::string lastCaseMapArguments() {
    const std::lock_guard lock(argumentsMutex);
    return arguments;
}

void setCaseMapStatus(int status) noexcept {
    openStatus = status;
}

void announceClosing() noexcept {
    announcing = true;
}

void setCodeSet(const char* name) noexcept {
    codeSet = name;
}

} // namespace kvt::test

using namespace kvt::test;

#define KVT_INTERCEPTING extern "C" __attribute__((visibility("default")))

KVT_INTERCEPTING UCaseMap* ucasemap_open(const char* locale, std::uint32_t options, UErrorCode* status) {
    static const auto real = KVT_REAL(ucasemap_open);
    {
        const std::lock_guard lock(argumentsMutex);
        arguments =
            (locale == nullptr ? "null" : '"' + std::string(locale) + '"') + ' ' + std::to_string(options);
    }
    const auto forced = static_cast<UErrorCode>(openStatus.load());
    if (U_FAILURE(forced)) {
        *status = forced;
        return nullptr;
    }
    UCaseMap* const map = real(locale, options, status);
    if (forced != U_ZERO_ERROR) {
        *status = forced;
    }
    ++opened;
    lastMap = map;
    return map;
}

KVT_INTERCEPTING void ucasemap_close(UCaseMap* map) {
    static const auto real = KVT_REAL(ucasemap_close);
    ++closed;
    if (announcing) {
        std::fputs("case map closed\n", stderr);
    }
    real(map);
}

KVT_INTERCEPTING std::int32_t ucasemap_utf8ToUpper(const UCaseMap* map, char* target, std::int32_t capacity,
                                                   const char* source, std::int32_t length,
                                                   UErrorCode* status) {
    static const auto real = KVT_REAL(ucasemap_utf8ToUpper);
    return mapped(utf8Call("ucasemap_utf8ToUpper", map, capacity, length), status,
                  [&] { return real(map, target, capacity, source, length, status); });
}

KVT_INTERCEPTING std::int32_t ucasemap_utf8ToLower(const UCaseMap* map, char* target, std::int32_t capacity,
                                                   const char* source, std::int32_t length,
                                                   UErrorCode* status) {
    static const auto real = KVT_REAL(ucasemap_utf8ToLower);
    return mapped(utf8Call("ucasemap_utf8ToLower", map, capacity, length), status,
                  [&] { return real(map, target, capacity, source, length, status); });
}

KVT_INTERCEPTING std::int32_t ucasemap_utf8FoldCase(const UCaseMap* map, char* target, std::int32_t capacity,
                                                    const char* source, std::int32_t length,
                                                    UErrorCode* status) {
    static const auto real = KVT_REAL(ucasemap_utf8FoldCase);
    return mapped(utf8Call("ucasemap_utf8FoldCase", map, capacity, length), status,
                  [&] { return real(map, target, capacity, source, length, status); });
}

KVT_INTERCEPTING std::int32_t u_strToUpper(UChar* target, std::int32_t capacity, const UChar* source,
                                           std::int32_t length, const char* locale, UErrorCode* status) {
    static const auto real = KVT_REAL(u_strToUpper);
    return mapped(utf16Call("u_strToUpper", capacity, length, locale), status,
                  [&] { return real(target, capacity, source, length, locale, status); });
}

KVT_INTERCEPTING std::int32_t u_strToLower(UChar* target, std::int32_t capacity, const UChar* source,
                                           std::int32_t length, const char* locale, UErrorCode* status) {
    static const auto real = KVT_REAL(u_strToLower);
    return mapped(utf16Call("u_strToLower", capacity, length, locale), status,
                  [&] { return real(target, capacity, source, length, locale, status); });
}

KVT_INTERCEPTING std::int32_t u_strFoldCase(UChar* target, std::int32_t capacity, const UChar* source,
                                            std::int32_t length, std::uint32_t options, UErrorCode* status) {
    static const auto real = KVT_REAL(u_strFoldCase);
    CaseCall call = utf16Call("u_strFoldCase", capacity, length, "none");
    call.options = options;
    return mapped(std::move(call), status,
                  [&] { return real(target, capacity, source, length, options, status); });
}

KVT_INTERCEPTING char* nl_langinfo(nl_item item) noexcept {
    static const auto real = KVT_REAL(nl_langinfo);
    const char* const name = codeSet;
    return item == CODESET && name != nullptr ? const_cast<char*>(name) : real(item);
}
