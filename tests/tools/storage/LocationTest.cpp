#include <tests/tools/storage/ToolTest.hpp>

namespace {

using Location = ToolTest;

TEST_F(Location, IsARelativePath)
{
    makeFolder("a");
    folder.write("a/b", "content");
    EXPECT_EQ(runWell({"cat", "a/b"}), "content");
    EXPECT_EQ(runWell({"cat", "./a/../a//b"}), "content");
}

TEST_F(Location, IsAnAbsolutePath)
{
    EXPECT_EQ(runWell({"cat", folder.write("a", "content")}), "content");
}

TEST_F(Location, IsAnIRI)
{
    folder.write("a b#?%", "content");
    std::string const iri = "file://" + folder.path().native() + "/a%20b%23%3F%25";
    EXPECT_EQ(runWell({"cat", iri}), "content");
    EXPECT_EQ(runWell({"cat", "FILE" + iri.substr(4)}), "content");
}

TEST_F(Location, PathsAreNeverUnescaped)
{
    folder.write("a%20b", "content");
    EXPECT_EQ(runWell({"cat", "a%20b"}), "content");
}

TEST_F(Location, OfAnUnknownSchemeSaysHowToWriteAPath)
{
    folder.write("a:b", "content");
    runFailing({"cat", "a:b"}, "storage: cat: a:b: no store serves the scheme 'a' (for a local path, write ./a:b)\n");
    EXPECT_EQ(runWell({"cat", "./a:b"}), "content");
}

TEST_F(Location, WithAColonAfterASlashIsAPath)
{
    makeFolder("d");
    folder.write("d/a:b", "content");
    folder.write("1:b", "content");
    EXPECT_EQ(runWell({"cat", "d/a:b"}), "content");
    EXPECT_EQ(runWell({"cat", "1:b"}), "content");
}

TEST_F(Location, IsNeverEmpty)
{
    runFailing({"ls", ""}, "storage: ls: '': an empty path names nothing\n");
}

TEST_F(Location, OnAnotherMachineIsRefused)
{
    ProgramResult const result = run({"ls", "file://elsewhere/tmp"});
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(result.errors.starts_with("storage: ls: file://elsewhere/tmp: not a possible location"));
}

TEST_F(Location, WithAQueryOrFragmentSaysHowToWriteTheName)
{
    for (std::string const iri : {"file:///a?b", "file:///a#b"})
        runFailing({"ls", iri},
                   "storage: ls: " + iri + ": a '?' or '#' that belongs to a name is written %3F or %23\n");
}

TEST_F(Location, MayLieInMemory)
{
    EXPECT_EQ(runWell({"ls", "mem:///"}), "");
    runFailing({"ls", "mem:///a"}, "storage: ls: mem:///a: no such file or folder\n");
}

TEST_F(Location, IsCopiedFromOneStoreToAnother)
{
    folder.write("a", "content");
    EXPECT_EQ(runWell({"cp", "-v", "a", "mem:///b"}), "a -> mem:///b\n");
}

TEST_F(Location, InMemoryReceivesNoMove)
{
    folder.write("a", "content");
    for (std::string const target : {"mem:///", "MEM:///b", "mem://host/b"})
        runFailing({"mv", "a", target},
                   "storage: mv: " + target + ": goes when the command ends, so that nothing is moved there\n");
    EXPECT_EQ(folder.read("a"), "content");
}

TEST_F(Location, OfAFileEndsInNoSlash)
{
    folder.write("a", "content");
    makeLink("a", "b");
    makeFolder("t");
    for (std::string const command : {"ls", "find", "du", "stat", "cat", "rm"})
        for (std::string const& name : {std::string("a/"), std::string("b/"), "file://" + (folder / "a/").native()})
            runFailing({command, name},
                       "storage: " + command + ": " + name + ": not a folder, as the slash at the end says\n");
    for (std::string const command : {"cp", "mv"})
        runFailing({command, "a/", "t"}, "storage: " + command + ": a/: not a folder, as the slash at the end says\n");
    EXPECT_EQ(folder.read("a"), "content");
    EXPECT_EQ(countEntries("t"), 0U);
}

TEST_F(Location, OfALinkToAFolderMayEndInASlash)
{
    makeFolder("d");
    folder.write("d/a", "content");
    makeLink("d", "b");
    EXPECT_EQ(runWell({"ls", "b/"}), "a\n");
}

TEST_F(Location, IsTheSameWhateverTheLetterCaseOfItsScheme)
{
    folder.write("a", "content");
    runFailing({"cp", "--replace", "a", "FILE://" + folder.path().native() + "/a"},
               "storage: cp: a: source and target are the same\n");
}

TEST_F(Location, OfASchemeWithoutContainersSaysSo)
{
    runFailing({"cat", "file:b"}, "storage: cat: file:b: 'file' names no places in a container: '/' follows file: (for "
                                  "a local path, write ./file:b)\n");
    runFailing({"cat", "mem:file:///a!/b"}, "storage: cat: mem:file:///a!/b: 'mem' names no places in a container: '/' "
                                            "follows mem: (for a local path, write ./mem:file:///a!/b)\n");
}

TEST_F(Location, WithAPasswordIsRefusedAndDoesNotShowIt)
{
    for (std::string const scheme : {"mem", "other", "MEM"})
        runFailing({"cat", scheme + "://me:canary@h/x"},
                   "storage: cat: " + scheme + "://me:***@h/x: a location must not carry a password\n");
    for (std::string const iri : {"mem://me:canary@h:99999/", "mem://me:canary@h/\xff", "zip:mem://me:canary@h/a"}) {
        ProgramResult const result = run({"cat", iri});
        EXPECT_EQ(result.status, 1);
        EXPECT_NE(result.errors.find("me:***@h"), std::string::npos) << result.errors;
        EXPECT_EQ(result.errors.find("canary"), std::string::npos) << result.errors;
    }
}

TEST_F(Location, ThatIsNotUtf8IsRefusedAsAnIRI)
{
    ProgramResult const result = run({"ls", "file:///\xff"});
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(result.errors.starts_with("storage: ls: file:///\\377: not a location: ")) << result.errors;
}

TEST_F(Location, BelowAnIRIIsShownAsAnIRI)
{
    makeFolder("a");
    makeLink("nowhere", "a/b c");
    std::string const iri = "file://" + folder.path().native();
    runFailing({"cp", "-r", iri + "/a", "b"}, "storage: cp: " + iri + "/a/b%20c: a broken link, not copied\n");
}

TEST_F(Location, InAMessageIsShownOnOneLine)
{
    runFailing({"cat", "a\nb\\\033"}, "storage: cat: a\\nb\\\\\\033: no such file or folder\n");
}

} // namespace
