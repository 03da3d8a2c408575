// A null pointer is not an empty text.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

UString<0> make() {
#ifdef MUST_FAIL
    return nullptr;
#else
    return "";
#endif
}
