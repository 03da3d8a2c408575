// The sum would be a UString<30> of no encoding.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

#ifdef MUST_FAIL
using String = UString<30>;
#else
using String = UString<0>;
#endif

String sum(const String& string) {
    return string.substr(1) + "x";
}
