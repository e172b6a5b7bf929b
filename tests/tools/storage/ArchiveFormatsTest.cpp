#include <tests/tools/storage/ToolTest.hpp>

#include <tests/support/Process.hpp>

#include <filesystem>
#include <string>
#include <vector>

namespace {

using foundation::tests::support::runProgram;

/// How the tree is packed, and as what it is read.
struct Format
{
    std::string scheme;
    std::string file;
    std::vector<std::string> command;
};

class ArchiveFormats : public ToolTest
{
protected:
    ArchiveFormats()
    {
        makeFolder("tree");
        makeFolder("tree/docs");
        makeFolder("tree/docs/empty");
        folder.write("tree/docs/a b.txt", "text of a");
        folder.write("tree/big", std::string(200'000, 'b'));
    }

    void pack(Arguments const& command, std::string const& from = "tree") const
    {
        Arguments program{"/usr/bin/env"}; // which finds the program
        program.insert(program.end(), command.begin(), command.end());
        ASSERT_EQ(runProgram(program, {.workingFolder = folder / from}).status, 0);
    }

    std::string inside(Format const& format, std::string const& path) const
    {
        return format.scheme + ":file://" + (folder / format.file).string() + "!" + path;
    }

    static std::vector<Format> all()
    {
        return {{"tar", "a.tar", {"tar", "-cf", "../a.tar", "big", "docs"}},
                {"tar", "a.tar.gz", {"tar", "-czf", "../a.tar.gz", "big", "docs"}},
                {"tar", "a.tar.bz2", {"tar", "-cjf", "../a.tar.bz2", "big", "docs"}},
                {"tar", "a.tar.xz", {"tar", "-cJf", "../a.tar.xz", "big", "docs"}},
                {"tar", "a.tar.zst", {"tar", "--zstd", "-cf", "../a.tar.zst", "big", "docs"}},
                {"7z", "a.7z", {"7z", "a", "../a.7z", "big", "docs"}},
                {"iso", "a.iso", {"genisoimage", "-quiet", "-R", "-o", "../a.iso", "."}},
                {"cpio", "a.cpio", {"sh", "-c", "find big docs | cpio --quiet -o -H newc >../a.cpio"}}};
    }
};

TEST_F(ArchiveFormats, AreListedReadAndCopiedOut)
{
    for (Format const& format : all()) {
        SCOPED_TRACE(format.file);
        pack(format.command);
        EXPECT_EQ(runWell({"ls", "--sort=name", inside(format, "/")}), "big\ndocs\n");
        EXPECT_EQ(runWell({"ls", inside(format, "/docs/empty")}), "");
        EXPECT_EQ(runWell({"cat", inside(format, "/docs/a%20b.txt")}), "text of a");
        std::string const out = "out of " + format.file;
        runWell({"cp", "-r", inside(format, "/"), out});
        EXPECT_TRUE(areEqual("tree", out));
    }
}

TEST_F(ArchiveFormats, AreSearchedCountedAndDescribed)
{
    for (Format const& format : all()) {
        SCOPED_TRACE(format.file);
        pack(format.command);
        EXPECT_NE(runWell({"find", inside(format, "/"), "--name", "*.txt"}).find("!/docs/a%20b.txt\n"),
                  std::string::npos);
        EXPECT_NE(runWell({"du", inside(format, "/")}).find("200009"), std::string::npos);
        EXPECT_NE(runWell({"stat", inside(format, "/big")}).find("200000"), std::string::npos);
        EXPECT_NE(runWell({"tree", inside(format, "/")}).find("a b.txt"), std::string::npos);
    }
}

TEST_F(ArchiveFormats, LieWithinEachOther)
{
    makeFolder("inner");
    pack({"tar", "-czf", "../inner/inner.tar.gz", "docs"});
    pack({"zip", "-qr", "../outer.zip", "inner.tar.gz"}, "inner");
    pack({"7z", "a", "../outer.7z", "inner.tar.gz"}, "inner");
    std::string const outer = "file://" + (folder / "outer").string();
    EXPECT_EQ(runWell({"cat", "tar:zip:" + outer + ".zip!/inner.tar.gz!/docs/a%20b.txt"}), "text of a");
    EXPECT_EQ(runWell({"cat", "tar:7z:" + outer + ".7z!/inner.tar.gz!/docs/a%20b.txt"}), "text of a");
}

TEST_F(ArchiveFormats, AreNotWrittenTo)
{
    for (Format const& format : all()) {
        SCOPED_TRACE(format.file);
        pack(format.command);
        std::string const place = inside(format, "/new");
        runFailing({"put", place}, "storage: put: " + place + ": the store is read-only\n");
    }
}

TEST_F(ArchiveFormats, ThatBreakOffAreReadAsFarAsTheyGo)
{
    pack({"tar", "-cf", "../a.tar", "docs/a b.txt", "big"});
    std::filesystem::resize_file(folder / "a.tar", 5000);
    Format const format{"tar", "a.tar", {}};
    EXPECT_EQ(runWell({"cat", inside(format, "/docs/a%20b.txt")}), "text of a");
    EXPECT_EQ(run({"cat", inside(format, "/big")}).status, 1);
    EXPECT_EQ(run({"ls", inside(format, "/")}).status, 1);
}

} // namespace
