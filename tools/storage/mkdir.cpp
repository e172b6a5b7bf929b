#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>

#include <memory>
#include <storage/provider/Exception.hpp>

namespace foundation::storage::tool {

namespace {

struct Options
{
    std::vector<std::string> folders;
    bool withParents = false;
};

/// A folder that somebody else makes meanwhile is as good.
void makeWithParents(provider::StorageItem const& folder)
{
    if (folder.folderExists())
        return;
    try {
        folder.createFolderRecursive();
    } catch (provider::Exception const& error) {
        if (error.getErrorCode() != provider::ErrorCode::ResourceAlreadyExists || !folder.folderExists())
            throw;
    }
}

void makeAlone(Place const& folder)
{
    try {
        folder.item().createFolder();
    } catch (provider::Exception const& error) {
        if (error.getErrorCode() == provider::ErrorCode::ResourceNotFound)
            throw Failure{folder.text(), "there is no folder to hold it (-p makes it)"};
        throw;
    }
}

void make(Options const& options, Place const& folder)
{
    at(folder, [&] { options.withParents ? makeWithParents(folder.item()) : makeAlone(folder); });
}

} // namespace

Action defineMkdir(CLI::App& app)
{
    auto const options = std::make_shared<Options>();
    addFlag(app, "-p,--parents", options->withParents, "Make missing parents too, and accept folders that exist");
    addOperands(app, "FOLDER...", "Folders to make", 1, options->folders);
    return [options](Session& session) {
        session.forEachPlace(options->folders, [&](Place const& folder) { make(*options, folder); });
    };
}

} // namespace foundation::storage::tool
