#include <tools/storage/FolderEnd.hpp>

#include <storage/local/folderCopies.hpp>
#include <storage/provider/Exception.hpp>
#include <tools/storage/FileCopier.hpp>
#include <tools/storage/describe.hpp>
#include <tools/storage/physicalPath.hpp>

namespace foundation::storage::tool {

namespace {

/// Calls `action` with both locations; a failure is one of the end that it names.
template <typename Action>
void betweenLocalFolders(Place const& source, Place const& target, Action const& action)
{
    provider::StorageIRI const from = source.item().getLocation();
    provider::StorageIRI const to = target.item().getLocation();
    try {
        action(from, to);
    } catch (provider::Exception const& error) {
        rethrowAsFailure(error.getStorageIRI() == to ? target : source);
    } catch (std::exception const&) {
        rethrowAsFailure(source);
    }
}

} // namespace

void FolderEnd::finish() const
{
    if (isLocal(source) && isLocal(target)) {
        local::FolderCopyOptions const options{.keepsPermissions = isNew, .keepsMetadata = keepsMetadata};
        betweenLocalFolders(source, target,
                            [&](auto const& from, auto const& to) { local::finishFolderCopy(from, to, options); });
    } else if (keepsMetadata) {
        keepTime(at(source, [&] { return source.item().getFolderAttributes().getLastModified(); }), target);
    }
}

void beginFolder(Place const& source, Place const& target)
{
    if (isLocal(source) && isLocal(target))
        betweenLocalFolders(source, target, local::prepareFolderCopy);
}

} // namespace foundation::storage::tool
