#include <storage/registry/registerAll.hpp>

#include <storage/memory/MemoryProviderFactory.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <gtest/gtest.h>

#include <stdexcept>

namespace foundation::storage::registry {
namespace {

using namespace tests::support;

TEST(RegisterAll, AddsWhatIsBuiltIn)
{
    Registry registry;
    registerAll(registry);
    std::vector<Scheme> const expected{
#ifdef FOUNDATION_STORAGE_HAS_ARCHIVE
        {u"cpio", SchemeKind::Container}, {u"file", SchemeKind::Physical},      {u"iso", SchemeKind::Container},
        {u"mem", SchemeKind::Physical},   {u"sevenzip", SchemeKind::Container}, {u"tar", SchemeKind::Container},
        {u"zip", SchemeKind::Container},
#else
        {u"file", SchemeKind::Physical},
        {u"mem", SchemeKind::Physical},
#endif
    };
    EXPECT_EQ(registry.schemes(), expected);
}

#ifdef FOUNDATION_STORAGE_HAS_ARCHIVE
TEST(RegisterAll, OpensPlacesInArchives)
{
    TemporaryFolder const folder;
    folder.write("a.zip", std::string("PK\x05\x06", 4) + std::string(18, '\0'));
    Registry registry;
    registerAll(registry);
    EXPECT_TRUE(registry.open(provider::StorageIRI(u"zip", folder.iri(u"a.zip"), u"/")).folderExists());
}
#endif

TEST(RegisterAll, OpensLocalFiles)
{
    TemporaryFolder const folder;
    folder.write("file", "content");
    Registry registry;
    registerAll(registry);
    EXPECT_TRUE(registry.open(folder.iri(u"file")).fileExists());
}

TEST(RegisterAll, OpensFilesInMemory)
{
    Registry registry;
    registerAll(registry);
    registry.open(u"mem:///file").createFile();
    EXPECT_TRUE(registry.open(u"mem:///file").fileExists());
}

TEST(RegisterAll, RefusesARegistryThatServesOneOfThem)
{
    Registry registry;
    registry.add(u"mem", std::make_shared<memory::MemoryProviderFactory>());
    EXPECT_THROW(registerAll(registry), std::invalid_argument);
}

} // namespace
} // namespace foundation::storage::registry
