#include <storage/provider/ContainerProviderFactory.hpp>

#include <tests/support/ConfigurableProvider.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/slotOf.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>

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
    mutable ConfigurableProvider* last = nullptr; ///< valid while somebody holds it
    mutable int built = 0;
    std::function<void()> onBuild = [] {};
    std::function<void()> onKey = [] {};

protected:
    std::shared_ptr<IProvider> doBuildProvider(StorageItem const& container) const override
    {
        EXPECT_TRUE(container.fileExists());
        ++built;
        onBuild();
        auto provider = std::make_shared<ConfigurableProvider>();
        last = provider.get();
        return provider;
    }
    StorageIRI doGetKey(StorageItem const& container) const override
    {
        onKey();
        return container.getLocation();
    }
};

struct Container
{
    explicit Container(std::u16string const& location = u"s://h/container") : item(provider, StorageIRI(location))
    {
        provider->put(item.getLocation(), "content");
    }

    std::shared_ptr<MinimalProvider> provider = std::make_shared<MinimalProvider>();
    StorageItem item;
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

TEST(ContainerProviderFactory, ProviderThatNobodyHoldsIsBuiltAnew)
{
    Container const container;
    FileFactory const factory;
    std::weak_ptr<IProvider> const first = factory.buildProvider(container.item);
    EXPECT_TRUE(first.expired());
    EXPECT_NE(factory.buildProvider(container.item), nullptr);
    EXPECT_EQ(factory.built, 2);
}

TEST(ContainerProviderFactory, FailingBuilderPassesAndNothingIsKept)
{
    Container const container;
    FileFactory factory;
    factory.onBuild = [] { throw std::domain_error("not built"); };
    EXPECT_THROW((void)factory.buildProvider(container.item), std::domain_error);
    factory.onBuild = [] {};
    EXPECT_NE(factory.buildProvider(container.item), nullptr);
    EXPECT_EQ(factory.built, 2);
}

TEST(ContainerProviderFactory, KeyIsAskedForBeforeTheLockIsTaken)
{
    Container const outer;
    Container const inner(u"s://h/inner");
    FileFactory factory;
    bool nested = false;
    factory.onKey = [&] {
        if (!std::exchange(nested, true)) {
            EXPECT_NE(factory.buildProvider(inner.item), nullptr);
        }
    };
    EXPECT_NE(factory.buildProvider(outer.item), nullptr);
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
