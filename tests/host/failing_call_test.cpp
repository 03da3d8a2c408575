// What the system refuses late: when data are sent to the device, or when a file is closed.

#include "host_test.h"

namespace kvt::test {

class KvtFailingCall : public HostTest {
protected:
    ChildSetup failing(const std::string& call, std::vector<std::string> arguments) const {
        ChildSetup made = setup(std::move(arguments));
        made.input = "text";
        made.environment = {{"LD_PRELOAD", KVT_FAILING_CALLS},
                            {"KVT_FAULT", call},
                            {"ASAN_OPTIONS", "verify_asan_link_order=0"}};
        return made;
    }
};

const std::vector<std::string> toFile = {"convert", "--from", "UTF-8", "--to", "UTF-8", "-o", "out"};
const std::vector<std::string> toStandardOutput = {"convert", "--from", "UTF-8", "--to", "UTF-8"};

TEST_F(KvtFailingCall, ADeviceThatDoesNotTakeTheDataIsAFailure) {
    write("out", "old");
    const ChildResult result = runChild(failing("fsync", toFile));
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write out: Input/output error\n");
    EXPECT_EQ(read("out"), "old");
    EXPECT_EQ(names(), std::vector<std::string>{"out"});
}

TEST_F(KvtFailingCall, AFileThatCannotBeClosedIsAFailure) {
    write("out", "old");
    ChildResult result = runChild(failing("close", toFile));
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write out: No space left on device\n");
    EXPECT_EQ(read("out"), "old");
    EXPECT_EQ(names(), std::vector<std::string>{"out"});

    ChildSetup made = failing("close", toStandardOutput);
    made.outputFile = path("out");
    result = runChild(made);
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write to standard output: No space left on device\n");
}

TEST_F(KvtFailingCall, AReadThatASignalEndedIsMadeAgain) {
    const ChildResult result = runChild(failing("read", toStandardOutput));
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(result.out, "text");
}

TEST_F(KvtFailingCall, WhatDoesNotWaitIsTriedAgain) {
    for (const char* call : {"early read", "write", "early write"}) {
        const ChildResult result = runChild(failing(call, toStandardOutput));
        EXPECT_EQ(result.status, 0) << call << result.err;
        EXPECT_EQ(result.out, "text") << call;
        EXPECT_EQ(result.err, "") << call;
    }
    // What is said of a failure, too, and what is copied because it is read twice.
    const ChildResult said = runChild(failing("write", {"explain", "1"}));
    EXPECT_EQ(said.status, 2);
    EXPECT_TRUE(said.err.starts_with("kvt: ")) << said.err;
    const ChildResult copied = runChild(failing("write", {"infer"}));
    EXPECT_EQ(copied.status, 0) << copied.err;
    EXPECT_TRUE(contains(copied.out, "standard input seems to be: 4 bytes, 0 rows.")) << copied.out;
}

TEST_F(KvtFailingCall, AFileThatCannotTakeItsNameIsAFailure) {
    write("out", "old");
    const ChildResult result = runChild(failing("rename", toFile));
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write out: Input/output error\n");
    EXPECT_EQ(read("out"), "old");
    EXPECT_EQ(names(), std::vector<std::string>{"out"});
}

TEST_F(KvtFailingCall, AFileOfSegmentsThatCannotBeReadIsAFailure) {
    write("file", std::string(8192, '\0'));
    const std::vector<std::string> inspect = {"memory", "inspect", "file"};
    EXPECT_EQ(runChild(failing("pread", inspect)).err, "kvt: file: it cannot be read: Input/output error\n");
    EXPECT_EQ(runChild(failing("short pread", inspect)).err,
              "kvt: file: it became shorter while it was read\n");
    const ChildResult plain = kvt(inspect);
    const ChildResult interrupted = runChild(failing("interrupted pread", inspect));
    EXPECT_EQ(interrupted.status, plain.status);
    EXPECT_EQ(interrupted.err, plain.err);
}

TEST_F(KvtFailingCall, WhereThereAreNoMoreThreadsOneDoesAllOfIt) {
    ChildSetup made = failing("pthread_create", {"translate", "--threads", "4", "--case", "1=upper"});
    made.input = "a\n";
    std::string expected = "a\n";
    for (int row = 0; row < 100'000; ++row) {
        made.input += "x\nyz\n";
        expected += "X\nYZ\n";
    }
    ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(result.out == expected);
    // Much of it is written on a thread of its own, if there is one.
    const std::string much(17 * 1024 * 1024, 'x');
    write("in", much);
    std::vector<std::string> arguments = toFile;
    arguments.emplace_back("in");
    result = runChild(failing("pthread_create", arguments));
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(read("out") == much);
}

} // namespace kvt::test
