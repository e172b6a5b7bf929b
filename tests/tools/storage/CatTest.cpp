#include <tests/tools/storage/ToolTest.hpp>

namespace {

using Cat = ToolTest;

TEST_F(Cat, WritesFilesOneAfterTheOther)
{
    folder.write("a", "first");
    folder.write("b", std::string("\0second", 7));
    EXPECT_EQ(runWell({"cat", "a", "b", "a"}), "first" + std::string("\0second", 7) + "first");
}

TEST_F(Cat, WritesFilesLargerThanAnyBuffer)
{
    std::string content;
    while (content.size() < 3'000'000)
        content += std::to_string(content.size());
    folder.write("a", content);
    EXPECT_EQ(runWell({"cat", "a"}), content);
}

TEST_F(Cat, WritesTheFileBehindALink)
{
    folder.write("a", "content");
    makeLink("a", "b");
    EXPECT_EQ(runWell({"cat", "b"}), "content");
}

TEST_F(Cat, ReportsWhatCannotBeReadAndWritesTheRest)
{
    folder.write("a", "content");
    makeFolder("b");
    makePipe("c");
    makeLink("x", "d");
    std::string const output =
        runFailing({"cat", "b", "c", "d", "e", "a"}, "storage: cat: b: a folder\n"
                                                     "storage: cat: c: a special file, not read\n"
                                                     "storage: cat: d: no such file or folder\n"
                                                     "storage: cat: e: no such file or folder\n");
    EXPECT_EQ(output, "content");
}

} // namespace
