#include <storage/registry/registerAll.hpp>

#include <storage/local/LocalProviderFactory.hpp>
#include <storage/memory/MemoryProviderFactory.hpp>

namespace foundation::storage::registry {

void registerAll(Registry& registry)
{
    registry.add(u"file", std::make_shared<local::LocalProviderFactory>());
    registry.add(u"mem", std::make_shared<memory::MemoryProviderFactory>());
}

} // namespace foundation::storage::registry
