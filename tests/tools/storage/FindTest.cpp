#include <tests/tools/storage/ToolTest.hpp>

#include <algorithm>
#include <nlohmann/json.hpp>
#include <sstream>

namespace {

/// The lines of what the tool finds come in the order of the disk, and are compared without it.
class Find : public ToolTest
{
protected:
    using Lines = std::vector<std::string>;

    static Lines sortedLines(std::string const& text, char terminator = '\n')
    {
        Lines lines;
        std::istringstream stream(text);
        for (std::string line; std::getline(stream, line, terminator);)
            lines.push_back(line);
        std::sort(lines.begin(), lines.end());
        return lines;
    }

    Lines find(Arguments arguments) const
    {
        arguments.insert(arguments.begin(), "find");
        return sortedLines(runWell(arguments));
    }
};

TEST_F(Find, PrintsAFolderAndAllBelowIt)
{
    makeFolder("a/b");
    folder.write("a/b/f", "");
    folder.write("a/.hidden", "");
    EXPECT_EQ(find({"a"}), (Lines{"a", "a/.hidden", "a/b", "a/b/f"}));
}

TEST_F(Find, PrintsParentsBeforeWhatTheyHold)
{
    makeFolder("a/b/c");
    EXPECT_EQ(runWell({"find"}), ".\n./a\n./a/b\n./a/b/c\n");
}

TEST_F(Find, TakesFilesAndSeveralFolders)
{
    makeFolder("a");
    folder.write("a/x", "");
    makeFolder("b");
    folder.write("f", "");
    EXPECT_EQ(runWell({"find", "b", "f", "a/"}), "b\nf\na/\na/x\n");
}

TEST_F(Find, ComparesPatternsWithWholeNames)
{
    makeFolder("a.txt");
    folder.write("a.txt/b.txt", "");
    folder.write("a.txt/b.txt.old", "");
    folder.write("a.txt/c", "");
    EXPECT_EQ(find({"--name", "*.txt"}), (Lines{"./a.txt", "./a.txt/b.txt"}));
    EXPECT_EQ(find({"--name=[!a-b]", "--name", "b.txt.???", "a.txt"}), (Lines{"a.txt/b.txt.old", "a.txt/c"}));
    EXPECT_EQ(find({"--name", "txt"}), Lines{});
}

TEST_F(Find, TakesPatternsThatParsersLikeToInterpret)
{
    for (std::string const name : {"[", "a,b", "{}", "%%", "-x", "="})
        folder.write(name, "");
    EXPECT_EQ(find({"--name", "[a,b]*"}), (Lines{"./a,b"}));
    EXPECT_EQ(find({"--name=[a,b]*"}), (Lines{"./a,b"}));
    EXPECT_EQ(find({"--name", "{}"}), (Lines{"./{}"}));
    EXPECT_EQ(find({"--name", "%%"}), (Lines{"./%%"}));
    EXPECT_EQ(find({"--name", "[[]"}), (Lines{"./["}));
    EXPECT_EQ(find({"--name", "-?"}), (Lines{"./-x"}));
    EXPECT_EQ(find({"--name=="}), (Lines{"./="}));
    EXPECT_EQ(find({"--name="}), Lines{});
}

TEST_F(Find, HasPatternsWithoutRegardToCase)
{
    for (std::string const name : {"Größe", "GRÖSSE", "GRÖßE", "größe"})
        folder.write(name, "");
    EXPECT_EQ(find({"--iname", "gRÖß[A-E]"}), (Lines{"./GRÖßE", "./Größe", "./größe"}));
    EXPECT_EQ(find({"--name", "g*"}), (Lines{"./größe"}));
}

TEST_F(Find, TakesACharacterOfAnyLengthForAQuestionMark)
{
    makeFolder("dir");
    for (std::string const name : {"dir/\xf0\x9f\x98\x80", "dir/\xff", "dir/ab"})
        folder.write(name, "");
    EXPECT_EQ(find({"--name", "?", "dir"}), (Lines{"dir/\xf0\x9f\x98\x80", "dir/\xff"}));
}

TEST_F(Find, ChoosesByType)
{
    makeFolder("d");
    folder.write("f", "");
    makePipe("p");
    makeLink("f", "lf");
    makeLink("d", "ld");
    makeLink("x", "lx");
    EXPECT_EQ(find({"--type", "file"}), (Lines{"./f"}));
    EXPECT_EQ(find({"--type", "folder"}), (Lines{".", "./d"}));
    EXPECT_EQ(find({"-t", "link"}), (Lines{"./ld", "./lf", "./lx"}));
    EXPECT_EQ(find({"-t", "link-to-folder", "-t", "special"}), (Lines{"./ld", "./p"}));
    EXPECT_EQ(find({"-t", "broken-link"}), (Lines{"./lx"}));
}

TEST_F(Find, ChoosesFilesBySize)
{
    makeFolder("d");
    folder.write("d/1", std::string(1023, 'x'));
    folder.write("d/2", std::string(1024, 'x'));
    folder.write("d/3", std::string(1025, 'x'));
    makeLink("3", "d/link");
    EXPECT_EQ(find({"--size", "1K"}), (Lines{"./d/2"}));
    EXPECT_EQ(find({"--size", "+1K"}), (Lines{"./d/2", "./d/3"}));
    EXPECT_EQ(find({"--size", "-1K"}), (Lines{"./d/1", "./d/2"}));
    EXPECT_EQ(find({"--size=+1000", "--size=-1023"}), (Lines{"./d/1"}));
    EXPECT_EQ(find({"--size=+1K", "d/1", "d/3"}), (Lines{"d/3"}));
}

TEST_F(Find, ChoosesByTheTimeOfTheLastChange)
{
    makeFolder("d");
    folder.write("d/old", "");
    setTime("d/old", 1709210096);
    folder.write("d/new", "");
    makeLink("x", "d/broken");
    EXPECT_EQ(find({"--older", "2024-03-01", "d"}), (Lines{"d/old"}));
    EXPECT_EQ(find({"--newer", "1h", "d"}), (Lines{"d", "d/new"}));
    EXPECT_EQ(find({"--newer", "2024-02-29T12:34:56Z", "--older", "1d", "d"}), Lines{});
    EXPECT_EQ(find({"--newer", "2024-02-29T12:34:55.999999Z", "--older", "1d", "d"}), (Lines{"d/old"}));
}

TEST_F(Find, GoesNoDeeperThanItIsTold)
{
    makeFolder("a/b/c");
    EXPECT_EQ(find({"a", "--max-depth", "0"}), (Lines{"a"}));
    EXPECT_EQ(find({"a", "-d1"}), (Lines{"a", "a/b"}));
    EXPECT_EQ(find({"a", "--max-depth=2", "--name", "c"}), (Lines{"a/b/c"}));
}

TEST_F(Find, FollowsLinksThatAreGivenAndNoOthers)
{
    makeFolder("a/b");
    makeLink("..", "a/b/up");
    makeLink("a", "l");
    EXPECT_EQ(find({"l"}), (Lines{"l", "l/b", "l/b/up"}));
}

TEST_F(Find, LeavesOutScratchFilesUnlessAsked)
{
    std::string const scratch = "7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak";
    folder.write(scratch, "");
    EXPECT_EQ(find({}), (Lines{"."}));
    EXPECT_EQ(find({"--all"}), (Lines{".", "./" + scratch}));
}

TEST_F(Find, PrintsPathsThatAreArguments)
{
    makeFolder("-d");
    for (std::string const name : {"-d/f", "-d/file:x", "-d/\xff\n%20"})
        folder.write(name, "content");
    std::size_t count = 0;
    for (std::string const& path : sortedLines(runWell({"find", "-0", "-t", "file", "--", "-d"}), '\0')) {
        EXPECT_TRUE(path.starts_with("./-d/")) << path;
        EXPECT_EQ(runWell({"cat", path}), "content");
        ++count;
    }
    EXPECT_EQ(count, 3U);
}

TEST_F(Find, PrintsIRIsBelowAnIRI)
{
    makeFolder("a");
    folder.write("a/b c", "content");
    std::string const root = "file://" + folder.path().native() + "/a";
    EXPECT_EQ(runWell({"find", root}), root + '\n' + root + "/b%20c\n");
}

TEST_F(Find, LooksThroughAnyStore)
{
    EXPECT_EQ(runWell({"find", "mem:///"}), "mem:///\n");
}

TEST_F(Find, PrintsOneJSONObjectALine)
{
    folder.write("a", "12345");
    setTime("a", 1709210096);
    auto const object = nlohmann::json::parse(runWell({"find", "--json", "--name", "a"}));
    EXPECT_EQ(object, nlohmann::json({{"name", "a"},
                                      {"location", "file://" + folder.path().native() + "/a"},
                                      {"type", "file"},
                                      {"size", 5},
                                      {"modified", "2024-02-29T12:34:56.000000Z"}}));
}

TEST_F(Find, ReportsWhatIsMissingAndFindsTheRest)
{
    folder.write("f", "");
    EXPECT_EQ(runFailing({"find", "x", "f"}, "storage: find: x: no such file or folder\n"), "f\n");
}

TEST_F(Find, ReportsFoldersThatCannotBeReadAndFindsTheRest)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    makeFolder("a/b");
    makeFolder("a/c/d");
    std::filesystem::permissions(folder / "a/b", std::filesystem::perms::none);
    ProgramResult const result = runUnprivileged({"find", "a"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: find: a/b: permission denied\n");
    EXPECT_EQ(sortedLines(result.output), (Lines{"a", "a/b", "a/c", "a/c/d"}));
}

TEST_F(Find, RefusesValuesThatMeanNothing)
{
    struct Row
    {
        Arguments arguments;
        std::string message;
    };
    std::vector<Row> const rows{
        {{"find", "--size", "12x"}, "--size: '12x' is no size such as 100, +1M or -64K"},
        {{"find", "--older=soon"},
         "--older: 'soon' is no time such as 2024-02-29, 2024-02-29T12:34:56Z, 10min, 36h or 7d"},
        {{"find", "--name", "a/b"}, "--name: 'a/b' has a '/', which no name has"},
        {{"find", "-d", "-1"}, "--max-depth: '-1' is no whole number"},
        {{"find", "-t", "pipe"},
         "--type: pipe not in {file,folder,link,link-to-file,link-to-folder,broken-link,special}"},
        {{"find", "--name"}, "--name: 1 required PATTERN missing"},
    };
    for (auto const& [arguments, message] : rows) {
        ProgramResult const result = run(arguments);
        EXPECT_EQ(result.status, 2) << message;
        EXPECT_EQ(result.errors, "storage: find: " + message + "\nstorage: 'storage find --help' says more\n");
        EXPECT_EQ(result.output, "");
    }
}

TEST_F(Find, GoesDeeperThanListingsCanBeOpen)
{
    makeDeepFolder("a");
    ProgramResult const result = runWithFewDescriptors({"find", "a", "--json", "--type", "file"});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.errors, "");
    EXPECT_EQ(sortedLines(result.output).size(), 400U);
}

} // namespace
