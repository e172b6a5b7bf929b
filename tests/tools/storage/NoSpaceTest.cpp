#include <tests/tools/storage/ToolTest.hpp>

#include <sys/resource.h>

namespace {

/// A file system that is nearly full at the start.
class NoSpace : public ToolTest
{
protected:
    void SetUp() override
    {
        if (!mount("small", "1m"))
            GTEST_SKIP() << "file systems may not be mounted here";
    }
};

TEST_F(NoSpace, IsReportedAndLeavesNothing)
{
    std::string const content(3 << 20, 'x');
    folder.write("a", content);
    runFailing({"cp", "a", "small"}, "storage: cp: small/a: no space left\n");
    EXPECT_EQ(countEntries("small"), 0U);
    EXPECT_EQ(folder.read("a"), content);
}

TEST_F(NoSpace, LeavesTheOldFile)
{
    folder.write("a", std::string(3 << 20, 'x'));
    folder.write("small/a", "old");
    runFailing({"cp", "--replace", "a", "small"}, "storage: cp: small/a: no space left\n");
    EXPECT_EQ(folder.read("small/a"), "old");
    EXPECT_EQ(countEntries("small"), 1U);
}

TEST_F(NoSpace, ForOneFileOfAFolderLeavesTheOthers)
{
    makeFolder("d");
    folder.write("d/big", std::string(3 << 20, 'x'));
    folder.write("d/little", "1");
    runFailing({"cp", "-r", "d", "small"}, "storage: cp: small/d/big: no space left\n");
    EXPECT_EQ(folder.read("small/d/little"), "1");
    EXPECT_EQ(countEntries("small/d"), 1U);
}

/// The limit that a shell sets with `ulimit -f`.
class FileSizeLimit : public ToolTest
{
protected:
    ProgramResult runLimited(Arguments const& arguments) const
    {
        ProcessOptions options = inFolder();
        options.prepare = [] {
            rlimit const limit{.rlim_cur = 1 << 20, .rlim_max = 1 << 20};
            ::setrlimit(RLIMIT_FSIZE, &limit);
        };
        return Process(command(arguments), options).finish();
    }
};

TEST_F(FileSizeLimit, IsReportedAndLeavesNothing)
{
    folder.write("a", std::string(3 << 20, 'x'));
    makeFolder("to");
    ProgramResult const result = runLimited({"cp", "a", "to"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: cp: to/a: the file is too large for this store\n");
    EXPECT_EQ(countEntries("to"), 0U);
}

TEST_F(FileSizeLimit, LeavesTheOldFile)
{
    folder.write("input", std::string(3 << 20, 'x'));
    folder.write("a", "old");
    ProgramResult const result = runLimited({"cp", "--replace", "input", "a"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(folder.read("a"), "old");
    EXPECT_EQ(countEntries(), 2U);
}

} // namespace
