#include <tests/tools/storage/ToolTest.hpp>

#include <nlohmann/json.hpp>

namespace {

using Stat = ToolTest;

TEST_F(Stat, TellsWhatIsKnownOfAFile)
{
    folder.write("a b", "12345");
    setTime("a b", 1709210096, 123456789);
    EXPECT_EQ(runWell({"stat", "a b"}), "a b\n"
                                        "  location  file://" +
                                            folder.path().native() +
                                            "/a%20b\n"
                                            "  type      file\n"
                                            "  size      5\n"
                                            "  modified  2024-02-29T12:34:56.123456Z\n"
                                            "  writable  yes\n");
}

TEST_F(Stat, TellsTypesApart)
{
    folder.write("a", "");
    makeFolder("b");
    makeLink("a", "to-a");
    makeLink("b", "to-b");
    makeLink("c", "to-c");
    makePipe("pipe");
    std::vector<std::pair<std::string, std::string>> const rows{
        {"a", "file"},           {"b", "folder"},     {"to-a", "link-to-file"}, {"to-b", "link-to-folder"},
        {"to-c", "broken-link"}, {"pipe", "special"},
    };
    for (auto const& [name, type] : rows) {
        EXPECT_NE(runWell({"stat", name}).find("  type      " + type + "\n"), std::string::npos) << name;
        EXPECT_EQ(nlohmann::json::parse(runWell({"stat", "--json", name}))["type"], type);
    }
}

TEST_F(Stat, OfNothingIsAFailure)
{
    runFailing({"stat", "a"}, "storage: stat: a: no such file or folder\n");
}

TEST_F(Stat, TellsWhetherTheUserMayWrite)
{
    if (!canRunUnprivileged())
        GTEST_SKIP() << "no user without special rights can run the tool where it lies";
    folder.write("a", "");
    std::filesystem::permissions(folder / "a", std::filesystem::perms::others_read);
    EXPECT_EQ(nlohmann::json::parse(runUnprivileged({"stat", "--json", "a"}).output)["writable"], false);
}

} // namespace
