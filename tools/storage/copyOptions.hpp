#pragma once

#include <tools/storage/CopyRun.hpp>

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace CLI {
class App;
} // namespace CLI

namespace foundation::storage::tool {

/// What the user says of how a run of copies is to be done and told of, as far as `cp` and `mv` share it.
struct TransferOptions
{
    bool isVerbose = false;
    bool isJSON = false;
    bool showsProgress = false;
    bool isSynced = false;
    std::optional<std::size_t> jobs;
};

/// Declares the options; `verbosity` is the help of the one that names what was done.
void addTransferOptions(CLI::App& app, std::string const& verbosity, TransferOptions& options);

Telling tellingOf(TransferOptions const& options);

/// How many copies go on at once.
std::size_t jobsOf(TransferOptions const& options);

/// What arguments name, without those that name nothing.
std::vector<Place> placesOf(Session& session, std::vector<std::string> const& arguments);

} // namespace foundation::storage::tool
