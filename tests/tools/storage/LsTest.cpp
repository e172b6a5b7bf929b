#include <tests/tools/storage/ToolTest.hpp>

#include <algorithm>
#include <nlohmann/json.hpp>
#include <sstream>

namespace {

using Ls = ToolTest;

std::vector<std::string> split(std::string const& text, char terminator)
{
    std::vector<std::string> parts;
    std::istringstream stream(text);
    for (std::string part; std::getline(stream, part, terminator);)
        parts.push_back(part);
    std::sort(parts.begin(), parts.end());
    return parts;
}

std::string const scratchName = "0123abcd-0123-4567-89ab-0123456789ab.tmp.bak";

TEST_F(Ls, ListsTheWorkingFolder)
{
    folder.write("a", "");
    makeFolder("b");
    EXPECT_EQ(split(runWell({"ls"}), '\n'), (std::vector<std::string>{"a", "b"}));
}

TEST_F(Ls, ListsNothingOfAnEmptyFolder)
{
    EXPECT_EQ(runWell({"ls"}), "");
    EXPECT_EQ(runWell({"ls", "--json"}), "");
}

TEST_F(Ls, NamesAFileAsItWasGiven)
{
    folder.write("a", "");
    EXPECT_EQ(runWell({"ls", "./a"}), "./a\n");
}

TEST_F(Ls, HeadsEachOfSeveralFolders)
{
    makeFolder("a");
    makeFolder("b");
    folder.write("a/x", "");
    folder.write("b/y", "");
    EXPECT_EQ(runWell({"ls", "a", "b"}), "a:\nx\n\nb:\ny\n");
}

TEST_F(Ls, ReportsWhatIsMissingAndListsTheRest)
{
    folder.write("a", "");
    std::string const output = runFailing({"ls", "x", "a", "y"}, "storage: ls: x: no such file or folder\n"
                                                                 "storage: ls: y: no such file or folder\n");
    EXPECT_EQ(output, "a\n");
}

TEST_F(Ls, WritesTheBytesOfNames)
{
    std::string const name = "\xff\n \\\xc3\xa4\xf0\x9f\x98\x80";
    folder.write(name, "");
    EXPECT_EQ(runWell({"ls"}), name + "\n");
    EXPECT_EQ(runWell({"ls", "-0"}), name + '\0');
}

TEST_F(Ls, ShowsNamesEscapedOnATerminal)
{
    folder.write("\xff\n\033[31m\\\xc3\xa4\xf0\x9f\x98\x80", "");
    makeFolder("d");
    ProcessOptions options = inFolder();
    options.onTerminal = true;
    ProgramResult const result = runProgram(command({"ls", "--sort", "name"}), options);
    EXPECT_EQ(result.output, "d/\r\n\\377\\n\\033[31m\\\\\xc3\xa4\xf0\x9f\x98\x80\r\n");
}

TEST_F(Ls, LongFormTellsTypeSizeAndTime)
{
    folder.write("a", "12345");
    makeFolder("b");
    setTime("a", 1709210096);
    setTime("b", 0);
    EXPECT_EQ(runWell({"ls", "-l", "--sort=name"}), "file                       5  2024-02-29T12:34:56Z  a\n"
                                                    "folder                     -  1970-01-01T00:00:00Z  b\n");
}

TEST_F(Ls, LongFormTellsSizesForPeople)
{
    folder.write("a", std::string(1536, 'x'));
    setTime("a", 1709210096);
    for (char const* const options : {"-lh", "-lH"})
        EXPECT_EQ(runWell({"ls", options}), "file                 1.5 KiB  2024-02-29T12:34:56Z  a\n");
}

TEST_F(Ls, HelpsOnlyWhenToldInFull)
{
    EXPECT_NE(runWell({"ls", "--help"}).find("--human-readable"), std::string::npos);
}

TEST_F(Ls, LongFormTellsLinksAndSpecialFilesApart)
{
    folder.write("a", "12345");
    makeFolder("b");
    makeLink("a", "to-a");
    makeLink("b", "to-b");
    makeLink("c", "to-c");
    makePipe("pipe");
    std::vector<std::string> types;
    for (std::string const& line : split(runWell({"ls", "-l"}), '\n'))
        types.push_back(line.substr(0, line.find(' ')));
    EXPECT_EQ(types,
              (std::vector<std::string>{"broken-link", "file", "folder", "link-to-file", "link-to-folder", "special"}));
}

TEST_F(Ls, PrintsSizesWithUnits)
{
    folder.write("a", std::string(1536, 'x'));
    folder.write("b", "x");
    std::string const output = runWell({"ls", "-lH", "--sort=name"});
    EXPECT_NE(output.find(" 1.5 KiB  "), std::string::npos) << output;
    EXPECT_NE(output.find(" 1 B  "), std::string::npos) << output;
}

TEST_F(Ls, SortsByNameSizeAndTime)
{
    folder.write("b", "1");
    folder.write("a", "333");
    folder.write("c", "22");
    setTime("a", 2000);
    setTime("b", 1000);
    setTime("c", 3000);
    EXPECT_EQ(runWell({"ls", "--sort", "name"}), "a\nb\nc\n");
    EXPECT_EQ(runWell({"ls", "--sort", "size"}), "a\nc\nb\n");
    EXPECT_EQ(runWell({"ls", "--sort", "time"}), "c\na\nb\n");
}

TEST_F(Ls, HidesScratchFilesUnlessAllIsAskedFor)
{
    folder.write(scratchName, "");
    folder.write("x" + scratchName, "");
    EXPECT_EQ(runWell({"ls"}), "x" + scratchName + "\n");
    EXPECT_EQ(runWell({"ls", "--all", "--sort=name"}), scratchName + "\nx" + scratchName + "\n");
}

TEST_F(Ls, PrintsOneJSONObjectALine)
{
    folder.write("a\n\"\xff", "12345");
    setTime("a\n\"\xff", 1709210096);
    auto const object = nlohmann::json::parse(runWell({"ls", "--json"}));
    EXPECT_EQ(object["name"], "a\n\"\xee\xbf\xbf");
    EXPECT_EQ(object["type"], "file");
    EXPECT_EQ(object["size"], 5);
    EXPECT_EQ(object["modified"], "2024-02-29T12:34:56.000000Z");
}

TEST_F(Ls, LocationsInJSONLeadBackToTheFile)
{
    for (std::string const name : {"\xff\xc3\n", "a b%20#?!", "\xf0\x9f\x98\x80;x=[1]"})
        folder.write(name, "content of " + name);
    std::istringstream lines(runWell({"ls", "--json"}));
    int count = 0;
    for (std::string line; std::getline(lines, line); ++count)
        EXPECT_TRUE(runWell({"cat", nlohmann::json::parse(line)["location"]}).starts_with("content of "));
    EXPECT_EQ(count, 3);
}

TEST_F(Ls, FollowsALinkToAFolderThatIsGiven)
{
    makeFolder("a");
    folder.write("a/x", "");
    makeLink("a", "b");
    EXPECT_EQ(runWell({"ls", "b"}), "x\n");
}

TEST_F(Ls, ReportsAFolderThatCannotBeRead)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    makeFolder("a");
    std::filesystem::permissions(folder / "a", std::filesystem::perms::none);
    ProgramResult const result = runUnprivileged({"ls", "a"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: ls: a: permission denied\n");
}

} // namespace
