#include <tests/tools/storage/ToolTest.hpp>

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

} // namespace
