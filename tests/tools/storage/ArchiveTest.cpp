#include <tests/tools/storage/ToolTest.hpp>

#include <tests/support/Process.hpp>

#include <sys/stat.h>

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

    std::string inside(std::string const& path) const
    {
        return "zip:file://" + (folder / "a.zip").string() + "!" + path;
    }
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

TEST_F(Archive, IsNotWrittenTo)
{
    runFailing({"put", inside("/new")}, "storage: put: " + inside("/new") + ": the store is read-only\n");
    runFailing({"rm", inside("/big")}, "storage: rm: " + inside("/big") + ": the store is read-only\n");
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
