// Two literals are not the ends of one range of units.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

void strip(UString<0>& string) {
#ifdef MUST_FAIL
    string.strip({"a", "b"});
#else
    string.strip({'a', 'b'});
#endif
}
