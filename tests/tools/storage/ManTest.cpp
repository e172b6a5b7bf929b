#include <tests/tools/storage/ToolTest.hpp>
#include <tests/tools/storage/declaredOptions.hpp>

namespace {

using Man = ToolTest;

std::string inRoff(std::string text)
{
    for (std::size_t i = text.find('-'); i != std::string::npos; i = text.find('-', i + 2))
        text.insert(i, "\\");
    return text;
}

TEST_F(Man, HasEveryOptionOfEveryCommand)
{
    std::string const page = runWell({"man"});
    for (auto const& [command, options] : declaredOptions()) {
        std::size_t const begin = page.find("\n.SS storage " + command + " ");
        ASSERT_NE(begin, std::string::npos) << command;
        std::string const section = page.substr(begin, page.find("\n.S", begin + 1) - begin);
        for (std::string const& option : options)
            EXPECT_NE(section.find("\\fB" + inRoff(option) + "\\fR"), std::string::npos) << command << option;
    }
}

TEST_F(Man, IsTypesetWithoutWarnings)
{
    folder.write("storage.1", runWell({"man"}));
    ProgramResult const result =
        runProgram({"/usr/bin/groff", "-man", "-ww", "-Tascii", "-P-bcou", "storage.1"}, inFolder());
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.errors, "");
    EXPECT_NE(result.output.find("ls [OPTION]... [PATH...]"), std::string::npos);
    EXPECT_NE(result.output.find("the store's"), std::string::npos);
    EXPECT_NE(result.output.find("* ? and [a-z] are"), std::string::npos);
}

TEST_F(Man, TellsItsVersion)
{
    std::string version = runWell({"--version"});
    version.pop_back();
    EXPECT_TRUE(runWell({"man"}).starts_with(".TH STORAGE 1 \"\" \"" + version + "\" \"User Commands\"\n"));
}

} // namespace
