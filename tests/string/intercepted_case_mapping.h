// ICU's case mapping, and the C library's name of the character set, as this test program has them: its own functions
// stand before the real ones. They tell what the library asks for, and can answer in place of ICU.
//
// The library's calls arrive here because a program's definitions come before those of shared libraries.
#pragma once

#include <unicode/utypes.h>

#include <cstdint>
#include <deque>
#include <functional>
#include <ostream>
#include <string>
#include <vector>

namespace kvt::test {

/// One call of a mapping function.
struct CaseCall {
    std::string function;
    std::int32_t capacity = 0;
    std::int32_t length = 0;
    int status = 0;              ///< as it was handed over
    std::string locale = "none"; ///< "null" for a null pointer, "none" for a function that takes no locale
    std::uint32_t options = 0;
    const void* caseMap = nullptr;

    friend bool operator==(const CaseCall&, const CaseCall&) = default;
    friend std::ostream& operator<<(std::ostream& stream, const CaseCall& call) {
        return stream << call.function << "(capacity " << call.capacity << ", length " << call.length
                      << ", status " << call.status << ", locale " << call.locale << ", options "
                      << call.options << ", map " << call.caseMap << ')';
    }
};

/// While it lives, calls of this thread are recorded, and answered by what is queued; ICU answers the rest.
class InterceptedCaseMapping {
public:
    InterceptedCaseMapping();
    InterceptedCaseMapping(const InterceptedCaseMapping&) = delete;
    InterceptedCaseMapping& operator=(const InterceptedCaseMapping&) = delete;
    ~InterceptedCaseMapping();

    /// The next call writes nothing, leaves `status` and returns `needed`.
    void answer(std::int32_t needed, int status);
    /// The next call runs `action`, which throws.
    void fail(std::function<void()> action);

    std::vector<CaseCall> calls;
    std::deque<std::function<std::int32_t(UErrorCode*)>> answers;
};

/// The case maps that were opened and closed by all threads, and the handle opened last.
int openedCaseMaps() noexcept;
int closedCaseMaps() noexcept;
const void* lastCaseMap() noexcept;
/// What the last opening asked for: the locale in quotes and the options.
std::string lastCaseMapArguments();

/// The status that opening a case map leaves from now on: an error opens nothing, a warning opens all the same.
void setCaseMapStatus(int status) noexcept;
/// Writes "case map closed" to the standard error stream whenever one is.
void announceClosing() noexcept;

/// The character set that the C library names from now on; null for the real one.
void setCodeSet(const char* name) noexcept;

} // namespace kvt::test
