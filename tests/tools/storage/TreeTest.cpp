#include <tests/tools/storage/ToolTest.hpp>

namespace {

using Tree = ToolTest;

TEST_F(Tree, DrawsFoldersAndCountsThem)
{
    makeFolder("a/b/c");
    folder.write("a/b/c/f", "");
    EXPECT_EQ(runWell({"tree", "a"}), "a\n"
                                      "└── b\n"
                                      "    └── c\n"
                                      "        └── f\n"
                                      "\n"
                                      "2 folders, 1 file\n");
}

TEST_F(Tree, DrawsTheLastEntryOfAFolderDifferently)
{
    makeFolder("a");
    folder.write("a/f", "");
    folder.write("a/g", "");
    std::string const drawn = runWell({"tree", "a"});
    EXPECT_TRUE(drawn == "a\n├── f\n└── g\n\n0 folders, 2 files\n" ||
                drawn == "a\n├── g\n└── f\n\n0 folders, 2 files\n")
        << drawn;
}

TEST_F(Tree, DrawsATrunkBesideWhatIsBelowAFolderWithSiblings)
{
    makeFolder("a/b/d");
    makeFolder("a/c/d");
    std::string const drawn = runWell({"tree", "a", "--ascii"});
    EXPECT_TRUE(drawn == "a\n|-- b\n|   `-- d\n`-- c\n    `-- d\n\n4 folders, 0 files\n" ||
                drawn == "a\n|-- c\n|   `-- d\n`-- b\n    `-- d\n\n4 folders, 0 files\n")
        << drawn;
}

TEST_F(Tree, ShowsLinksToFoldersAndDoesNotFollowThem)
{
    makeFolder("a");
    makeLink("..", "a/up");
    EXPECT_EQ(runWell({"tree", "a"}), "a\n└── up (a link to a folder, not followed)\n\n1 folder, 0 files\n");
}

TEST_F(Tree, KeepsOddNamesOnOneLine)
{
    makeFolder("a");
    folder.write("a/x\ny", "");
    EXPECT_EQ(runWell({"tree", "a"}), "a\n└── x\\ny\n\n0 folders, 1 file\n");
}

TEST_F(Tree, OfAFileOrOfNothingIsAFailure)
{
    folder.write("f", "");
    runFailing({"tree", "f", "x"}, "storage: tree: f: not a folder\nstorage: tree: x: no such file or folder\n");
}

TEST_F(Tree, ReportsFoldersThatCannotBeReadAndDrawsTheRest)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    makeFolder("a/b");
    std::filesystem::permissions(folder / "a/b", std::filesystem::perms::none);
    ProgramResult const result = runUnprivileged({"tree", "a"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: tree: a/b: permission denied\n");
    EXPECT_EQ(result.output, "a\n└── b\n\n1 folder, 0 files\n");
}

TEST_F(Tree, GoesDeeperThanListingsCanBeOpen)
{
    makeDeepFolder("a");
    EXPECT_TRUE(runWell({"tree", "a"}).ends_with("\n400 folders, 400 files\n"));
}

} // namespace
