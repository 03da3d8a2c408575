// The encoding of every other type is part of the type.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

#ifdef MUST_FAIL
using String = UString<0>;
#else
using String = UString<30>;
#endif

void relabel(String& string) {
    string.setEncoding(Encoding::Windows1252);
}
