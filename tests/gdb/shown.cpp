// A program with one object of each kind that the pretty-printers show. gdb stops it at stopHere().
#include <kvt/kvt.h>

#include <string>
#include <utility>

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringArray;
using kvt::ex::UStringView;

int stopped = 0;

// Before anything has asked for an encoding there is no registry, and its names are not known.
__attribute__((noinline)) void stopEarly() {
    ++stopped;
}
__attribute__((noinline)) void stopHere() {
    ++stopped;
}

// A failure as a user's program derives its own.
class OwnFailure : public kvt::ex::Exception {
public:
    using Exception::Exception;
};

int main() {
    {
        UString<27> early;
        UString<3> earlyText(U"abc", 3);
        Encoding earlyEncoding = Encoding::System;
        stopEarly();
    }
    UString<0> empty;
    UString<0> utf8("caf\u00e9 \U0001F600 \"quoted\" \\ \n\t\x01");
    UString<0> zeros("a\0b", 3);
    UString<0> illegal("caf\xE9 \xFF", 6);
    UString<0> single("x");
    UString<0> longText(std::string(1000, 'y').c_str());
    UString<1> ascii("abc");
    UString<2> utf16(u"caf\u00e9 \U0001F600", 7);
    UString<2> lone(u"a\xD800z", 3);
    UString<3> utf32(U"caf\u00e9 \U0001F600", 6);
    UString<3> beyond(U"a\x110000", 2);
    UString<27> system("caf\u00e9");
    UString<28> binary("caf\xE9\0\n", 6);
    UString<29> wwjd("caf\u00e9 <");
    UString<30> none("abc\xE9", 4, Encoding::Unknown);
    UString<30> western("caf\xE9 \x80", 6, Encoding::Windows1252);
    UString<30> undefined("a\x81z", 3, Encoding::Windows1252);
    UString<30> russian("\xeb\xc9\xc5\xd7", 4, Encoding("KOI8-R"));
    UString<30> japanese("\x93\xfa\x96\x7b", 4, Encoding("Shift_JIS"));
    UString<30> thai("\xa1", 1, Encoding("windows-874-2000"));
    UString<30> bigEndian("\0a\x20\xAC", 4, Encoding::Utf16BE);
    UString<30> mainframe("\xC8\x85\x93\x93\x96", 5, Encoding("ibm-37"));
    UString<30> nobodys("\x81z", 2, Encoding("LMBCS-1"));
    const UString<0>& reference = utf8;

    UStringView<0> view(utf8.rawData(), 5);
    UStringView<2> wideView = utf16;
    UStringView<30> anyView = western;
    UStringView<0> noView;

    UStringArray<0> array{UString<0>("one"), UString<0>(), UString<0>("caf\u00e9")};
    UStringArray<2> wideArray{UString<2>(u"one", 3)};
    UStringArray<30> anyArray{western, russian};
    UStringArray<0> noArray;
    kvt::ex::vector<char> set{'a', 'b'};

    Encoding fixed = Encoding::Windows1252;
    Encoding systems = Encoding::System;
    Encoding dynamic("KOI8-R");
    Encoding unknown = Encoding::Unknown;

    kvt::ex::Exception emptyFailure;
    kvt::ex::UStringTranscodingException transcoding("caf\u00e9", Encoding::Utf8, Encoding::UsAscii, "caf?",
                                                     "?");
    transcoding.addStackFrame("file.cpp", "function", -12);
    transcoding.addMessageString("one line\nand another");
    kvt::ex::InvalidEncodingException invalid("no-such");
    OwnFailure own("a failure of the program");
    kvt::ex::Throwable& base = own;
    kvt::ex::Exception source("x");
    kvt::ex::Exception moved(std::move(source));
    stopHere();
    return reference.isEmpty() || view.isEmpty() || wideView.isEmpty() || anyView.isEmpty() ||
           !noView.isEmpty() || base.what().isEmpty() || stopped != 2;
}
