// Only a literal of the string's own units, or one of UTF-8, is taken without a word.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

#ifdef MUST_FAIL
using String = UString<0>;
#else
using String = UString<2>;
#endif

String make() {
    return u"text";
}
