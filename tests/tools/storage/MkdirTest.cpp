#include <tests/tools/storage/ToolTest.hpp>

namespace {

using Mkdir = ToolTest;

TEST_F(Mkdir, MakesFolders)
{
    EXPECT_EQ(runWell({"mkdir", "a", "a/b", "\xff\n%"}), "");
    EXPECT_TRUE(isFolder("a/b"));
    EXPECT_TRUE(isFolder("\xff\n%"));
}

TEST_F(Mkdir, RefusesWhatExists)
{
    makeFolder("a");
    folder.write("b", "");
    runFailing({"mkdir", "a", "b"}, "storage: mkdir: a: exists already\nstorage: mkdir: b: exists already\n");
}

TEST_F(Mkdir, RefusesAFolderWithoutAParent)
{
    runFailing({"mkdir", "a/b"}, "storage: mkdir: a/b: there is no folder to hold it (-p makes it)\n");
}

TEST_F(Mkdir, MakesParentsWhenTold)
{
    runWell({"mkdir", "-p", "a/b/c"});
    runWell({"mkdir", "-p", "a/b/c", "/"});
    EXPECT_TRUE(isFolder("a/b/c"));
}

TEST_F(Mkdir, WithParentsRefusesAFileInTheWay)
{
    folder.write("a", "");
    makeLink("nowhere", "b");
    runFailing({"mkdir", "-p", "a", "b", "a/b", "a/b/c"},
               "storage: mkdir: a: exists already, and is not a folder\n"
               "storage: mkdir: b: exists already, and is not a folder\n"
               "storage: mkdir: a/b: something above it is not a folder\n"
               "storage: mkdir: a/b/c: something above it is not a folder\n");
}

} // namespace
