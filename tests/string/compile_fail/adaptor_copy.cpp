// A copy of the table in a string would stand for the storage of another string.
#include <kvt/string/ustring.h>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

using Adaptor = kvt::ex::detail::IZQTUStringAdaptor<char>;

std::size_t use(std::string& storage) {
    Adaptor adaptor(storage);
#ifdef MUST_FAIL
    Adaptor copy(adaptor);
#else
    Adaptor copy(storage);
#endif
    return copy.byteLength();
}
