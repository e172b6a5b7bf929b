#include <storage/local/LocalProvider.hpp>

#include <storage/local/DurabilityException.hpp>
#include <storage/local/detail/ChangeNotifier.hpp>
#include <storage/local/detail/LocalByteStream.hpp>
#include <storage/local/detail/LocalTransaction.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/local/detail/Settings.hpp>
#include <storage/local/detail/TreeRemoval.hpp>
#include <storage/local/detail/attributes.hpp>
#include <storage/local/detail/changeAttributes.hpp>
#include <storage/local/detail/copyFile.hpp>
#include <storage/local/detail/durableMove.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/extendedAttributes.hpp>
#include <storage/local/detail/fileSystem.hpp>
#include <storage/local/detail/move.hpp>
#include <storage/local/detail/nativePath.hpp>
#include <storage/local/detail/sync.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>
#include <storage/provider/Exception.hpp>

#include <fl/filesystem/native_name.hpp>

#include <cerrno>
#include <deque>
#include <optional>
#include <utility>

namespace foundation::storage::local {

using namespace provider;
using namespace detail;

namespace {

/// Nothing where nothing is.
std::optional<Status> findStatus(Root const& root, std::string const& path, Links links, StorageIRI const& iri)
{
    Status status;
    int const error = root.getStatus(path, links, status);
    if (meansMissing(error))
        return std::nullopt;
    if (error != 0)
        throwError(error, iri);
    return status;
}

Status requireStatus(Root const& root, std::string const& path, StorageIRI const& iri)
{
    Status status;
    if (int const error = root.getStatus(path, Links::Follow, status))
        throwError(error, iri);
    return status;
}

ExistenceTypeExtended typeOfLink(Root const& root, std::string const& path, StorageIRI const& iri)
{
    std::optional<Status> const target = findStatus(root, path, Links::Follow, iri);
    if (!target)
        return ExistenceTypeExtended::BrokenSymlink;
    return isFolder(*target) ? ExistenceTypeExtended::SymlinkToFolder : ExistenceTypeExtended::SymlinkToFile;
}

Located locate(Root const& root, std::string const& path, StorageIRI const& iri)
{
    Located entry;
    if (int const error = root.locate(path, entry))
        throwError(error, iri);
    return entry;
}

} // namespace

LocalProvider::LocalProvider() : settings_(std::make_shared<Settings>()), notifier_(std::make_unique<ChangeNotifier>())
{}

LocalProvider::~LocalProvider() = default;

void LocalProvider::doConfigure(boost::property_tree::ptree tree)
{
    auto settings = std::make_shared<Settings const>(tree);
    std::lock_guard const lock(mutex_);
    settings_.swap(settings);
}

void LocalProvider::doShutdown()
{
    notifier_->stopAll();
}

std::shared_ptr<Settings const> LocalProvider::settings() const
{
    std::lock_guard const lock(mutex_);
    return settings_;
}

std::shared_ptr<Root const> LocalProvider::root() const
{
    std::shared_ptr<Settings const> settings = this->settings();
    Root const* const root = &settings->root;
    return {std::move(settings), root};
}

void LocalProvider::doCreateFile(StorageIRI const& iri) const
{
    auto const root = this->root();
    FileDescriptor file;
    int error = root->open(root->pathOf(iri), O_WRONLY | O_CREAT | O_EXCL, file);
    if (error == 0)
        error = file.close();
    if (error != 0)
        throwError(error, iri);
}

void LocalProvider::doCreateFolder(StorageIRI const& iri) const
{
    auto const settings = this->settings();
    Root const& root = settings->root;
    std::string const path = root.pathOf(iri);
    bool const isDurable = settings->durability == Durability::Full;
    Located folder;
    int error = isDurable ? root.locateInFolder(path, folder) : root.locate(path, folder);
    if (error == 0)
        error = makeFolder(folder.at());
    if (error != 0)
        throwError(error, iri);
    if (isDurable)
        if (error = syncFolder(folder.folder()); error != 0)
            throwNotDurable(error, iri);
}

/// A folder that is made, but not certain to stay, is one into which others can be made.
void LocalProvider::doCreateFolderRecursive(StorageIRI const& iri) const
{
    if (!iri.hasParent())
        return IConfigurableProvider::doCreateFolderRecursive(iri);
    std::deque<StorageIRI> missing{iri};
    while (missing.front().hasParent() && !doFolderExists(missing.front().getParent()))
        missing.push_front(missing.front().getParent());
    std::optional<ErrorCode> uncertain;
    for (StorageIRI const& folder : missing) {
        try {
            doCreateFolder(folder);
        } catch (DurabilityException const& failure) {
            uncertain = failure.getErrorCode();
        } catch (Exception const& failure) {
            throw Exception(failure.getErrorCode(), iri);
        }
    }
    if (uncertain)
        throw DurabilityException(*uncertain, iri);
}

bool LocalProvider::doFileExists(StorageIRI const& iri) const
{
    return doExists(iri) == ExistenceType::AsFile;
}

bool LocalProvider::doFolderExists(StorageIRI const& iri) const
{
    return doExists(iri) == ExistenceType::AsFolder;
}

/// What is no possible location, or cannot be looked at, has what its text says.
StorageIRI LocalProvider::doGetCanonicalLocation(StorageIRI const& iri) const
{
    auto const root = this->root();
    std::string path;
    try {
        path = root->canonicalPath(root->pathOf(iri));
    } catch (Exception const&) {
        return iri.getResolvedIRI();
    }
    if (path.empty())
        return iri.getResolvedIRI();
    return StorageIRI(StorageIRI(u"file:///"), fl::filesystem::from_native_bytes(path));
}

ExistenceType LocalProvider::doExists(StorageIRI const& iri) const
{
    auto const root = this->root();
    std::optional<Status> const status = findStatus(*root, root->pathOf(iri), Links::Follow, iri);
    if (!status)
        return ExistenceType::AsNeither;
    return isFolder(*status) ? ExistenceType::AsFolder : ExistenceType::AsFile;
}

ExistenceTypeExtended LocalProvider::doExistsExtended(StorageIRI const& iri) const
{
    auto const root = this->root();
    std::string const path = root->pathOf(iri);
    std::optional<Status> const status = findStatus(*root, path, Links::Keep, iri);
    if (!status)
        return ExistenceTypeExtended::None;
    if (isLink(*status))
        return typeOfLink(*root, path, iri);
    if (isFolder(*status))
        return ExistenceTypeExtended::RegularFolder;
    return S_ISREG(status->stx_mode) ? ExistenceTypeExtended::RegularFile : ExistenceTypeExtended::SpecialFile;
}

void LocalProvider::doRemoveFile(StorageIRI const& iri) const
{
    auto const root = this->root();
    int const error = removeName(locate(*root, root->pathOf(iri), iri).at());
    if (error != 0)
        throwError(error == EISDIR ? ENOENT : error, iri);
}

void LocalProvider::doRemoveFolder(StorageIRI const& iri) const
{
    auto const root = this->root();
    std::string const path = root->pathOf(iri);
    int const error = removeEmptyFolder(locate(*root, path, iri).at());
    if (error == ENOTDIR)
        throwNotAFolder(*root, path, iri);
    if (error != 0)
        throwError(error == EEXIST ? ENOTEMPTY : error, iri);
}

void LocalProvider::doRemoveFolderRecursively(StorageIRI const& iri) const
{
    removeTree(*root(), iri);
}

void LocalProvider::doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    moveFileDurably(*settings(), from, to, policy);
}

void LocalProvider::doMoveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    moveFolderDurably(*settings(), from, to, policy);
}

void LocalProvider::doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    detail::copyFile(*settings(), from, to, policy);
}

TransactionStatus LocalProvider::doCopyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                                  ReplacementPolicy const& policy, Interrupt const& interrupt) const
{
    return detail::copyFileAtomic(*settings(), from, to, policy, interrupt);
}

FileAttributes LocalProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    auto root = this->root();
    std::string path = root->pathOf(iri);
    Status const status = requireStatus(*root, path, iri);
    if (isFolder(status))
        throwError(ErrorCode::ResourceNotFound, iri);
    return toFileAttributes(status, std::move(root), std::move(path));
}

FolderAttributes LocalProvider::doGetFolderAttributes(StorageIRI const& iri) const
{
    auto root = this->root();
    std::string path = root->pathOf(iri);
    Status const status = requireStatus(*root, path, iri);
    if (!isFolder(status))
        throwError(ErrorCode::ResourceNotFound, iri);
    return toFolderAttributes(status, std::move(root), std::move(path));
}

ExtendedAttributes LocalProvider::doGetExtendedAttributes(StorageIRI const& iri) const
{
    return detail::getExtendedAttributes(*root(), iri);
}

void LocalProvider::doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const
{
    detail::setLastModified(*root(), iri, time);
}

void LocalProvider::doSetWritable(StorageIRI const& iri, bool writable) const
{
    detail::setWritable(*root(), iri, writable);
}

std::unique_ptr<ByteStream> LocalProvider::doOpenStream(StorageIRI const& iri,
                                                        ByteStreamOpenOptions const& options) const
{
    return openForWriting(*root(), iri, options);
}

std::unique_ptr<ByteStream> LocalProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    return openForReading(*root(), iri);
}

/// Without a location for the scratch file, which is all that a failure to create nothing could name.
std::unique_ptr<TransactionalStream>
LocalProvider::doOpenTransactionalStream(StorageIRI const& target, ByteStreamOpenOptions const& options) const
{
    if (options.create != ByteStreamCreate::Create)
        return IConfigurableProvider::doOpenTransactionalStream(target, options);
    return std::make_unique<LocalTransaction>(settings(), target, options);
}

std::unique_ptr<TransactionalStream>
LocalProvider::doOpenTransactionalStreamAtScratchLocation(StorageIRI const& target, StorageIRI const& scratch,
                                                          ByteStreamOpenOptions const& options) const
{
    return std::make_unique<LocalTransaction>(settings(), target, scratch, options);
}

void LocalProvider::doPublishFolderEventsFor(StorageIRI const& folder, ChangeEventCallback const& callback,
                                             EventKinds const& kinds) const
{
    auto const root = this->root();
    notifier_->subscribe({.root = root,
                          .path = root->pathOf(folder),
                          .folder = folder,
                          .subject = folder,
                          .callback = callback,
                          .kinds = kinds});
}

void LocalProvider::doPublishFileEventsFor(StorageIRI const& file, ChangeEventCallback const& callback,
                                           EventKinds const& kinds) const
{
    auto const root = this->root();
    std::string const path = root->pathOf(file);
    std::string name = nameOf(path);
    if (name.empty() || name == "." || name == "..")
        throw ChangeEventsSubscriptionException(file);
    StorageIRI const folder = file.getParent();
    notifier_->subscribe({.root = root,
                          .path = root->pathOf(folder),
                          .folder = folder,
                          .name = std::move(name),
                          .subject = file,
                          .callback = callback,
                          .kinds = kinds});
}

void LocalProvider::doStopPublishingEventsFor(StorageIRI const& folder) const
{
    notifier_->stop(nativePath(folder));
}

bool LocalProvider::doHasFeature(ExtendedFeature const& feature) const
{
    return feature == ExtendedFeature::RecursiveFolderRemoval || feature == ExtendedFeature::AtomicFileCopy;
}

} // namespace foundation::storage::local
