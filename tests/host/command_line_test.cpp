// The command line: help, version, and what is said about words that nobody knows.

#include "host_test.h"

#include <sstream>

namespace kvt::test {

class KvtCommandLine : public HostTest {};

TEST_F(KvtCommandLine, EveryHelpBeginsWithAnExampleAndListsTheStatuses) {
    for (const std::vector<std::string>& command : {std::vector<std::string>{},
                                                    {"convert"},
                                                    {"encodings"},
                                                    {"match"},
                                                    {"wwjd"},
                                                    {"wwjd", "encode"},
                                                    {"wwjd", "decode"},
                                                    {"date"},
                                                    {"date", "parse"},
                                                    {"date", "format"},
                                                    {"date", "cast"},
                                                    {"date", "add"},
                                                    {"date", "diff"},
                                                    {"date", "compare"},
                                                    {"date", "interval"},
                                                    {"date", "interval", "create"},
                                                    {"date", "interval", "negate"},
                                                    {"date", "zone"},
                                                    {"date", "zone", "get"},
                                                    {"date", "zone", "set"},
                                                    {"date", "zone", "remove"},
                                                    {"date", "now"},
                                                    {"date", "why"},
                                                    {"sort"},
                                                    {"unique"},
                                                    {"memory"},
                                                    {"memory", "inspect"},
                                                    {"doctor"},
                                                    {"explain"}}) {
        for (const char* option : {"--help", "-h"}) {
            std::vector<std::string> arguments = command;
            arguments.push_back(option);
            const ChildResult result = kvt(arguments);
            const std::string name = command.empty() ? "kvt" : command.back();
            EXPECT_EQ(result.status, 0) << name;
            EXPECT_EQ(result.err, "") << name;
            EXPECT_TRUE(result.out.starts_with("Example:\n  ")) << result.out;
            EXPECT_TRUE(contains(result.out.substr(0, result.out.find('\n', 12)), "kvt")) << result.out;
            const std::size_t statuses = result.out.find("\nExit status");
            ASSERT_NE(statuses, std::string::npos) << name;
            EXPECT_NE(result.out.find("\n  0  ", statuses), std::string::npos) << name;
            EXPECT_NE(result.out.find("\n  2  ", statuses), std::string::npos) << name;
        }
    }
    EXPECT_TRUE(contains(kvt({"convert", "--help"}).out, "\n  1  "));
}

TEST_F(KvtCommandLine, HelpFitsATerminal) {
    for (const std::string command : {"convert", "encodings", "text", "match", "number", "explain", "date",
                                      "sort", "unique", "memory", "doctor", "tzdata", "infer"}) {
        std::istringstream lines(kvt({command, "--help"}).out);
        for (std::string line; std::getline(lines, line) && !line.empty();) {
            // Examples are command lines and stay whole.
        }
        for (std::string line; std::getline(lines, line);) {
            EXPECT_LE(line.size(), 81u) << line;
        }
    }
}

TEST_F(KvtCommandLine, HelpOfTheProgramListsTheCommands) {
    const std::string help = kvt({"--help"}).out;
    for (const char* command : {"convert", "encodings", "text", "match", "number", "wwjd", "date", "sort",
                                "unique", "memory", "doctor", "explain", "tzdata"}) {
        EXPECT_TRUE(contains(help, std::string("\n  ") + command + " ")) << help;
    }
}

TEST_F(KvtCommandLine, VersionNamesTheLibraryIcuAndBoost) {
    const ChildResult result = kvt({"--version"});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.err, "");
    std::istringstream words(result.out);
    std::string kvtWord, kvtVersion, icuWord, icuVersion, boostWord, boostVersion, more;
    words >> kvtWord >> kvtVersion >> icuWord >> icuVersion >> boostWord >> boostVersion;
    EXPECT_EQ(kvtWord, "kvt");
    EXPECT_EQ(kvtVersion, KVT_VERSION);
    EXPECT_EQ(icuWord, "ICU");
    EXPECT_GE(std::stod(icuVersion), 58.0);
    EXPECT_EQ(boostWord, "Boost");
    EXPECT_TRUE(boostVersion.starts_with("1.")) << boostVersion;
    EXPECT_FALSE(words >> more);
}

TEST_F(KvtCommandLine, NoCommandShowsTheHelpOnStandardError) {
    const ChildResult result = kvt({});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.out, "");
    EXPECT_TRUE(result.err.starts_with("Example:")) << result.err;
}

TEST_F(KvtCommandLine, UnknownWordsSuggestTheNearest) {
    struct Row {
        std::vector<std::string> arguments;
        std::string error;
    };
    const std::string tryKvt = "Try 'kvt --help'.\n";
    const std::string tryConvert = "Try 'kvt convert --help'.\n";
    const std::vector<Row> rows = {
        {{"convrt"}, "kvt: unknown command 'convrt'. Did you mean 'convert'?\n" + tryKvt},
        {{"encoding", "UTF-8"}, "kvt: unknown command 'encoding'. Did you mean 'encodings'?\n" + tryKvt},
        {{"xyzzy"}, "kvt: unknown command 'xyzzy'.\n" + tryKvt},
        {{"--verison"}, "kvt: unknown option '--verison'. Did you mean '--version'?\n" + tryKvt},
        {{"convert", "--form", "UTF-8", "--to", "UTF-8"},
         "kvt: unknown option '--form'. Did you mean '--from'?\n" + tryConvert},
        {{"convert", "--from", "UTF-8", "--to", "UTF-8", "--on-eror=stop"},
         "kvt: unknown option '--on-eror'. Did you mean '--on-error'?\n" + tryConvert},
        {{"convert", "--from", "UTF-8", "--to", "UTF-8", "--zzzzzz"},
         "kvt: unknown option '--zzzzzz'.\n" + tryConvert},
        {{"encodings", "--jsno"},
         "kvt: unknown option '--jsno'. Did you mean '--json'?\nTry 'kvt encodings --help'.\n"},
        {{"wwjd", "encdoe"},
         "kvt: unknown command 'encdoe'. Did you mean 'encode'?\nTry 'kvt wwjd --help'.\n"},
        {{"wwjd"}, "kvt: which command? There are 'encode', 'decode'.\nTry 'kvt wwjd --help'.\n"},
        {{"date", "prase"}, "kvt: unknown command 'prase'. Did you mean 'parse'?\nTry 'kvt date --help'.\n"},
        {{"date", "parse", "2020", "%Y", "--leninet"},
         "kvt: unknown option '--leninet'. Did you mean '--lenient'?\nTry 'kvt date parse --help'.\n"},
        {{"wwjd", "encode", "--ouptut", "x"},
         "kvt: unknown option '--ouptut'. Did you mean '--output'?\nTry 'kvt wwjd encode --help'.\n"},
    };
    for (const Row& row : rows) {
        const ChildResult result = kvt(row.arguments);
        EXPECT_EQ(result.status, 2) << row.error;
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(result.err, row.error);
    }
}

TEST_F(KvtCommandLine, HelpForACommandThatThereIsNotIsRefused) {
    for (const std::vector<std::string>& arguments :
         {std::vector<std::string>{"nosuch", "--help"}, {"date", "nosuch", "--help"}, {"--help", "nosuch"}}) {
        const ChildResult result = kvt(arguments);
        EXPECT_EQ(result.out, "");
        EXPECT_TRUE(contains(result.err, "unknown command 'nosuch'")) << result.err;
        EXPECT_EQ(result.status, 2);
    }
}

TEST_F(KvtCommandLine, ProgressIsOfOneKindEverywhere) {
    write("file", "1\n");
    for (const std::vector<std::string>& arguments :
         {std::vector<std::string>{"convert", "--from", "UTF-8", "--to", "UTF-8", "file"},
          {"text", "upper", "file"},
          {"match", "1", "file"},
          {"wwjd", "encode", "file"},
          {"sort", "file"},
          {"unique", "file"},
          {"number", "--file", "file"},
          {"date", "parse", "%H", "--file", "file"}}) {
        const auto with = [&](const std::string& option) {
            std::vector<std::string> all = arguments;
            all.push_back(option);
            return kvt(all);
        };
        EXPECT_TRUE(contains(with("--progress").err, "100% of 2 bytes")) << arguments[0];
        EXPECT_TRUE(contains(with("--progress=always").err, "100% of 2 bytes")) << arguments[0];
        EXPECT_EQ(with("--progress=never").err, "") << arguments[0];
        EXPECT_EQ(with("--progress=auto").err, "") << arguments[0];
        EXPECT_EQ(with("--progress=some").status, 2) << arguments[0];
        EXPECT_TRUE(contains(with("--help").out, "--progress[=WHEN]  ")) << with("--help").out;
        const ChildResult named = with("-oout");
        EXPECT_EQ(named.out, "") << arguments[0];
        EXPECT_NE(read("out"), "") << arguments[0];
    }
    EXPECT_EQ(kvt({"date", "parse", "12", "%H", "-o", "out"}).out, "");
    EXPECT_EQ(read("out"), "120000\n");
    EXPECT_EQ(kvt({"unique", "--ignore-case"}, "a\nA\n").out, "a\n");
    EXPECT_EQ(kvt({"unique", "-i"}, "a\nA\n").out, "a\n");
}

TEST_F(KvtCommandLine, ComplaintsAreInTheWordsOfTheHelp) {
    struct Row {
        int line;
        std::vector<std::string> arguments;
        std::string error;
    };
    const std::vector<Row> rows = {
        {__LINE__, {"convert", "--to"}, "--to takes a value: --to ENC"},
        {__LINE__, {"match", "a", "--encoding"}, "--encoding takes a value: --encoding ENC"},
        {__LINE__, {"sort", "-k"}, "--key takes a value: --key N"},
        {__LINE__, {"sort", "-o"}, "--output takes a value: --output FILE"},
        {__LINE__, {"date", "parse", "--or"}, "--or takes a value: --or FORMAT"},
        {__LINE__, {"convert", "--from", "a", "--from", "b", "--to", "c"}, "--from is given more than once"},
        {__LINE__, {"convert", "--to", "a"}, "--from is required"},
        {__LINE__, {"match"}, "REGEX is required"},
        {__LINE__, {"match", "--"}, "REGEX is required"},
        {__LINE__, {"explain"}, "NUMBER is required"},
        {__LINE__, {"text", "replace", "a"}, "TO is required"},
        {__LINE__, {"match", "--count=5", "a"}, "--count takes no value"},
        {__LINE__, {"match", "--count=false", "a"}, "--count takes no value"},
        {__LINE__, {"encodings", "--json=3"}, "--json takes no value"},
        {__LINE__, {"sort", "--quiet=no"}, "--quiet takes no value"},
        {__LINE__, {"match", "-vz", "a"}, "unknown option '-z'. Did you mean '-c', '-h' or '-i'?"},
        {__LINE__, {"match", "-zv", "a"}, "unknown option '-z'. Did you mean '-c', '-h' or '-i'?"},
        {__LINE__, {"date", "now", "x"}, "unexpected argument 'x'"},
        {__LINE__, {"memory", "inspect", "a", "b\x1b"}, "unexpected argument 'b\\x1B'"},
        {__LINE__, {"memory", "inspect", "-"}, "cannot read -: No such file or directory"},
    };
    for (const Row& row : rows) {
        const ChildResult result = kvt(row.arguments);
        EXPECT_EQ(result.status, 2) << row.line;
        EXPECT_EQ(result.out, "") << row.line;
        EXPECT_EQ(result.err.substr(0, result.err.find('\n')), "kvt: " + row.error) << row.line;
    }
    EXPECT_TRUE(contains(kvt({"date"}).err, "which command? There are 'parse', 'format'"));
    EXPECT_EQ(kvt({"text", "upper", ""}).err, "kvt: cannot read '': No such file or directory\n");
}

TEST_F(KvtCommandLine, TheArgumentWithABadByteIsNamed) {
    for (const auto& [arguments, name] : std::vector<std::pair<std::vector<std::string>, std::string>>{
             {{"date", "parse", "2020", "%Y\xb5"}, "FORMAT"},
             {{"date", "parse", "\xb5", "%Y"}, "VALUE"},
             {{"date", "parse", "2020", "%Y", "--or", "\xb5"}, "--or"},
             {{"date", "why", "\xb5", "%Y"}, "VALUE"},
             {{"date", "add", "20200101", "P\xb5"}, "INTERVAL"},
             {{"date", "diff", "20200101", "\xb5"}, "SECOND"},
             {{"sort", "--key", "1", "--delimiter", "\xb5"}, "--delimiter"},
             {{"sort", "--date", "\xb5"}, "--date"},
             {{"explain", "910002", "\xb5"}, "PARAMETER"}}) {
        const ChildResult result = kvt(arguments);
        EXPECT_TRUE(result.err.starts_with("kvt: " + name + " is not UTF-8: \"")) << result.err;
        EXPECT_EQ(result.status, 2);
    }
}

TEST_F(KvtCommandLine, QuietLeavesTheReasonAlone) {
    struct Row {
        int line;
        std::vector<std::string> arguments;
        std::string input;
        int status;
        std::string error;
    };
    for (const Row& row :
         std::vector<Row>{{__LINE__,
                           {"convert", "--from", "UTF-8", "--to", "US-ASCII", "--on-error", "report"},
                           "é",
                           1,
                           ""},
                          {__LINE__, {"number"}, "1\nx\n", 1, ""},
                          {__LINE__, {"date", "parse", "%Y"}, "2020\nx\n", 1, ""},
                          {__LINE__, {"date", "parse", "x", "%Y"}, "", 2, "kvt: The value fits"},
                          {__LINE__, {"sort", "--number", "--progress"}, "x\n", 1, ""},
                          {__LINE__, {"match", "(b"}, "", 2, "kvt: REGEX cannot be compiled"},
                          {__LINE__, {"encodings", "nosuch"}, "", 2, "kvt: \"nosuch\" is not the name"},
                          {__LINE__, {"text", "upper", "nosuch"}, "", 2, "kvt: cannot read nosuch"}}) {
        for (const char* option : {"-q", "--quiet"}) {
            std::vector<std::string> arguments = row.arguments;
            arguments.push_back(option);
            const ChildResult result = kvt(arguments, row.input);
            EXPECT_EQ(result.status, row.status) << row.line;
            EXPECT_EQ(result.err.substr(0, row.error.size()), row.error) << row.line;
            EXPECT_EQ(std::count(result.err.begin(), result.err.end(), '\n'), row.error.empty() ? 0 : 1)
                << row.line << ": " << result.err;
            EXPECT_EQ(kvt(row.arguments, row.input).out, result.out) << row.line;
            EXPECT_NE(kvt(row.arguments, row.input).err, "") << row.line;
        }
    }
}

TEST_F(KvtCommandLine, WhatIsPrintedGoesToAFileWhereThatIsWanted) {
    write("segments", "");
    for (const std::vector<std::string>& arguments : {std::vector<std::string>{"explain", "910002"},
                                                      {"encodings", "latin1"},
                                                      {"encodings", "--json", "latin1"},
                                                      {"date", "why", "2020", "%Y"},
                                                      {"date", "interval", "create", "--days", "3"},
                                                      {"number", "1.50"},
                                                      {"number", "1.50", "--json"},
                                                      {"date", "parse", "12", "%H"}}) {
        const std::string printed = kvt(arguments).out;
        EXPECT_NE(printed, "");
        std::vector<std::string> more = arguments;
        more.insert(more.end(), {"-o", "out"});
        const ChildResult result = kvt(more);
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(read("out"), printed);
    }
    EXPECT_EQ(kvt({"date", "now", "--utc", "-o", "out"}).out, "");
    EXPECT_TRUE(read("out").ends_with("+00:00\n")) << read("out");
    EXPECT_EQ(kvt({"doctor", "--json", "-o", "out"}).out, "");
    EXPECT_TRUE(contains(read("out"), "system encoding"));
}

TEST_F(KvtCommandLine, MissingOptionsAreNamed) {
    struct Row {
        std::vector<std::string> arguments;
        std::string part;
    };
    for (const Row& row :
         {Row{{"convert", "--to", "UTF-8"}, "--from"}, Row{{"convert", "--from", "UTF-8"}, "--to"},
          Row{{"convert", "--from", "UTF-8", "--to"}, "--to"}, Row{{"explain"}, "NUMBER"},
          Row{{"match"}, "REGEX"}}) {
        const ChildResult result = kvt(row.arguments);
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.out, "");
        EXPECT_TRUE(contains(result.err, row.part)) << result.err;
    }
}

} // namespace kvt::test
