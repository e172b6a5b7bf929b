#include <tools/storage/Session.hpp>
#include <tools/storage/TreeRemover.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/interrupt.hpp>
#include <tools/storage/kinds.hpp>
#include <tools/storage/physicalPath.hpp>

#include <memory>

namespace foundation::storage::tool {

namespace {

struct Options
{
    std::vector<std::string> paths;
    bool isRecursive = false;
    bool ignoresMissing = false;
};

void requireRemovableFolder(Options const& options, Place const& folder)
{
    std::u16string const name = folder.item().getName();
    if (name == u"." || name == u"..")
        throw Failure{folder.text(), "'.' and '..' are not removed"};
    if (!folder.item().hasParent() || physicalPath(folder) == u"/")
        throw Failure{folder.text(), "the root is not removed"};
    if (!options.isRecursive)
        throw Failure{folder.text(), "a folder (-r removes folders and all they hold)"};
}

void remove(Session& session, Options const& options, Place const& place)
{
    checkInterrupt();
    Kind const kind = kindOf(place);
    if (kind == Kind::None && options.ignoresMissing)
        return;
    requireKindAsSaid(place, kind);
    if (kind == Kind::RegularFolder) {
        requireRemovableFolder(options, place);
        TreeRemover(session).remove(place);
        return;
    }
    at(place, [&] { place.item().removeFile(); });
}

} // namespace

Action defineRm(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "-r,-R,--recursive", options->isRecursive, "Also remove folders, with all they hold");
    addFlag(app, "-f,--force", options->ignoresMissing, "Pass over what is not there");
    addOperands(app, "PATH...", "Files and folders to remove; of a link, the link itself", 1, options->paths);
    return [options](Session& session) {
        session.forEachPlace(options->paths, [&](Place const& place) { remove(session, *options, place); });
    };
}

} // namespace foundation::storage::tool
