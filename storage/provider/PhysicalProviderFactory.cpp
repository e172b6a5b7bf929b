#include <storage/provider/PhysicalProviderFactory.hpp>

#include <storage/provider/detail/ProviderFactoryImpl.hpp>

#include <utility>

namespace foundation::storage::provider {

PhysicalProviderFactory::PhysicalProviderFactory() : implementation_(std::make_shared<detail::ProviderFactoryImpl>()) {}

PhysicalProviderFactory::~PhysicalProviderFactory() = default;

StorageIRI PhysicalProviderFactory::getKey(StorageIRI const& location) const
{
    return doGetKey(location);
}

std::shared_ptr<IProvider> PhysicalProviderFactory::buildProvider(StorageIRI const& location) const
{
    return implementation_->findOrBuild(doGetKey(location), [&] { return doBuildProvider(location); });
}

void PhysicalProviderFactory::shutdownProvider() const
{
    implementation_->shutdown();
}

void PhysicalProviderFactory::configure(boost::property_tree::ptree tree)
{
    implementation_->configure(std::move(tree));
}

} // namespace foundation::storage::provider
