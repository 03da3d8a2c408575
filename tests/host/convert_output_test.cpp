// Output files: whole or not at all, whatever happens on the way.

#include "encode.h"
#include "host_test.h"

#include <csignal>
#include <sys/stat.h>

namespace kvt::test {

namespace {

mode_t modeOf(const std::string& path) {
    struct stat file {};
    return ::stat(path.c_str(), &file) == 0 ? file.st_mode & 07777 : 0;
}

} // namespace

class KvtConvertOutput : public HostTest {
protected:
    // Waits until the program has its temporary file.
    void waitForTemporary(std::size_t files) {
        for (int tries = 0; tries < 1000 && names().size() < files; ++tries) {
            ::usleep(10000);
        }
        ASSERT_EQ(names().size(), files);
    }
};

TEST_F(KvtConvertOutput, AnInterruptedConversionLeavesWhatWasThere) {
    for (const int number : {SIGINT, SIGTERM, SIGHUP}) {
        write("out", "old");
        RunningChild child(
            setup({"convert", "--from", "UTF-8", "--to", "US-ASCII", "--report", "losses", "-o", "out"}));
        child.write(std::string(300000, 'x') + "\u0141");
        waitForTemporary(3);
        EXPECT_EQ(read("out"), "old");
        child.signal(number);
        EXPECT_EQ(child.wait(), 128 + number);
        EXPECT_EQ(names(), std::vector<std::string>{"out"}) << number;
        EXPECT_EQ(read("out"), "old");
    }
}

TEST_F(KvtConvertOutput, AKilledConversionLeavesWhatWasThere) {
    write("out", "old");
    RunningChild child(setup({"convert", "--from", "UTF-8", "--to", "UTF-8", "-o", "out"}));
    child.write(std::string(300000, 'x'));
    waitForTemporary(2);
    child.signal(SIGKILL);
    EXPECT_EQ(child.wait(), 128 + SIGKILL);
    EXPECT_EQ(read("out"), "old");
}

TEST_F(KvtConvertOutput, AnIgnoredSignalStaysIgnored) {
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-8", "-o", "out"});
    made.ignoredSignal = SIGHUP;
    RunningChild child(made);
    child.write("text");
    waitForTemporary(1);
    child.signal(SIGHUP);
    child.write(" goes on");
    EXPECT_EQ(child.wait(), 0);
    EXPECT_EQ(read("out"), "text goes on");
}

TEST_F(KvtConvertOutput, AFailureLeavesWhatWasThere) {
    write("out", "old");
    EXPECT_EQ(convert("UTF-8", "US-ASCII", "a\u0141", {"-o", "out"}).status, 2);
    EXPECT_EQ(convert("UTF-8", "US-ASCII", "a", {"-o", "out", "-", "missing"}).status, 2);
    EXPECT_EQ(read("out"), "old");
    EXPECT_EQ(names(), std::vector<std::string>{"out"});
}

TEST_F(KvtConvertOutput, InputAndOutputMayBeOneFile) {
    const std::u32string text(400000, U'\u00e9');
    write("file", utf8Of(text));
    EXPECT_EQ(convert("UTF-8", "UTF-16LE", "", {"file", "-o", "file"}).status, 0);
    EXPECT_EQ(read("file"), utf16Of(text, false));
    EXPECT_EQ(names(), std::vector<std::string>{"file"});
    // Through a link, and with a loss.
    std::filesystem::create_symlink("file", path("link"));
    EXPECT_EQ(convert("UTF-16LE", "US-ASCII", "", {"file", "-o", "link"}).status, 2);
    EXPECT_EQ(read("file"), utf16Of(text, false));
}

TEST_F(KvtConvertOutput, StandardOutputThatIsTheInputIsRefused) {
    // Each block that is written would be read again, for ever.
    write("file", "text");
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-8", "file"});
    made.outputFile = path("file");
    made.appendOutput = true;
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: file is both input and output; use -o, which writes beside it\n");
    EXPECT_EQ(read("file"), "text");
}

TEST_F(KvtConvertOutput, ANewFileHasTheModeThatTheMaskAllows) {
    const mode_t before = ::umask(027);
    EXPECT_EQ(convert("UTF-8", "UTF-8", "a", {"-o", "out"}).status, 0);
    ::umask(before);
    EXPECT_EQ(modeOf(path("out")), 0640u);
}

TEST_F(KvtConvertOutput, AReplacedFileKeepsItsMode) {
    write("out", "old");
    ::chmod(path("out").c_str(), 0766); // more than the mask lets a new file have
    EXPECT_EQ(convert("UTF-8", "UTF-8", "new", {"-o", "out"}).status, 0);
    EXPECT_EQ(modeOf(path("out")), 0766u);
    EXPECT_EQ(read("out"), "new");
}

// In a folder such as /tmp, where anybody can put a link that waits for a name.
TEST_F(KvtConvertOutput, ALinkOfSomebodyElseIsNotFollowedWhereAllMayWrite) {
    if (::geteuid() != 0) {
        GTEST_SKIP() << "it takes the superuser to make a link of somebody else";
    }
    constexpr uid_t somebody = 65534;
    write("mine", "old");
    std::filesystem::create_directory(path("all"));
    ASSERT_EQ(::chmod(path("all").c_str(), 01777), 0);
    std::filesystem::create_symlink(path("mine"), path("all/trap"));
    ASSERT_EQ(::lchown(path("all/trap").c_str(), somebody, somebody), 0);
    const ChildResult refused = convert("UTF-8", "UTF-8", "new", {"-o", "all/trap"});
    EXPECT_EQ(refused.status, 2);
    EXPECT_TRUE(contains(refused.err, "cannot write")) << refused.err;
    EXPECT_EQ(read("mine"), "old");

    // It is as good as any other where nobody else could have put it.
    ASSERT_EQ(::chmod(path("all").c_str(), 0755), 0);
    EXPECT_EQ(convert("UTF-8", "UTF-8", "new", {"-o", "all/trap"}).status, 0);
    EXPECT_EQ(read("mine"), "new");
}

// Nobody may read it while it is written who may not read it afterwards.
TEST_F(KvtConvertOutput, WhatReplacesAPrivateFileIsPrivateFromTheBeginning) {
    write("out", "old");
    ASSERT_EQ(::chmod(path("out").c_str(), 0600), 0);
    RunningChild child(setup({"convert", "--from", "UTF-8", "--to", "UTF-8", "-o", "out"}));
    child.write(std::string(300000, 'x'));
    waitForTemporary(2);
    for (const std::string& name : names()) {
        EXPECT_EQ(modeOf(path(name)), 0600) << name;
    }
    child.signal(SIGTERM);
    child.wait();
}

TEST_F(KvtConvertOutput, ASymbolicLinkStaysOne) {
    std::filesystem::create_directory(path("folder"));
    write("folder/target", "old");
    std::filesystem::create_symlink("folder/target", path("link"));
    std::filesystem::create_symlink("folder/new", path("dangling"));
    EXPECT_EQ(convert("UTF-8", "UTF-8", "one", {"-o", "link"}).status, 0);
    EXPECT_EQ(convert("UTF-8", "UTF-8", "two", {"-o", "dangling"}).status, 0);
    EXPECT_TRUE(std::filesystem::is_symlink(path("link")));
    EXPECT_TRUE(std::filesystem::is_symlink(path("dangling")));
    EXPECT_EQ(read("folder/target"), "one");
    EXPECT_EQ(read("folder/new"), "two");
}

TEST_F(KvtConvertOutput, AVeryLongNameIsWritten) {
    const std::string name(255, 'n');
    EXPECT_EQ(convert("UTF-8", "UTF-8", "a", {"-o", name}).status, 0);
    EXPECT_EQ(read(name), "a");
}

TEST_F(KvtConvertOutput, PlacesThatCannotBeWrittenAreRefused) {
    struct Row {
        std::string output;
        std::string error;
    };
    std::filesystem::create_directory(path("folder"));
    for (const Row& row : {Row{"folder", "kvt: cannot write folder: Is a directory\n"},
                           Row{"missing/out", "kvt: cannot create missing/out: No such file or directory\n"},
                           Row{"/proc/out", "kvt: cannot create /proc/out: No such file or directory\n"}}) {
        const ChildResult result = convert("UTF-8", "UTF-8", "a", {"-o", row.output});
        EXPECT_EQ(result.status, 2) << row.output;
        EXPECT_EQ(result.err, row.error);
        EXPECT_EQ(names(), std::vector<std::string>{"folder"});
    }
}

TEST_F(KvtConvertOutput, AFullDiskIsAFailure) {
    const std::string full = "No space left on device\n";
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-8"});
    made.input = "text";
    made.outputFile = "/dev/full";
    ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write to standard output: " + full);

    result = convert("UTF-8", "UTF-8", "text", {"-o", "/dev/full"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write /dev/full: " + full);

    result = convert("UTF-8", "US-ASCII", "\u0141", {"--report", "/dev/full", "-o", "out"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write /dev/full: " + full);
    EXPECT_TRUE(names().empty());

    for (const std::vector<std::string>& arguments :
         {std::vector<std::string>{"encodings"}, {"--help"}, {"--version"}, {"explain", "910002"}}) {
        ChildSetup other = setup(arguments);
        other.outputFile = "/dev/full";
        EXPECT_EQ(runChild(other).status, 2) << arguments.front();
    }
}

// Much data is written on a thread of its own.
TEST_F(KvtConvertOutput, MuchDataIsWrittenWholeOrAsFarAsItGoes) {
    const std::string text(17 * 1024 * 1024, 'x');
    write("text", text + "\u0141");
    const std::vector<std::string> toUtf8 = {"convert", "--from", "UTF-8", "--to", "UTF-8", "text"};
    EXPECT_EQ(runChild(setup(toUtf8)).out == text + "\u0141", true);

    ChildSetup made = setup(toUtf8);
    made.outputFile = "/dev/full";
    ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write to standard output: No space left on device\n");

    result = runChild(setup({"convert", "--from", "UTF-8", "--to", "US-ASCII", "text"}));
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.err, "ends before the loss")) << result.err;
    EXPECT_EQ(result.out, text.substr(0, result.out.size()));
    EXPECT_GT(result.out.size(), text.size() - 1024 * 1024);

    made = setup({"convert", "--from", "UTF-8", "--to", "UTF-16LE", "-o", "out", "text"});
    made.mostFileBytes = 1000000;
    result = runChild(made);
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write out: File too large\n");
    EXPECT_EQ(names(), std::vector<std::string>{"text"});
}

TEST_F(KvtConvertOutput, AFileThatGrowsTooLongIsAFailure) {
    write("out", "old");
    // Of the shorter one, the last write stores all but two bytes.
    for (const int characters : {300000, 50001}) {
        ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-16LE", "-o", "out"});
        made.input = std::string(static_cast<std::size_t>(characters), 'x');
        made.mostFileBytes = 100000;
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.err, "kvt: cannot write out: File too large\n");
        EXPECT_EQ(read("out"), "old");
        EXPECT_EQ(names(), std::vector<std::string>{"out"});
    }
}

TEST_F(KvtConvertOutput, DevicesAreWrittenToAndNotReplaced) {
    EXPECT_EQ(convert("UTF-8", "UTF-8", "text", {"-o", "/dev/null"}).status, 0);
    EXPECT_TRUE(std::filesystem::is_character_file("/dev/null"));
    const ChildResult result = convert("UTF-8", "UTF-8", "text", {"-o", "/dev/stdout"});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(result.out, "text");
}

TEST_F(KvtConvertOutput, WhatIsOpenAlreadyIsAStream) {
    // Standard output is a file: it is written on, and not replaced by another one of that name.
    write("out", "before ");
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-8", "-o", "/dev/stdout"});
    made.input = "text";
    made.outputFile = path("out");
    made.appendOutput = true;
    EXPECT_EQ(runChild(made).status, 0);
    EXPECT_EQ(read("out"), "before text");
    made.command.back() = "/dev/fd/1";
    EXPECT_EQ(runChild(made).status, 0);
    EXPECT_EQ(read("out"), "before texttext");
    std::filesystem::create_symlink("/dev/stdout", path("link"));
    made.command.back() = path("link");
    EXPECT_EQ(runChild(made).status, 0);
    EXPECT_EQ(read("out"), "before texttexttext");
    const ChildResult report =
        convert("UTF-8", "US-ASCII", "\u0141", {"--report", "/dev/stderr", "--on-error", "report"});
    EXPECT_EQ(report.out, "?");
    EXPECT_TRUE(report.err.starts_with("{\"file\":\"standard input\"")) << report.err;
    EXPECT_EQ(convert("UTF-8", "UTF-8", "text", {"-o", "/dev/fd/99"}).status, 2);
}

TEST_F(KvtConvertOutput, AWriteProtectedFileIsNotReplaced) {
    write("out", "old");
    ::chmod(path("out").c_str(), 0444);
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-8", "-o", "out"});
    made.input = "new";
    made.modesHold = true;
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write out: Permission denied\n");
    EXPECT_EQ(read("out"), "old");
}

} // namespace kvt::test
