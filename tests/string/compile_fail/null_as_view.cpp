// Nor is it one for what reads text.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

bool begins(const UString<0>& string) {
#ifdef MUST_FAIL
    return string == nullptr;
#else
    return string == "";
#endif
}
