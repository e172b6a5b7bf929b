#include <storage/registry/Registry.hpp>

#include <storage/memory/MemoryProviderFactory.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/storage/registry/FakeFactory.hpp>
#include <tests/support/Box.hpp>
#include <tests/support/CallLog.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

#include <stdexcept>

namespace foundation::storage::registry {
namespace {

using namespace provider;
using namespace tests::support;

/// Boxes in memory, and containers whose providers do not hold the container.
struct RegistryOfContainers : testing::Test
{
    RegistryOfContainers()
    {
        registry.add(u"mem", std::make_shared<memory::MemoryProviderFactory>());
        registry.add(u"box", boxes);
        registry.add(u"disk", disk);
        registry.add(u"tar", tar);
        registry.add(u"zip", zip);
    }

    void write(std::u16string const& location, std::string const& content) const
    {
        registry.open(location).createFile();
        auto const stream = registry.open(location).openStream({});
        ASSERT_EQ(stream->write(content.data(), static_cast<long>(content.size())), static_cast<long>(content.size()));
        stream->close();
    }

    std::string read(std::u16string const& location) const
    {
        auto const stream = registry.open(location).openReadOnlyStream();
        std::string content(100, '\0');
        content.resize(static_cast<std::size_t>(stream->read(content.data(), 100)));
        return content;
    }

    std::shared_ptr<BoxFactory> boxes = std::make_shared<BoxFactory>();
    std::shared_ptr<FakePhysicalFactory> disk = std::make_shared<FakePhysicalFactory>();
    std::shared_ptr<FakeContainerFactory> tar = std::make_shared<FakeContainerFactory>();
    std::shared_ptr<FakeContainerFactory> zip = std::make_shared<FakeContainerFactory>();
    Registry registry;
};

TEST_F(RegistryOfContainers, ReadsWhatLiesInsideAContainer)
{
    write(u"mem:///file", "bytes");
    EXPECT_EQ(read(u"box:mem:///file!/content"), "bytes");
}

TEST_F(RegistryOfContainers, ReadsWhatLiesInsideNestedContainers)
{
    write(u"mem:///a%20b%21", "bytes");
    EXPECT_EQ(read(u"box:box:box:mem:///a%20b%21!/content!/content!/content"), "bytes");
    EXPECT_EQ(boxes->built, 3);
}

TEST_F(RegistryOfContainers, OpensFromTheInsideOut)
{
    CallLog log;
    disk->onBuild = [&] { log.push_back("disk"); };
    tar->onBuild = [&] { log.push_back("tar"); };
    zip->onBuild = [&] { log.push_back("zip"); };
    registry.open(u"zip:tar:disk:/a!/b!/c");
    EXPECT_EQ(log, (CallLog{"disk", "tar", "zip"}));
}

TEST_F(RegistryOfContainers, StopsWhereAContainerIsMissing)
{
    EXPECT_EQ(failureOf([&] { registry.open(u"zip:box:mem:///file!/content!/x"); }),
              failure(ErrorCode::ResourceNotFound, StorageIRI(u"mem:///file")));
    EXPECT_EQ(zip->built, 0);
}

TEST_F(RegistryOfContainers, ItemsOfOneContainerShareItsProvider)
{
    StorageItem const item = registry.open(u"tar:disk:/a!/b");
    EXPECT_TRUE(registry.open(u"tar:disk:/a!/c").hasSameProviderInstance(item));
    EXPECT_FALSE(registry.open(u"tar:disk:/other!/b").hasSameProviderInstance(item));
    EXPECT_EQ(registry.open(u"tar:disk:/a!/b"), item);
    EXPECT_EQ(disk->built, 1);
    EXPECT_EQ(tar->built, 2);
}

TEST_F(RegistryOfContainers, ItemsKeepTheProvidersOfAllOuterLevels)
{
    StorageItem const item = registry.open(u"zip:tar:disk:/a!/b!/c");
    EXPECT_FALSE(disk->last.expired());
    EXPECT_FALSE(tar->last.expired());
    EXPECT_FALSE(zip->last.expired());
}

TEST_F(RegistryOfContainers, ItemsMadeFromAnItemKeepThemToo)
{
    auto item = std::make_unique<StorageItem>(registry.open(u"zip:tar:disk:/a!/b!/c"));
    StorageItem const child(*item, u"d");
    StorageItem const parent = item->getParent();
    item.reset();
    EXPECT_FALSE(disk->last.expired());
    EXPECT_FALSE(tar->last.expired());
}

TEST_F(RegistryOfContainers, EachItemKeepsThemByItself)
{
    auto first = std::make_unique<StorageItem>(registry.open(u"tar:disk:/a!/b"));
    StorageItem const second = registry.open(u"tar:disk:/a!/c");
    first.reset();
    EXPECT_FALSE(disk->last.expired());
    EXPECT_FALSE(tar->last.expired());
}

TEST_F(RegistryOfContainers, TheLastItemLetsGoOfAllProviders)
{
    registry.open(u"zip:tar:disk:/a!/b!/c");
    EXPECT_TRUE(zip->last.expired());
    EXPECT_TRUE(tar->last.expired());
    EXPECT_TRUE(disk->last.expired());
}

TEST_F(RegistryOfContainers, FailureToOpenAContainerLetsGoOfTheStore)
{
    zip->onBuild = [] { throw std::domain_error("no archive"); };
    EXPECT_THROW(registry.open(u"zip:tar:disk:/a!/b!/c"), std::domain_error);
    EXPECT_TRUE(tar->last.expired());
    EXPECT_TRUE(disk->last.expired());
}

TEST_F(RegistryOfContainers, ContainersGiveTheirItemsTheLocationAsAsked)
{
    EXPECT_EQ(registry.open(u"tar:disk:/a!/b%21/").getLocation().toString(), u"tar:disk:/a!/b%21");
}

} // namespace
} // namespace foundation::storage::registry
