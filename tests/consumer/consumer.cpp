// What an outside program does first: include everything, convert, and catch what the library throws by the class
// that its own copy of the headers declares.

#include <kvt/kvt.h>

#include <iostream>
#include <stdexcept>
#include <string>

namespace {

void expect(bool holds, const char* what) {
    if (!holds) {
        throw std::runtime_error(what);
    }
}

void converts() {
    const kvt::ex::AnyString cyrillic("\xeb\xc9\xc5\xd7", 4, kvt::ex::Encoding("KOI8-R"));
    expect(cyrillic.getAsUtf8() == kvt::ex::Utf8String("\xd0\x9a\xd0\xb8\xd0\xb5\xd0\xb2"),
           "KOI8-R to UTF-8");
    expect(kvt::ex::Utf16String(cyrillic).size() == 4, "KOI8-R to UTF-16");
}

void failsByClass() {
    try {
        kvt::ex::AsciiString narrow(kvt::ex::Utf8String("na\xc3\xafve"));
        throw std::runtime_error("a loss went unnoticed: " + narrow.toStdString());
    } catch (const kvt::ex::UStringTranscodingException& failure) {
        expect(failure.className() == kvt::ex::Utf8String("kvt::ex::UStringTranscodingException"),
               "the class's name");
    }
    try {
        kvt::ex::Encoding nobody("no such encoding");
        throw std::runtime_error("an unknown name went unnoticed: " + std::to_string(nobody.id()));
    } catch (const kvt::ex::Throwable& failure) {
        expect(dynamic_cast<const kvt::ex::InvalidEncodingException*>(&failure) != nullptr,
               "a cast to the class");
    }
}

} // namespace

int main() {
    try {
        converts();
        failsByClass();
    } catch (const std::runtime_error& failure) {
        std::cerr << "consumer: " << failure.what() << "\n";
        return 1;
    } catch (const kvt::ex::Throwable& failure) {
        std::cerr << "consumer: " << failure.what() << "\n";
        return 1;
    }
    std::cout << "consumer: all well\n";
}
