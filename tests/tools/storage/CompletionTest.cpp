#include <tests/tools/storage/ToolTest.hpp>
#include <tests/tools/storage/declaredOptions.hpp>

#include <map>
#include <set>
#include <sstream>

namespace {

class Completion : public ToolTest
{
protected:
    using Words = std::set<std::string>;

    /// What bash offers for the last of these words.
    Words inBash(Arguments const& words) const
    {
        folder.write("script", runWell({"completion", "bash"}));
        Arguments line{"/usr/bin/bash", "-c",
                       "compopt() { printf 'compopt %s\\n' \"$*\"; }\n"
                       "source ./script && COMP_WORDS=(\"$@\") COMP_CWORD=$(($# - 1)) && _storage && "
                       "((${#COMPREPLY[@]} == 0)) || printf '%s\\n' \"${COMPREPLY[@]}\"",
                       "bash", "storage"};
        line.insert(line.end(), words.begin(), words.end());
        ProgramResult const result = runProgram(line, inFolder());
        EXPECT_EQ(result.errors, "");
        Words offered;
        std::istringstream lines(result.output);
        for (std::string word; std::getline(lines, word);)
            EXPECT_TRUE(offered.insert(word).second) << word;
        return offered;
    }

    /// Bash itself completes paths then.
    Words const paths{"compopt -o default"};
    Words const nothing{};
};

std::string sectionOf(std::string const& text, std::string const& begin, std::string const& end)
{
    std::size_t const start = text.find(begin);
    return start == std::string::npos ? "" : text.substr(start, text.find(end, start) - start);
}

TEST_F(Completion, OffersCommandsFirst)
{
    Words expected{"-h", "--help", "--version"};
    for (auto const& [command, options] : declaredOptions())
        expected.insert(command);
    EXPECT_EQ(inBash({""}), expected);
    EXPECT_EQ(inBash({"mk"}), (Words{"mkdir"}));
    EXPECT_EQ(inBash({"--v"}), (Words{"--version"}));
}

TEST_F(Completion, OffersEveryOptionOfACommand)
{
    for (auto const& [command, options] : declaredOptions())
        EXPECT_EQ(inBash({command, "-"}), options) << command;
    EXPECT_EQ(inBash({"ls", "a", "--lo"}), (Words{"--long"}));
}

TEST_F(Completion, LeavesPathsToTheShell)
{
    EXPECT_EQ(inBash({"ls", ""}), paths);
    EXPECT_EQ(inBash({"cp", "-r", "a", "b"}), paths);
    EXPECT_EQ(inBash({"ls", "--", "-"}), paths);
    EXPECT_EQ(inBash({"ls", "--", "--sort", "n"}), paths);
}

TEST_F(Completion, OffersTheWordsThatAValueMayBe)
{
    EXPECT_EQ(inBash({"ls", "--sort", ""}), (Words{"name", "size", "time"}));
    EXPECT_EQ(inBash({"ls", "--sort", "=", "t"}), (Words{"time"}));
    EXPECT_EQ(inBash({"ls", "--sort", "="}), (Words{"name", "size", "time"}));
    EXPECT_EQ(inBash({"find", "-t", "fo"}), (Words{"folder"}));
    EXPECT_EQ(inBash({"completion", ""}), (Words{"bash", "fish", "zsh"}));
}

TEST_F(Completion, OffersNothingWhereAnythingMayStandThatIsNoPath)
{
    EXPECT_EQ(inBash({"find", "--name", ""}), nothing);
    EXPECT_EQ(inBash({"find", "-d", ""}), nothing);
    EXPECT_EQ(inBash({"man", ""}), nothing);
    EXPECT_EQ(inBash({"unknown", ""}), nothing);
}

TEST_F(Completion, OfBashBelongsToTheTool)
{
    folder.write("script", runWell({"completion", "bash"}));
    ProgramResult const result =
        runProgram({"/usr/bin/bash", "-c", "source ./script && complete -p storage"}, inFolder());
    EXPECT_EQ(result.output, "complete -F _storage storage\n");
    EXPECT_EQ(result.errors, "");
}

TEST_F(Completion, OfZshHasEveryOptionOfEveryCommand)
{
    std::string const script = runWell({"completion", "zsh"});
    EXPECT_TRUE(script.starts_with("#compdef storage\n"));
    for (auto const& [command, options] : declaredOptions()) {
        EXPECT_NE(script.find("\n            '" + command + ':'), std::string::npos) << command;
        std::string const section = sectionOf(script, "\n        " + command + ")\n", ";;\n");
        for (std::string const& option : options) {
            std::size_t const flag = section.find(')' + option + '[');
            std::size_t const withValue = section.find("'*" + option + (option[1] == '-' ? "=[" : "+["));
            EXPECT_TRUE((flag == std::string::npos) != (withValue == std::string::npos)) << command << option;
        }
    }
    EXPECT_NE(script.find(":value:(name size time)'"), std::string::npos);
    EXPECT_NE(script.find("are those of the shell]:value: '"), std::string::npos);
    EXPECT_NE(script.find("\\[a-z\\]"), std::string::npos);
}

TEST_F(Completion, OfFishHasEveryOptionOfEveryCommand)
{
    std::string const script = runWell({"completion", "fish"}) + "complete";
    for (auto const& [command, options] : declaredOptions()) {
        EXPECT_NE(script.find("-n __storage_has_no_command -a " + command + " -d '"), std::string::npos) << command;
        std::string lines;
        std::istringstream all(script);
        for (std::string line; std::getline(all, line);)
            lines += line.starts_with("complete -c storage -n '__storage_command_is " + command + "'") ? line : "";
        for (std::string const& option : options) {
            bool const isLong = option.starts_with("--");
            std::string const name = isLong ? " -l " + option.substr(2) : " -s " + option.substr(1);
            EXPECT_NE(lines.find(name + ' '), std::string::npos) << command << option;
        }
    }
    EXPECT_NE(script.find(" -l sort -x -a 'name size time' -d 'Sort, "), std::string::npos);
    EXPECT_NE(script.find("'__storage_command_is ls' -F\n"), std::string::npos);
    EXPECT_EQ(script.find("'__storage_command_is man' -F\n"), std::string::npos);
}

TEST_F(Completion, OfAShellThatIsUnknownIsMisuse)
{
    ProgramResult const result = run({"completion", "tcsh"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.errors, "storage: completion: SHELL: tcsh not in {bash,fish,zsh}\n"
                             "storage: 'storage completion --help' says more\n");
}

} // namespace
