// What is searched for is in the units of the string.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

std::uint64_t find(const UString<2>& string) {
#ifdef MUST_FAIL
    return string.findFirstOf({"a", "b"});
#else
    return string.findFirstOf({u"a", u"b"});
#endif
}
