#include <storage/memory/MemoryProvider.hpp>

#include <storage/memory/detail/MemoryListing.hpp>
#include <storage/memory/detail/MemoryStream.hpp>
#include <storage/memory/detail/Tree.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>
#include <storage/provider/Exception.hpp>

#include <charconv>
#include <stdexcept>
#include <utility>

namespace foundation::storage::memory {

using fl::filesystem::Wildcards;
using namespace provider;
using detail::Depth;
using detail::Detail;
using detail::Entries;
using detail::Selection;
using detail::Status;
using detail::Subscriptions;
using detail::Tree;

namespace {

/// Every digit counts: a limit that is half understood would refuse or let in what nobody expects.
std::uint64_t parseLimit(std::string const& text)
{
    std::uint64_t bytes = 0;
    char const* const end = text.data() + text.size();
    auto const [parsed, error] = std::from_chars(text.data(), end, bytes);
    if (error != std::errc() || parsed != end)
        throw std::invalid_argument("limit: \"" + text + "\" is not a number of bytes");
    return bytes;
}

} // namespace

MemoryProvider::MemoryProvider(StorageIRI const& location) : MemoryProvider(std::make_shared<Tree>(location)) {}

MemoryProvider::MemoryProvider(std::shared_ptr<Tree> tree) : tree_(std::move(tree))
{
    tree_->account().setLimit(detail::Account::unlimited);
}

void MemoryProvider::doCreateFile(StorageIRI const& iri) const
{
    tree_->createFile(iri);
}

void MemoryProvider::doCreateFolder(StorageIRI const& iri) const
{
    tree_->createFolder(iri);
}

bool MemoryProvider::doFileExists(StorageIRI const& iri) const
{
    return tree_->exists(iri) == ExistenceType::AsFile;
}

bool MemoryProvider::doFolderExists(StorageIRI const& iri) const
{
    return tree_->exists(iri) == ExistenceType::AsFolder;
}

ExistenceType MemoryProvider::doExists(StorageIRI const& iri) const
{
    return tree_->exists(iri);
}

ExistenceTypeExtended MemoryProvider::doExistsExtended(StorageIRI const& iri) const
{
    switch (tree_->exists(iri)) {
    case ExistenceType::AsFile:
        return ExistenceTypeExtended::RegularFile;
    case ExistenceType::AsFolder:
        return ExistenceTypeExtended::RegularFolder;
    default:
        return ExistenceTypeExtended::None;
    }
}

void MemoryProvider::doRemoveFile(StorageIRI const& iri) const
{
    tree_->removeFile(iri);
}

void MemoryProvider::doRemoveFolder(StorageIRI const& iri) const
{
    tree_->removeFolder(iri, Tree::Removal::EmptyFolder);
}

void MemoryProvider::doRemoveFolderRecursively(StorageIRI const& iri) const
{
    tree_->removeFolder(iri, Tree::Removal::FolderAndContents);
}

void MemoryProvider::doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    tree_->moveFile(from, to, policy);
}

void MemoryProvider::doMoveFolder(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    tree_->moveFolder(from, to, policy);
}

void MemoryProvider::doCopyFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const
{
    tree_->copyFile(from, to, policy);
}

TransactionStatus MemoryProvider::doCopyFileAtomic(StorageIRI const& from, StorageIRI const& to,
                                                   ReplacementPolicy const& policy, Interrupt const& interrupt) const
{
    return tree_->copyFileAtomic(from, to, policy, interrupt);
}

FileAttributes MemoryProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    Status const status = tree_->fileStatus(iri);
    return FileAttributes(status.size, status.lastModified, status.writable);
}

FolderAttributes MemoryProvider::doGetFolderAttributes(StorageIRI const& iri) const
{
    Status const status = tree_->folderStatus(iri);
    return FolderAttributes(status.lastModified, status.writable);
}

void MemoryProvider::doSetLastModified(StorageIRI const& iri, boost::posix_time::ptime const& time) const
{
    if (time.is_special())
        throw Exception(ErrorCode::UnsupportedOperation, iri);
    tree_->setLastModified(iri, time);
}

void MemoryProvider::doSetWritable(StorageIRI const& iri, bool writable) const
{
    tree_->setWritable(iri, writable);
}

std::unique_ptr<ByteStream> MemoryProvider::doOpenStream(StorageIRI const& iri,
                                                         ByteStreamOpenOptions const& options) const
{
    bool const appends = options.append == ByteStreamAppend::Append;
    return std::make_unique<detail::MemoryWriteStream>(tree_, iri, tree_->open(iri, options), appends);
}

std::unique_ptr<ByteStream> MemoryProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    return std::make_unique<detail::MemoryReadStream>(iri, tree_->content(iri));
}

void MemoryProvider::doPublishFolderEventsFor(StorageIRI const& folder, ChangeEventCallback const& callback,
                                              EventKinds const& kinds) const
{
    if (!callback || tree_->exists(folder) != ExistenceType::AsFolder)
        throw ChangeEventsSubscriptionException(folder);
    tree_->subscriptions().add(tree_->canonicalPath(folder), Subscriptions::Scope::FolderAndEntries, callback, kinds);
}

void MemoryProvider::doPublishFileEventsFor(StorageIRI const& file, ChangeEventCallback const& callback,
                                            EventKinds const& kinds) const
{
    std::u16string path = tree_->canonicalPath(file);
    if (!callback || !file.hasParent() || tree_->exists(file.getParent()) != ExistenceType::AsFolder)
        throw ChangeEventsSubscriptionException(file);
    tree_->subscriptions().add(std::move(path), Subscriptions::Scope::Entry, callback, kinds);
}

void MemoryProvider::doStopPublishingEventsFor(StorageIRI const& folder) const
{
    tree_->subscriptions().stop(tree_->canonicalPath(folder));
}

bool MemoryProvider::doHasFeature(ExtendedFeature const& feature) const
{
    return feature == ExtendedFeature::RecursiveFolderRemoval || feature == ExtendedFeature::AtomicFileCopy;
}

StorageIRI MemoryProvider::doGetCanonicalLocation(StorageIRI const& iri) const
{
    return tree_->canonicalLocation(iri);
}

void MemoryProvider::doConfigure(boost::property_tree::ptree tree)
{
    auto const limit = tree.get_optional<std::string>("limit");
    tree_->account().setLimit(limit ? parseLimit(*limit) : detail::Account::unlimited);
}

void MemoryProvider::doShutdown()
{
    tree_->subscriptions().stopAll();
}

IProvider::Listing MemoryProvider::list(StorageIRI const& folder, Selection selection) const
{
    return std::make_unique<detail::MemoryListing>(tree_, folder, std::move(selection));
}

IProvider::Listing MemoryProvider::doListAll(StorageIRI const& folder) const
{
    return list(folder, {});
}

IProvider::Listing MemoryProvider::doListAllWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.pattern = Wildcards(pattern)});
}

IProvider::Listing MemoryProvider::doListFiles(StorageIRI const& folder) const
{
    return list(folder, {.entries = Entries::Files});
}

IProvider::Listing MemoryProvider::doListFilesWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.entries = Entries::Files, .pattern = Wildcards(pattern)});
}

IProvider::Listing MemoryProvider::doListFolders(StorageIRI const& folder) const
{
    return list(folder, {.entries = Entries::Folders});
}

IProvider::Listing MemoryProvider::doListFoldersWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.entries = Entries::Folders, .pattern = Wildcards(pattern)});
}

IProvider::Listing MemoryProvider::doListAllNamesOnly(StorageIRI const& folder) const
{
    return list(folder, {.detail = Detail::NamesOnly});
}

IProvider::Listing MemoryProvider::doListAllNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.detail = Detail::NamesOnly, .pattern = Wildcards(pattern)});
}

IProvider::Listing MemoryProvider::doListFoldersNamesOnly(StorageIRI const& folder) const
{
    return list(folder, {.entries = Entries::Folders, .detail = Detail::NamesOnly});
}

IProvider::Listing MemoryProvider::doListFoldersNamesOnlyWildcards(StorageIRI const& folder,
                                                                   std::u16string pattern) const
{
    return list(folder, {.entries = Entries::Folders, .detail = Detail::NamesOnly, .pattern = Wildcards(pattern)});
}

IProvider::Listing MemoryProvider::doListFilesNamesOnly(StorageIRI const& folder) const
{
    return list(folder, {.entries = Entries::Files, .detail = Detail::NamesOnly});
}

IProvider::Listing MemoryProvider::doListFilesNamesOnlyWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.entries = Entries::Files, .detail = Detail::NamesOnly, .pattern = Wildcards(pattern)});
}

IProvider::Listing MemoryProvider::doListAllRecursive(StorageIRI const& folder) const
{
    return list(folder, {.depth = Depth::AllBelow});
}

IProvider::Listing MemoryProvider::doListAllRecursiveWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return list(folder, {.depth = Depth::AllBelow, .pattern = Wildcards(pattern)});
}

IProvider::Listing MemoryProvider::doListAllRecursiveNamesOnly(StorageIRI const& folder) const
{
    return list(folder, {.detail = Detail::NamesOnly, .depth = Depth::AllBelow});
}

IProvider::Listing MemoryProvider::doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder,
                                                                        std::u16string pattern) const
{
    return list(folder, {.detail = Detail::NamesOnly, .depth = Depth::AllBelow, .pattern = Wildcards(pattern)});
}

} // namespace foundation::storage::memory
