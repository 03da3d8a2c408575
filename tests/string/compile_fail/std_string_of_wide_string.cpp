// Only units of 8 bits go into a std::string as they are.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

#ifdef MUST_FAIL
using String = UString<2>;
#else
using String = UString<1>;
#endif

std::string units(const String& string) {
    return string.toStdString();
}
