#pragma once

#include <foundation/export.hpp>
#include <storage/conformance/FaultPlan.hpp>
#include <storage/conformance/ForwardingProvider.hpp>

#include <memory>
#include <string>
#include <vector>

namespace foundation::storage::conformance {

namespace detail {
class FaultSource;
} // namespace detail

/// A provider that hands everything to another one, but for the faults of a plan.
///
/// Errors: an injected failure of the provider or of a listing is an `Exception` with the code of the plan that names
/// the first location of the operation, one of a stream a `ByteStreamFailure` with that code.
/// Ownership: keeps the wrapped provider alive.
/// Threads: as the wrapped provider; operations are counted across all threads.
class FOUNDATION_API FaultInjectingProvider : public ForwardingProvider
{
public:
    FaultInjectingProvider(std::shared_ptr<provider::IProvider> wrapped, FaultPlan plan);

    /// The operations so far, in order, those that failed included.
    std::vector<std::string> operations() const;

    /// How many of the plan's failures have happened.
    std::size_t faults() const;

protected:
    void before(char const* operation, provider::StorageIRI const& location) const override;

    provider::FileAttributes doGetFileAttributes(provider::StorageIRI const& iri) const override;
    std::unique_ptr<provider::TransactionalStream>
    doOpenTransactionalStream(provider::StorageIRI const& iri,
                              provider::ByteStreamOpenOptions const& options) const override;

    std::unique_ptr<provider::ByteStream> handOutStream(std::unique_ptr<provider::ByteStream> stream,
                                                        provider::StorageIRI const& file) const override;
    std::unique_ptr<provider::TransactionalStream>
    handOutTransaction(std::unique_ptr<provider::TransactionalStream> stream,
                       provider::StorageIRI const& file) const override;
    Listing list(char const* name, ListingOperation operation, provider::StorageIRI const& folder,
                 std::u16string pattern) const override;

private:
    std::shared_ptr<detail::FaultSource> faults_;
};

} // namespace foundation::storage::conformance
