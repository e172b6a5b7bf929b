#include <storage/registry/registerAll.hpp>

#include <storage/local/LocalProviderFactory.hpp>
#include <storage/memory/MemoryProviderFactory.hpp>

#ifdef FOUNDATION_STORAGE_HAS_ARCHIVE
#include <storage/archive/ArchiveProviderFactory.hpp>
#endif

namespace foundation::storage::registry {

namespace {

#ifdef FOUNDATION_STORAGE_HAS_ARCHIVE
void registerArchives(Registry& registry)
{
    using archive::ArchiveFormat;
    using archive::ArchiveProviderFactory;
    registry.add(u"cpio", std::make_shared<ArchiveProviderFactory>(ArchiveFormat::Cpio));
    registry.add(u"iso", std::make_shared<ArchiveProviderFactory>(ArchiveFormat::Iso));
    registry.add(u"sevenzip", std::make_shared<ArchiveProviderFactory>(ArchiveFormat::SevenZip));
    registry.add(u"tar", std::make_shared<ArchiveProviderFactory>(ArchiveFormat::Tar));
    registry.add(u"zip", std::make_shared<ArchiveProviderFactory>(ArchiveFormat::Zip));
}
#else
void registerArchives(Registry& /*registry*/) {}
#endif

} // namespace

void registerAll(Registry& registry)
{
    registry.add(u"file", std::make_shared<local::LocalProviderFactory>());
    registry.add(u"mem", std::make_shared<memory::MemoryProviderFactory>());
    registerArchives(registry);
}

} // namespace foundation::storage::registry
