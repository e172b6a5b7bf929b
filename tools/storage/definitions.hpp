#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
} // namespace CLI

namespace foundation::storage::tool {

/// An option of the command line as it was declared.
struct OptionDefinition
{
    std::vector<std::string> names;   ///< with their dashes: "-r", "--recursive"
    std::string value;                ///< how the help calls its value; empty for a flag
    std::vector<std::string> choices; ///< the words that the value may be; empty when it may be any
    std::string description;
};

/// The operands of a command, all in one.
struct OperandDefinition
{
    std::string name;                 ///< as in the usage line: "[PATH...]"
    std::vector<std::string> choices; ///< the words that an operand may be; empty when it is a location
    std::string description;
};

struct CommandDefinition
{
    std::string name;
    std::string summary;
    std::vector<OptionDefinition> options;
    std::vector<OperandDefinition> operands; ///< one or none
};

/// What was declared of a command, or for the tool itself, of the options that stand without a command.
CommandDefinition definitionOf(CLI::App const& app);

/// What was declared of each command of the tool, in the order of the help.
std::vector<CommandDefinition> definitionsOfCommands(CLI::App const& tool);

} // namespace foundation::storage::tool
