#include <storage/provider/ContainerProviderFactory.hpp>

#include <storage/provider/detail/ProviderFactoryImpl.hpp>

namespace foundation::storage::provider {

ContainerProviderFactory::ContainerProviderFactory() : implementation_(std::make_shared<detail::ProviderFactoryImpl>())
{}

ContainerProviderFactory::~ContainerProviderFactory() = default;

StorageIRI ContainerProviderFactory::getKey(StorageItem const& container) const
{
    return doGetKey(container);
}

std::shared_ptr<IProvider> ContainerProviderFactory::buildProvider(StorageItem const& container) const
{
    return implementation_->findOrBuild(doGetKey(container), [&] { return doBuildProvider(container); });
}

void ContainerProviderFactory::shutdownProvider() const
{
    implementation_->shutdown();
}

} // namespace foundation::storage::provider
