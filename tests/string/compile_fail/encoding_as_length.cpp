// An encoding in the place of the length would be a length.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

UString<0> make(const char* text, Encoding encoding) {
#ifdef MUST_FAIL
    return UString<0>(text, encoding);
#else
    return UString<0>(text, 3, encoding);
#endif
}
