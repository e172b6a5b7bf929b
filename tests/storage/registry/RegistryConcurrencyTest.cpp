#include <storage/registry/Registry.hpp>

#include <storage/memory/MemoryProviderFactory.hpp>
#include <tests/storage/registry/FakeFactory.hpp>
#include <tests/support/Box.hpp>
#include <tests/support/inThreads.hpp>

#include <gtest/gtest.h>

#include <optional>
#include <vector>

namespace foundation::storage::registry {
namespace {

using namespace provider;
using namespace tests::support;
using boost::property_tree::ptree;

constexpr int threadCount = 8;
constexpr int rounds = 200;

ptree limit(int bytes)
{
    ptree settings;
    settings.put("mem.limit", bytes);
    return settings;
}

struct RegistryConcurrency : testing::Test
{
    RegistryConcurrency()
    {
        registry.add(u"mem", std::make_shared<memory::MemoryProviderFactory>());
        registry.add(u"box", boxes);
        registry.open(u"mem:///file").createFile();
    }

    std::shared_ptr<BoxFactory> boxes = std::make_shared<BoxFactory>();
    Registry registry;
};

TEST_F(RegistryConcurrency, AllWhoOpenOneContainerShareItsProvider)
{
    std::vector<std::optional<StorageItem>> items(threadCount);
    inThreads(threadCount, [&](int i) {
        items[static_cast<std::size_t>(i)] = registry.open(u"box:box:mem:///file!/content!/content");
    });
    EXPECT_EQ(boxes->built, 2);
    for (auto const& item : items)
        EXPECT_TRUE(item->hasSameProviderInstance(*items.front()));
}

TEST_F(RegistryConcurrency, ItemsThatComeAndGoFindTheirStoreAlive)
{
    inThreads(threadCount, [&](int) {
        for (int round = 0; round < rounds; ++round)
            EXPECT_TRUE(registry.open(u"box:box:mem:///file!/content!/content").openReadOnlyStream() != nullptr);
    });
}

TEST_F(RegistryConcurrency, OpensListsConfiguresAndShutsDownAtOnce)
{
    inThreads(threadCount, [&](int i) {
        for (int round = 0; round < rounds; ++round) {
            if (i == 0)
                registry.configure(limit(round));
            else if (i == 1)
                registry.shutdown();
            else if (i == 2)
                EXPECT_EQ(registry.schemes().size(), 2U);
            else
                EXPECT_TRUE(registry.open(u"box:mem:///file!/content").fileExists());
        }
    });
}

} // namespace
} // namespace foundation::storage::registry
