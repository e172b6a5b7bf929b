#pragma once

#include <foundation/export.hpp>
#include <storage/archive/ArchiveFormat.hpp>
#include <storage/archive/ArchiveLimits.hpp>
#include <storage/provider/ContainerProviderFactory.hpp>

#include <map>
#include <memory>
#include <mutex>
#include <set>

namespace foundation::storage::archive {

class ArchiveProvider;

/// Makes and shares the providers of archives of one format.
///
/// Key: the canonical location of the container, so that it has one provider whatever links lead to it. Containers in
/// stores that use the same locations for different files, such as two stores in memory made by hand, need factories of
/// their own.
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
    /// The locations under which a container was asked for, and its provider while that lives.
    struct Known
    {
        std::set<provider::StorageIRI> locations;
        std::weak_ptr<ArchiveProvider> provider;
    };

    ArchiveFormat const format_;
    ArchiveLimits const limits_;
    mutable std::mutex mutex_;
    mutable std::map<provider::StorageIRI, Known> known_; ///< by key
};

} // namespace foundation::storage::archive
