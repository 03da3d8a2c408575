// The expectations of these tests count on a system encoding of UTF-8. The library asks for the locale when
// an encoding is first used, which is after this.
#include <cstdlib>

namespace {

[[maybe_unused]] const int plainLocale = setenv("LC_ALL", "C", 1);

} // namespace
