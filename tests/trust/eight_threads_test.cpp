// Eight threads on everything that the library lets any thread touch: the registry, converters, tables of code pages,
// patterns, the zone database, one memory_manager. What each answers is compared with what one thread was answered.
//
// Two seconds in the normal run; KVT_THREADS_SECONDS=60 asks for a minute, as for the thread sanitizer.
#include <kvt/kvt.h>

#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <functional>
#include <string>
#include <thread>
#include <unistd.h>
#include <vector>

namespace {

using namespace kvt::ex;

struct Question {
    const char* name;
    std::function<std::string()> ask;
};

const std::string longText = [] {
    std::string text;
    for (int i = 0; i < 400; ++i) {
        text += "Gr\xC3\xB6\xC3\x9F\x65 \xE2\x82\xAC " + std::to_string(i) +
                ", \xD0\x9F\xD1\x80 \xE6\x97\xA5\xE6\x9C\xAC; ";
    }
    return text;
}();

std::string throughEncoding(const char* name) {
    const Encoding encoding{kvt::future::string_view(name)};
    UString<30> bytes(encoding);
    try {
        bytes.assign(UString<0>(longText.c_str()));
    } catch (const Throwable&) { // a character that the encoding lacks; the text is there all the same
    }
    return std::string(encoding.getName()) + bytes.toStdString() +
           UString<0>(UString<2>(bytes)).toStdString();
}

std::string answer(const datetime::TextResult& result) {
    return std::to_string(static_cast<int>(std::get<0>(result))) + std::get<1>(result).toStdString();
}

const std::vector<Question>& questions() {
    static const URegex<0> words("(\\w+), ?(\\w+)?");
    static const std::vector<Question> all = {
        {"windows-1251", [] { return throughEncoding("windows-1251"); }},
        {"cp1252", [] { return throughEncoding("cp1252"); }},
        {"Shift_JIS", [] { return throughEncoding("Shift_JIS"); }},
        {"EUC-JP", [] { return throughEncoding("EUC-JP"); }},
        {"GB18030", [] { return throughEncoding("GB18030"); }},
        {"ISO-2022-JP", [] { return throughEncoding("ISO-2022-JP"); }},
        {"IBM037", [] { return throughEncoding("IBM037"); }},
        {"UTF-7", [] { return throughEncoding("UTF-7"); }},
        {"wwjd", [] { return UString<29>(UString<0>(longText.c_str())).toStdString(); }},
        {"folding", [] { return UString<0>(longText.c_str()).getAsFoldedCase().toStdString(); }},
        {"upper case", [] { return UString<0>(longText.c_str()).getAsUpperCase().toStdString(); }},
        {"a pattern", [] { return words.search(UString<0>(longText.c_str()), 7).text(1).toStdString(); }},
        {"a new pattern",
         [] { return URegex<0>("(a|b)*c").search(UString<0>("xxababc")).text(0).toStdString(); }},
        {"parse", [] { return answer(datetime::parse("31 January 2020, 12:30", "%d %B %Y, %H:%M", false)); }},
        {"format", [] { return answer(datetime::format("20200131123000+01:00", "%A, %d %B %Y, %T %z")); }},
        {"the zone of the machine",
         [] {
             return answer(datetime::timezoneSet("20200131123000", "local", datetime::SetZoneMode::Replace));
         }},
        {"no zone",
         [] {
             return answer(
                 datetime::timezoneSet("20200131123000+01:00", "utc", datetime::SetZoneMode::Convert));
         }},
        {"a difference", [] { return answer(datetime::diff("20200131", "19990228")); }},
        {"a number", [] { return UString<0>::fromNumber(1.0 / 3).toStdString(); }},
        {"an unknown name", [] { return std::to_string(Encoding("no such name", kvt::ex::nothrow).id()); }},
    };
    return all;
}

std::chrono::seconds wantedTime() {
    const char* const asked = std::getenv("KVT_THREADS_SECONDS");
    return std::chrono::seconds(asked != nullptr ? std::atoi(asked) : 2);
}

TEST(EightThreads, AreAnsweredAsOneIs) {
    const std::string path = testing::TempDir() + "kvt-threads-" + std::to_string(::getpid());
    mmap::manager_options options;
    options.segment_size = 65536;
    std::atomic<unsigned long long> asked{0};
    std::atomic<unsigned long long> wrong{0};
    std::atomic<bool> done{false};
    // The first questions are asked by all at once, so that what is built at a first use is built among them.
    std::vector<std::atomic<const std::string*>> expected(questions().size());
    mmap::memory_manager manager(path, options);
    const auto work = [&](std::size_t thread) {
        mmap::memory_manager handle(manager);
        for (std::size_t round = thread; !done; ++round) {
            const std::size_t which = (round * 7 + thread) % questions().size();
            const std::string is = questions()[which].ask();
            const std::string* known = nullptr;
            auto own = std::make_unique<std::string>(is);
            if (expected[which].compare_exchange_strong(known, own.get())) {
                known = own.release();
            }
            wrong += *known == is ? 0U : 1U;
            ++asked;
            if (round % 16 == 0) {
                mmap::mapped_region_segment segment = handle.create_segment();
                segment.load(false);
                *segment.segment_manager()->construct<unsigned long>("word")(round) += 1;
                wrong += *segment.segment_manager()->find<unsigned long>("word").first == round + 1 ? 0U : 1U;
            }
        }
    };
    std::vector<std::thread> threads;
    for (std::size_t thread = 0; thread < 8; ++thread) {
        threads.emplace_back(work, thread);
    }
    std::this_thread::sleep_for(wantedTime());
    done = true;
    for (std::thread& thread : threads) {
        thread.join();
    }
    std::cout << asked << " questions\n";
    EXPECT_GT(asked, questions().size());
    EXPECT_EQ(wrong, 0U);
    for (std::size_t which = 0; which < questions().size(); ++which) {
        const std::string* const answered = expected[which];
        EXPECT_TRUE(answered == nullptr || *answered == questions()[which].ask()) << questions()[which].name;
        delete answered;
    }
}

} // namespace
