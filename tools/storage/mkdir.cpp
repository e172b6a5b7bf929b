#include <tools/storage/Session.hpp>
#include <tools/storage/arguments.hpp>
#include <tools/storage/commands.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/kinds.hpp>

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
void makeWithParents(Place const& folder)
{
    if (folder.item().folderExists())
        return;
    try {
        folder.item().createFolderRecursive();
    } catch (provider::Exception const& error) {
        if (error.getErrorCode() != provider::ErrorCode::ResourceAlreadyExists)
            throw;
        if (folder.item().folderExists())
            return;
        bool const isAbove = kindOf(folder) == Kind::None;
        throw Failure{folder.text(),
                      isAbove ? "something above it is not a folder" : "exists already, and is not a folder"};
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
    at(folder, [&] { options.withParents ? makeWithParents(folder) : makeAlone(folder); });
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
