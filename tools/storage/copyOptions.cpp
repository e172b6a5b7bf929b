#include <tools/storage/copyOptions.hpp>

#include <tools/storage/arguments.hpp>

#include <algorithm>
#include <thread>

namespace foundation::storage::tool {

namespace {

constexpr std::size_t maximumJobs = 256;

} // namespace

void addTransferOptions(CLI::App& app, std::string const& verbosity, TransferOptions& options)
{
    addFlag(app, "-v,--verbose", options.isVerbose, verbosity);
    addFlag(app, "--json", options.isJSON, "Print one JSON object a line for each, failed ones too");
    addFlag(app, "--progress", options.showsProgress,
            "Say each second how far it is, also where standard error is no terminal");
    addSyncFlag(app, options.isSynced);
    addNumber(app, "-j,--jobs", "N", "Copy so many files at once; otherwise as many as there are processors",
              options.jobs, {.least = 1, .most = maximumJobs});
}

Telling tellingOf(TransferOptions const& options)
{
    if (options.isJSON)
        return Telling::JSON;
    return options.isVerbose ? Telling::Names : Telling::Nothing;
}

std::size_t jobsOf(TransferOptions const& options)
{
    std::size_t const asked = options.jobs.value_or(std::thread::hardware_concurrency());
    return std::clamp<std::size_t>(asked, 1, maximumJobs);
}

std::vector<Place> placesOf(Session& session, std::vector<std::string> const& arguments)
{
    std::vector<Place> places;
    for (std::string const& argument : arguments) {
        try {
            places.push_back(session.stores().open(argument));
        } catch (Failure const&) {
            // Complained about when it is its turn.
        }
    }
    return places;
}

} // namespace foundation::storage::tool
