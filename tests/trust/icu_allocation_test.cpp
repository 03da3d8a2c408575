// Lack of memory within ICU, whose allocations are no C++ ones: each of them fails in turn, in calls that go to ICU. What
// comes out then is a failure of the library or std::bad_alloc; nothing ICU allocated for the call is kept beyond what it
// keeps for good; and the same call made once more, with memory, gives what it always gives.
//
// Converters are opened once for each thread, so that each attempt runs on a thread of its own.
#include <kvt/kvt.h>

#include <gtest/gtest.h>
#include <unicode/uclean.h>

#include <cstdlib>
#include <functional>
#include <new>
#include <string>
#include <thread>
#include <vector>

namespace {

using namespace kvt::ex;

// How many of ICU's allocations on this thread are granted before one fails; none fails when it is negative.
thread_local long toSucceed = -1;
thread_local bool failed = false;

bool isRefused() {
    if (toSucceed < 0 || toSucceed-- != 0) {
        return false;
    }
    failed = true;
    return true;
}

extern "C" void* allocate(const void*, std::size_t bytes) {
    return isRefused() ? nullptr : std::malloc(bytes);
}
extern "C" void* reallocate(const void*, void* block, std::size_t bytes) {
    return isRefused() ? nullptr : std::realloc(block, bytes);
}
extern "C" void release(const void*, void* block) {
    std::free(block);
}

struct Call {
    const char* name;
    std::function<std::string()> run;
};

const std::string text =
    "Gr\xC3\xB6\xC3\x9F\x65, 12,50; na\xC3\xAFve Stra\xC3\x9F\x65n, long enough for no small buffer at all";

std::string converted(const char* encoding) {
    UString<30> bytes{Encoding(kvt::future::string_view(encoding))};
    bytes.assign(UString<0>(text.c_str()));
    return bytes.toStdString() + UString<0>(bytes).toStdString();
}

const std::vector<Call> calls = {
    {"windows-1252", [] { return converted("windows-1252"); }},
    {"GB18030", [] { return converted("GB18030"); }},
    {"UTF-7", [] { return converted("UTF-7"); }},
    {"IBM037", [] { return converted("IBM037"); }},
    {"SCSU", [] { return converted("SCSU"); }},
    {"UTF-16", [] { return UString<0>(UString<2>(UString<0>(text.c_str()))).toStdString(); }},
    {"folding of UTF-16",
     [] {
         const std::u16string letters(2000, u'\xC4');
         return UString<0>(UString<2>(letters.data(), letters.size()).getAsFoldedCase()).toStdString();
     }},
    {"upper case of a long text",
     [] {
         std::string letters;
         for (int i = 0; i < 1000; ++i) {
             letters += "\xC3\xA4";
         }
         return UString<0>(letters.c_str()).getAsUpperCase().toStdString();
     }},
    {"upper case", [] { return UString<0>(text.c_str()).getAsUpperCase().toStdString(); }},
    {"folding", [] { return UString<0>(text.c_str()).getAsFoldedCase().toStdString(); }},
    {"a stream",
     [] {
         StreamTranscoder stream(Encoding::Utf8, Encoding("ISO-8859-1"));
         std::string out;
         stream.convert(text, out, {});
         stream.finish(out, {});
         return out;
     }},
    {"wwjd", [] { return UString<29>(UString<0>(text.c_str())).toStdString(); }},
};

// What a call gives on a thread of its own, with ICU's allocation number `succeeding` failing; no text for a failure.
struct Attempt {
    std::string given;
    bool isFailure = false;
    bool isOther = false; ///< something came out that may not
    bool happened = false;
};

Attempt attempt(const Call& call, long succeeding) {
    Attempt made;
    std::thread([&] {
        toSucceed = succeeding;
        failed = false;
        try {
            made.given = call.run();
        } catch (const Throwable& failure) {
            made.given = failure.what().toStdString();
            made.isFailure = true;
        } catch (const std::bad_alloc&) {
            made.isFailure = true;
        } catch (...) {
            made.isOther = true;
        }
        made.happened = failed;
        toSucceed = -1;
    }).join();
    return made;
}

TEST(EveryIcuAllocation, MayFail) {
    UErrorCode status = U_ZERO_ERROR;
    u_setMemoryFunctions(nullptr, allocate, reallocate, release, &status);
    ASSERT_EQ(status, U_ZERO_ERROR) << "ICU has been used before";
    // Where ICU finds no memory for its own data it never looks for them again.
    u_init(&status);
    ASSERT_EQ(status, U_ZERO_ERROR);
    (void)converted("IBM273");
    int failures = 0;
    for (const Call& call : calls) {
        SCOPED_TRACE(call.name);
        bool happened = true;
        std::vector<std::string> given;
        for (long succeeding = 0; happened && succeeding < 10000; ++succeeding) {
            const Attempt made = attempt(call, succeeding);
            happened = made.happened;
            failures += happened ? 1 : 0;
            EXPECT_FALSE(made.isOther) << "with " << succeeding << " allocations";
            EXPECT_TRUE(happened || !made.isFailure) << made.given;
            if (!made.isFailure) {
                given.push_back(made.given);
            }
        }
        ASSERT_FALSE(given.empty());
        for (const std::string& other : given) {
            EXPECT_EQ(other, given.back());
        }
    }
    std::cout << calls.size() << " calls, " << failures << " failed allocations\n";
}

} // namespace
