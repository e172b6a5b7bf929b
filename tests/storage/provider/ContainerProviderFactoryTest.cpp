#include <storage/provider/ContainerProviderFactory.hpp>

#include <tests/support/ConfigurableProvider.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/slotOf.hpp>

#include <gtest/gtest.h>

#include <memory>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;

static_assert(std::is_abstract_v<ContainerProviderFactory>);
static_assert(std::is_same_v<decltype(&ContainerProviderFactory::getKey),
                             StorageIRI (ContainerProviderFactory::*)(StorageItem const&) const>);
static_assert(std::is_same_v<decltype(&ContainerProviderFactory::buildProvider),
                             std::shared_ptr<IProvider> (ContainerProviderFactory::*)(StorageItem const&) const>);
static_assert(
    std::is_same_v<decltype(&ContainerProviderFactory::shutdownProvider), void (ContainerProviderFactory::*)() const>);

template <typename Factory>
concept Configurable = requires(Factory& factory)
{
    factory.configure({});
};
static_assert(!Configurable<ContainerProviderFactory>);

struct Opened : ContainerProviderFactory
{
    using ContainerProviderFactory::doBuildProvider;
    using ContainerProviderFactory::doGetKey;
};

/// Serves each container file by a provider of its own.
class FileFactory : public ContainerProviderFactory
{
public:
    mutable std::shared_ptr<ConfigurableProvider> last;
    mutable int built = 0;

protected:
    std::shared_ptr<IProvider> doBuildProvider(StorageItem const& container) const override
    {
        EXPECT_TRUE(container.fileExists());
        ++built;
        return last = std::make_shared<ConfigurableProvider>();
    }
    StorageIRI doGetKey(StorageItem const& container) const override { return container.getLocation(); }
};

struct Container
{
    Container() { provider->put(item.getLocation(), "content"); }

    std::shared_ptr<MinimalProvider> provider = std::make_shared<MinimalProvider>();
    StorageItem item{provider, StorageIRI(u"s://h/container")};
};

TEST(ContainerProviderFactory, BuildingIsTheFirstSlotAfterTheDestructorAndTheKeyTheNext)
{
    EXPECT_EQ(slotOf(&Opened::doBuildProvider), 2U);
    EXPECT_EQ(slotOf(&Opened::doGetKey), 3U);
}

TEST(ContainerProviderFactory, KeyIsThatOfTheConcreteFactory)
{
    EXPECT_EQ(FileFactory().getKey(Container().item), StorageIRI(u"s://h/container"));
}

TEST(ContainerProviderFactory, OneContainerHasOneLiveProvider)
{
    Container const container;
    FileFactory const factory;
    auto const first = factory.buildProvider(container.item);
    EXPECT_EQ(factory.buildProvider(container.item), first);
    EXPECT_EQ(factory.built, 1);
}

TEST(ContainerProviderFactory, ProvidersAreNeverConfigured)
{
    FileFactory const factory;
    auto const provider = factory.buildProvider(Container().item);
    EXPECT_TRUE(factory.last->trees.empty());
}

TEST(ContainerProviderFactory, ShutdownReachesTheLive)
{
    FileFactory const factory;
    auto const provider = factory.buildProvider(Container().item);
    bool reached = false;
    factory.last->onShutdown = [&] { reached = true; };
    factory.shutdownProvider();
    EXPECT_TRUE(reached);
}

} // namespace
} // namespace foundation::storage::provider
