#include <tools/storage/definitions.hpp>

#include <tools/storage/arguments.hpp>

#include <CLI/App.hpp>

namespace foundation::storage::tool {

namespace {

/// "{name,size,time}" holds three words; other names of values hold none.
std::vector<std::string> wordsOf(std::string const& value)
{
    std::vector<std::string> words;
    if (value.starts_with('{') && value.ends_with('}'))
        words = CLI::detail::split(value.substr(1, value.size() - 2), ',');
    return words;
}

std::vector<std::string> namesOf(CLI::Option const& option)
{
    std::vector<std::string> names;
    for (std::string const& name : option.get_snames())
        names.push_back('-' + name);
    for (std::string const& name : option.get_lnames())
        names.push_back("--" + name);
    return names;
}

} // namespace

CommandDefinition definitionOf(CLI::App const& app)
{
    CommandDefinition command{app.get_name(), app.get_description(), {}, {}};
    for (CLI::Option const* const option : app.get_options()) {
        std::string const value = valueName(*option);
        if (option->get_positional())
            command.operands.push_back({option->get_name(true), wordsOf(value), option->get_description()});
        else
            command.options.push_back({namesOf(*option), value, wordsOf(value), option->get_description()});
    }
    return command;
}

std::vector<CommandDefinition> definitionsOfCommands(CLI::App const& tool)
{
    std::vector<CommandDefinition> commands;
    for (CLI::App const* const command : tool.get_subcommands(nullptr))
        commands.push_back(definitionOf(*command));
    return commands;
}

} // namespace foundation::storage::tool
