#include <tests/tools/storage/ToolTest.hpp>

#include <filesystem>

namespace {

using Mv = ToolTest;

TEST_F(Mv, RenamesAFileAndAFolder)
{
    folder.write("a", "content");
    makeFolder("d");
    folder.write("d/f", "1");
    EXPECT_EQ(runWell({"mv", "a", "b"}), "");
    runWell({"mv", "d", "e"});
    EXPECT_EQ(folder.read("b") + folder.read("e/f"), "content1");
    EXPECT_EQ(countEntries(), 2U);
}

TEST_F(Mv, MovesIntoAFolder)
{
    folder.write("a", "1");
    makeFolder("b");
    makeFolder("d");
    EXPECT_EQ(runWell({"mv", "-v", "a", "b", "d"}), "a -> d/a\nb -> d/b\n");
    EXPECT_EQ(countEntries(), 1U);
    EXPECT_EQ(countEntries("d"), 2U);
}

TEST_F(Mv, MovesLinksThemselves)
{
    makeFolder("d");
    makeFolder("t");
    makeLink("../d", "to-folder");
    makeLink("nowhere", "broken");
    runWell({"mv", "to-folder", "broken", "t"});
    EXPECT_EQ(std::filesystem::read_symlink(folder / "t/to-folder"), "../d");
    EXPECT_EQ(std::filesystem::read_symlink(folder / "t/broken"), "nowhere");
}

TEST_F(Mv, MovesALinkIntoTheFolderThatItLeadsTo)
{
    makeFolder("d");
    makeLink("d", "to-d");
    runWell({"mv", "to-d", "d"});
    EXPECT_EQ(std::filesystem::read_symlink(folder / "d/to-d"), "d");
}

TEST_F(Mv, RefusesToReplaceUnlessTold)
{
    folder.write("a", "new");
    folder.write("b", "old");
    runFailing({"mv", "a", "b"}, "storage: mv: b: exists already (--replace replaces it)\n");
    EXPECT_EQ(folder.read("a") + folder.read("b"), "newold");
    runWell({"mv", "--replace", "a", "b"});
    EXPECT_EQ(folder.read("b"), "new");
    EXPECT_FALSE(exists("a"));
}

TEST_F(Mv, NeverReplacesAFolder)
{
    makeFolder("a");
    folder.write("f", "");
    makeFolder("t/a");
    makeFolder("t/f");
    runFailing({"mv", "--replace", "a", "f", "t"},
               "storage: mv: t/a: exists already, and a folder never replaces anything\n"
               "storage: mv: t/f: a folder, which a file never replaces\n");
    EXPECT_EQ(countEntries(), 3U);
}

TEST_F(Mv, RefusesToMoveAFolderIntoItself)
{
    makeFolder("a/b");
    makeLink("a/b", "link");
    runFailing({"mv", "a", "a/b"}, "storage: mv: a: the target lies inside the source: a/b/a\n");
    runFailing({"mv", "a", "link"}, "storage: mv: a: the target lies inside the source: link/a\n");
    EXPECT_TRUE(exists("a/b"));
}

TEST_F(Mv, RefusesWhatIsTheSame)
{
    folder.write("a", "content");
    makeLink("a", "link");
    runFailing({"mv", "--replace", "a", "./a"}, "storage: mv: a: source and target are the same\n");
    runFailing({"mv", "--replace", "link", "a"}, "storage: mv: link: source and target are the same\n");
    EXPECT_EQ(folder.read("a"), "content");
}

TEST_F(Mv, ReportsWhatIsMissingAndMovesTheRest)
{
    folder.write("a", "");
    makeFolder("d");
    runFailing({"mv", "x", "a", "d/.", "d"}, "storage: mv: x: no such file or folder\n"
                                             "storage: mv: d/.: a folder that cannot be moved under this name\n");
    EXPECT_TRUE(exists("d/a"));
}

/// A second file system below the folder of the test, or none where it may not be mounted.
class MvAcrossFileSystems : public ToolTest
{
protected:
    void SetUp() override
    {
        if (!mount("other", "16m"))
            GTEST_SKIP() << "file systems may not be mounted here";
    }
};

TEST_F(MvAcrossFileSystems, MovesAFile)
{
    folder.write("a", "content");
    runWell({"mv", "a", "other"});
    EXPECT_FALSE(exists("a"));
    EXPECT_EQ(folder.read("other/a"), "content");
}

TEST_F(MvAcrossFileSystems, MovesAFolder)
{
    makeFolder("a/b/c");
    folder.write("a/f", "1");
    folder.write("a/b/\xff\n", "2");
    makeFolder("copy");
    ASSERT_EQ(run({"cp", "-r", "a/.", "copy"}).status, 0);
    runWell({"mv", "a", "other"});
    EXPECT_FALSE(exists("a"));
    EXPECT_TRUE(areEqual("copy", "other/a"));
}

TEST_F(MvAcrossFileSystems, KeepsTheRulesOfReplacement)
{
    folder.write("a", "new");
    folder.write("other/a", "old");
    runFailing({"mv", "a", "other"}, "storage: mv: other/a: exists already (--replace replaces it)\n");
    runWell({"mv", "--replace", "a", "other"});
    EXPECT_EQ(folder.read("other/a"), "new");
}

TEST_F(MvAcrossFileSystems, LeavesBothEndsWhenNotAllCanBeMoved)
{
    makeFolder("a/b");
    folder.write("a/f", "1");
    makePipe("a/b/pipe");
    runFailing({"mv", "a", "other"},
               "storage: mv: a/b/pipe: a special file, which cannot be moved to another file system\n");
    EXPECT_EQ(folder.read("a/f"), "1");
    EXPECT_TRUE(exists("a/b/pipe"));
    EXPECT_EQ(countEntries("other"), 0U);
}

TEST_F(MvAcrossFileSystems, SaysWhatIsMountedInTheSource)
{
    makeFolder("a");
    if (!mount("a/b", "1m"))
        GTEST_SKIP() << "file systems may not be mounted here";
    runFailing({"mv", "a", "other"}, "storage: mv: a/b: something is mounted on it\n");
    EXPECT_EQ(countEntries("other"), 0U);
}

TEST_F(MvAcrossFileSystems, MovesLinksAndScratchFilesInAFolder)
{
    constexpr char const* scratch = "7e9f4b5e-0d6c-4a57-8f2e-1b9d3c5a7e90.tmp.bak";
    makeFolder("a");
    folder.write("a/f", "1");
    folder.write(std::string("a/") + scratch, "2");
    makeLink("f", "a/link");
    makeLink("nowhere", "a/broken");
    EXPECT_EQ(runWell({"mv", "-v", "a", "other"}), "a -> other/a\n");
    EXPECT_FALSE(exists("a"));
    EXPECT_EQ(folder.read(std::string("other/a/") + scratch), "2");
    EXPECT_EQ(std::filesystem::read_symlink(folder / "other/a/link"), "f");
    EXPECT_EQ(std::filesystem::read_symlink(folder / "other/a/broken"), "nowhere");
}

TEST_F(MvAcrossFileSystems, KeepsTimes)
{
    makeFolder("a");
    folder.write("a/f", "1");
    setTime("a/f", 1'100'000'000, 987'654'321);
    setTime("a", 1'100'000'000, 987'654'321);
    auto const time = std::filesystem::last_write_time(folder / "a");
    runWell({"mv", "a", "other"});
    EXPECT_EQ(std::filesystem::last_write_time(folder / "other/a"), time);
    EXPECT_EQ(std::filesystem::last_write_time(folder / "other/a/f"), time);
}

TEST_F(MvAcrossFileSystems, KeepsTheSourceWhenTheTargetIsFull)
{
    folder.write("a", std::string(20 << 20, 'x'));
    runFailing({"mv", "a", "other"}, "storage: mv: other/a: no space left\n");
    EXPECT_EQ(std::filesystem::file_size(folder / "a"), 20U << 20U);
    EXPECT_EQ(countEntries("other"), 0U);
}

TEST_F(MvAcrossFileSystems, MovesLinksThemselves)
{
    folder.write("f", "");
    makeLink("f", "link");
    runWell({"mv", "link", "other"});
    EXPECT_FALSE(std::filesystem::is_symlink(folder / "link"));
    EXPECT_EQ(std::filesystem::read_symlink(folder / "other/link"), "f");
}

} // namespace
