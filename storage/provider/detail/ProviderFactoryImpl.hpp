#pragma once

#include <foundation/export.hpp>
#include <storage/provider/IProvider.hpp>

#include <boost/property_tree/ptree.hpp>

#include <functional>
#include <map>
#include <memory>
#include <mutex>

namespace foundation::storage::provider::detail {

/// Builds each provider once while it lives, and configures and shuts down those that do.
///
/// Providers are held weakly: one goes when its last user lets go, and its entry stays until the key is built again.
/// Threads: every operation runs under the one mutex, builders included, which so must not come back here.
class FOUNDATION_API ProviderFactoryImpl
{
public:
    /// The live provider of `key`, or a new one from `build`, configured when there is a configuration for it.
    /// Errors: what `build` and the provider's `configure` throw; nothing is recorded then.
    std::shared_ptr<IProvider> findOrBuild(StorageIRI const& key,
                                           std::function<std::shared_ptr<IProvider>()> const& build);

    /// Keeps the configuration and hands it to every live provider that takes one, in key order.
    /// Errors: the first failure ends the walk; the configuration stays.
    void configure(boost::property_tree::ptree tree);

    /// Shuts down every live provider, in key order; the first failure ends the walk.
    void shutdown();

private:
    void passConfigurationTo(IProvider* provider) const;

    std::map<StorageIRI, std::weak_ptr<IProvider>> cache_;
    std::mutex mutex_;
    boost::property_tree::ptree configuration_;
};

} // namespace foundation::storage::provider::detail
