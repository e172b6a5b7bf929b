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

std::unique_ptr<TransactionalStream>
FaultInjectingProvider::doOpenTransactionalStream(StorageIRI const& iri, ByteStreamOpenOptions const& options) const
{
    if (faults_->plan().composeTransactions)
        return IProvider::doOpenTransactionalStream(iri, options);
    return ForwardingProvider::doOpenTransactionalStream(iri, options);
}

std::unique_ptr<ByteStream> FaultInjectingProvider::handOutStream(std::unique_ptr<ByteStream> stream,
                                                                  StorageIRI const&) const
{
    return faulty(std::move(stream), faults_);
}

std::unique_ptr<TransactionalStream>
FaultInjectingProvider::handOutTransaction(std::unique_ptr<TransactionalStream> stream, StorageIRI const&) const
{
    return faulty(std::move(stream), faults_);
}

IProvider::Listing FaultInjectingProvider::list(char const* name, ListingOperation operation, StorageIRI const& folder,
                                                std::u16string pattern) const
{
    return faulty(ForwardingProvider::list(name, operation, folder, std::move(pattern)), faults_, folder);
}

} // namespace foundation::storage::conformance
