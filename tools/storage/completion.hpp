#pragma once

#include <tools/storage/definitions.hpp>

#include <string>
#include <vector>

namespace foundation::storage::tool {

/// Scripts that have a shell complete commands, options, their values and paths. `tool` holds what stands without a
/// command.
std::string makeBashCompletion(CommandDefinition const& tool, std::vector<CommandDefinition> const& commands);
std::string makeZshCompletion(CommandDefinition const& tool, std::vector<CommandDefinition> const& commands);
std::string makeFishCompletion(CommandDefinition const& tool, std::vector<CommandDefinition> const& commands);

} // namespace foundation::storage::tool
