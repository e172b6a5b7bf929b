#include <tests/tools/storage/ToolTest.hpp>

#include <nlohmann/json.hpp>

#include <string>
#include <sys/xattr.h>
#include <unistd.h>

namespace {

class Stat : public ToolTest
{
protected:
    void setAttribute(std::string const& file, char const* name, std::string const& value) const
    {
        ASSERT_EQ(::setxattr((folder / file).c_str(), name, value.data(), value.size(), 0), 0);
    }
};

TEST_F(Stat, TellsWhatIsKnownOfAFile)
{
    folder.write("a b", "12345");
    setTime("a b", 1709210096, 123456789);
    std::string const told = runWell({"stat", "a b"});
    std::string const common = "a b\n"
                               "  location   file://" +
                               folder.path().native() +
                               "/a%20b\n"
                               "  type       file\n"
                               "  size       5\n"
                               "  modified   2024-02-29T12:34:56.123456Z\n"
                               "  writable   yes\n";
    EXPECT_EQ(told.substr(0, common.size()), common);
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
        EXPECT_NE(runWell({"stat", name}).find("  type       " + type + "\n"), std::string::npos) << name;
        EXPECT_EQ(nlohmann::json::parse(runWell({"stat", "--json", name}))["type"], type);
    }
}

TEST_F(Stat, TellsExtendedAttributes)
{
    folder.write("a", "12345");
    std::filesystem::permissions(folder / "a", std::filesystem::perms(0640));
    std::filesystem::create_hard_link(folder / "a", folder / "b");
    setAttribute("a", "user.comment", "two\nlines \xff");
    std::string const told = runWell({"stat", "a"});
    EXPECT_NE(told.find("\n  mode       0640\n"), std::string::npos) << told;
    EXPECT_NE(told.find("\n  links      2\n"), std::string::npos) << told;
    EXPECT_NE(told.find("\n  uid        " + std::to_string(::geteuid()) + '\n'), std::string::npos) << told;
    EXPECT_NE(told.find("\n  user.comment two\\nlines \\377\n"), std::string::npos) << told;
}

TEST_F(Stat, TellsExtendedAttributesAsJSON)
{
    folder.write("a", "12345");
    std::filesystem::permissions(folder / "a", std::filesystem::perms(0640));
    setAttribute("a", "user.comment", "two\nlines \xff");
    nlohmann::json const told = nlohmann::json::parse(runWell({"stat", "--json", "a"}))["attributes"];
    EXPECT_EQ(told["mode"], "0640");
    EXPECT_EQ(told["links"], 1);
    EXPECT_EQ(told["uid"], ::geteuid());
    EXPECT_TRUE(told["inode"].is_number());
    EXPECT_EQ(told["changeTime"].get<std::string>().size(), std::string("2024-02-29T12:34:56.123456Z").size());
    EXPECT_EQ(told["user.comment"], "two\nlines \uEFFF");
}

TEST_F(Stat, TellsNoExtendedAttributesOfABrokenLink)
{
    makeLink("nothing", "a");
    EXPECT_FALSE(nlohmann::json::parse(runWell({"stat", "--json", "a"})).contains("attributes"));
    EXPECT_EQ(runWell({"stat", "a"}).find("mode"), std::string::npos);
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
