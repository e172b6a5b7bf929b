#include <tests/tools/storage/ToolTest.hpp>

namespace {

using Rm = ToolTest;

TEST_F(Rm, RemovesFiles)
{
    folder.write("a", "");
    folder.write("b", "");
    runWell({"rm", "a", "b"});
    EXPECT_EQ(countEntries(), 0U);
}

TEST_F(Rm, ReportsWhatIsMissingAndRemovesTheRest)
{
    folder.write("a", "");
    runFailing({"rm", "x", "a"}, "storage: rm: x: no such file or folder\n");
    EXPECT_FALSE(exists("a"));
}

TEST_F(Rm, PassesOverWhatIsMissingWhenForced)
{
    folder.write("a", "");
    runWell({"rm", "-f", "x", "a", "x/y"});
    EXPECT_FALSE(exists("a"));
}

TEST_F(Rm, KeepsFoldersUnlessToldOtherwise)
{
    makeFolder("a");
    runFailing({"rm", "a"}, "storage: rm: a: a folder (-r removes folders and all they hold)\n");
    EXPECT_TRUE(exists("a"));
}

TEST_F(Rm, RemovesFoldersWithAllTheyHold)
{
    makeFolder("a/b/c");
    folder.write("a/f", "");
    folder.write("a/b/\xff\n", "");
    makePipe("a/pipe");
    makeLink("nowhere", "a/b/broken");
    runWell({"rm", "-r", "a"});
    EXPECT_EQ(countEntries(), 0U);
}

TEST_F(Rm, RemovesManyEntriesOfOneFolder)
{
    makeFolder("a");
    for (int i = 0; i < 5000; ++i)
        folder.write("a/" + std::to_string(i), "");
    runWell({"rm", "-r", "a"});
    EXPECT_FALSE(exists("a"));
}

TEST_F(Rm, RemovesLinksAndNotWhatTheyLeadTo)
{
    makeFolder("a");
    folder.write("a/f", "");
    makeFolder("b");
    makeLink("../a", "b/to-folder");
    makeLink("../a/f", "b/to-file");
    makeLink("a", "c");
    runWell({"rm", "-r", "b", "c"});
    EXPECT_FALSE(exists("b"));
    EXPECT_FALSE(exists("c"));
    EXPECT_TRUE(exists("a/f"));
}

TEST_F(Rm, RefusesTheRootAndDots)
{
    makeFolder("a");
    runFailing({"rm", "-r", "/", "/tmp/..", "a/.", "a/.."}, "storage: rm: /: the root is not removed\n"
                                                            "storage: rm: /tmp/..: '.' and '..' are not removed\n"
                                                            "storage: rm: a/.: '.' and '..' are not removed\n"
                                                            "storage: rm: a/..: '.' and '..' are not removed\n");
    EXPECT_TRUE(exists("a"));
}

TEST_F(Rm, ReportsWhatItMayNotRemoveOnceAndRemovesTheRest)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    makeFolder("a/closed");
    makeFolder("a/open");
    folder.write("a/closed/f", "");
    folder.write("a/open/f", "");
    for (std::string const name : {"a", "a/open"})
        std::filesystem::permissions(folder / name, std::filesystem::perms::all);
    std::filesystem::permissions(folder / "a/closed", std::filesystem::perms(0555));
    ProgramResult const result = runUnprivileged({"rm", "-r", "a"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: rm: a/closed/f: permission denied\n");
    EXPECT_TRUE(exists("a/closed/f"));
    EXPECT_FALSE(exists("a/open"));
}

TEST_F(Rm, GoesDeeperThanListingsCanBeOpen)
{
    makeDeepFolder("a");
    EXPECT_EQ(runWithFewDescriptors({"rm", "-r", "a"}).status, 0);
    EXPECT_FALSE(exists("a"));
}

} // namespace
