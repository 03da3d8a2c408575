#include <iostream>
#include <kvt/kvt.h>

int main() try {
    const kvt::ex::AnyString sent("Caf\xe9, 5 \x80", 9, kvt::ex::Encoding::Windows1252);
    std::cout << sent.getAsUtf8() << "\n";
    std::cout << sent.getAsEncoding(kvt::ex::Encoding::Iso8859_1) << "\n";
} catch (const kvt::ex::UStringTranscodingException& failure) {
    std::cout << "lost something: " << failure.what() << "\n";
}
