#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <boost/property_tree/ptree.hpp>

#include <memory>

namespace foundation::storage::provider {

namespace detail {
class ProviderFactoryImpl;
} // namespace detail

/// Makes and shares the providers of stores that stand on their own, such as a disk or a server.
///
/// Locations for which the concrete factory derives one key share one provider, as long as somebody holds it: the
/// factory itself keeps none alive. A provider is built at most once at a time, and configured exactly when it is
/// built.
///
/// Ownership: providers live on independently of their factory.
/// Threads: may be used from any number of threads at once. Providers are built, configured and shut down under one
/// lock, so none of that may come back to the same factory.
class FOUNDATION_API PhysicalProviderFactory
{
public:
    PhysicalProviderFactory();
    PhysicalProviderFactory(PhysicalProviderFactory const&) = delete;
    PhysicalProviderFactory& operator=(PhysicalProviderFactory const&) = delete;
    virtual ~PhysicalProviderFactory();

    /// The key under which the provider of location is shared.
    StorageIRI getKey(StorageIRI const& location) const;

    /// The provider of location: the live one of its key, or a new one.
    /// Errors: what the concrete factory or the provider's `configure` throws; nothing is kept then.
    std::shared_ptr<IProvider> buildProvider(StorageIRI const& location) const;

    /// Shuts down every provider that is alive, in key order. The first failure ends the walk and is passed on.
    void shutdownProvider() const;

    /// Keeps the settings, hands them to every live provider that takes settings, and to each built from now on.
    /// Errors: the first failure ends the walk; the settings stay.
    void configure(boost::property_tree::ptree tree);

protected:
    /// Called with the factory locked, only when no provider of the key is alive.
    virtual std::shared_ptr<IProvider> doBuildProvider(StorageIRI const& location) const = 0;

    /// Must answer equal keys for locations that one provider serves; called without the lock.
    virtual StorageIRI doGetKey(StorageIRI const& location) const = 0;

private:
    std::shared_ptr<detail::ProviderFactoryImpl> implementation_;
};

} // namespace foundation::storage::provider
