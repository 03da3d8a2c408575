// So would the number of an encoding.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

UString<0> make(const char* text) {
#ifdef MUST_FAIL
    return UString<0>(text, Encoding::Windows1252);
#else
    return UString<0>(text, 3, Encoding::Windows1252);
#endif
}
