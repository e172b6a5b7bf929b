#include <tests/tools/storage/ToolTest.hpp>

#include <cerrno>
#include <chrono>
#include <fcntl.h>
#include <nlohmann/json.hpp>
#include <unistd.h>

namespace {

class Clean : public ToolTest
{
protected:
    void makeScratch(std::string const& name) const
    {
        folder.write(name, "half");
        setTime(name, 1'700'000'000);
    }

    std::string const old = "7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak";
    std::string const other = "00000000-0000-4000-b000-000000000001.tmp.bak";
};

TEST_F(Clean, RemovesScratchFilesOfLongAgoAndNothingElse)
{
    makeScratch(old);
    folder.write(other, "being written");
    folder.write("file", "");
    makeScratch("x" + old);
    EXPECT_EQ(runWell({"clean", "."}), "");
    EXPECT_FALSE(exists(old));
    EXPECT_TRUE(exists(other) && exists("file") && exists("x" + old));
}

TEST_F(Clean, PrintsWhatItWouldRemoveInADryRun)
{
    makeScratch(old);
    EXPECT_EQ(runWell({"clean", "--dry-run", "."}), "./" + old + "\n");
    EXPECT_TRUE(exists(old));
}

TEST_F(Clean, LooksBelowOnlyWhenToldTo)
{
    makeFolder("a/b");
    makeScratch("a/b/" + old);
    runWell({"clean", "a"});
    EXPECT_TRUE(exists("a/b/" + old));
    EXPECT_EQ(runWell({"clean", "-rn", "a"}), "a/b/" + old + "\n");
    runWell({"clean", "-r", "a"});
    EXPECT_FALSE(exists("a/b/" + old));
}

TEST_F(Clean, TakesTheAgeThatItIsGiven)
{
    folder.write(other, "");
    runWell({"clean", "--older-than", "10min", "."});
    EXPECT_TRUE(exists(other));
    runWell({"clean", "--older-than", "0s", "."});
    EXPECT_FALSE(exists(other));
    EXPECT_EQ(run({"clean", "--older-than", "soon", "."}).status, 2);
}

TEST_F(Clean, LeavesWhatAnotherProcessHasOpen)
{
    makeScratch(old);
    makeScratch(other);
    int const descriptor = ::open((folder / old).c_str(), O_RDONLY | O_CLOEXEC);
    EXPECT_EQ(runWell({"clean", "--dry-run", "."}), "./" + other + "\n");
    runWell({"clean", "."});
    EXPECT_TRUE(exists(old));
    EXPECT_FALSE(exists(other));
    ::close(descriptor);
    runWell({"clean", "."});
    EXPECT_FALSE(exists(old));
}

/// A real writer, which waits for what it is to write.
TEST_F(Clean, LeavesWhatTheToolItselfIsWriting)
{
    makePipe("pipe");
    ProcessOptions options = inFolder();
    int const pipe = ::open((folder / "pipe").c_str(), O_RDWR | O_CLOEXEC);
    options.input = folder / "pipe";
    Process writer(command({"put", "file"}), options);
    while (countEntries() < 2)
        ASSERT_TRUE(writer.isRunning());
    runWell({"clean", "--older-than", "0s", "."});
    EXPECT_EQ(countEntries(), 2U);
    ASSERT_EQ(::write(pipe, "whole", 5), 5);
    ::close(pipe);
    EXPECT_EQ(writer.finish().status, 0);
    EXPECT_EQ(folder.read("file"), "whole");
}

/// Moves to other file systems leave them that were killed.
TEST_F(Clean, RemovesScratchFoldersAndLinks)
{
    makeFolder(old + "/a");
    folder.write(old + "/a/file", "half");
    makeLink("missing", other);
    EXPECT_EQ(runWell({"clean", "."}), "");
    EXPECT_EQ(countEntries(), 2U) << "they were made just now";
    EXPECT_NE(runWell({"clean", "--dry-run", "--older-than", "0s", "."}).find("./" + old + "\n"), std::string::npos);
    EXPECT_EQ(countEntries(), 2U);
    runWell({"clean", "--older-than", "0s", "."});
    EXPECT_EQ(countEntries(), 0U);
}

TEST_F(Clean, RemovesLinksToFoldersAndNotWhatTheyLeadTo)
{
    makeFolder("a");
    makeScratch("a/" + old);
    makeLink("a", other);
    runWell({"clean", "--older-than", "0s", "."});
    EXPECT_EQ(countEntries(), 1U);
    EXPECT_TRUE(exists("a/" + old));
}

TEST_F(Clean, LeavesAScratchFolderInWhichAFileIsOpen)
{
    makeFolder(old);
    folder.write(old + "/file", "half");
    int const descriptor = ::open((folder / old / "file").c_str(), O_RDONLY | O_CLOEXEC);
    runWell({"clean", "--older-than", "0s", "."});
    EXPECT_TRUE(exists(old + "/file"));
    ::close(descriptor);
    runWell({"clean", "--older-than", "0s", "."});
    EXPECT_FALSE(exists(old));
}

TEST_F(Clean, TellsWhatItRemovedAsJSON)
{
    makeScratch(old);
    auto const told = nlohmann::json::parse(runWell({"clean", "--json", "."}));
    EXPECT_EQ(told["name"], old);
    EXPECT_EQ(told["size"], 4);
    EXPECT_FALSE(exists(old));
}

TEST_F(Clean, IsForLocalFoldersOnly)
{
    folder.write("file", "");
    runFailing({"clean", "mem:///"}, "storage: clean: mem:///: scratch files can be removed from local folders only\n");
    runFailing({"clean", "file"}, "storage: clean: file: not a folder\n");
    runFailing({"clean", "missing"}, "storage: clean: missing: no such file or folder\n");
    EXPECT_EQ(run({"clean"}).status, 2);
}

/// Who may not be told whether somebody uses a file must not remove it.
TEST_F(Clean, LeavesFilesOfOthersAndSaysSo)
{
    if (::geteuid() != 0 || !canRunUnprivileged())
        GTEST_SKIP() << "needs root, and a tool that others can run";
    makeFolder("open");
    std::filesystem::permissions(folder / "open", std::filesystem::perms::all);
    std::filesystem::permissions(folder.path(), std::filesystem::perms(0755));
    makeScratch("open/" + old);
    ProgramResult const result = runUnprivileged({"clean", "open"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: clean: open/" + old + ": permission denied\n");
    EXPECT_TRUE(exists("open/" + old));
}

} // namespace
