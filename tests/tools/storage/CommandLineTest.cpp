#include <tests/tools/storage/ToolTest.hpp>

#include <csignal>
#include <unistd.h>

namespace {

using CommandLine = ToolTest;

TEST_F(CommandLine, PrintsItsVersion)
{
    EXPECT_TRUE(runWell({"--version"}).starts_with("storage 0."));
}

TEST_F(CommandLine, HelpNamesEveryCommand)
{
    std::string const help = runWell({"--help"});
    for (std::string const name : {"ls", "tree", "find", "du", "stat", "cat", "put", "cp", "mv", "rm", "clean", "mkdir",
                                   "watch", "schemes", "completion", "man"})
        EXPECT_NE(help.find("\n  " + name + ' '), std::string::npos) << name;
}

TEST_F(CommandLine, EachCommandHasHelpOfItsOwn)
{
    for (std::string const name : {"ls", "tree", "find", "du", "stat", "cat", "put", "cp", "mv", "rm", "clean", "mkdir",
                                   "watch", "schemes", "completion", "man"})
        EXPECT_NE(runWell({name, "--help"}).find("Usage: storage " + name + ' '), std::string::npos) << name;
}

TEST_F(CommandLine, MisuseIsStatusTwoWithAHint)
{
    struct Row
    {
        Arguments arguments;
        std::string command;
        std::string message;
    };
    std::vector<Row> const rows{
        {{}, "", "a command is missing"},
        {{"list"}, "", "no command is called 'list'"},
        {{""}, "", "no command is called ''"},
        {{"--frobnicate"}, "", "a command is needed, and '--frobnicate' is none"},
        {{"ls", "--frobnicate"}, "ls", "The following argument was not expected: --frobnicate"},
        {{"ls", "--sort=colour"}, "ls", "--sort: colour not in {name,size,time}"},
        {{"cat"}, "cat", "FILE... is required"},
        {{"cp", "a"}, "cp", "SOURCE... TARGET: At least 2 required but received 1"},
    };
    for (auto const& [arguments, name, message] : rows) {
        ProgramResult const result = run(arguments);
        EXPECT_EQ(result.status, 2) << message;
        EXPECT_EQ(result.errors, "storage: " + (name.empty() ? "" : name + ": ") + message + "\nstorage: 'storage " +
                                     (name.empty() ? "" : name + ' ') + "--help' says more\n");
        EXPECT_EQ(result.output, "");
    }
}

TEST_F(CommandLine, LongOptionsWithOneDashAreNotReadAsShortOnes)
{
    folder.write("ame", "");
    ProgramResult const result = run({"find", "-name", "ame"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.errors, "storage: find: -name: did you mean --name?\n"
                             "storage: 'storage find --help' says more\n");
    EXPECT_TRUE(
        run({"find", "-max-depth=1"}).errors.starts_with("storage: find: -max-depth=1: did you mean --max-depth=1?\n"));
    EXPECT_EQ(runWell({"find", "-name*", "."}), "./ame\n");
}

TEST_F(CommandLine, NamesThatParsersLikeToInterpretAreNames)
{
    for (std::string const name : {"[a,b]", "{}", "%%", "ls", "a=b", "'x'", "\"", "\1", "\\", "#x", "?", "*"}) {
        folder.write(name, "content of " + name);
        EXPECT_EQ(runWell({"cat", name}), "content of " + name);
    }
}

TEST_F(CommandLine, HelpShowsOperandsAndValuesByTheirNames)
{
    std::string const help = runWell({"find", "--help"});
    EXPECT_NE(help.find("\nUsage: storage find [OPTIONS] [PATH...]\n"), std::string::npos);
    EXPECT_NE(help.find("\n  -d,--max-depth N  "), std::string::npos);
    EXPECT_NE(help.find("\n  --json  "), std::string::npos);
    EXPECT_NE(runWell({"ls", "--help"}).find("\n  --sort {name,size,time}  "), std::string::npos);
}

TEST_F(CommandLine, NamesThatBeginWithADashFollowTwoDashes)
{
    folder.write("-x", "content");
    EXPECT_EQ(runWell({"cat", "--", "-x"}), "content");
    EXPECT_EQ(runWell({"cat", "./-x"}), "content");
    EXPECT_EQ(runWell({"cat", "./-x", "--", "-x"}), "contentcontent");
    EXPECT_EQ(runWell({"ls", "--", "-x"}), "-x\n");
    runFailing({"ls", "--", "--"}, "storage: ls: --: no such file or folder\n");
}

TEST_F(CommandLine, FullStandardOutputIsAFailure)
{
    folder.write("a", "content");
    ProcessOptions options = inFolder();
    options.output = "/dev/full";
    for (Arguments const& arguments : {Arguments{"cat", "a"}, Arguments{"ls"}, Arguments{"stat", "a"}}) {
        ProgramResult const result = runProgram(command(arguments), options);
        EXPECT_EQ(result.status, 1);
        EXPECT_EQ(result.errors, "storage: " + arguments[0] + ": standard output: No space left on device\n");
    }
}

TEST_F(CommandLine, ClosedStandardOutputIsAFailureAndNeverAFile)
{
    folder.write("a", "content");
    ProcessOptions options = inFolder();
    options.prepare = [] { ::close(STDOUT_FILENO); };
    ProgramResult const result = runProgram(command({"cp", "-v", "a", "b"}), options);
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: cp: standard output: Bad file descriptor\n");
    EXPECT_EQ(folder.read("b"), "content");
}

TEST_F(CommandLine, EndsQuietlyWhenNobodyReads)
{
    folder.write("a", std::string(1 << 20, 'x'));
    ProcessOptions options = inFolder();
    options.prepare = [] {
        int ends[2];
        if (::pipe(ends) != 0 || ::dup2(ends[1], STDOUT_FILENO) == -1)
            ::_exit(126);
        ::close(ends[0]);
        ::close(ends[1]);
    };
    ProgramResult const result = runProgram(command({"cat", "a"}), options);
    EXPECT_EQ(result.status, 128 + SIGPIPE);
    EXPECT_EQ(result.errors, "");
}

} // namespace
