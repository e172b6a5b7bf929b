#include <storage/memory/MemoryProviderFactory.hpp>

#include <storage/memory/MemoryProvider.hpp>
#include <storage/memory/detail/Tree.hpp>

namespace foundation::storage::memory {

using provider::StorageIRI;

std::shared_ptr<provider::IProvider> MemoryProviderFactory::doBuildProvider(StorageIRI const& location) const
{
    std::u16string const authority(detail::authorityOf(detail::rootOf(location)));
    std::shared_ptr<detail::Tree>& tree = trees_[authority];
    if (tree == nullptr)
        tree = std::make_shared<detail::Tree>(location);
    return std::make_shared<MemoryProvider>(tree);
}

StorageIRI MemoryProviderFactory::doGetKey(StorageIRI const& location) const
{
    return detail::rootOf(location);
}

} // namespace foundation::storage::memory
