// Prints what a process finds its system encoding to be, one `key=value` a line; texts as hexadecimal bytes. The test
// runs it under locales of its own.
//
//     system_encoding_child NAME TEXT OUTSIDE BAD
//
// NAME is an encoding to compare with; TEXT is UTF-8 text of the system encoding's repertoire, OUTSIDE UTF-8 text
// that is not, BAD bytes that are not text in it; each as hexadecimal bytes.
#include <foundation/items.h>

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>

#include <clocale>
#include <iostream>
#include <string>

namespace {

using kvt::ex::Encoding;
using kvt::ex::UString;

std::string fromHex(const std::string& digits) {
    std::string bytes;
    for (std::size_t i = 0; i + 1 < digits.size(); i += 2) {
        bytes += static_cast<char>(std::stoi(digits.substr(i, 2), nullptr, 16));
    }
    return bytes;
}

std::string toHex(const std::string& bytes) {
    constexpr const char* digits = "0123456789ABCDEF";
    std::string hex;
    for (const char c : bytes) {
        hex += digits[static_cast<unsigned char>(c) >> 4];
        hex += digits[static_cast<unsigned char>(c) & 15];
    }
    return hex;
}

template <typename T>
void print(const char* key, const T& value) {
    std::cout << key << "=" << value << "\n";
}

template <typename Conversion>
void printFailure(const char* key, Conversion conversion) {
    try {
        conversion();
        print(key, "none");
    } catch (const kvt::ex::Throwable& failure) {
        std::string text = failure.className().toStdString();
        for (const std::string& item : kvt::test::itemsOf(failure)) {
            text += " " + toHex(item);
        }
        print(key, text);
    }
}

std::string locale(int category) {
    return std::setlocale(category, nullptr);
}

UString<0> utf8(const std::string& bytes) {
    return UString<0>(bytes.data(), bytes.size());
}

} // namespace

int main(int argc, char** argv) {
    if (argc != 5) {
        std::cerr << "four arguments, please\n";
        return 2;
    }
    const std::string named = argv[1];
    const std::string text = fromHex(argv[2]);
    const std::string outside = fromHex(argv[3]);
    const std::string bad = fromHex(argv[4]);

    print("locale.start", locale(LC_CTYPE));
    // Encodings with a fixed id need no registry, and so leave the locale alone.
    (void)Encoding::windowsCodePage<1252>();
    (void)Encoding::windowsCodePage<20127>();
    (void)Encoding::ibmCodePage<367>();
    print("locale.fixed", locale(LC_CTYPE));

    const Encoding system = Encoding::System;
    print("id", system.id());
    print("evaluate", system.evaluate());
    print("locale.after", locale(LC_CTYPE));
    print("locale.numeric", locale(LC_NUMERIC));
    print("name", system.getName());
    print("unevaluated", system.getUnevaluatedName());
    print("ansi", Encoding(kvt::future::string_view("ANSI")).getName());
    print("firstNew", Encoding(kvt::future::string_view("ibm-1047_P100-1995")).id());
    const Encoding other(named, kvt::ex::nothrow);
    print("named.id", other.id());
    print("named.equal", other == system && system == other && !(other < system) && !(system < other));
    print("ascii", system.supports7BitASCII());
    print("single", system.isSingleByte());

    // A later change of the locale changes nothing: the encoding was found once.
    std::setlocale(LC_CTYPE, "C");
    print("evaluate.later", system.evaluate());
    print("name.later", system.getName());

    const UString<27> converted(utf8(text));
    print("to", toHex(converted.toStdString()));
    print("back", toHex(UString<0>(converted).toStdString()));
    print("backUtf16", toHex(UString<0>(converted.getAsUtf16()).toStdString()));
    print("fromBytes", toHex(UString<27>(text.data(), text.size(), Encoding::Utf8).toStdString()));
    print("getAsSystem", toHex(utf8(text).getAsSystem().toStdString()));
    // Bytes that are said to be in the system's encoding are taken as they are.
    print("unchecked", toHex(UString<27>(bad.data(), bad.size(), Encoding::System).toStdString()));
    print("uncheckedNamed", toHex(UString<27>(bad.data(), bad.size(), other).toStdString()));
    printFailure("outside", [&] { (void)UString<27>(utf8(outside)); });
    printFailure("bad", [&] { (void)UString<27>(bad.data(), bad.size(), Encoding::System).getAsUtf16(); });
    return 0;
}
