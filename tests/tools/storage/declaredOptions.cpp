#include <tests/tools/storage/declaredOptions.hpp>

#include <tools/storage/commands.hpp>

#include <CLI/App.hpp>
#include <CLI/Config.hpp>
#include <CLI/Formatter.hpp>

std::map<std::string, std::set<std::string>> declaredOptions()
{
    std::map<std::string, std::set<std::string>> result;
    CLI::App tool;
    for (auto const& command : foundation::storage::tool::commands()) {
        CLI::App* const parser = tool.add_subcommand(command.name);
        command.define(*parser);
        for (CLI::Option const* const option : parser->get_options()) {
            for (std::string const& name : option->get_snames())
                result[command.name].insert('-' + name);
            for (std::string const& name : option->get_lnames())
                result[command.name].insert("--" + name);
        }
    }
    return result;
}
