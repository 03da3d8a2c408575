// A literal zero is a null pointer, which would be read as a name.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

Encoding make() {
#ifdef MUST_FAIL
    return 0;
#else
    return Encoding::Utf8;
#endif
}
