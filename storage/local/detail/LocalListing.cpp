#include <storage/local/detail/LocalListing.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/detail/SystemCalls.hpp>
#include <storage/local/detail/attributes.hpp>
#include <storage/local/detail/errorCode.hpp>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <dirent.h>
#include <utility>

namespace foundation::storage::local::detail {

using provider::FolderEntry;
using provider::StorageIRI;

namespace {

/// Hundreds of entries per call: beyond that a larger buffer gains nothing.
constexpr std::size_t bufferSize = 32 * 1024;

FileDescriptor openFolder(Root const& root, std::string const& path, StorageIRI const& iri)
{
    FileDescriptor folder;
    if (int const error = root.open(path, O_RDONLY | O_DIRECTORY, folder))
        throwError(error, iri);
    return folder;
}

bool isSelfOrParent(char const* name)
{
    return name[0] == '.' && (name[1] == '\0' || (name[1] == '.' && name[2] == '\0'));
}

} // namespace

struct LocalListing::NameAndType
{
    char const* name;
    unsigned char type;

    /// A link may lead anywhere, and not every file system tells.
    bool isDecided() const { return type != DT_LNK && type != DT_UNKNOWN; }
};

LocalListing::LocalListing(std::shared_ptr<Root const> root, StorageIRI const& folder, Entries entries, Detail detail)
    : root_(std::move(root)),
      folder_(folder),
      path_(root_->pathOf(folder)),
      entries_(entries),
      detail_(detail),
      descriptor_(openFolder(*root_, path_, folder_)),
      buffer_(std::make_unique_for_overwrite<char[]>(bufferSize))
{
    next();
}

void LocalListing::next()
{
    entry_.reset();
    while (position_ < end_ || refill()) {
        char const* const record = buffer_.get() + position_;
        std::uint16_t length;
        std::memcpy(&length, record + offsetof(dirent64, d_reclen), sizeof length);
        position_ += length;
        if (accept(
                {record + offsetof(dirent64, d_name), static_cast<unsigned char>(record[offsetof(dirent64, d_type)])}))
            return;
    }
}

void LocalListing::reset()
{
    position_ = end_ = 0;
    if (systemCalls().lseek(descriptor_.get(), 0, SEEK_SET) == -1)
        throwError(errno, folder_);
    next();
}

bool LocalListing::refill()
{
    position_ = end_ = 0;
    ssize_t const size =
        retried([&] { return systemCalls().getdents64(descriptor_.get(), buffer_.get(), bufferSize); });
    if (size == -1)
        throwError(errno, folder_);
    end_ = static_cast<std::size_t>(size);
    return size > 0;
}

bool LocalListing::accept(NameAndType const& found)
{
    if (isSelfOrParent(found.name) || (found.isDecided() && !isWanted(found.type == DT_DIR)))
        return false;
    return detail_ == Detail::Attributes ? acceptAttributes(found.name) : acceptName(found);
}

bool LocalListing::acceptName(NameAndType const& found)
{
    bool const folder = isFolderEntry(found);
    if (!isWanted(folder))
        return false;
    entry_.emplace(fl::filesystem::from_native_bytes(found.name),
                   folder ? FolderEntry::EntryType::Folder : FolderEntry::EntryType::File);
    return true;
}

bool LocalListing::isFolderEntry(NameAndType const& found) const
{
    if (found.isDecided())
        return found.type == DT_DIR;
    Status status;
    return getTargetStatus(found.name, status) == 0 && isFolder(status);
}

/// In a confined store a link is followed by its path, because only the root knows where it must not lead.
int LocalListing::getTargetStatus(char const* name, Status& status) const
{
    if (!root_->isConfined())
        return getStatus({descriptor_.get(), name}, Links::Follow, status);
    int const error = getStatus({descriptor_.get(), name}, Links::Keep, status);
    return error == 0 && isLink(status) ? root_->getStatus(path_ + '/' + name, Links::Follow, status) : error;
}

bool LocalListing::acceptAttributes(char const* name)
{
    Status status;
    if (getTargetStatus(name, status) != 0) {
        int const error = getStatus({descriptor_.get(), name}, Links::Keep, status);
        if (error == ENOENT)
            return false;
        if (error != 0)
            throwAt(name, error);
    }
    bool const folder = isFolder(status);
    if (!isWanted(folder))
        return false;
    std::string path = path_ + '/' + name;
    if (folder)
        entry_.emplace(fl::filesystem::from_native_bytes(name), toFolderAttributes(status, root_, std::move(path)));
    else
        entry_.emplace(fl::filesystem::from_native_bytes(name), toFileAttributes(status, root_, std::move(path)));
    return true;
}

bool LocalListing::isWanted(bool folder) const
{
    return entries_ == Entries::All || (entries_ == Entries::Folders) == folder;
}

void LocalListing::throwAt(char const* name, int error) const
{
    throwError(error, StorageIRI(folder_, fl::filesystem::from_native_bytes(name)));
}

} // namespace foundation::storage::local::detail
