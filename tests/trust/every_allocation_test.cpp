// Lack of memory at every allocation of every kind of call there is: a row of the table below is run with its first
// allocation failing, then with its second, and so on until it passes. Each time nothing but std::bad_alloc may come
// out, nothing may be kept, and what the call worked on has to be as it was.
//
// What is built once, at a first use, is built before: each call is made once with memory.
#include <support/allocations.h>
#include <support/trust_page.h>

#include <kvt/kvt.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <functional>
#include <new>
#include <sstream>
#include <stdexcept>
#include <string>
#include <unistd.h>
#include <vector>

namespace {

using namespace kvt::ex;
using kvt::test::FailingAllocations;
using kvt::test::livingBlocks;

struct Call {
    std::string name;
    std::function<void()> run;
};

// Long enough for no string to keep it within itself.
const std::string ascii = "The quick brown fox, jumps, over the lazy dog. 0123456789";
const std::string umlauts =
    "Gr\xC3\xB6\xC3\x9F\x65, \xC3\x84pfel und \xE2\x82\xAC 12,50; na\xC3\xAFve Stra\xC3\x9F\x65n";

const std::string damaged = umlauts + "\xFF" + umlauts;
const UString<2> wide = UString<0>(umlauts.c_str()).getAsUtf16();
const UString<29> tokens = wide;

template <std::uint32_t N>
UString<N> stringOf(const std::string& text) {
    return UString<N>(UString<0>(text.data(), text.size()));
}

template <std::uint32_t N>
void addStringCalls(std::vector<Call>& calls) {
    // What is made here once is worked on by copies only.
    static const UString<N> text = stringOf<N>(ascii);
    static const UString<N> piece = stringOf<N>("o");
    static const UString<N> other = stringOf<N>("another text that is too long for the string itself");
    static const UStringArray<N> pieces = text.split(piece);
    const auto add = [&](const char* name, auto run) {
        calls.push_back({std::string(name) + " on UString<" + std::to_string(N) + ">", [run] {
                             UString<N> own = text;
                             try {
                                 run(own);
                             } catch (const std::bad_alloc&) {
                                 EXPECT_TRUE(own == text) << "a change that failed has left a trace";
                                 throw;
                             }
                         }});
    };
    using String = UString<N>;
    using View = UStringView<N>;
    add("copy", [](String& s) { const String copy(s); });
    add("append", [](String& s) { s.append(View(other)); });
    add("+=", [](String& s) { s += other; });
    add("prepend", [](String& s) { s.prepend(View(other)); });
    add("insert", [](String& s) { s.insert(3, View(other)); });
    add("replace", [](String& s) { s.replace(3, 1, View(other)); });
    add("replaceAll", [](String& s) { s.replaceAll(View(piece), View(other)); });
    add("replaceFirst", [](String& s) { s.replaceFirst(View(piece), View(other)); });
    add("replaceLast", [](String& s) { s.replaceLast(View(piece), View(other)); });
    add("replaceAll in any case",
        [](String& s) { s.replaceAll(View(piece), View(other), String::case_insensitive); });
    add("replaceFirst in any case",
        [](String& s) { s.replaceFirst(View(piece), View(other), String::case_insensitive); });
    add("replaceLast in any case",
        [](String& s) { s.replaceLast(View(piece), View(other), String::case_insensitive); });
    add("push_back", [](String& s) { s.push_back(s.front()); });
    add("resize", [](String& s) { s.resize(1000, s.front()); });
    add("+", [](String& s) { const String sum = s + other; });
    add("split at a unit", [](String& s) { const UStringArray<N> made = s.split(piece.front()); });
    add("split at a text", [](String& s) { const UStringArray<N> made = s.split(View(piece)); });
    add("split at some", [](String& s) { const UStringArray<N> made = s.split(pieces); });
    add("join", [](String&) { const String joined = pieces.join(piece); });
    add("join by a unit", [](String&) { const String joined = pieces.join(piece.front()); });
    add("copy of an array", [](String&) { const UStringArray<N> copy(pieces); });
    add("toUpperCase", [](String& s) { s.toUpperCase(); });
    add("toLowerCase", [](String& s) { s.toLowerCase(); });
    add("toFoldedCase", [](String& s) { s.toFoldedCase(); });
    add("getAsUpperCase", [](String& s) { const String made = s.getAsUpperCase(); });
    add("getAsLowerCase", [](String& s) { const String made = s.getAsLowerCase(); });
    add("getAsFoldedCase", [](String& s) { const String made = s.getAsFoldedCase(); });
    add("compare in any case", [](String& s) { (void)s.compare(View(other), String::case_insensitive); });
    add("find in any case", [](String& s) { (void)s.find(View(other), 0, String::case_insensitive); });
    add("rfind in any case", [](String& s) { (void)s.rfind(View(other), 9, String::case_insensitive); });
    add("beginsWith in any case",
        [](String& s) { (void)s.beginsWith(View(other), String::case_insensitive); });
    add("endsWith in any case", [](String& s) { (void)s.endsWith(View(other), String::case_insensitive); });
    add("fromNumber", [](String&) { const String number = String::fromNumber(-1.2345678901234567e-123); });
    add("asSigned", [](String& s) { (void)s.asSigned(); });
    add("asUnsigned", [](String& s) { (void)s.asUnsigned(); });
    add("getAsUtf8", [](String& s) { const UString<0> copy = s.getAsUtf8(); });
    add("getAsUtf16", [](String& s) { const UString<2> copy = s.getAsUtf16(); });
    add("getAsUtf32", [](String& s) { const UString<3> copy = s.getAsUtf32(); });
    add("getAsSystem", [](String& s) { const UString<27> copy = s.getAsSystem(); });
    for (const char* name :
         {"ISO-8859-1", "windows-1252", "Shift_JIS", "IBM037", "UTF-7", "ISO-2022-JP", "GB18030"}) {
        add(name,
            [encoding = Encoding(name)](String& s) { const UString<30> copy = s.getAsEncoding(encoding); });
    }
    add("from bytes", [](String&) { const String made(umlauts.data(), umlauts.size()); });
    add("from bytes with a loss", [](String&) { const String made(damaged.data(), damaged.size()); });
    add("from UTF-16", [](String&) { const String made(wide); });
    add("from wwjd", [](String&) { const String made(tokens); });
    add("a stream", [](String& s) {
        std::ostringstream stream;
        stream << s;
    });
}

void addOtherCalls(std::vector<Call>& calls) {
    const auto add = [&](const char* name, std::function<void()> run) {
        calls.push_back({name, std::move(run)});
    };
    add("Encoding by a new spelling", [] { const Encoding encoding("iso_8859-1"); });
    add("Encoding that there is not",
        [] { const Encoding encoding("no such encoding, whatever one tries", nothrow); });
    add("Encoding that there is not, thrown",
        [] { const Encoding encoding("no such encoding, whatever one tries"); });
    add("ICUTranscoder", [] {
        ICUTranscoder transcoder(Encoding::Utf8, Encoding("EUC-JP"));
        std::string out;
        transcoder.transcode(kvt::future::string_view(umlauts), out);
    });
    add("StreamTranscoder", [] {
        StreamTranscoder stream(Encoding("Shift_JIS"), Encoding("ISO-8859-1"));
        std::string out;
        const auto onLoss = [](const Loss&) {};
        stream.convert(umlauts, out, onLoss);
        stream.finish(out, onLoss);
    });
    add("StreamTranscoder of bad input", [] {
        StreamTranscoder stream(Encoding("ISO-2022-JP"), Encoding::Utf8);
        std::string out;
        const auto onLoss = [](const Loss&) {};
        stream.convert(damaged, out, onLoss);
        stream.finish(out, onLoss);
    });
    add("utf16ToWwjd", [] { (void)detail::utf16ToWwjd({wide.rawData(), wide.size()}); });
    add("wwjdToUtf16", [] { (void)detail::wwjdToUtf16({tokens.rawData(), tokens.size()}); });
    add("wwjdToBytes", [] { (void)detail::wwjdToBytes({tokens.rawData(), tokens.size()}); });
    add("URegex", [] { const URegex<0> regex("(a+|b)*c(?<name>[x-z]{2,5})\\bnot in the text"); });
    add("URegex that is none", [] { const URegex<0> regex("(a+|b)*c(?<name>[x-z]{2,5}"); });
    add("URegex::search", [] {
        static const URegex<0> regex("(\\w+), (\\w+)");
        const URegexMatch<0> match = regex.search(UString<0>(ascii.c_str()));
        (void)match.text(1);
    });
    add("URegex::searchAll", [] {
        static const URegex<0> regex("\\w+");
        regex.searchAll(UString<0>(ascii.c_str()), [](const URegexMatch<0>&) { return true; });
    });
    add("traceParse", [] { (void)datetime::traceParse("31 January 2020, 12:30:00", "%d %B %Y, %T", false); });
    add("patternElements", [] { (void)datetime::patternElements(); });
    add("a failure with parameters", [] {
        try {
            throw UStringNotImplementedException("a function of a long name that does not fit into itself");
        } catch (const Throwable& failure) {
            (void)failure.what();
        }
    });
}

// The functions on dates and times throw nothing: lack of memory is an answer.
void addDateCalls(std::vector<Call>& calls) {
    using namespace datetime;
    static const UString<0> value("20200102030405.123456789+01:00");
    static const UString<0> other("20190203040506.5+02:30");
    static const UString<0> written("31 January 2020, 12:30:00 Z");
    static const UString<0> writtenIso("2020-01-02T03:04:05+01:00");
    static const UString<0> noMonth("31 Januember 2020, 12:30:00 Z");
    static const UString<0> pattern("%d %B %Y, %T %z");
    static const UString<0> longPattern("%A, %d %B %Y, %T %z");
    static const UString<0> iso("iso");
    static const UString<0> zone("+05:30");
    static const DateTimeParts parts(2020, 1, 2, 3, 4, 5.5, "+01");
    static const IntervalParts intervalParts(1, 2, 3, 4, 5, 6.123456789, true);
    static const UString<0> interval("P1Y2M3DT4H5M6.123456789S");
    static const std::string zoneFolder("/a folder of zones that is nowhere at all");
    const auto add = [&](const char* name, auto run) {
        calls.push_back({name, [run] {
                             try {
                                 run();
                             } catch (...) {
                                 ADD_FAILURE() << "it threw";
                             }
                         }});
    };
    add("parseZQTDateTime", [] { (void)parseZQTDateTime(value, 3); });
    add("create", [] { (void)create(parts); });
    add("intervalCreate", [] { (void)intervalCreate(intervalParts); });
    add("cast", [] { (void)cast(value, CastToTemporalType::Datetime); });
    add("add", [] { (void)datetime::add(value, interval); });
    add("diff", [] { (void)diff(value, other); });
    add("diffAsNumber", [] { (void)diffAsNumber(value, other, UnitType::Days); });
    add("compare", [] { (void)compare(value, other); });
    add("intervalNegate", [] { (void)intervalNegate(interval); });
    add("parse", [] { (void)parse(written, pattern, false); });
    add("parse of ISO", [] { (void)parse(writtenIso, iso, false); });
    add("parse that fails", [] { (void)parse(noMonth, pattern, true); });
    add("format", [] { (void)format(value, longPattern); });
    add("format of ISO", [] { (void)format(value, iso); });
    add("now", [] { (void)now(ZoneMode::Utc); });
    add("timezoneGet", [] { (void)timezoneGet(value, UTCOffsetType::OffsetText); });
    add("timezoneSet", [] { (void)timezoneSet(value, zone, SetZoneMode::Convert); });
    add("timezoneRemove", [] { (void)timezoneRemove(value); });
    add("setInstallPathWrapper", [] { setInstallPathWrapper(zoneFolder); });
}

// A file is made, and gone with its manager.
void addFileCalls(std::vector<Call>& calls) {
    static const std::string path = testing::TempDir() + "kvt-allocation-" + std::to_string(::getpid());
    calls.push_back({"memory_manager", [] {
                         mmap::manager_options options;
                         options.segment_size = 65536;
                         mmap::memory_manager manager(path, options);
                         mmap::mapped_region_segment segment = manager.create_segment();
                         segment.load(false);
                     }});
    calls.push_back({"memory_manager that keeps", [] {
                         std::filesystem::remove(path);
                         mmap::manager_options options;
                         options.segment_size = 65536;
                         options.persistent = true;
                         mmap::memory_manager manager(path, options);
                         manager.save({1, 2, 3});
                         (void)manager.restore();
                     }});
}

std::vector<Call> allCalls() {
    std::vector<Call> calls;
    addStringCalls<0>(calls);
    addStringCalls<1>(calls);
    addStringCalls<2>(calls);
    addStringCalls<3>(calls);
    addStringCalls<27>(calls);
    addStringCalls<28>(calls);
    addStringCalls<29>(calls);
    addStringCalls<30>(calls);
    addOtherCalls(calls);
    addDateCalls(calls);
    addFileCalls(calls);
    return calls;
}

// What is no lack of memory is how some of the calls end always.
void runUntilFailure(const Call& call) {
    try {
        call.run();
    } catch (const Throwable&) {
    } catch (const std::bad_alloc&) {
        throw;
    } catch (const std::runtime_error&) { // a pattern or a file
    }
}

TEST(EveryAllocation, MayFail) {
    const std::vector<Call> calls = allCalls();
    std::size_t failures = 0;
    for (const Call& call : calls) {
        SCOPED_TRACE(call.name);
        runUntilFailure(call);
        runUntilFailure(call);
        for (const std::size_t failing : {std::size_t(1), FailingAllocations::all}) {
            bool failed = true;
            for (std::size_t succeeding = 0; failed; ++succeeding) {
                const auto before = livingBlocks();
                try {
                    const FailingAllocations scope(succeeding, failing);
                    runUntilFailure(call);
                } catch (const std::bad_alloc&) {
                }
                failed = FailingAllocations::happened();
                failures += failed ? 1 : 0;
                EXPECT_EQ(livingBlocks(), before) << "with " << succeeding << " allocations";
                ASSERT_LT(succeeding, 100000U) << "it never ends";
            }
        }
    }
    std::cout << calls.size() << " calls, " << failures << " failed allocations\n";
    const auto row = kvt::test::trustRow(KVT_SOURCE_DIR, "Lack of memory", "every allocation");
    ASSERT_FALSE(row.empty()) << "docs/trust.md has no such row";
    EXPECT_EQ(row.at("calls"), std::to_string(calls.size()));
}

} // namespace
