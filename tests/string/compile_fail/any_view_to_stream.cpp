// What a view of a UString<30> shows is written nowhere.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

#include <ostream>

#ifdef MUST_FAIL
using String = UString<30>;
#else
using String = UString<0>;
#endif

void write(std::ostream& stream, const String& string) {
    stream << string.substr(1);
}
