#pragma once

#include <foundation/export.hpp>
#include <storage/provider/PhysicalProviderFactory.hpp>

namespace foundation::storage::local {

/// Makes and shares the one provider of the files of this machine.
///
/// Key: `file:///`, from text, for every location.
///
/// Errors: `InvalidLocation` for what names no local file, by the rules of `LocalProvider`.
/// Threads: as its base.
class FOUNDATION_API LocalProviderFactory : public provider::PhysicalProviderFactory
{
protected:
    std::shared_ptr<provider::IProvider> doBuildProvider(provider::StorageIRI const& location) const override;
    provider::StorageIRI doGetKey(provider::StorageIRI const& location) const override;
};

} // namespace foundation::storage::local
