#include <tests/tools/storage/ToolTest.hpp>

#include <nlohmann/json.hpp>

namespace {

using CpFolder = ToolTest;

std::vector<std::string> const hostileNames{
    "a b",
    " ",
    "%41",
    "%2F",
    "100%",
    "#",
    "?",
    "!",
    "a!",
    "a\nb",
    "\\",
    "a:b",
    "[1]",
    "-rf",
    "...",
    "~",
    "\xf0\x9f\x98\x80",
    "\xff",
    "\xc3",
    "a\x80"
    "b",
    "\xed\xa0\x80",
    "e\xcc\x81",
    "\xc3\xa9",
    "\xee\xbe\x80",
    "\1\x7f",
    std::string(255, 'x'),
};

TEST_F(CpFolder, BecomesTheTargetWhenThatIsMissing)
{
    makeFolder("a/b/empty");
    folder.write("a/f", "1");
    folder.write("a/b/g", "2");
    EXPECT_EQ(runWell({"cp", "-r", "a", "t"}), "");
    EXPECT_TRUE(areEqual("a", "t"));
    EXPECT_TRUE(isFolder("t/b/empty"));
}

TEST_F(CpFolder, GoesIntoAnExistingTarget)
{
    makeFolder("a");
    folder.write("a/f", "1");
    folder.write("g", "2");
    makeFolder("t");
    runWell({"cp", "-r", "a", "g", "t"});
    EXPECT_EQ(folder.read("t/a/f") + folder.read("t/g"), "12");
}

TEST_F(CpFolder, NamedByADotGivesItsContent)
{
    makeFolder("a");
    folder.write("a/f", "1");
    makeFolder("t");
    runWell({"cp", "-r", "a/.", "t"});
    EXPECT_EQ(folder.read("t/f"), "1");
}

TEST_F(CpFolder, MayHaveASlashAtTheEnd)
{
    makeFolder("a");
    folder.write("a/f", "1");
    runWell({"cp", "-r", "a/", "t/"});
    EXPECT_TRUE(areEqual("a", "t"));
}

TEST_F(CpFolder, KeepsEveryNameAndContent)
{
    makeFolder("a");
    for (std::string const& name : hostileNames) {
        folder.write("a/" + name, "content of " + name);
        makeFolder("a/sub/" + name.substr(0, 250) + "-dir");
    }
    runWell({"cp", "-r", "a", "t"});
    EXPECT_TRUE(areEqual("a", "t"));
    EXPECT_EQ(countEntries("t"), countEntries("a"));
    EXPECT_EQ(countEntries("t/sub"), countEntries("a/sub"));
}

TEST_F(CpFolder, SecondRunChangesNothingAndSaysWhy)
{
    makeFolder("a/b");
    folder.write("a/b/f", "1");
    makeFolder("t");
    runWell({"cp", "-r", "a", "t"});
    folder.write("a/b/f", "2");
    folder.write("a/b/new", "3");
    runFailing({"cp", "-r", "a", "t"}, "storage: cp: t/a/b/f: exists already (--replace replaces it)\n");
    EXPECT_EQ(folder.read("t/a/b/f"), "1");
    EXPECT_EQ(folder.read("t/a/b/new"), "3");
}

TEST_F(CpFolder, MergesAndReplacesWhenTold)
{
    makeFolder("a/b");
    folder.write("a/b/f", "new");
    makeFolder("t/a/b");
    folder.write("t/a/b/f", "old");
    folder.write("t/a/b/g", "other");
    runWell({"cp", "-r", "--replace", "a", "t"});
    EXPECT_EQ(folder.read("t/a/b/f"), "new");
    EXPECT_EQ(folder.read("t/a/b/g"), "other");
}

TEST_F(CpFolder, NeverReplacesAFileByAFolderNorAFolderByAFile)
{
    makeFolder("a/folder");
    folder.write("a/file", "");
    makeFolder("t/a/file");
    folder.write("t/a/folder", "");
    ProgramResult const result = run({"cp", "-r", "--replace", "a", "t"});
    EXPECT_EQ(result.status, 1);
    EXPECT_NE(result.errors.find("storage: cp: t/a/file: a folder, which a file never replaces\n"), std::string::npos);
    EXPECT_NE(result.errors.find("storage: cp: t/a/folder: not a folder, and a folder never replaces it\n"),
              std::string::npos);
}

TEST_F(CpFolder, PassesOverLinksToFoldersBrokenLinksAndSpecialFiles)
{
    makeFolder("a/z");
    makeFolder("outside");
    folder.write("outside/secret", "");
    makeLink("../outside", "a/link");
    folder.write("a/z/f", "1");
    runFailing({"cp", "-r", "a", "t"}, "storage: cp: a/link: a link to a folder, not followed\n");
    EXPECT_FALSE(exists("t/link"));
    EXPECT_EQ(folder.read("t/z/f"), "1");
    std::filesystem::remove(folder / "a/link");
    makePipe("a/pipe");
    runFailing({"cp", "-r", "a", "t2"}, "storage: cp: a/pipe: a special file, not copied\n");
    std::filesystem::remove(folder / "a/pipe");
    makeLink("link", "a/link");
    runFailing({"cp", "-r", "a", "t3"}, "storage: cp: a/link: a broken link, not copied\n");
}

TEST_F(CpFolder, CopiesLinksToFilesAsFiles)
{
    makeFolder("a");
    folder.write("f", "1");
    makeLink("../f", "a/link");
    runWell({"cp", "-r", "a", "t"});
    EXPECT_TRUE(isFile("t/link"));
    EXPECT_EQ(folder.read("t/link"), "1");
}

TEST_F(CpFolder, NeverWritesThroughALinkInTheTarget)
{
    makeFolder("a/b");
    folder.write("a/b/f", "1");
    makeFolder("outside");
    makeFolder("t/a");
    makeLink("../../outside", "t/a/b");
    runFailing({"cp", "-r", "--replace", "a", "t"}, "storage: cp: t/a/b: a link to a folder, not followed\n");
    EXPECT_EQ(countEntries("outside"), 0U);
}

TEST_F(CpFolder, RefusesATargetInsideTheSource)
{
    makeFolder("a/b");
    makeLink("a/b", "link");
    std::string const why = "storage: cp: a: the target lies inside the source: ";
    runFailing({"cp", "-r", "a", "a/b"}, why + "a/b/a\n");
    runFailing({"cp", "-r", "a", "a/new"}, why + "a/new\n");
    runFailing({"cp", "-r", "a", "link"}, why + "link/a\n");
    runFailing({"cp", "-r", "a", "link/../new"}, why + "link/../new\n");
    runFailing({"cp", "-r", "a", "."}, "storage: cp: a: source and target are the same\n");
    runFailing({"cp", "-r", "a/b/.", "."}, "storage: cp: a/b/.: the source lies inside the folder that it would be "
                                           "merged into: .\n");
    EXPECT_EQ(countEntries("a"), 1U);
    EXPECT_EQ(countEntries("a/b"), 0U);
}

TEST_F(CpFolder, NamedByTwoDotsGivesItsContent)
{
    makeFolder("a/b");
    folder.write("a/f", "1");
    makeFolder("t");
    runWell({"cp", "-r", "a/b/..", "t"});
    EXPECT_TRUE(areEqual("a", "t"));
}

TEST_F(CpFolder, ReportsWhatCannotBeReadAndCopiesTheRest)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    makeFolder("a/closed");
    folder.write("a/f", "1");
    std::filesystem::permissions(folder / "a/closed", std::filesystem::perms::none);
    ProgramResult const result = runUnprivileged({"cp", "-r", "a", "t"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: cp: a/closed: permission denied\n");
    EXPECT_EQ(folder.read("t/f"), "1");
    EXPECT_FALSE(exists("t/closed"));
}

TEST_F(CpFolder, CopiesManySmallFiles)
{
    makeFolder("a");
    for (int i = 0; i < 20'000; ++i)
        folder.write("a/" + std::to_string(i), std::to_string(i));
    runWell({"cp", "-r", "a", "t"});
    EXPECT_TRUE(areEqual("a", "t"));
}

TEST_F(CpFolder, GoesDeeperThanListingsCanBeOpen)
{
    makeDeepFolder("a");
    EXPECT_EQ(runWithFewDescriptors({"cp", "-r", "a", "t"}).status, 0);
    EXPECT_TRUE(areEqual("a", "t"));
}

TEST_F(CpFolder, LeavesOutScratchFiles)
{
    constexpr char const* scratch = "7e9f4b5e-0d6c-4a57-8f2e-1b9d3c5a7e90.tmp.bak";
    makeFolder("a/b");
    folder.write("a/b/f", "1");
    folder.write(std::string("a/b/") + scratch, "2");
    runWell({"cp", "-r", "a", "t"});
    EXPECT_TRUE(exists("t/b/f"));
    EXPECT_EQ(countEntries("t/b"), 1U);
}

TEST_F(CpFolder, TellsOfFilesByTheLocationsThatUsersKnow)
{
    makeFolder("a/b");
    folder.write("a/b/f", "1");
    auto const told = nlohmann::json::parse(runWell({"cp", "-r", "--json", "./a/.", "t"}));
    EXPECT_EQ(told.at("source"), "file://" + (folder / "a/b/f").string());
    EXPECT_EQ(told.at("target"), "file://" + (folder / "t/b/f").string());
}

} // namespace
