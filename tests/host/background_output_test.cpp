// Writing on a thread of its own: the same bytes in the same order, and no failure is lost.

#include "base/background_output.h"

#include "base/failure.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

namespace host {
namespace {

/// What is behind the output under test; it outlives it.
struct Behind {
    std::string written;
    std::size_t room = std::string::npos; ///< more than so many bytes fail
    bool isCommitted = false;
};

class Recorded : public Output {
public:
    explicit Recorded(Behind& behind) : behind_(behind) {}

    void write(std::string_view bytes) override {
        if (bytes.size() > behind_.room - behind_.written.size()) {
            throw Failure("no room");
        }
        behind_.written += bytes;
    }
    void commit() override { behind_.isCommitted = true; }
    bool writesInPlaceTo(int descriptor) const override { return descriptor == 7; }

private:
    Behind& behind_;
};

TEST(BackgroundOutput, WritesAllInOrder) {
    Behind behind;
    std::string expected;
    BackgroundOutput output(std::make_unique<Recorded>(behind));
    for (int i = 0; i < 10000; ++i) {
        const std::string piece = std::to_string(i) + std::string(static_cast<std::size_t>(i % 50), '.');
        expected += piece;
        output.write(piece);
    }
    output.write("");
    output.commit();
    EXPECT_TRUE(behind.isCommitted);
    EXPECT_EQ(behind.written, expected);
}

TEST(BackgroundOutput, TakesWhatItIsGiven) {
    Behind behind;
    std::string expected;
    BackgroundOutput output(std::make_unique<Recorded>(behind));
    std::string piece;
    for (int i = 0; i < 1000; ++i) {
        piece.append(static_cast<std::size_t>(i), static_cast<char>('a' + i % 26));
        expected += piece;
        output.writeAndClear(piece);
        ASSERT_TRUE(piece.empty());
    }
    output.commit();
    EXPECT_EQ(behind.written, expected);
}

TEST(BackgroundOutput, WithoutCommitAllIsWrittenAndNothingAppears) {
    Behind behind;
    { BackgroundOutput(std::make_unique<Recorded>(behind)).write("before the loss"); }
    EXPECT_EQ(behind.written, "before the loss");
    EXPECT_FALSE(behind.isCommitted);
}

TEST(BackgroundOutput, AFailureStopsTheWriter) {
    Behind behind;
    behind.room = 10;
    BackgroundOutput output(std::make_unique<Recorded>(behind));
    int writes = 0;
    // It is noticed when the pieces under way are full, at the latest.
    EXPECT_THROW(
        for (; writes < 100; ++writes) { output.write("four"); }, Failure);
    EXPECT_LT(writes, 10);
    EXPECT_THROW(output.write("four"), Failure);
    EXPECT_THROW(output.commit(), Failure);
    EXPECT_EQ(behind.written, "fourfour");
    EXPECT_FALSE(behind.isCommitted);
}

TEST(BackgroundOutput, AFailureOfTheLastPieceIsThrownByCommit) {
    Behind behind;
    behind.room = 3;
    BackgroundOutput output(std::make_unique<Recorded>(behind));
    output.write("four");
    EXPECT_THROW(output.commit(), Failure);
    EXPECT_FALSE(behind.isCommitted);
}

TEST(BackgroundOutput, KnowsWhereItWrites) {
    Behind behind;
    const BackgroundOutput output(std::make_unique<Recorded>(behind));
    EXPECT_TRUE(output.writesInPlaceTo(7));
    EXPECT_FALSE(output.writesInPlaceTo(8));
}

} // namespace
} // namespace host
