// Units of 8 bits do not say in which encoding they would have to be converted.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

#ifdef MUST_FAIL
using Standard = std::string;
#else
using Standard = std::u16string;
#endif

bool same(const UString<2>& string, const Standard& standard) {
    return standard == string;
}
