#include <storage/provider/detail/ProviderFactoryImpl.hpp>

#include <storage/provider/IConfigurableProvider.hpp>

#include <utility>

namespace foundation::storage::provider::detail {

std::shared_ptr<IProvider> ProviderFactoryImpl::findOrBuild(StorageIRI const& key,
                                                            std::function<std::shared_ptr<IProvider>()> const& build)
{
    std::lock_guard const lock(mutex_);
    auto const found = cache_.find(key);
    if (found != cache_.end()) {
        if (std::shared_ptr<IProvider> live = found->second.lock())
            return live;
    }
    std::shared_ptr<IProvider> built = build();
    if (!configuration_.empty())
        passConfigurationTo(built.get());
    cache_.insert_or_assign(key, built);
    return built;
}

void ProviderFactoryImpl::configure(boost::property_tree::ptree tree)
{
    std::lock_guard const lock(mutex_);
    configuration_ = std::move(tree);
    for (auto const& [key, provider] : cache_)
        passConfigurationTo(provider.lock().get());
}

void ProviderFactoryImpl::shutdown()
{
    std::lock_guard const lock(mutex_);
    for (auto const& [key, provider] : cache_) {
        if (std::shared_ptr<IProvider> const live = provider.lock())
            live->shutdown();
    }
}

void ProviderFactoryImpl::passConfigurationTo(IProvider* provider) const
{
    if (auto* const configurable = dynamic_cast<IConfigurableProvider*>(provider))
        configurable->configure(configuration_);
}

} // namespace foundation::storage::provider::detail
