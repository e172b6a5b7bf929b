#include <tools/storage/completion.hpp>

#include <fmt/format.h>
#include <fmt/ranges.h>

namespace foundation::storage::tool {

namespace {

constexpr char const* end = R"(        esac
        ;;
    esac
    return found
}

# Loaded by zsh itself, the file is the function; read by hand, it makes it.
if [[ $funcstack[1] == _storage ]]; then
    _storage "$@"
else
    compdef _storage storage
fi
)";

std::string quoted(std::string_view text)
{
    std::string result = "'";
    for (char const c : text)
        result += c == '\'' ? std::string("'\\''") : std::string(1, c);
    return result + '\'';
}

std::string inBrackets(std::string_view description)
{
    std::string result = "[";
    for (char const c : description) {
        if (c == '[' || c == ']' || c == '\\')
            result += '\\';
        result += c;
    }
    return result + ']';
}

/// A value is the next word, or follows a "=" or the letter of a short option.
std::string specificationOf(OptionDefinition const& option, std::string const& name)
{
    std::string const description = inBrackets(option.description);
    if (option.value.empty())
        return quoted(fmt::format("({}){}{}", fmt::join(option.names, " "), name, description));
    std::string const values = option.choices.empty() ? " " : fmt::format("({})", fmt::join(option.choices, " "));
    return quoted(fmt::format("*{}{}{}:value:{}", name, name.starts_with("--") ? "=" : "+", description, values));
}

std::string specificationOf(OperandDefinition const& operand)
{
    return operand.choices.empty() ? "'*:location:_files'"
                                   : quoted(fmt::format("1:value:({})", fmt::join(operand.choices, " ")));
}

std::vector<std::string> specificationsOf(CommandDefinition const& command)
{
    std::vector<std::string> result;
    for (OptionDefinition const& option : command.options) {
        for (std::string const& name : option.names)
            result.push_back(specificationOf(option, name));
    }
    for (OperandDefinition const& operand : command.operands)
        result.push_back(specificationOf(operand));
    return result;
}

std::string caseOf(CommandDefinition const& command)
{
    constexpr char const* separator = " \\\n                ";
    return fmt::format("        {})\n            _arguments -s -S{}{} && found=0\n            ;;\n", command.name,
                       separator, fmt::join(specificationsOf(command), separator));
}

std::string beginningOf(CommandDefinition const& tool, std::vector<CommandDefinition> const& commands)
{
    std::string text = "#compdef storage\n"
                       "# Completion of storage for zsh. Loaded by hand: source <(storage completion zsh)\n\n"
                       "_storage()\n{\n"
                       "    local curcontext=$curcontext state state_descr line found=1\n"
                       "    typeset -A opt_args\n"
                       "    _arguments -C -s -S \\\n";
    for (std::string const& specification : specificationsOf(tool))
        text += "        " + specification + " \\\n";
    text += "        '1:command:->command' \\\n"
            "        '*::argument:->argument' && found=0\n"
            "    case $state in\n"
            "    command)\n"
            "        local -a commands=(\n";
    for (CommandDefinition const& command : commands)
        text += "            " + quoted(command.name + ':' + command.summary) + '\n';
    return text + "        )\n"
                  "        _describe -t commands command commands && found=0\n"
                  "        ;;\n"
                  "    argument)\n"
                  "        case $words[1] in\n";
}

} // namespace

std::string makeZshCompletion(CommandDefinition const& tool, std::vector<CommandDefinition> const& commands)
{
    std::string text = beginningOf(tool, commands);
    for (CommandDefinition const& command : commands)
        text += caseOf(command);
    return text + end;
}

} // namespace foundation::storage::tool
