#include <storage/local/folderCopies.hpp>

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/copyFailure.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/metadata.hpp>

#include <fcntl.h>

namespace foundation::storage::local {

using namespace detail;
using provider::StorageIRI;

namespace {

constexpr mode_t permissionBits = 0777;

struct OpenedFolder
{
    explicit OpenedFolder(StorageIRI const& location) : iri(location)
    {
        int error = Root().open(Root().pathOf(iri), O_RDONLY | O_DIRECTORY | O_NOFOLLOW, folder);
        if (error == 0)
            error = getStatus(folder, status);
        if (error != 0)
            throwError(error, iri);
    }

    mode_t permissions() const { return status.stx_mode & permissionBits; }

    void setPermissions(mode_t mode) const
    {
        int const error = mode == permissions() ? 0 : errorOf([&] { return systemCalls().fchmod(folder.get(), mode); });
        if (error != 0)
            throwError(error, iri);
    }

    StorageIRI const& iri;
    FileDescriptor folder;
    Status status;
};

void keepTime(OpenedFolder const& source, OpenedFolder const& target)
{
    statx_timestamp const& time = source.status.stx_mtime;
    if (int const error = setModified(target.folder, {.tv_sec = time.tv_sec, .tv_nsec = time.tv_nsec}))
        throwError(error, target.iri);
}

} // namespace

/// What the target has by now is all that the umask lets it have.
void prepareFolderCopy(StorageIRI const& source, StorageIRI const& target)
{
    OpenedFolder const original(source);
    OpenedFolder const copy(target);
    copy.setPermissions((original.permissions() & copy.permissions()) | S_IRWXU);
}

void finishFolderCopy(StorageIRI const& source, StorageIRI const& target, FolderCopyOptions const& options)
{
    OpenedFolder const original(source);
    OpenedFolder const copy(target);
    if (options.keepsMetadata)
        requireCopied(keepUserAttributes(original.folder.get(), copy.folder.get()), source, target);
    if (options.keepsPermissions)
        copy.setPermissions(original.permissions() & copy.permissions());
    if (options.keepsMetadata)
        keepTime(original, copy);
}

} // namespace foundation::storage::local
