// ICU's ucnv_open as this test program has it: it stands before the real one, counts the calls and refuses names.
// The library is linked into the program, so its calls arrive here too.
#pragma once

#include <cstddef>
#include <string>

namespace kvt::test {

/// Calls of ucnv_open by this thread.
std::size_t openCalls() noexcept;

/// While it lives, ICU cannot open `name` on this thread.
class RefusedConverter {
public:
    explicit RefusedConverter(std::string name);
    RefusedConverter(const RefusedConverter&) = delete;
    RefusedConverter& operator=(const RefusedConverter&) = delete;
    ~RefusedConverter();
};

} // namespace kvt::test
