// A view becomes a string only where that is written: it costs a copy.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

UString<0> make(UStringView<0> view) {
#ifdef MUST_FAIL
    return view;
#else
    return UString<0>(view);
#endif
}
