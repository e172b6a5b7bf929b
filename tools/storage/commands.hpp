#pragma once

#include <tools/storage/Command.hpp>

#include <span>

namespace foundation::storage::tool {

Action defineCat(CLI::App& app);
Action defineClean(CLI::App& app);
Action defineCompletion(CLI::App& app);
Action defineCp(CLI::App& app);
Action defineDu(CLI::App& app);
Action defineFind(CLI::App& app);
Action defineLs(CLI::App& app);
Action defineMan(CLI::App& app);
Action defineMkdir(CLI::App& app);
Action defineMv(CLI::App& app);
Action definePut(CLI::App& app);
Action defineRm(CLI::App& app);
Action defineSchemes(CLI::App& app);
Action defineStat(CLI::App& app);
Action defineTree(CLI::App& app);
Action defineWatch(CLI::App& app);

/// Every command, in the order of the help.
std::span<Command const> commands();

} // namespace foundation::storage::tool
