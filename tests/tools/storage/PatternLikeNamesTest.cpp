#include <tests/tools/storage/ToolTest.hpp>

namespace {

/// A name that is a pattern stands for itself wherever a file or folder is named.
class PatternLikeNames : public ToolTest
{
protected:
    PatternLikeNames()
    {
        makeFolder("*");
        folder.write("*/[ab]", "inside");
        makeFolder("neighbour");
        folder.write("neighbour/a", "kept");
        folder.write("a", "kept");
        folder.write("[ab]", "content");
    }

    void expectNeighboursKept() const
    {
        EXPECT_EQ(folder.read("a"), "kept");
        EXPECT_EQ(folder.read("neighbour/a"), "kept");
        EXPECT_EQ(countEntries("neighbour"), 1u);
    }
};

TEST_F(PatternLikeNames, AreListed)
{
    EXPECT_EQ(runWell({"ls", "*"}), "[ab]\n");
    EXPECT_EQ(runWell({"find", "*"}), "*\n*/[ab]\n");
    EXPECT_EQ(runWell({"cat", "*/[ab]"}), "inside");
    EXPECT_EQ(runWell({"cat", "[ab]"}), "content");
}

TEST_F(PatternLikeNames, AreCopied)
{
    makeFolder("to");
    runWell({"cp", "[ab]", "to"});
    runWell({"cp", "-r", "*", "to"});
    EXPECT_EQ(countEntries("to"), 2u);
    EXPECT_EQ(folder.read("to/[ab]"), "content");
    EXPECT_EQ(folder.read("to/*/[ab]"), "inside");
    expectNeighboursKept();
}

TEST_F(PatternLikeNames, AreMoved)
{
    runWell({"mv", "[ab]", "?"});
    EXPECT_EQ(folder.read("?"), "content");
    EXPECT_FALSE(exists("[ab]"));
    runWell({"mv", "*", "[!*]"});
    EXPECT_EQ(folder.read("[!*]/[ab]"), "inside");
    EXPECT_FALSE(exists("*"));
    expectNeighboursKept();
}

TEST_F(PatternLikeNames, AreRemoved)
{
    runWell({"rm", "[ab]"});
    runWell({"rm", "-r", "*"});
    EXPECT_EQ(countEntries(), 2u);
    expectNeighboursKept();
}

TEST_F(PatternLikeNames, AreMissedWhereOnlyNeighboursAre)
{
    runFailing({"rm", "?"}, "storage: rm: ?: no such file or folder\n");
    runFailing({"cat", "[a]"}, "storage: cat: [a]: no such file or folder\n");
    runFailing({"rm", "-r", "n*"}, "storage: rm: n*: no such file or folder\n");
    EXPECT_EQ(countEntries(), 4u);
    expectNeighboursKept();
}

} // namespace
