// Conversions in destructors of static and thread_local objects, in a process of their own for each way to end.
#include <support/child_process.h>

#include <gtest/gtest.h>

#include <string>
#include <string_view>

namespace kvt::test {
namespace {

ChildResult endedBy(const char* end) {
    ChildSetup setup;
    setup.command = {KVT_LATE_CONVERSION_CHILD, end};
    return runChild(setup);
}

std::size_t count(std::string_view text, std::string_view line) {
    std::size_t found = 0;
    for (std::size_t at = text.find(line); at != std::string_view::npos; at = text.find(line, at + 1)) {
        ++found;
    }
    return found;
}

void expectAll(const ChildResult& result, std::size_t threads) {
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.err, "");
    EXPECT_EQ(count(result.out, "static object made before the first use\n"), 1U);
    EXPECT_EQ(count(result.out, "static object made after the first use\n"), 1U);
    EXPECT_EQ(count(result.out, "thread_local object made before the first use\n"), threads);
    EXPECT_EQ(count(result.out, "thread_local object made after the first use\n"), threads);
    EXPECT_EQ(count(result.out, "thread_local object of a thread that converts at its end only\n"), 1U);
    EXPECT_EQ(count(result.out, "destructor of a thread-specific key\n"), 2U);
    EXPECT_EQ(count(result.out, "wrong"), 0U) << result.out;
}

TEST(LateConversion, WhenMainReturns) {
    expectAll(endedBy("return"), 2);
}

// The thread that ends the process runs the destructors of the static objects; those of the main thread's own
// objects do not run.
TEST(LateConversion, WhenAnotherThreadEndsTheProcess) {
    expectAll(endedBy("exit"), 2);
}

} // namespace
} // namespace kvt::test
