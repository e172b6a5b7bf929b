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
    EXPECT_EQ(registry.schemes(), (std::vector<Scheme>{{u"file", SchemeKind::Physical}, //
                                                       {u"mem", SchemeKind::Physical}}));
}

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
