#include <storage/archive/ArchiveProviderFactory.hpp>

#include <storage/archive/ArchiveProvider.hpp>

namespace foundation::storage::archive {

using namespace provider;

ArchiveProviderFactory::ArchiveProviderFactory(ArchiveFormat format, ArchiveLimits const& limits)
    : format_(format), limits_(limits)
{}

ArchiveProviderFactory::~ArchiveProviderFactory() = default;

std::shared_ptr<IProvider> ArchiveProviderFactory::doBuildProvider(StorageItem const& container) const
{
    return std::make_shared<ArchiveProvider>(format_, container, limits_);
}

StorageIRI ArchiveProviderFactory::doGetKey(StorageItem const& container) const
{
    return StorageIRI(container.getCanonicalLocation().toString());
}

} // namespace foundation::storage::archive
