#include <storage/conformance/FaultInjectingProvider.hpp>

#include <storage/conformance/detail/FaultSource.hpp>
#include <storage/conformance/detail/faultyStreams.hpp>

#include <utility>

namespace foundation::storage::conformance {

using namespace provider;
using detail::faulty;

FaultInjectingProvider::FaultInjectingProvider(std::shared_ptr<IProvider> wrapped, FaultPlan plan)
    : ForwardingProvider(std::move(wrapped)), faults_(std::make_shared<detail::FaultSource>(std::move(plan)))
{}

std::vector<std::string> FaultInjectingProvider::operations() const
{
    return faults_->operations();
}

std::size_t FaultInjectingProvider::faults() const
{
    return faults_->faults();
}

void FaultInjectingProvider::before(char const* operation, StorageIRI const& location) const
{
    faults_->before(operation, location);
}

FileAttributes FaultInjectingProvider::doGetFileAttributes(StorageIRI const& iri) const
{
    FileAttributes const attributes = ForwardingProvider::doGetFileAttributes(iri);
    std::optional<std::uint64_t> const claimed = faults_->plan().claimedSize;
    if (!claimed)
        return attributes;
    return FileAttributes(*claimed, attributes.getLastModified(), [attributes] { return attributes.isWritable(); });
}

std::unique_ptr<ByteStream> FaultInjectingProvider::doOpenStream(StorageIRI const& iri,
                                                                 ByteStreamOpenOptions const& options) const
{
    return faulty(ForwardingProvider::doOpenStream(iri, options), faults_);
}

std::unique_ptr<ByteStream> FaultInjectingProvider::doOpenReadOnlyStream(StorageIRI const& iri) const
{
    return faulty(ForwardingProvider::doOpenReadOnlyStream(iri), faults_);
}

std::unique_ptr<TransactionalStream>
FaultInjectingProvider::doOpenTransactionalStream(StorageIRI const& iri, ByteStreamOpenOptions const& options) const
{
    if (faults_->plan().composeTransactions)
        return IProvider::doOpenTransactionalStream(iri, options);
    return faulty(ForwardingProvider::doOpenTransactionalStream(iri, options), faults_);
}

IProvider::Listing FaultInjectingProvider::doListAll(StorageIRI const& folder) const
{
    return guarded(ForwardingProvider::doListAll(folder), folder);
}

IProvider::Listing FaultInjectingProvider::doListAllWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return guarded(ForwardingProvider::doListAllWildcards(folder, std::move(pattern)), folder);
}

IProvider::Listing FaultInjectingProvider::doListAllNamesOnly(StorageIRI const& folder) const
{
    return guarded(ForwardingProvider::doListAllNamesOnly(folder), folder);
}

IProvider::Listing FaultInjectingProvider::doListAllNamesOnlyWildcards(StorageIRI const& folder,
                                                                       std::u16string pattern) const
{
    return guarded(ForwardingProvider::doListAllNamesOnlyWildcards(folder, std::move(pattern)), folder);
}

IProvider::Listing FaultInjectingProvider::doListFiles(StorageIRI const& folder) const
{
    return guarded(ForwardingProvider::doListFiles(folder), folder);
}

IProvider::Listing FaultInjectingProvider::doListFilesWildcards(StorageIRI const& folder, std::u16string pattern) const
{
    return guarded(ForwardingProvider::doListFilesWildcards(folder, std::move(pattern)), folder);
}

IProvider::Listing FaultInjectingProvider::doListFilesNamesOnly(StorageIRI const& folder) const
{
    return guarded(ForwardingProvider::doListFilesNamesOnly(folder), folder);
}

IProvider::Listing FaultInjectingProvider::doListFilesNamesOnlyWildcards(StorageIRI const& folder,
                                                                         std::u16string pattern) const
{
    return guarded(ForwardingProvider::doListFilesNamesOnlyWildcards(folder, std::move(pattern)), folder);
}

IProvider::Listing FaultInjectingProvider::doListFolders(StorageIRI const& folder) const
{
    return guarded(ForwardingProvider::doListFolders(folder), folder);
}

IProvider::Listing FaultInjectingProvider::doListFoldersWildcards(StorageIRI const& folder,
                                                                  std::u16string pattern) const
{
    return guarded(ForwardingProvider::doListFoldersWildcards(folder, std::move(pattern)), folder);
}

IProvider::Listing FaultInjectingProvider::doListFoldersNamesOnly(StorageIRI const& folder) const
{
    return guarded(ForwardingProvider::doListFoldersNamesOnly(folder), folder);
}

IProvider::Listing FaultInjectingProvider::doListFoldersNamesOnlyWildcards(StorageIRI const& folder,
                                                                           std::u16string pattern) const
{
    return guarded(ForwardingProvider::doListFoldersNamesOnlyWildcards(folder, std::move(pattern)), folder);
}

IProvider::Listing FaultInjectingProvider::doListAllRecursive(StorageIRI const& folder) const
{
    return guarded(ForwardingProvider::doListAllRecursive(folder), folder);
}

IProvider::Listing FaultInjectingProvider::doListAllRecursiveWildcards(StorageIRI const& folder,
                                                                       std::u16string pattern) const
{
    return guarded(ForwardingProvider::doListAllRecursiveWildcards(folder, std::move(pattern)), folder);
}

IProvider::Listing FaultInjectingProvider::doListAllRecursiveNamesOnly(StorageIRI const& folder) const
{
    return guarded(ForwardingProvider::doListAllRecursiveNamesOnly(folder), folder);
}

IProvider::Listing FaultInjectingProvider::doListAllRecursiveNamesOnlyWildcards(StorageIRI const& folder,
                                                                                std::u16string pattern) const
{
    return guarded(ForwardingProvider::doListAllRecursiveNamesOnlyWildcards(folder, std::move(pattern)), folder);
}

IProvider::Listing FaultInjectingProvider::guarded(Listing listing, StorageIRI const& folder) const
{
    return faulty(std::move(listing), faults_, folder);
}

} // namespace foundation::storage::conformance
