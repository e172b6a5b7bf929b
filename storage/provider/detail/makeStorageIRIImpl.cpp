#include <storage/provider/detail/ContainerImpl.hpp>
#include <storage/provider/detail/HierarchicalImpl.hpp>

#include <utility>

namespace foundation::storage::provider::detail {

std::shared_ptr<StorageIRIImpl> makeStorageIRIImpl(network::IRI iri)
{
    if (iri.isOpaque())
        return std::shared_ptr<StorageIRIImpl>(new ContainerImpl(std::move(iri)));
    return std::shared_ptr<StorageIRIImpl>(new HierarchicalImpl(std::move(iri)));
}

} // namespace foundation::storage::provider::detail
