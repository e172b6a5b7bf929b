#include <tests/tools/storage/ToolTest.hpp>

#include <tests/support/ScopedMount.hpp>
#include <tests/support/deepFolders.hpp>

#include <algorithm>

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

TEST_F(Rm, NamesEachThatStays)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    for (std::string const name : {"a/x/closed", "a/x/y/closed", "a/z"})
        makeFolder(name);
    for (std::string const name : {"a/x/closed/f", "a/x/y/closed/f", "a/x/y/closed/g", "a/x/f", "a/z/f"})
        folder.write(name, "");
    for (std::string const name : {"a", "a/x", "a/x/y", "a/z"})
        std::filesystem::permissions(folder / name, std::filesystem::perms::all);
    for (std::string const name : {"a/x/closed", "a/x/y/closed"})
        std::filesystem::permissions(folder / name, std::filesystem::perms(0555));
    ProgramResult const result = runUnprivileged({"rm", "-r", "a"});
    EXPECT_EQ(result.status, 1);
    for (std::string const name : {"a/x/closed/f", "a/x/y/closed/f", "a/x/y/closed/g"})
        EXPECT_NE(result.errors.find("storage: rm: " + name + ": permission denied\n"), std::string::npos) << name;
    EXPECT_EQ(std::count(result.errors.begin(), result.errors.end(), '\n'), 3);
    EXPECT_FALSE(exists("a/x/f"));
    EXPECT_FALSE(exists("a/z"));
}

TEST_F(Rm, LeavesWhatIsMountedBelow)
{
    makeFolder("a/b/mounted");
    makeFolder("elsewhere");
    folder.write("a/f", "");
    folder.write("elsewhere/f", "");
    auto const mount = foundation::tests::support::ScopedMount::bind(folder / "elsewhere", folder / "a/b/mounted");
    if (!mount)
        GTEST_SKIP() << "this user may not mount";
    runFailing({"rm", "-r", "a"}, "storage: rm: a/b/mounted: in use by somebody else\n");
    EXPECT_TRUE(exists("elsewhere/f"));
    EXPECT_FALSE(exists("a/f"));
}

TEST_F(Rm, GoesDeeperThanAnyPath)
{
    makeFolder("a");
    foundation::tests::support::makeDeepFolders(folder / "a", 60, std::string(250, 'd'));
    runWell({"rm", "-r", "a"});
    EXPECT_FALSE(exists("a"));
}

} // namespace
