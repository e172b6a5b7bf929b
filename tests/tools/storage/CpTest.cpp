#include <tests/tools/storage/ToolTest.hpp>

#include <csignal>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

using Cp = ToolTest;

TEST_F(Cp, CopiesAFileToANewName)
{
    folder.write("a", "content");
    EXPECT_EQ(runWell({"cp", "a", "b"}), "");
    EXPECT_EQ(folder.read("a"), "content");
    EXPECT_EQ(folder.read("b"), "content");
    EXPECT_EQ(countEntries(), 2U);
}

TEST_F(Cp, CopiesContentOfEverySize)
{
    for (std::size_t const size : {0U, 1U, 4096U, 262143U, 262144U, 262145U, 1000000U}) {
        std::string content(size, 'x');
        for (std::size_t i = 0; i < size; i += 97)
            content[i] = static_cast<char>(i);
        folder.write("a", content);
        runWell({"cp", "--replace", "a", "b"});
        EXPECT_EQ(folder.read("b"), content);
    }
}

/// Holes, and zeros that are none, of every length around the size of the buffer.
TEST_F(Cp, CopiesRunsOfZeros)
{
    std::size_t const buffer = 262144;
    for (std::size_t const zeros : {4095UL, 4096UL, buffer - 1, buffer, buffer + 1, 2 * buffer, 3 * buffer + 4096}) {
        for (std::size_t const before : {0UL, 1UL, buffer}) {
            std::string const hole(zeros, '\0');
            folder.write("a", std::string(before, 'x') + hole + "y" + hole);
            runWell({"cp", "--replace", "a", "b"});
            EXPECT_TRUE(areEqual("a", "b")) << before << " and " << zeros;
        }
    }
}

TEST_F(Cp, CopiesAFileOfGigabytesThatHasNoBlocksWithoutMakingAny)
{
    folder.write("a", "start");
    std::filesystem::resize_file(folder / "a", std::uintmax_t{4} << 30U);
    runWell({"cp", "a", "b"});
    EXPECT_EQ(std::filesystem::file_size(folder / "b"), std::uintmax_t{4} << 30U);
    EXPECT_TRUE(areEqual("a", "b"));
    struct stat status
    {};
    ASSERT_EQ(::stat((folder / "b").c_str(), &status), 0);
    EXPECT_LT(status.st_blocks * 512, 1 << 20);
}

TEST_F(Cp, CopiesFilesIntoAFolder)
{
    folder.write("a", "1");
    folder.write("b", "2");
    makeFolder("d");
    runWell({"cp", "a", "b", "d"});
    EXPECT_EQ(folder.read("d/a") + folder.read("d/b"), "12");
}

TEST_F(Cp, CopiesIntoAFolderBehindALink)
{
    folder.write("a", "1");
    makeFolder("d");
    makeLink("d", "to-d");
    runWell({"cp", "a", "to-d"});
    EXPECT_EQ(folder.read("d/a"), "1");
}

TEST_F(Cp, NamesEachFileWhenVerbose)
{
    folder.write("a", "");
    makeFolder("d");
    EXPECT_EQ(runWell({"cp", "-v", "a", "d"}), "a -> d/a\n");
}

TEST_F(Cp, RefusesToReplaceUnlessTold)
{
    folder.write("a", "new");
    folder.write("b", "old");
    runFailing({"cp", "a", "b"}, "storage: cp: b: exists already (--replace replaces it)\n");
    EXPECT_EQ(folder.read("b"), "old");
    runWell({"cp", "--replace", "a", "b"});
    EXPECT_EQ(folder.read("b"), "new");
    EXPECT_EQ(countEntries(), 2U);
}

TEST_F(Cp, ReplacesALinkAndNotWhatItLeadsTo)
{
    folder.write("a", "new");
    folder.write("b", "old");
    makeLink("b", "to-b");
    makeLink("nowhere", "broken");
    runFailing({"cp", "a", "broken"}, "storage: cp: broken: exists already (--replace replaces it)\n");
    runWell({"cp", "--replace", "a", "to-b"});
    runWell({"cp", "--replace", "a", "broken"});
    EXPECT_EQ(folder.read("b"), "old");
    EXPECT_EQ(folder.read("to-b"), "new");
    EXPECT_EQ(folder.read("broken"), "new");
    EXPECT_FALSE(exists("nowhere"));
}

TEST_F(Cp, NeverReplacesAFolderByAFile)
{
    folder.write("a", "new");
    makeFolder("d/a");
    runFailing({"cp", "--replace", "a", "d"}, "storage: cp: d/a: a folder, which a file never replaces\n");
    EXPECT_TRUE(isFolder("d/a"));
}

TEST_F(Cp, NeverReplacesASpecialFile)
{
    folder.write("a", "new");
    makePipe("p");
    runFailing({"cp", "--replace", "a", "p"}, "storage: cp: p: a special file, which a file never replaces\n");
}

TEST_F(Cp, CopiesALinkAsTheFileThatItLeadsTo)
{
    folder.write("a", "content");
    makeLink("a", "to-a");
    runWell({"cp", "to-a", "b"});
    EXPECT_TRUE(isFile("b"));
    EXPECT_EQ(folder.read("b"), "content");
}

TEST_F(Cp, NamesAndPassesOverWhatIsNotCopied)
{
    folder.write("a", "1");
    makeFolder("d");
    makeFolder("e");
    makeLink("e", "to-e");
    makeLink("nowhere", "broken");
    makePipe("pipe");
    runFailing({"cp", "to-e", "broken", "pipe", "missing", "e", "a", "d"},
               "storage: cp: to-e: a link to a folder, not followed\n"
               "storage: cp: broken: a broken link, not copied\n"
               "storage: cp: pipe: a special file, not copied\n"
               "storage: cp: missing: no such file or folder\n"
               "storage: cp: e: a folder (-r copies folders and all they hold)\n");
    EXPECT_EQ(folder.read("d/a"), "1");
    EXPECT_EQ(countEntries("d"), 1U);
}

TEST_F(Cp, RefusesToCopyAFileOntoItself)
{
    folder.write("a", "content");
    makeLink("a", "to-a");
    makeFolder("d");
    for (std::string const target : {"a", "./a", "d/../a", "to-a", "."})
        runFailing({"cp", "--replace", "a", target}, "storage: cp: a: source and target are the same\n");
    runFailing({"cp", "--replace", "to-a", "a"}, "storage: cp: to-a: source and target are the same\n");
    EXPECT_EQ(folder.read("a"), "content");
}

TEST_F(Cp, NeedsAFolderForSeveralSources)
{
    folder.write("a", "");
    folder.write("b", "");
    runFailing({"cp", "a", "b", "c"}, "storage: cp: c: not a folder, which it must be for several sources\n");
    EXPECT_FALSE(exists("c"));
}

TEST_F(Cp, NeedsTheFolderOfTheTarget)
{
    folder.write("a", "");
    runFailing({"cp", "a", "x/b"}, "storage: cp: x/b: there is no folder to hold it\n");
    runFailing({"cp", "a", "a/b"}, "storage: cp: a/b: there is no folder to hold it\n");
    runFailing({"cp", "a", "b/"}, "storage: cp: b/: no such folder\n");
    EXPECT_EQ(countEntries(), 1U);
}

TEST_F(Cp, RefusesANameThatIsTooLong)
{
    folder.write("a", "");
    std::string const name(256, 'n');
    for (std::string const command : {"cp", "mv"})
        runFailing({command, "a", name}, "storage: " + command + ": " + name +
                                             ": not a possible location (a name may be too long, or the host is not "
                                             "this one)\n");
    EXPECT_EQ(countEntries(), 1U);
}

TEST_F(Cp, NeverCopiesTwoSourcesToOneTarget)
{
    makeFolder("d");
    makeFolder("e");
    makeFolder("t");
    folder.write("d/a", "first");
    folder.write("e/a", "second");
    runFailing({"cp", "--replace", "d/a", "e/a", "t"},
               "storage: cp: e/a: another source went to the same target before: t/a\n");
    EXPECT_EQ(folder.read("t/a"), "first");
}

TEST_F(Cp, ReportsASourceThatCannotBeRead)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    folder.write("a", "secret");
    std::filesystem::permissions(folder / "a", std::filesystem::perms::none);
    ProgramResult const result = runUnprivileged({"cp", "a", "b"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: cp: a: permission denied\n");
    EXPECT_EQ(countEntries(), 1U);
}

TEST_F(Cp, ReportsATargetThatCannotBeWritten)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    folder.write("a", "content");
    makeFolder("d");
    std::filesystem::permissions(folder / "d", std::filesystem::perms(0555));
    ProgramResult const result = runUnprivileged({"cp", "a", "d"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.errors, "storage: cp: d/a: permission denied\n");
}

TEST_F(Cp, ReportsAFailedWriteAndLeavesNothing)
{
    folder.write("a", std::string(1 << 20, 'x'));
    folder.write("b", "old");
    ProcessOptions options = inFolder();
    options.prepare = [] {
        rlimit const small{1 << 19, 1 << 19};
        ::signal(SIGXFSZ, SIG_IGN);
        if (::setrlimit(RLIMIT_FSIZE, &small) != 0)
            ::_exit(126);
    };
    for (Arguments const& arguments : {Arguments{"cp", "a", "c"}, Arguments{"cp", "--replace", "a", "b"}}) {
        ProgramResult const result = runProgram(command(arguments), options);
        EXPECT_EQ(result.status, 1);
        EXPECT_EQ(result.errors, "storage: cp: " + arguments.back() + ": the file is too large for this store\n");
    }
    EXPECT_EQ(folder.read("b"), "old");
    EXPECT_EQ(countEntries(), 2U);
}

} // namespace
