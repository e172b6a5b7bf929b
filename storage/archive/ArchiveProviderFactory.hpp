#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveFormat.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/provider/ContainerProviderFactory.hpp>

namespace foundation::storage::archive {

/// Makes and shares the providers of archives of one format.
///
/// Key: the canonical location of the container. Containers in stores that use the same locations for different files,
/// such as two stores in memory made by hand, need factories of their own.
///
/// Errors: `ArchiveException` for a container that lies too deep in others.
/// Threads: as its base.
class FOUNDATION_API ArchiveProviderFactory : public provider::ContainerProviderFactory
{
public:
    explicit ArchiveProviderFactory(ArchiveFormat format, ArchiveLimits const& limits = {});
    ~ArchiveProviderFactory() override;

protected:
    std::shared_ptr<provider::IProvider> doBuildProvider(provider::StorageItem const& container) const override;
    provider::StorageIRI doGetKey(provider::StorageItem const& container) const override;

private:
    ArchiveFormat const format_;
    ArchiveLimits const limits_;
};

} // namespace foundation::storage::archive
