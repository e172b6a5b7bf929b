#include <storage/archive/ArchiveProviderFactory.hpp>

#include <storage/archive/ArchiveProvider.hpp>

namespace foundation::storage::archive {

using namespace provider;

namespace {

StorageIRI keyOf(StorageItem const& container)
{
    return StorageIRI(container.getCanonicalLocation().toString());
}

/// The container at its canonical path, which a link that changes leaves as it is. A store may have its containers
/// elsewhere than the path says.
StorageItem canonical(StorageItem const& container)
{
    StorageIRI const location = container.getCanonicalLocation();
    StorageItem const item(container, location.getPath());
    return item.getCanonicalLocation() == location ? item : container;
}

} // namespace

ArchiveProviderFactory::ArchiveProviderFactory(ArchiveFormat format, ArchiveLimits const& limits)
    : format_(format), limits_(limits)
{}

ArchiveProviderFactory::~ArchiveProviderFactory() = default;

std::shared_ptr<IProvider> ArchiveProviderFactory::doBuildProvider(StorageItem const& container) const
{
    auto provider = std::make_shared<ArchiveProvider>(format_, canonical(container), limits_);
    std::lock_guard const lock(mutex_);
    Known& known = known_[keyOf(container)];
    known.provider = provider;
    for (StorageIRI const& location : known.locations)
        provider->addContainerLocation(location);
    return provider;
}

StorageIRI ArchiveProviderFactory::doGetKey(StorageItem const& container) const
{
    StorageIRI const key = keyOf(container);
    std::lock_guard const lock(mutex_);
    Known& known = known_[key];
    bool const isNew = known.locations.insert(container.getLocation()).second;
    if (auto const provider = isNew ? known.provider.lock() : nullptr)
        provider->addContainerLocation(container.getLocation());
    return key;
}

} // namespace foundation::storage::archive
