#include <storage/local/LocalProvider.hpp>

#include <storage/local/detail/LocalByteStream.hpp>
#include <storage/local/detail/LocalListing.hpp>
#include <storage/local/detail/attributes.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/move.hpp>
#include <storage/local/detail/nativePath.hpp>

#include <cerrno>
#include <optional>
#include <utility>

namespace foundation::storage::local {

using namespace provider;
using namespace detail;

namespace {

/// Nothing where nothing is.
std::optional<Status> findStatus(std::string const& path, Links links, StorageIRI const& iri)
{
    Status status;
    int const error = getStatus(path, links, status);
    if (meansMissing(error))
        return std::nullopt;
    if (error != 0)
        throwError(error, iri);
    return status;
}

Status requireStatus(std::string const& path, StorageIRI const& iri)
{
    Status status;
    if (int const error = getStatus(path, Links::Follow, status))
        throwError(error, iri);
    return status;
}

ExistenceTypeExtended typeOfLink(std::string const& path, StorageIRI const& iri)
{
    std::optional<Status> const target = findStatus(path, Links::Follow, iri);
    if (!target)
        return ExistenceTypeExtended::BrokenSymlink;
    return isFolder(*target) ? ExistenceTypeExtended::SymlinkToFolder : ExistenceTypeExtended::SymlinkToFile;
}

bool isSameContent(StorageIRI const& left, StorageIRI const& right)
{
    Status leftStatus;
    Status rightStatus;
    return getStatus(nativePath(right), Links::Follow, rightStatus) == 0 &&
           getStatus(nativePath(left), Links::Follow, leftStatus) == 0 && isSameFile(leftStatus, rightStatus) &&
           S_ISREG(leftStatus.stx_mode);
}

} // namespace

void LocalProvider::doCreateFile(StorageIRI const& iri) const
{
    FileDescriptor file;
    if (int const error = openFile(nativePath(iri), O_WRONLY | O_CREAT | O_EXCL, file))
        throwError(error, iri);
}

void LocalProvider::doCreateFolder(StorageIRI const& iri) const
{
    if (int const error = makeFolder(nativePath(iri)))
        throwError(error, iri);
}

bool LocalProvider::doFileExists(StorageIRI const& iri) const
{
    return doExists(iri) == ExistenceType::AsFile;
}

bool LocalProvider::doFolderExists(StorageIRI const& iri) const
{
    return doExists(iri) == ExistenceType::AsFolder;
}

ExistenceType LocalProvider::doExists(StorageIRI const& iri) const
{
    std::optional<Status> const status = findStatus(nativePath(iri), Links::Follow, iri);
    if (!status)
        return ExistenceType::AsNeither;
    return isFolder(*status) ? ExistenceType::AsFolder : ExistenceType::AsFile;
}

ExistenceTypeExtended LocalProvider::doExistsExtended(StorageIRI const& iri) const
{
    std::string const path = nativePath(iri);
    std::optional<Status> const status = findStatus(path, Links::Keep, iri);
    if (!status)
        return ExistenceTypeExtended::None;
    if (isLink(*status))
        return typeOfLink(path, iri);
    if (isFolder(*status))
        return ExistenceTypeExtended::RegularFolder;
    return S_ISREG(status->stx_mode) ? ExistenceTypeExtended::RegularFile : ExistenceTypeExtended::SpecialFile;
}

void LocalProvider::doRemoveFile(StorageIRI const& iri) const
{
    int const error = removeName(nativePath(iri));
    if (error != 0)
        throwError(error == EISDIR ? ENOENT : error, iri);
}

void LocalProvider::doRemoveFolder(StorageIRI const& iri) const
{
    std::string const path = nativePath(iri);
    int const error = removeEmptyFolder(path);
    if (error == ENOTDIR)
        throwNotAFolder(path, iri);
    if (error != 0)
        throwError(error == EEXIST ? ENOTEMPTY : error, iri);
}

void LocalProvider::doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    detail::moveFile(from, to, policy);
}

void LocalProvider::doMoveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    detail::moveFolder(from, to, policy);
}

void LocalProvider::doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    if (replaces(policy) && isSameContent(from, to))
        return;
    IProvider::doCopyFile(from, to, policy);
}

FileAttributes LocalProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    std::string path = nativePath(iri);
    Status const status = requireStatus(path, iri);
    if (isFolder(status))
        throwError(ErrorCode::ResourceNotFound, iri);
    return toFileAttributes(status, std::move(path));
}

FolderAttributes LocalProvider::doGetFolderAttributes(StorageIRI const& iri) const
{
    std::string path = nativePath(iri);
    Status const status = requireStatus(path, iri);
    if (!isFolder(status))
        throwError(ErrorCode::ResourceNotFound, iri);
    return toFolderAttributes(status, std::move(path));
}

std::unique_ptr<ByteStream> LocalProvider::doOpenStream(StorageIRI const& iri,
                                                        ByteStreamOpenOptions const& options) const
{
    return openForWriting(iri, options);
}

std::unique_ptr<ByteStream> LocalProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    return openForReading(iri);
}

IProvider::Listing LocalProvider::doListAll(StorageIRI const& folder) const
{
    return std::make_unique<LocalListing>(folder, Entries::All, Detail::Attributes);
}

IProvider::Listing LocalProvider::doListFiles(StorageIRI const& folder) const
{
    return std::make_unique<LocalListing>(folder, Entries::Files, Detail::Attributes);
}

IProvider::Listing LocalProvider::doListFolders(StorageIRI const& folder) const
{
    return std::make_unique<LocalListing>(folder, Entries::Folders, Detail::Attributes);
}

IProvider::Listing LocalProvider::doListAllNamesOnly(StorageIRI const& folder) const
{
    return std::make_unique<LocalListing>(folder, Entries::All, Detail::NamesOnly);
}

IProvider::Listing LocalProvider::doListFilesNamesOnly(StorageIRI const& folder) const
{
    return std::make_unique<LocalListing>(folder, Entries::Files, Detail::NamesOnly);
}

IProvider::Listing LocalProvider::doListFoldersNamesOnly(StorageIRI const& folder) const
{
    return std::make_unique<LocalListing>(folder, Entries::Folders, Detail::NamesOnly);
}

} // namespace foundation::storage::local
