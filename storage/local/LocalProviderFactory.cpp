#include <storage/local/LocalProviderFactory.hpp>

#include <storage/local/LocalProvider.hpp>
#include <storage/local/detail/nativePath.hpp>

namespace foundation::storage::local {

using provider::StorageIRI;

std::shared_ptr<provider::IProvider> LocalProviderFactory::doBuildProvider(StorageIRI const& /*location*/) const
{
    return std::make_shared<LocalProvider>();
}

StorageIRI LocalProviderFactory::doGetKey(StorageIRI const& location) const
{
    static_cast<void>(detail::nativePath(location)); // throws for what the provider would refuse
    return StorageIRI(u"file:///");
}

} // namespace foundation::storage::local
