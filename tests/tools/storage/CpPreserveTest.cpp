#include <tests/tools/storage/ToolTest.hpp>

#include <array>
#include <fcntl.h>
#include <string>
#include <sys/stat.h>
#include <sys/xattr.h>

namespace {

using foundation::tests::support::TemporaryFolder;

struct stat statusOf(std::filesystem::path const& path)
{
    struct stat status = {};
    EXPECT_EQ(::lstat(path.c_str(), &status), 0) << path;
    return status;
}

/// Copies of what was changed at a time that no copy would have by itself.
class CpPreserve : public ToolTest
{
protected:
    static constexpr long seconds = 1'100'000'000;
    static constexpr long nanoseconds = 987'654'321;

    void age(std::string const& name) const { setTime(name, seconds, nanoseconds); }

    void writeAged(std::string const& name, std::string const& content) const
    {
        folder.write(name, content);
        age(name);
    }

    bool isAged(std::string const& name) const
    {
        struct stat const status = statusOf(folder / name);
        return status.st_mtim.tv_sec == seconds && status.st_mtim.tv_nsec == nanoseconds;
    }

    unsigned modeOf(std::string const& name) const { return statusOf(folder / name).st_mode & 07777U; }

    void chmod(std::string const& name, mode_t mode) const { ASSERT_EQ(::chmod((folder / name).c_str(), mode), 0); }
};

TEST_F(CpPreserve, IsNotDoneUnlessAskedFor)
{
    writeAged("a", "content");
    runWell({"cp", "a", "b"});
    EXPECT_FALSE(isAged("b"));
}

TEST_F(CpPreserve, KeepsTheTimeOfAFileToTheNanosecond)
{
    writeAged("a", "content");
    writeAged("empty", "");
    makeFolder("t");
    runWell({"cp", "-p", "a", "empty", "t"});
    EXPECT_EQ(folder.read("t/a"), "content");
    EXPECT_TRUE(isAged("t/a"));
    EXPECT_TRUE(isAged("t/empty"));
}

TEST_F(CpPreserve, KeepsTheTimeOfAFileThatReplacesAnother)
{
    writeAged("a", "new");
    folder.write("b", "old");
    runWell({"cp", "-p", "--replace", "a", "b"});
    EXPECT_EQ(folder.read("b"), "new");
    EXPECT_TRUE(isAged("b"));
}

TEST_F(CpPreserve, KeepsTheTimeOfTheFileThatALinkLeadsTo)
{
    writeAged("a", "content");
    makeLink("a", "link");
    runWell({"cp", "-p", "link", "b"});
    EXPECT_TRUE(isFile("b"));
    EXPECT_TRUE(isAged("b"));
}

TEST_F(CpPreserve, KeepsTheTimeOfAReadOnlyFile)
{
    writeAged("a", "content");
    chmod("a", 0444);
    runWell({"cp", "-p", "a", "b"});
    EXPECT_EQ(modeOf("b"), 0444U);
    EXPECT_TRUE(isAged("b"));
}

TEST_F(CpPreserve, KeepsTheTimeOfAFileWithHoles)
{
    folder.write("a", "");
    std::filesystem::resize_file(folder / "a", 64 << 20);
    age("a");
    runWell({"cp", "-p", "a", "b"});
    EXPECT_EQ(statusOf(folder / "b").st_size, 64 << 20);
    EXPECT_LT(statusOf(folder / "b").st_blocks, 1000);
    EXPECT_TRUE(isAged("b"));
}

TEST_F(CpPreserve, LeavesAFileAloneThatWouldBeCopiedOntoItself)
{
    writeAged("a", "content");
    runFailing({"cp", "-p", "--replace", "a", "./a"}, "storage: cp: a: source and target are the same\n");
    EXPECT_TRUE(isAged("a"));
}

TEST_F(CpPreserve, KeepsTheTimesOfFoldersWhateverTheyHold)
{
    makeFolder("a/b/c");
    makeFolder("a/empty");
    for (int i = 0; i < 50; ++i)
        writeAged("a/b/c/" + std::to_string(i), std::to_string(i));
    for (char const* const name : {"a/b/c", "a/b", "a/empty", "a"})
        age(name);
    runWell({"cp", "-rp", "-j4", "a", "t"});
    EXPECT_TRUE(areEqual("a", "t"));
    for (char const* const name : {"t", "t/b", "t/b/c", "t/b/c/49", "t/empty"})
        EXPECT_TRUE(isAged(name)) << name;
}

TEST_F(CpPreserve, KeepsTheTimeOfAFolderThatWasMergedWith)
{
    makeFolder("a");
    writeAged("a/f", "1");
    age("a");
    makeFolder("t/a");
    runWell({"cp", "-rp", "a", "t"});
    EXPECT_TRUE(isAged("t/a"));
    EXPECT_TRUE(isAged("t/a/f"));
}

TEST_F(CpPreserve, MakesACopyThatIsUpToDate)
{
    makeFolder("a");
    writeAged("a/f", "1");
    runWell({"cp", "-rp", "a", "t"});
    EXPECT_EQ(runWell({"cp", "-rpuv", "a/.", "t"}), "");
}

TEST_F(CpPreserve, IsNotDoneInPlace)
{
    folder.write("a", "content");
    EXPECT_EQ(run({"cp", "-p", "--in-place", "a", "b"}).status, 2);
    EXPECT_FALSE(exists("b"));
}

TEST_F(CpPreserve, KeepsPermissionsOfNewFoldersWithoutBeingAsked)
{
    makeFolder("a/private/deep");
    folder.write("a/private/deep/f", "1");
    makeFolder("a/read-only");
    folder.write("a/read-only/f", "1");
    chmod("a/private", 0700);
    chmod("a/read-only", 0555);
    makeFolder("t");
    runWell({"cp", "-r", "a/.", "t"});
    EXPECT_EQ(modeOf("t/private"), 0700U);
    EXPECT_EQ(modeOf("t/read-only"), 0555U);
    EXPECT_EQ(folder.read("t/read-only/f"), "1");
    chmod("a/read-only", 0755);
    chmod("t/read-only", 0755);
}

TEST_F(CpPreserve, LeavesPermissionsOfAFolderThatWasThere)
{
    makeFolder("a/f");
    makeFolder("t/f");
    chmod("a/f", 0700);
    chmod("t/f", 0750);
    runWell({"cp", "-rp", "a/.", "t"});
    EXPECT_EQ(modeOf("t/f"), 0750U);
}

/// Copies of what has an extended attribute of the user, in a place that keeps them.
class CpPreserveAttributes : public CpPreserve
{
protected:
    static constexpr char const* name = "user.colo\xff r";

    void SetUp() override
    {
        source.write("a", "content");
        std::filesystem::create_directories(source / "d/e");
        source.write("d/e/f", "1");
        for (char const* const path : {"a", "d", "d/e", "d/e/f"})
            if (::setxattr((source / path).c_str(), name, "red", 3, 0) != 0)
                GTEST_SKIP() << "the folder for temporary files has no extended attributes";
    }

    std::string pathOf(std::string const& path) const { return (source / path).string(); }

    bool hasAttribute(std::string const& path) const
    {
        std::array<char, 8> value;
        return ::getxattr(pathOf(path).c_str(), name, value.data(), value.size()) == 3;
    }

    TemporaryFolder const source;
};

TEST_F(CpPreserveAttributes, KeepsThoseOfFilesAndFolders)
{
    runWell({"cp", "-rp", pathOf("d"), pathOf("t")});
    for (char const* const path : {"t", "t/e", "t/e/f"})
        EXPECT_TRUE(hasAttribute(path)) << path;
    runWell({"cp", "-r", pathOf("d"), pathOf("other")});
    for (char const* const path : {"other", "other/e", "other/e/f"})
        EXPECT_FALSE(hasAttribute(path)) << path;
}

/// Some file systems have no room for more than a few KiB.
TEST_F(CpPreserveAttributes, NamesWhatCannotKeepThemAndLeavesNothingThere)
{
    std::string const value(30'000, 'x');
    auto const set = [&](std::filesystem::path const& path) {
        return ::setxattr(path.c_str(), "user.long", value.data(), value.size(), 0) == 0;
    };
    folder.write("b", "content");
    if (!set(folder / "b") || set(source / "a"))
        GTEST_SKIP() << "both folders for temporary files take equally long attributes";
    std::string const target = pathOf("b");
    runFailing({"cp", "-p", "b", target},
               "storage: cp: " + target + ": the extended attributes of its source cannot be kept there\n");
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(source.path()), {}), 2);
    runWell({"cp", "b", target});
    EXPECT_EQ(source.read("b"), "content");
}

} // namespace
