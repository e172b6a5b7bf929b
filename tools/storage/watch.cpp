#include <tools/storage/Session.hpp>
#include <tools/storage/Watcher.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/eventLines.hpp>

#include <memory>

namespace foundation::storage::tool {

Action defineWatch(CLI::App& app)
{
    auto const options = std::make_shared<WatchOptions>();
    addFlag(app, "-r,--recursive", options->isRecursive, "Also watch all folders below, and those made later");
    addChoices(app, "-k,--kind", "Only events of this kind, or of one of several that are given", eventWords(),
               options->kinds);
    addNumber(app, "-c,--count", "N", "End after N events", options->count);
    addFlag(app, "-a,--all", options->isAll, "Also tell of scratch files, of writes that are not finished");
    addFlag(app, "--time", options->tellsTime, "Print the time (UTC) of each event");
    addFlag(app, "--json", options->isJSON, "Print one JSON object a line for each event");
    addOperands(app, "PATH...", "Folders to watch, and files", 1, options->paths);
    return [options](Session& session) {
        Watcher watcher(session, *options);
        session.forEachPlace(options->paths, [&](Place const& place) { watcher.add(place); });
        watcher.run();
    };
}

} // namespace foundation::storage::tool
