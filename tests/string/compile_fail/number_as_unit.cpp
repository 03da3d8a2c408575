// A number is not a unit: it would become one of another meaning, or be cut.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

void append(UString<0>& string) {
#ifdef MUST_FAIL
    string += 65;
#else
    string += char{65};
#endif
}
