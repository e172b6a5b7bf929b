#include <tests/tools/storage/ToolTest.hpp>

namespace {

class Sync : public ToolTest
{};

TEST_F(Sync, CopiesWhatIsToBeOnTheDisk)
{
    makeFolder("d");
    folder.write("d/a", "content");
    folder.write("old", "old");
    EXPECT_EQ(run({"cp", "--sync", "-r", "d", "e"}).status, 0);
    EXPECT_EQ(folder.read("e/a"), "content");
    EXPECT_EQ(run({"cp", "--sync", "--replace", "d/a", "old"}).status, 0);
    EXPECT_EQ(folder.read("old"), "content");
    EXPECT_EQ(run({"mv", "--sync", "old", "new"}).status, 0);
    EXPECT_EQ(folder.read("new"), "content");
}

TEST_F(Sync, NeverReplacesUnasked)
{
    folder.write("a", "content");
    folder.write("b", "old");
    EXPECT_EQ(run({"cp", "--sync", "a", "b"}).status, 1);
    EXPECT_EQ(folder.read("b"), "old");
}

TEST_F(Sync, CannotBeHadInPlace)
{
    folder.write("a", "content");
    EXPECT_EQ(run({"cp", "--sync", "--in-place", "a", "b"}).status, 2);
    EXPECT_EQ(run({"put", "--sync", "--in-place", "b"}).status, 2);
    EXPECT_FALSE(exists("b"));
}

} // namespace
