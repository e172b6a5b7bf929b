#include <tests/tools/storage/ToolTest.hpp>

#include <chrono>
#include <csignal>
#include <fcntl.h>
#include <thread>
#include <unistd.h>

namespace {

using namespace std::chrono_literals;

class Put : public ToolTest
{
protected:
    /// Runs the tool with this on standard input.
    ProgramResult runWithInput(std::string const& content, Arguments const& arguments) const
    {
        foundation::tests::support::TemporaryFolder const other;
        ProcessOptions options = inFolder();
        options.input = other.write("input", content);
        return runProgram(command(arguments), options);
    }

    void putWell(std::string const& content, Arguments const& arguments) const
    {
        ProgramResult const result = runWithInput(content, arguments);
        EXPECT_EQ(result.status, 0);
        EXPECT_EQ(result.errors, "");
        EXPECT_EQ(result.output, "");
    }

    void putFailing(Arguments const& arguments, std::string const& errors) const
    {
        ProgramResult const result = runWithInput("new", arguments);
        EXPECT_EQ(result.status, 1);
        EXPECT_EQ(result.errors, errors);
    }

    std::uintmax_t sizeOfScratchFile(std::string const& name) const
    {
        for (auto const& entry : std::filesystem::directory_iterator(folder / name)) {
            if (entry.path().native().ends_with(".tmp.bak"))
                return entry.file_size();
        }
        return 0;
    }

    /// Sends a signal to the tool while it waits for the rest of its input, of which it has written the beginning.
    ProgramResult interrupt(Arguments const& arguments) const
    {
        ProcessOptions options = inFolder();
        makePipe("pipe");
        options.input = folder / "pipe";
        int const pipe = ::open(options.input.c_str(), O_RDWR | O_CLOEXEC);
        EXPECT_EQ(::write(pipe, "beginning", 9), 9);
        Process process(command(arguments), options);
        auto const deadline = std::chrono::steady_clock::now() + 60s;
        while (sizeOfScratchFile("t") < 9 && process.isRunning() && std::chrono::steady_clock::now() < deadline)
            std::this_thread::yield();
        EXPECT_EQ(sizeOfScratchFile("t"), 9U);
        process.send(SIGINT);
        ProgramResult const result = process.finish();
        ::close(pipe);
        return result;
    }
};

TEST_F(Put, WritesStandardInputToANewFile)
{
    std::string content("\0\n\xFF", 3);
    while (content.size() < 3'000'000)
        content += std::to_string(content.size());
    putWell(content, {"put", "a"});
    EXPECT_EQ(folder.read("a"), content);
    EXPECT_EQ(countEntries(), 1U);
}

TEST_F(Put, OfNothingMakesAnEmptyFile)
{
    putWell("", {"put", "a"});
    EXPECT_EQ(folder.read("a"), "");
}

TEST_F(Put, TakesAnIRI)
{
    putWell("content", {"put", "file://" + folder.path().native() + "/a%20b"});
    EXPECT_EQ(folder.read("a b"), "content");
}

TEST_F(Put, WritesToAnyStore)
{
    putWell("content", {"put", "mem:///a"});
    putWell("content", {"put", "--in-place", "mem:///a"});
    putFailing({"put", "mem:///a/b"}, "storage: put: mem:///a/b: there is no folder to hold it\n");
}

TEST_F(Put, ReplacesNothingUnlessAsked)
{
    folder.write("a", "old");
    putFailing({"put", "a"}, "storage: put: a: exists already (--replace replaces it)\n");
    EXPECT_EQ(folder.read("a"), "old");
    putWell("new", {"put", "--replace", "a"});
    EXPECT_EQ(folder.read("a"), "new");
    EXPECT_EQ(countEntries(), 1U);
}

TEST_F(Put, ReplacesALinkAndNotWhatItLeadsTo)
{
    folder.write("a", "old");
    makeLink("a", "b");
    putWell("new", {"put", "--replace", "b"});
    EXPECT_TRUE(isFile("b"));
    EXPECT_EQ(folder.read("a"), "old");
}

TEST_F(Put, InPlaceKeepsTheFileAndItsLinks)
{
    folder.write("a", "a longer old content");
    std::filesystem::create_hard_link(folder / "a", folder / "b");
    makeLink("a", "c");
    putFailing({"put", "--in-place", "c"}, "storage: put: c: exists already (--replace replaces it)\n");
    putWell("new", {"put", "--in-place", "--replace", "c"});
    EXPECT_EQ(folder.read("b"), "new");
    EXPECT_FALSE(isFile("c"));
    EXPECT_EQ(countEntries(), 3U);
}

TEST_F(Put, InPlaceMakesANewFile)
{
    putWell("new", {"put", "--in-place", "a"});
    EXPECT_EQ(folder.read("a"), "new");
}

TEST_F(Put, InPlaceLeavesNothingOfANewFileThatFails)
{
    makeFolder("t");
    ProcessOptions options = inFolder();
    options.input = folder / "t";
    EXPECT_EQ(runProgram(command({"put", "--in-place", "a"}), options).status, 1);
    EXPECT_FALSE(exists("a"));
}

TEST_F(Put, InPlaceTellsThatAnExistingFileIsLeftIncomplete)
{
    folder.write("a", "old");
    ProcessOptions options = inFolder();
    options.input = folder.path();
    ProgramResult const result = runProgram(command({"put", "--in-place", "--replace", "a"}), options);
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: put: a: incomplete, because it was being written in place\n"
                             "storage: put: standard input: Is a directory\n");
}

TEST_F(Put, RefusesWhatIsNoFile)
{
    makeFolder("d");
    makePipe("p");
    for (std::string const option : {"--replace", "--in-place"}) {
        putFailing({"put", option, "d"}, "storage: put: d: a folder, which a file never replaces\n");
        putFailing({"put", option, "p"}, "storage: put: p: a special file, which a file never replaces\n");
        putFailing({"put", option, "x/"}, "storage: put: x/: no such folder, and a file has no slash at the end\n");
        putFailing({"put", option, "x/y"}, "storage: put: x/y: there is no folder to hold it\n");
    }
    EXPECT_EQ(countEntries(), 2U);
    EXPECT_EQ(countEntries("d"), 0U);
}

TEST_F(Put, TakesOneTarget)
{
    EXPECT_EQ(run({"put"}).errors, "storage: put: TARGET is required\nstorage: 'storage put --help' says more\n");
    ProgramResult const result = run({"put", "a", "b"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.errors, "storage: put: The following argument was not expected: b\n"
                             "storage: 'storage put --help' says more\n");
}

TEST_F(Put, LeavesNothingWhenTheInputCannotBeRead)
{
    makeFolder("t");
    folder.write("t/old", "old");
    ProcessOptions options = inFolder();
    options.input = folder / "t";
    for (Arguments const& arguments : {Arguments{"put", "t/a"}, Arguments{"put", "--replace", "t/old"}}) {
        ProgramResult const result = runProgram(command(arguments), options);
        EXPECT_EQ(result.status, 1);
        EXPECT_EQ(result.errors, "storage: put: standard input: Is a directory\n");
    }
    EXPECT_EQ(folder.read("t/old"), "old");
    EXPECT_EQ(countEntries("t"), 1U);
}

TEST_F(Put, LeavesNothingWhenThereIsNoInput)
{
    ProcessOptions options = inFolder();
    options.prepare = [] { ::close(STDIN_FILENO); };
    ProgramResult const result = runProgram(command({"put", "a"}), options);
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: put: standard input: Bad file descriptor\n");
    EXPECT_EQ(countEntries(), 0U);
}

TEST_F(Put, EndsAtOnceWhenInterruptedWhileItWaitsForInput)
{
    makeFolder("t");
    ProgramResult const result = interrupt({"put", "t/a"});
    EXPECT_EQ(result.status, 130);
    EXPECT_EQ(result.errors, "storage: put: interrupted\n");
    EXPECT_EQ(countEntries("t"), 0U);
}

TEST_F(Put, LeavesTheOldFileWhenInterrupted)
{
    makeFolder("t");
    folder.write("t/a", "old");
    EXPECT_EQ(interrupt({"put", "--replace", "t/a"}).status, 130);
    EXPECT_EQ(folder.read("t/a"), "old");
    EXPECT_EQ(countEntries("t"), 1U);
}

TEST_F(Put, LeavesTheOldFileWhenThereIsNoSpace)
{
    if (!mount("small", "1m"))
        GTEST_SKIP() << "file systems may not be mounted here";
    folder.write("small/a", "old");
    ProgramResult const result = runWithInput(std::string(3 << 20, 'x'), {"put", "--replace", "small/a"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: put: small/a: no space left\n");
    EXPECT_EQ(folder.read("small/a"), "old");
    EXPECT_EQ(countEntries("small"), 1U);
}

} // namespace
