#pragma once

#include <foundation/export.hpp>
#include <storage/provider/PhysicalProviderFactory.hpp>

#include <map>
#include <memory>
#include <string>

namespace foundation::storage::memory {

namespace detail {
class Tree;
} // namespace detail

/// Makes and shares the providers of stores in memory: one for each authority, so that `mem://a/` and `mem://b/` are
/// apart.
///
/// The factory keeps what is stored: a store whose provider is gone is found as it was left when its provider is built
/// again. Key: the root location of the authority, from text.
///
/// Errors: `InvalidLocation` for what is no location in memory.
/// Threads: as its base.
class FOUNDATION_API MemoryProviderFactory : public provider::PhysicalProviderFactory
{
protected:
    std::shared_ptr<provider::IProvider> doBuildProvider(provider::StorageIRI const& location) const override;
    provider::StorageIRI doGetKey(provider::StorageIRI const& location) const override;

private:
    /// Used by `doBuildProvider` alone, which the base calls under its lock.
    mutable std::map<std::u16string, std::shared_ptr<detail::Tree>> trees_;
};

} // namespace foundation::storage::memory
