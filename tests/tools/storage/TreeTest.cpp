#include <tests/tools/storage/ToolTest.hpp>

#include <map>
#include <nlohmann/json.hpp>
#include <sstream>

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

TEST_F(Tree, LeavesScratchFilesOutUnlessAskedForThem)
{
    makeFolder("a");
    folder.write("a/7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak", "");
    EXPECT_EQ(runWell({"tree", "a"}), "a\n\n0 folders, 0 files\n");
    EXPECT_EQ(runWell({"tree", "--all", "a"}),
              "a\n└── 7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak\n\n0 folders, 1 file\n");
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

TEST_F(Tree, PrintsOneJSONObjectALine)
{
    makeFolder("a/b");
    folder.write("a/b/f", "12345");
    setTime("a/b/f", 1709210096);
    makeLink("..", "a/b/up");
    std::map<std::string, nlohmann::json> objects;
    std::istringstream lines(runWell({"tree", "--json", "a"}));
    for (std::string line; std::getline(lines, line);)
        objects[nlohmann::json::parse(line)["name"]] = nlohmann::json::parse(line);
    EXPECT_EQ(objects.size(), 4U);
    EXPECT_EQ(objects["a"]["depth"], 0);
    EXPECT_EQ(objects["b"]["depth"], 1);
    EXPECT_EQ(objects["b"]["type"], "folder");
    EXPECT_EQ(objects["up"]["type"], "link-to-folder");
    std::string const location = "file://" + folder.path().native() + "/a/b/f";
    EXPECT_EQ(objects["f"], nlohmann::json({{"name", "f"},
                                            {"location", location},
                                            {"type", "file"},
                                            {"depth", 2},
                                            {"size", 5},
                                            {"modified", "2024-02-29T12:34:56.000000Z"}}));
}

TEST_F(Tree, InJSONTellsOfParentsBeforeWhatTheyHold)
{
    makeFolder("a/b/c");
    folder.write("a/.x", "");
    folder.write("a/7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak", "");
    std::vector<int> depths;
    std::istringstream lines(runWell({"tree", "--json", "a"}));
    for (std::string line; std::getline(lines, line);)
        depths.push_back(nlohmann::json::parse(line)["depth"]);
    EXPECT_TRUE(depths == std::vector({0, 1, 2, 1}) || depths == std::vector({0, 1, 1, 2}));
}

TEST_F(Tree, GoesDeeperThanListingsCanBeOpen)
{
    makeDeepFolder("a");
    EXPECT_TRUE(runWell({"tree", "a"}).ends_with("\n400 folders, 400 files\n"));
}

} // namespace
