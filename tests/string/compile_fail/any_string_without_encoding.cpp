// Units alone do not say what a UString<30> is encoded in.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

UString<30> make(UStringView<30> view) {
#ifdef MUST_FAIL
    return UString<30>(view);
#else
    return UString<30>(view, Encoding::Utf8);
#endif
}
