// Converts in the destructors of static and thread_local objects, which run before and after those of the library's
// own. late_conversion_test runs it and compares what it prints: a line for each destructor that got the right texts.
//
// The argument says how the process ends: "return" from main or "exit" in another thread.
#include <kvt/codec/wwjd.h>
#include <kvt/encoding/icu_transcoder.h>
#include <kvt/encoding/stream_transcoder.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>

#include <cstdio>
#include <cstdlib>
#include <pthread.h>
#include <string>
#include <string_view>
#include <thread>

namespace {

using kvt::ex::AnyString;
using kvt::ex::Encoding;
using kvt::ex::StreamTranscoder;
using kvt::ex::UString;

void require(bool condition, const char* what) {
    if (!condition) {
        std::printf("wrong: %s\n", what);
        std::fflush(stdout);
        std::_Exit(3);
    }
}

std::string converted(const char* encoding, const char* text) {
    return UString<0>(text).getAsEncoding(Encoding(encoding)).toStdString();
}

std::string streamed(const char* encoding, std::string_view text) {
    StreamTranscoder stream(Encoding::Utf8, Encoding(encoding));
    std::string out;
    stream.convert(text, out, {});
    stream.finish(out, {});
    return out;
}

/// Everything of text that keeps something between calls.
void convertAll() {
    require(converted("GB18030", "\u4e2d\U0001F600") == "\xD6\xD0\x94\x39\xFC\x36", "GB18030");
    require(converted("Shift_JIS", "\u3042") == "\x82\xA0", "Shift_JIS");
    require(converted("windows-1251", "\u0416") == "\xC6", "windows-1251");
    require(converted("ISO-2022-JP", "\u3042") == "\x1B$B$\"\x1B(B", "ISO-2022-JP");
    require(streamed("GB18030", "\u4e2d") == "\xD6\xD0", "a stream");
    require(UString<2>(UString<0>("\u00e9")).getAsUtf32().getAsUtf8() == UString<0>("\u00e9"),
            "UTF-16 and UTF-32");
    require(UString<0>("\u00e9").getAsSystem().getAsUtf8() == UString<0>("\u00e9"), "the system's encoding");
    require(UString<0>("\u00c9A").getAsLowerCase() == UString<0>("\u00e9a"), "lower case");
    require(UString<0>::fromNumber(499) == UString<0>("499"), "a small number");
    require(Encoding("GBK").supports7BitASCII(), "an encoding that keeps ASCII");
    require(Encoding::windowsCodePage<932>() == Encoding("Shift_JIS"), "a code page");
    require(Encoding("sjis").getName() == "Shift_JIS", "another spelling");
    require(Encoding("no such name", kvt::ex::nothrow).id() == Encoding::Unknown, "an unknown name");
    const char* data = nullptr;
    std::uint64_t size = 0;
    kvt::ex::detail::wwjdDecode<char>("a longer text than fits into a string object <lt>", data, size);
    require(std::string(data, size) == "a longer text than fits into a string object <", "wwjd");
    try {
        UString<1>(UString<0>("\u00e9"));
        require(false, "a loss");
    } catch (const kvt::ex::UStringTranscodingException& failure) {
        require(failure.getLossyConversion() == UString<0>("\x1A"), "the text of a failure");
    }
}

/// As a logger that writes what it still holds when it ends.
class Logger {
public:
    explicit Logger(const char* name) : name_(name) {}
    Logger(const Logger&) = delete;
    Logger& operator=(const Logger&) = delete;
    ~Logger() {
        convertAll();
        std::printf("%s\n", name_);
        std::fflush(stdout);
    }

private:
    const char* name_;
};

const Logger staticBefore("static object made before the first use");
// Each in a function of its own, so that it is made when it is mentioned.
void makeThreadBefore() {
    thread_local const Logger logger("thread_local object made before the first use");
}
void makeThreadAfter() {
    thread_local const Logger logger("thread_local object made after the first use");
}
void makeThreadOnly() {
    thread_local const Logger logger("thread_local object of a thread that converts at its end only");
}

void convertInBetween() {
    makeThreadBefore();
    convertAll();
    makeThreadAfter();
}

extern "C" void convertAtKey(void*) {
    convertAll();
    std::printf("destructor of a thread-specific key\n");
    std::fflush(stdout);
}

pthread_key_t key;

} // namespace

int main(int argc, char** argv) {
    const std::string end = argc == 2 ? argv[1] : "";
    makeThreadBefore();
    std::thread(&makeThreadOnly).join();
    std::thread(&convertInBetween).join();
    // The keys are made before and after the library's own, so that their destructors run on both sides of it.
    pthread_key_t late;
    require(pthread_key_create(&key, &convertAtKey) == 0, "a key");
    convertAll();
    require(pthread_key_create(&late, &convertAtKey) == 0, "a key");
    std::thread([late] {
        convertAll();
        pthread_setspecific(key, &key);
        pthread_setspecific(late, &key);
    }).join();
    static const Logger staticAfter("static object made after the first use");
    makeThreadAfter();
    if (end == "exit") {
        std::thread([] {
            convertInBetween();
            std::exit(0);
        }).join();
    }
    return end == "return" ? 0 : 2;
}
