#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IProvider.hpp>
#include <storage/provider/StorageItem.hpp>

#include <memory>

namespace foundation::storage::provider {

namespace detail {
class ProviderFactoryImpl;
} // namespace detail

/// Makes and shares the providers of the insides of containers, such as an archive file, given the container itself.
///
/// Locations for which the concrete factory derives one key share one provider, as long as somebody holds it: the
/// factory itself keeps none alive. A provider is built at most once at a time, and configured exactly when it is
/// built.
///
/// Ownership: providers live on independently of their factory.
/// Threads: may be used from any number of threads at once. Providers are built and shut down under one lock, so
/// none of that may come back to the same factory.
class FOUNDATION_API ContainerProviderFactory
{
public:
    ContainerProviderFactory();
    ContainerProviderFactory(ContainerProviderFactory const&) = delete;
    ContainerProviderFactory& operator=(ContainerProviderFactory const&) = delete;
    virtual ~ContainerProviderFactory();

    /// The key under which the provider of container is shared.
    StorageIRI getKey(StorageItem const& container) const;

    /// The provider of container: the live one of its key, or a new one.
    /// Errors: what the concrete factory throws; nothing is kept then.
    std::shared_ptr<IProvider> buildProvider(StorageItem const& container) const;

    /// Shuts down every provider that is alive, in key order. The first failure ends the walk and is passed on.
    void shutdownProvider() const;

protected:
    /// Called with the factory locked, only when no provider of the key is alive.
    virtual std::shared_ptr<IProvider> doBuildProvider(StorageItem const& container) const = 0;

    /// Must answer equal keys for locations that one provider serves; called without the lock.
    virtual StorageIRI doGetKey(StorageItem const& container) const = 0;

private:
    std::shared_ptr<detail::ProviderFactoryImpl> implementation_;
};

} // namespace foundation::storage::provider
