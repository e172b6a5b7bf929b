#include <tests/tools/storage/ToolTest.hpp>

#include <tests/support/Process.hpp>

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <thread>
#include <unistd.h>

#include <sys/stat.h>
#include <unistd.h>

namespace {

using foundation::tests::support::runProgram;

class Archive : public ToolTest
{
protected:
    Archive()
    {
        makeFolder("tree");
        makeFolder("tree/docs");
        makeFolder("tree/docs/empty");
        folder.write("tree/docs/a b.txt", "text of a");
        folder.write("tree/big", std::string(200'000, 'b'));
        pack({"/usr/bin/env", "zip", "-qr", "../a.zip", "big", "docs"}, "tree");
    }

    void pack(Arguments const& command, std::string const& from) const
    {
        EXPECT_EQ(runProgram(command, {.workingFolder = folder / from}).status, 0);
    }

    std::string zip(std::string const& name, std::string const& path) const
    {
        return "zip:file://" + (folder / name).string() + "!" + path;
    }

    bool hasTemporaryFile(Process const& process) const
    {
        namespace fs = std::filesystem;
        std::string const inside = (fs::canonical(folder.path()) / "temporary").native() + '/';
        std::error_code gone;
        fs::directory_iterator file("/proc/" + std::to_string(process.id()) + "/fd", gone);
        for (; !gone && file != fs::directory_iterator(); file.increment(gone)) {
            std::error_code closed;
            if (fs::read_symlink(file->path(), closed).native().starts_with(inside))
                return true;
        }
        return false;
    }

    std::string inside(std::string const& path) const { return zip("a.zip", path); }
};

TEST_F(Archive, IsListedAsFolders)
{
    EXPECT_EQ(runWell({"ls", inside("/")}), "big\ndocs\n");
    EXPECT_EQ(runWell({"ls", inside("/docs/empty")}), "");
}

TEST_F(Archive, HoldsFilesThatAreRead)
{
    EXPECT_EQ(runWell({"cat", inside("/docs/a%20b.txt")}), "text of a");
}

TEST_F(Archive, IsCopiedOutAsItWasPacked)
{
    runWell({"cp", "-r", inside("/"), "out"});
    EXPECT_TRUE(areEqual("tree", "out"));
}

TEST_F(Archive, GivesItsTimesToCopiesThatAreToKeepThem)
{
    constexpr long time = 1'100'000'000;
    setTime("tree/docs/a b.txt", time);
    setTime("tree/docs", time);
    pack({"/usr/bin/env", "zip", "-qr", "../aged.zip", "docs"}, "tree");
    runWell({"cp", "-rp", "zip:file://" + (folder / "aged.zip").string() + "!/docs", "out"});
    struct stat status = {};
    for (char const* const name : {"out/a b.txt", "out"}) {
        EXPECT_EQ(::stat((folder / name).c_str(), &status), 0);
        EXPECT_EQ(status.st_mtim.tv_sec, time) << name;
    }
}

TEST_F(Archive, IsSearchedCountedAndDescribed)
{
    EXPECT_EQ(runWell({"find", inside("/"), "--name", "*.txt"}), inside("/docs/a%20b.txt") + "\n");
    EXPECT_NE(runWell({"du", inside("/")}).find("200009"), std::string::npos);
    EXPECT_NE(runWell({"stat", inside("/big")}).find("200000"), std::string::npos);
    EXPECT_NE(runWell({"tree", inside("/")}).find("a b.txt"), std::string::npos);
}

TEST_F(Archive, IsMadeByCopyingIntoIt)
{
    runWell({"cp", "-r", "tree", zip("new.zip", "/")});
    runWell({"cp", "-r", zip("new.zip", "/tree"), "out"});
    EXPECT_TRUE(areEqual("tree", "out"));
    EXPECT_EQ(runProgram({"/usr/bin/env", "unzip", "-tq", "new.zip"}, inFolder()).status, 0);
}

TEST_F(Archive, TakesFilesAndFoldersAndGivesThemUp)
{
    folder.write("file", "content");
    runWell({"cp", "file", inside("/docs/copied")});
    runWell({"mkdir", inside("/made")});
    runWell({"mv", inside("/docs/empty"), inside("/made")});
    runWell({"rm", "-r", inside("/docs/a%20b.txt"), inside("/big")});
    EXPECT_EQ(runWell({"find", inside("/")}), inside("/") + "\n" + inside("/docs") + "\n" + inside("/docs/copied") +
                                                  "\n" + inside("/made") + "\n" + inside("/made/empty") + "\n");
    EXPECT_EQ(runWell({"cat", inside("/docs/copied")}), "content");
}

TEST_F(Archive, TakesStandardInput)
{
    folder.write("input", "put in");
    ProcessOptions options = inFolder();
    options.input = folder / "input";
    EXPECT_EQ(runProgram(command({"put", inside("/put")}), options).status, 0);
    EXPECT_EQ(runWell({"cat", inside("/put")}), "put in");
}

TEST_F(Archive, IsWrittenInAnotherOne)
{
    std::string const deep = "zip:" + zip("outer.zip", "/inner.zip") + "!/x";
    folder.write("file", "content");
    runWell({"cp", "file", deep});
    EXPECT_EQ(runWell({"cat", deep}), "content");
    EXPECT_EQ(runProgram({"/usr/bin/env", "unzip", "-tq", "outer.zip"}, inFolder()).status, 0);
}

TEST_F(Archive, ReceivesWhatIsMoved)
{
    runWell({"mv", "tree", zip("new.zip", "/")});
    EXPECT_FALSE(exists("tree"));
    EXPECT_EQ(runWell({"cat", zip("new.zip", "/tree/docs/a%20b.txt")}), "text of a");
}

TEST_F(Archive, ThatCannotBeWrittenLeavesWhatWasToBeMoved)
{
    folder.write("file", "content");
    runFailing({"mv", "file", "zip:file://" + (folder / "missing/new.zip").string() + "!/"},
               "storage: mv: zip:file://" + (folder / "missing/new.zip").string() +
                   "!/file: the archive cannot be written, and stays as it was: there is no folder to hold it\n");
    EXPECT_TRUE(isFile("file"));
}

/// The first file is copied by the time that the second, which has no end, takes a temporary file.
TEST_F(Archive, IsNotWrittenAfterAnInterrupt)
{
    folder.write("file", "content");
    makeFolder("temporary");
    std::filesystem::create_symlink("/proc/" + std::to_string(::getpid()) + "/pagemap", folder / "endless");
    ::setenv("TMPDIR", (folder / "temporary").c_str(), 1);
    Process process(command({"cp", "-j", "1", "file", "endless", inside("/")}), inFolder());
    auto const deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (!hasTemporaryFile(process) && process.isRunning() && std::chrono::steady_clock::now() < deadline)
        std::this_thread::yield();
    EXPECT_TRUE(hasTemporaryFile(process));
    process.send(SIGINT);
    EXPECT_EQ(process.finish().status, 130);
    EXPECT_EQ(runWell({"ls", inside("/")}), "big\ndocs\n");
}

TEST_F(Archive, LeavesNothingBesideItself)
{
    folder.write("file", "content");
    std::size_t const before = countEntries();
    runWell({"cp", "file", inside("/")});
    EXPECT_EQ(countEntries(), before);
}

TEST_F(Archive, ThatIsDamagedIsToldInPlainWords)
{
    pack({"/usr/bin/env", "zip", "-0qr", "../stored.zip", "docs"}, "tree");
    std::string bytes = folder.read("stored.zip");
    bytes[bytes.find("text of a")] ^= 1;
    folder.write("stored.zip", bytes);
    std::string const file = "zip:file://" + (folder / "stored.zip").string() + "!/docs/a%20b.txt";
    std::string const words = ": damaged: it breaks off, contradicts itself, or does not match its checksum\n";
    runFailing({"cat", file}, "storage: cat: " + file + words);
    runFailing({"cp", file, "out"}, "storage: cp: " + file + words);
}

TEST_F(Archive, WithLinksThatLoopIsToldInPlainWords)
{
    ASSERT_EQ(::symlink("loop", (folder / "tree/loop").c_str()), 0);
    pack({"/usr/bin/env", "zip", "-qry", "../loop.zip", "loop"}, "tree");
    std::string const link = "zip:file://" + (folder / "loop.zip").string() + "!/loop";
    runFailing({"cat", link}, "storage: cat: " + link + ": links in the archive lead to each other without end\n");
}

TEST_F(Archive, IsTheOneThatTheLocationLeadsToOverLinks)
{
    makeFolder("tree/docs/deep");
    ASSERT_EQ(::symlink("tree/docs/deep", (folder / "link").c_str()), 0);
    folder.write("tree/docs/a b.txt", "other");
    pack({"/usr/bin/env", "zip", "-qr", "../tree/docs/a.zip", "docs"}, "tree");
    std::string const other = "zip:file://" + (folder / "link/../a.zip").string() + "!/docs/a%20b.txt";
    EXPECT_EQ(runWell({"cat", inside("/docs/a%20b.txt"), other}), "text of aother");
}

TEST_F(Archive, WithNamesThatMeanHarmIsCopiedBeneathTheTargetOnly)
{
    makeFolder("work");
    makeFolder("work/deep");
    pack({"/usr/bin/env", "python3", "-c",
          "import zipfile\n"
          "with zipfile.ZipFile('../evil.zip', 'w') as z:\n"
          "    for name in ['../../up', '/etc/absolute', '..\\\\..\\\\back', 'C:\\\\drive', 'C:/d', 'e\\033[31m', "
          "'n\\nl']:\n"
          "        z.writestr(name, 'content')\n"},
         "tree");
    runWell({"cp", "-r", "zip:file://" + (folder / "evil.zip").string() + "!/", "work/deep/out"});
    for (auto const* const name :
         {"%2E%2E/%2E%2E/up", "etc/absolute", "..\\..\\back", "C:\\drive", "C:/d", "e\033[31m", "n\nl"})
        EXPECT_EQ(folder.read(std::string("work/deep/out/") + name), "content") << name;
    EXPECT_EQ(runWell({"ls", "work"}), "deep\n");
    EXPECT_EQ(runWell({"ls", "work/deep"}), "out\n");
}

TEST_F(Archive, ThatIsNoneIsToldFromAMissingOne)
{
    folder.write("text.zip", "text");
    std::string const text = "zip:file://" + (folder / "text.zip").string() + "!/";
    std::string const missing = "zip:file://" + (folder / "missing.zip").string() + "!/";
    runFailing({"ls", text}, "storage: ls: " + text + ": not an archive of this format, or its end is missing\n");
    runFailing({"ls", missing}, "storage: ls: " + missing + ": no such file or folder\n");
}

} // namespace
