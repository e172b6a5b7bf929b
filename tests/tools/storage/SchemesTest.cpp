#include <tests/tools/storage/ToolTest.hpp>

#include <algorithm>
#include <map>
#include <nlohmann/json.hpp>
#include <sstream>

namespace {

using Schemes = ToolTest;

std::vector<std::string> linesOf(std::string const& text)
{
    std::vector<std::string> lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);)
        lines.push_back(line);
    return lines;
}

TEST_F(Schemes, ListsWhatIsServedByName)
{
    std::vector<std::string> const lines = linesOf(runWell({"schemes"}));
    EXPECT_EQ(std::count(lines.begin(), lines.end(), "file          physical"), 1);
    EXPECT_EQ(std::count(lines.begin(), lines.end(), "mem           physical"), 1);
    EXPECT_TRUE(std::is_sorted(lines.begin(), lines.end()));
}

TEST_F(Schemes, SaysTheSameInJSON)
{
    std::map<std::string, std::string> kinds;
    for (std::string const& line : linesOf(runWell({"schemes", "--json"}))) {
        auto const object = nlohmann::json::parse(line);
        EXPECT_EQ(object.size(), 2U);
        EXPECT_TRUE(kinds.emplace(object["scheme"], object["kind"]).second);
    }
    std::map<std::string, std::string> listed;
    for (std::string const& line : linesOf(runWell({"schemes"})))
        listed.emplace(line.substr(0, line.find(' ')), line.substr(line.rfind(' ') + 1));
    EXPECT_EQ(kinds, listed);
}

TEST_F(Schemes, TakesNoOperands)
{
    EXPECT_EQ(run({"schemes", "file"}).status, 2);
}

} // namespace
