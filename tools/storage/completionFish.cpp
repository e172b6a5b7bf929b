#include <tools/storage/completion.hpp>

#include <fmt/format.h>
#include <fmt/ranges.h>

namespace foundation::storage::tool {

namespace {

constexpr char const* beginning = R"(# Completion of storage for fish. Loaded by hand: storage completion fish | source

function __storage_has_no_command
    test (count (commandline -opc)) -eq 1
end

function __storage_command_is
    set -l words (commandline -opc)
    test (count $words) -gt 1; and test $words[2] = $argv[1]
end

complete -c storage -f
)";

std::string quoted(std::string_view text)
{
    std::string result = "'";
    for (char const c : text) {
        if (c == '\'' || c == '\\')
            result += '\\';
        result += c;
    }
    return result + '\'';
}

std::string optionName(std::string const& name)
{
    return name.starts_with("--") ? "-l " + name.substr(2) : "-s " + name.substr(1);
}

std::string lineOf(std::string const& condition, OptionDefinition const& option)
{
    std::string line = "complete -c storage -n " + quoted(condition);
    for (std::string const& name : option.names)
        line += ' ' + optionName(name);
    if (!option.value.empty())
        line += " -x";
    if (!option.choices.empty())
        line += fmt::format(" -a '{}'", fmt::join(option.choices, " "));
    return line + " -d " + quoted(option.description) + '\n';
}

std::string lineOf(std::string const& condition, OperandDefinition const& operand)
{
    std::string const words = operand.choices.empty() ? "-F" : fmt::format("-a '{}'", fmt::join(operand.choices, " "));
    return fmt::format("complete -c storage -n {} {}\n", quoted(condition), words);
}

std::string linesOf(std::string const& condition, CommandDefinition const& command)
{
    std::string lines;
    for (OptionDefinition const& option : command.options)
        lines += lineOf(condition, option);
    for (OperandDefinition const& operand : command.operands)
        lines += lineOf(condition, operand);
    return lines;
}

} // namespace

std::string makeFishCompletion(CommandDefinition const& tool, std::vector<CommandDefinition> const& commands)
{
    constexpr char const* noCommand = "__storage_has_no_command";
    std::string text = beginning + linesOf(noCommand, tool);
    for (CommandDefinition const& command : commands)
        text +=
            fmt::format("complete -c storage -n {} -a {} -d {}\n", noCommand, command.name, quoted(command.summary)) +
            linesOf("__storage_command_is " + command.name, command);
    return text;
}

} // namespace foundation::storage::tool
