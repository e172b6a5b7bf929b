#include <storage/local/detail/EntryMaker.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>

#include <cerrno>
#include <utility>

namespace foundation::storage::local::detail {

using provider::FolderEntry;
using provider::StorageIRI;

namespace {

/// In a confined store a link is followed by its path, because only the root knows where it must not lead.
int getTargetStatus(ListedFolder const& folder, char const* name, Status& status)
{
    Root const& root = *folder.path->root;
    At const at{folder.descriptor, name};
    if (!root.isConfined())
        return getStatus(at, Links::Follow, status);
    int const error = getStatus(at, Links::Keep, status);
    return error == 0 && isLink(status) ? root.getStatus(folder.path->pathOf(name), Links::Follow, status) : error;
}

/// A link is listed wherever it leads, but not otherwise than it is because something runs out.
bool isShortage(int error)
{
    return error == ENOMEM || error == EMFILE || error == ENFILE;
}

int findWhetherFolder(ListedFolder const& folder, FoundName const& found, bool& answer)
{
    answer = found.isFolder();
    if (found.isDecided())
        return 0;
    Status status;
    int const error = getTargetStatus(folder, found.name.data(), status);
    answer = error == 0 && isFolder(status);
    return isShortage(error) ? error : 0;
}

} // namespace

std::shared_ptr<FolderPath const> listedPath(std::shared_ptr<Root const> root, StorageIRI const& folder)
{
    std::string path = root->pathOf(folder);
    return std::make_shared<FolderPath const>(FolderPath{std::move(root), std::move(path)});
}

FileDescriptor openListed(FolderPath const& path, StorageIRI const& folder)
{
    FileDescriptor opened;
    if (int const error = path.root->open(path.path, O_RDONLY | O_DIRECTORY, opened))
        throwError(error, folder);
    return opened;
}

int EntryMaker::make(ListedFolder const& folder, FoundName const& found, std::optional<FolderEntry>& entry) const
{
    if (found.isDecided() && !selection_.wantsKind(found.isFolder()))
        return 0;
    std::u16string name = fl::filesystem::from_native_bytes(found.name);
    if (!selection_.wantsName(name))
        return 0;
    if (!folder.prefix.empty())
        name.insert(0, folder.prefix);
    if (selection_.detail == Detail::Attributes)
        return makeWithAttributes(folder, found, std::move(name), entry);
    bool isFolder = false;
    if (int const error = findWhetherFolder(folder, found, isFolder))
        return error;
    if (selection_.wantsKind(isFolder))
        entry.emplace(std::move(name), isFolder ? FolderEntry::EntryType::Folder : FolderEntry::EntryType::File);
    return 0;
}

int EntryMaker::makeWithAttributes(ListedFolder const& folder, FoundName const& found, std::u16string&& name,
                                   std::optional<FolderEntry>& entry) const
{
    Status status;
    int error = getTargetStatus(folder, found.name.data(), status);
    if (error != 0 && !isShortage(error))
        error = getStatus({folder.descriptor, found.name.data()}, Links::Keep, status);
    if (error != 0)
        return error == ENOENT ? 0 : error;
    if (!selection_.wantsKind(isFolder(status)))
        return 0;
    if (isFolder(status))
        entry.emplace(std::move(name), toFolderAttributes(status, folder.path, found.name));
    else
        entry.emplace(std::move(name), toFileAttributes(status, folder.path, found.name));
    return 0;
}

} // namespace foundation::storage::local::detail
