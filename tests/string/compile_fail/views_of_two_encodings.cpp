// A view has no encoding of its own, so that nothing could convert it.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

#ifdef MUST_FAIL
using Other = UStringView<1>;
#else
using Other = UStringView<0>;
#endif

bool same(const UString<0>& string, Other view) {
    return string == view;
}
