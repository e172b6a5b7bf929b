#include <tests/tools/storage/ToolTest.hpp>

#include <map>
#include <nlohmann/json.hpp>
#include <sstream>

namespace {

class Du : public ToolTest
{
protected:
    /// What the tool says of each path, by the path.
    std::map<std::string, std::string> sums(Arguments arguments) const
    {
        arguments.insert(arguments.begin(), "du");
        std::istringstream lines(runWell(arguments));
        std::map<std::string, std::string> result;
        for (std::string line; std::getline(lines, line);) {
            std::size_t const begin = line.find_first_not_of(' ');
            std::size_t const end = line.find("  ", begin);
            EXPECT_GE(end, 12U);
            EXPECT_TRUE(result.emplace(line.substr(end + 2), line.substr(begin, end - begin)).second) << line;
        }
        return result;
    }

    using Sums = std::map<std::string, std::string>;

    /// a with 1 byte, a/b with 10, a/b/c with 100.
    void makeTree() const
    {
        makeFolder("a/b/c");
        folder.write("a/f", std::string(1, 'x'));
        folder.write("a/b/f", std::string(10, 'x'));
        folder.write("a/b/c/f", std::string(100, 'x'));
    }
};

TEST_F(Du, PrintsNoLinesForScratchFoldersUnlessAsked)
{
    makeTree();
    std::string const scratch = "a/b/7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak";
    makeFolder(scratch + "/d");
    folder.write(scratch + "/d/f", "12345");
    EXPECT_EQ(sums({"a"}), (Sums{{"a/b/c", "100"}, {"a/b", "115"}, {"a", "116"}}));
    Sums const all = sums({"--all", "a"});
    EXPECT_EQ(all, (Sums{{"a/b/c", "100"}, {"a/b", "115"}, {"a", "116"}, {scratch, "5"}, {scratch + "/d", "5"}}));
}

TEST_F(Du, SumsUpFilesFolderByFolderFromBelow)
{
    makeTree();
    EXPECT_EQ(runWell({"du", "a"}), "         100  a/b/c\n         110  a/b\n         111  a\n");
}

TEST_F(Du, TakesTheWorkingFolderWhenNoneIsGiven)
{
    makeTree();
    EXPECT_EQ(sums({"-d1"}), (Sums{{".", "111"}, {"./a", "111"}}));
}

TEST_F(Du, PrintsALineForEachPathAloneWhenAsked)
{
    makeTree();
    makeFolder("e");
    EXPECT_EQ(sums({"-s", "a", "e"}), (Sums{{"a", "111"}, {"e", "0"}}));
}

TEST_F(Du, CountsWhatIsDeeperThanItShows)
{
    makeTree();
    EXPECT_EQ(sums({"--max-depth", "1", "a"}), (Sums{{"a", "111"}, {"a/b", "110"}}));
    EXPECT_EQ(sums({"-d", "0", "a"}), (Sums{{"a", "111"}}));
}

TEST_F(Du, TakesFiles)
{
    makeTree();
    EXPECT_EQ(sums({"a/f", "a/b/f"}), (Sums{{"a/f", "1"}, {"a/b/f", "10"}}));
}

TEST_F(Du, CountsOnceWhatTwoPathsLeadTo)
{
    makeTree();
    makeLink("a/b", "l");
    EXPECT_EQ(sums({"-s", "-c", "a", "a/b", "l", "a/f"}),
              (Sums{{"a", "111"}, {"a/b", "0"}, {"l", "0"}, {"a/f", "0"}, {"total", "111"}}));
    EXPECT_EQ(sums({"-s", "-c", "a/f", "l", "a"}), (Sums{{"a/f", "1"}, {"l", "110"}, {"a", "0"}, {"total", "111"}}));
    EXPECT_EQ(sums({"-s", "-c", "a/b/c", "a"}), (Sums{{"a/b/c", "100"}, {"a", "11"}, {"total", "111"}}));
    EXPECT_EQ(sums({"-s", "-c", "a", "a/."}), (Sums{{"a", "111"}, {"a/.", "0"}, {"total", "111"}}));
}

TEST_F(Du, DoesNotTakeANameThatBeginsAlikeForAFolder)
{
    makeTree();
    makeFolder("aa");
    folder.write("aa/f", "12345");
    EXPECT_EQ(sums({"-s", "aa", "a"}), (Sums{{"a", "111"}, {"aa", "5"}}));
    EXPECT_EQ(sums({"-s", "a", "aa"}), (Sums{{"a", "111"}, {"aa", "5"}}));
}

TEST_F(Du, CountsNeitherLinksNorSpecialFiles)
{
    makeFolder("a/b");
    folder.write("big", std::string(1000, 'x'));
    makeLink("../big", "a/file");
    makeLink("..", "a/b/up");
    makeLink("x", "a/broken");
    makePipe("a/pipe");
    EXPECT_EQ(sums({"a"}), (Sums{{"a", "0"}, {"a/b", "0"}}));
}

TEST_F(Du, FollowsLinksThatAreGiven)
{
    makeTree();
    makeLink("a", "l");
    makeLink("a/f", "m");
    EXPECT_EQ(sums({"-s", "l", "m"}), (Sums{{"l", "111"}, {"m", "0"}}));
    EXPECT_EQ(sums({"m"}), (Sums{{"m", "1"}}));
}

TEST_F(Du, CountsTheSizeOfFilesAndNotOfTheirBlocks)
{
    makeFolder("a");
    folder.write("a/f", "");
    std::filesystem::resize_file(folder / "a/f", std::uintmax_t{3} << 40U);
    for (char const* const option : {"-h", "-H", "--human-readable"})
        EXPECT_EQ(sums({option, "a"}), (Sums{{"a", "3.0 TiB"}}));
    EXPECT_EQ(sums({"a"}), (Sums{{"a", "3298534883328"}}));
}

TEST_F(Du, PrintsOneJSONObjectALine)
{
    makeTree();
    std::istringstream lines(runWell({"du", "--json", "--total", "-s", "a", "a/f"}));
    std::vector<nlohmann::json> objects;
    for (std::string line; std::getline(lines, line);)
        objects.push_back(nlohmann::json::parse(line));
    std::string const location = "file://" + folder.path().native() + "/a";
    nlohmann::json const a{{"name", "a"}, {"location", location}, {"type", "folder"}, {"size", 111}, {"files", 3}};
    nlohmann::json const f{{"name", "f"}, {"location", location + "/f"}, {"type", "file"}, {"size", 0}, {"files", 0}};
    EXPECT_EQ(objects, (std::vector{a, f, nlohmann::json{{"type", "total"}, {"size", 111}, {"files", 3}}}));
}

TEST_F(Du, ReportsWhatIsMissingAndSumsUpTheRest)
{
    makeTree();
    EXPECT_EQ(runFailing({"du", "-s", "x", "a"}, "storage: du: x: no such file or folder\n"), "         111  a\n");
}

TEST_F(Du, ReportsFoldersThatCannotBeReadAndSumsUpTheRest)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    makeTree();
    std::filesystem::permissions(folder / "a/b/c", std::filesystem::perms::none);
    ProgramResult const result = runUnprivileged({"du", "a"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: du: a/b/c: permission denied\n");
    EXPECT_EQ(result.output, "          10  a/b\n          11  a\n");
}

TEST_F(Du, GoesDeeperThanListingsCanBeOpen)
{
    makeDeepFolder("a");
    ProgramResult const result = runWithFewDescriptors({"du", "-s", "a"});
    EXPECT_EQ(result.errors, "");
    EXPECT_EQ(result.output, "        2800  a\n");
}

} // namespace
