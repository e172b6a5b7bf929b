#pragma once

#include <storage/provider/ContainerProviderFactory.hpp>
#include <storage/provider/PhysicalProviderFactory.hpp>
#include <tests/support/ConfigurableProvider.hpp>

#include <atomic>
#include <functional>
#include <memory>
#include <vector>

namespace foundation::storage::registry {

inline provider::StorageIRI keyOf(provider::StorageIRI const& location)
{
    return provider::StorageIRI(location, u"/");
}

/// Containers are known by where they stand.
inline provider::StorageIRI keyOf(provider::StorageItem const& container)
{
    return container.getLocation();
}

/// Makes providers that hold nothing, and calls what the test gave it. Has to outlive its providers.
template <typename Base, typename Place>
class FakeFactory : public Base
{
public:
    using Provider = tests::support::ConfigurableProvider;

    std::function<void()> onBuild = [] {};
    std::function<void()> onConfigure = [] {};
    std::function<void()> onShutdown = [] {};
    mutable std::atomic<int> built = 0;
    mutable std::weak_ptr<Provider> last;

    /// What the last provider was configured with, while it lives.
    std::vector<boost::property_tree::ptree> settings() const
    {
        auto const live = last.lock();
        return live == nullptr ? std::vector<boost::property_tree::ptree>() : live->trees;
    }

protected:
    std::shared_ptr<provider::IProvider> doBuildProvider(Place const&) const override
    {
        onBuild();
        ++built;
        auto const made = std::make_shared<Provider>();
        made->onConfigure = [this](Provider&) { onConfigure(); };
        made->onShutdown = [this] { onShutdown(); };
        last = made;
        return made;
    }
    provider::StorageIRI doGetKey(Place const& place) const override { return keyOf(place); }
};

using FakePhysicalFactory = FakeFactory<provider::PhysicalProviderFactory, provider::StorageIRI>;
using FakeContainerFactory = FakeFactory<provider::ContainerProviderFactory, provider::StorageItem>;

} // namespace foundation::storage::registry
