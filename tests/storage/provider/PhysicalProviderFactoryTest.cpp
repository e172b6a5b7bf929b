#include <storage/provider/PhysicalProviderFactory.hpp>

#include <storage/provider/IConfigurableProvider.hpp>
#include <tests/support/ConfigurableProvider.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/inThreads.hpp>
#include <tests/support/slotOf.hpp>

#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <memory>
#include <set>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <vector>

namespace foundation::storage::provider {
namespace {

using namespace tests::support;
using boost::property_tree::ptree;

static_assert(std::is_abstract_v<PhysicalProviderFactory>);
static_assert(std::is_same_v<decltype(&PhysicalProviderFactory::getKey),
                             StorageIRI (PhysicalProviderFactory::*)(StorageIRI const&) const>);
static_assert(std::is_same_v<decltype(&PhysicalProviderFactory::buildProvider),
                             std::shared_ptr<IProvider> (PhysicalProviderFactory::*)(StorageIRI const&) const>);
static_assert(
    std::is_same_v<decltype(&PhysicalProviderFactory::shutdownProvider), void (PhysicalProviderFactory::*)() const>);
static_assert(std::is_same_v<decltype(&PhysicalProviderFactory::configure), void (PhysicalProviderFactory::*)(ptree)>);

struct Opened : PhysicalProviderFactory
{
    using PhysicalProviderFactory::doBuildProvider;
    using PhysicalProviderFactory::doGetKey;
};

/// Serves each root with a provider that it makes as it is told.
class RootFactory : public PhysicalProviderFactory
{
public:
    std::function<std::shared_ptr<IProvider>()> make = [] { return std::make_shared<MinimalProvider>(); };
    std::function<StorageIRI(StorageIRI const&)> keyOf = [](StorageIRI const& x) { return StorageIRI(x, u"/"); };
    mutable std::atomic<int> built{0};

protected:
    std::shared_ptr<IProvider> doBuildProvider(StorageIRI const&) const override
    {
        ++built;
        return make();
    }
    StorageIRI doGetKey(StorageIRI const& x) const override { return keyOf(x); }
};

StorageIRI const a(u"s://a/x");
StorageIRI const b(u"s://b/x");

ptree tree(std::string const& value)
{
    ptree result;
    result.put("key", value);
    return result;
}

TEST(PhysicalProviderFactory, BuildingIsTheFirstSlotAfterTheDestructorAndTheKeyTheNext)
{
    EXPECT_EQ(slotOf(&Opened::doBuildProvider), 2U);
    EXPECT_EQ(slotOf(&Opened::doGetKey), 3U);
}

TEST(PhysicalProviderFactory, KeyIsThatOfTheConcreteFactory)
{
    EXPECT_EQ(RootFactory().getKey(a), StorageIRI(u"s://a/"));
}

TEST(PhysicalProviderFactory, LocationsOfOneKeyShareOneProvider)
{
    RootFactory const factory;
    auto const first = factory.buildProvider(a);
    EXPECT_EQ(factory.buildProvider(StorageIRI(u"s://a/other/place")), first);
    EXPECT_EQ(factory.built, 1);
}

TEST(PhysicalProviderFactory, LocationsOfTwoKeysDoNot)
{
    RootFactory const factory;
    EXPECT_NE(factory.buildProvider(a), factory.buildProvider(b));
}

TEST(PhysicalProviderFactory, ProviderThatNobodyHoldsIsBuiltAnew)
{
    RootFactory const factory;
    std::weak_ptr<IProvider> const first = factory.buildProvider(a);
    EXPECT_TRUE(first.expired());
    auto const second = factory.buildProvider(a);
    EXPECT_EQ(factory.built, 2);
    EXPECT_EQ(factory.buildProvider(a), second);
    EXPECT_EQ(factory.built, 2);
}

TEST(PhysicalProviderFactory, ProvidersOutliveTheFactory)
{
    std::shared_ptr<IProvider> provider;
    {
        RootFactory const factory;
        provider = factory.buildProvider(a);
    }
    EXPECT_FALSE(provider->fileExists(a));
}

TEST(PhysicalProviderFactory, MissingProviderIsAnsweredAndAskedForAgain)
{
    RootFactory factory;
    factory.configure(tree("1"));
    factory.make = [] { return nullptr; };
    EXPECT_EQ(factory.buildProvider(a), nullptr);
    EXPECT_EQ(factory.buildProvider(a), nullptr);
    EXPECT_EQ(factory.built, 2);
    factory.configure(tree("2"));
    factory.shutdownProvider();
}

TEST(PhysicalProviderFactory, FailingKeyPassesAndTheFactoryGoesOn)
{
    RootFactory factory;
    auto const keyOf = factory.keyOf;
    factory.keyOf = [](StorageIRI const&) -> StorageIRI { throw std::domain_error("no key"); };
    EXPECT_THROW((void)factory.buildProvider(a), std::domain_error);
    EXPECT_EQ(factory.built, 0);
    factory.keyOf = keyOf;
    EXPECT_NE(factory.buildProvider(a), nullptr);
}

TEST(PhysicalProviderFactory, KeyIsAskedForBeforeTheLockIsTaken)
{
    RootFactory factory;
    auto const keyOf = factory.keyOf;
    bool nested = false;
    factory.keyOf = [&](StorageIRI const& x) {
        if (!nested) {
            nested = true;
            EXPECT_NE(factory.buildProvider(b), nullptr);
        }
        return keyOf(x);
    };
    EXPECT_NE(factory.buildProvider(a), nullptr);
}

TEST(PhysicalProviderFactory, FailingBuilderPassesAndNothingIsKept)
{
    RootFactory factory;
    auto const make = factory.make;
    factory.make = []() -> std::shared_ptr<IProvider> { throw std::domain_error("not built"); };
    EXPECT_THROW((void)factory.buildProvider(a), std::domain_error);
    factory.make = make;
    EXPECT_NE(factory.buildProvider(a), nullptr);
    EXPECT_EQ(factory.built, 2);
}

/// Makes configurable providers, and keeps each together with what it was given.
struct ConfigurableFactory : RootFactory
{
    ConfigurableFactory()
    {
        make = [this] {
            auto provider = std::make_shared<ConfigurableProvider>();
            provider->onConfigure = onConfigure;
            providers.push_back(provider.get());
            return provider;
        };
    }

    std::function<void(ConfigurableProvider&)> onConfigure = [](ConfigurableProvider&) {};
    std::vector<ConfigurableProvider*> providers; ///< valid while somebody holds them
};

TEST(PhysicalProviderFactory, WithoutConfigurationNothingIsConfigured)
{
    ConfigurableFactory factory;
    auto const provider = factory.buildProvider(a);
    EXPECT_TRUE(factory.providers[0]->trees.empty());
}

TEST(PhysicalProviderFactory, EmptyTreeConfiguresNoNewProvider)
{
    ConfigurableFactory factory;
    factory.configure(tree("1"));
    factory.configure(ptree("data without children"));
    auto const provider = factory.buildProvider(a);
    EXPECT_TRUE(factory.providers[0]->trees.empty());
}

TEST(PhysicalProviderFactory, NewProviderIsConfiguredOnceWithTheStoredTree)
{
    ConfigurableFactory factory;
    factory.configure(tree("1"));
    auto const provider = factory.buildProvider(a);
    EXPECT_EQ(factory.buildProvider(a), provider);
    EXPECT_EQ(factory.providers[0]->trees, std::vector{tree("1")});
}

TEST(PhysicalProviderFactory, LiveProvidersAreReconfiguredInKeyOrder)
{
    std::vector<std::string> order;
    ConfigurableFactory factory;
    auto const second = factory.buildProvider(b);
    auto const first = factory.buildProvider(a);
    auto const dead = factory.buildProvider(StorageIRI(u"s://c/")).get();
    EXPECT_NE(dead, nullptr);
    factory.providers[0]->onConfigure = [&](auto&) { order.emplace_back("b"); };
    factory.providers[1]->onConfigure = [&](auto&) { order.emplace_back("a"); };
    factory.configure(tree("2"));
    EXPECT_EQ(order, (std::vector<std::string>{"a", "b"}));
    EXPECT_EQ(factory.providers[0]->trees, std::vector{tree("2")});
}

TEST(PhysicalProviderFactory, EmptyTreeReachesLiveProviders)
{
    ConfigurableFactory factory;
    auto const provider = factory.buildProvider(a);
    factory.configure(ptree());
    EXPECT_EQ(factory.providers[0]->trees, std::vector{ptree()});
}

TEST(PhysicalProviderFactory, ProvidersThatTakeNoConfigurationAreSkipped)
{
    RootFactory factory;
    factory.configure(tree("1"));
    auto const provider = factory.buildProvider(a);
    EXPECT_NE(provider, nullptr);
    EXPECT_NO_THROW(factory.configure(tree("2")));
}

TEST(PhysicalProviderFactory, ProviderThatRefusesItsFirstConfigurationIsNotKept)
{
    ConfigurableFactory factory;
    factory.onConfigure = [](auto&) { throw std::domain_error("refused"); };
    factory.configure(tree("1"));
    EXPECT_THROW((void)factory.buildProvider(a), std::domain_error);
    factory.onConfigure = [](auto&) {};
    auto const provider = factory.buildProvider(a);
    EXPECT_EQ(factory.built, 2);
    EXPECT_EQ(factory.providers[1], provider.get());
}

TEST(PhysicalProviderFactory, FirstRefusalEndsReconfigurationAndTheNewTreeStays)
{
    ConfigurableFactory factory;
    auto const first = factory.buildProvider(a);
    auto const second = factory.buildProvider(b);
    factory.providers[0]->onConfigure = [](auto&) { throw std::domain_error("refused"); };
    EXPECT_THROW(factory.configure(tree("2")), std::domain_error);
    EXPECT_TRUE(factory.providers[1]->trees.empty());
    auto const third = factory.buildProvider(StorageIRI(u"s://c/"));
    EXPECT_EQ(factory.providers[2]->trees, std::vector{tree("2")});
}

TEST(PhysicalProviderFactory, ShutdownReachesTheLiveInKeyOrderAndKeepsThem)
{
    std::vector<std::string> order;
    ConfigurableFactory factory;
    auto const second = factory.buildProvider(b);
    auto const first = factory.buildProvider(a);
    (void)factory.buildProvider(StorageIRI(u"s://c/"));
    factory.providers[0]->onShutdown = [&] { order.emplace_back("b"); };
    factory.providers[1]->onShutdown = [&] { order.emplace_back("a"); };
    factory.shutdownProvider();
    EXPECT_EQ(order, (std::vector<std::string>{"a", "b"}));
    EXPECT_EQ(factory.buildProvider(a), first);
}

TEST(PhysicalProviderFactory, ProviderThatLosesItsLastUserMeanwhileLivesUntilItIsDone)
{
    ConfigurableFactory factory;
    auto provider = factory.buildProvider(a);
    std::weak_ptr<IProvider> const watch = provider;
    auto const letGo = [&] {
        provider.reset();
        EXPECT_FALSE(watch.expired());
    };
    factory.providers[0]->onConfigure = [&](auto&) { letGo(); };
    factory.configure(tree("1"));
    EXPECT_TRUE(watch.expired());

    provider = factory.buildProvider(b);
    std::weak_ptr<IProvider> const other = provider;
    factory.providers[1]->onShutdown = [&] {
        provider.reset();
        EXPECT_FALSE(other.expired());
    };
    factory.shutdownProvider();
    EXPECT_TRUE(other.expired());
}

TEST(PhysicalProviderFactory, ShutDownProvidersAreStillConfigured)
{
    ConfigurableFactory factory;
    auto const provider = factory.buildProvider(a);
    factory.shutdownProvider();
    factory.configure(tree("1"));
    EXPECT_EQ(factory.providers[0]->trees, std::vector{tree("1")});
}

TEST(PhysicalProviderFactory, FirstFailureEndsShutdown)
{
    bool reached = false;
    ConfigurableFactory factory;
    auto const first = factory.buildProvider(a);
    auto const second = factory.buildProvider(b);
    factory.providers[0]->onShutdown = [] { throw std::domain_error("stuck"); };
    factory.providers[1]->onShutdown = [&] { reached = true; };
    EXPECT_THROW(factory.shutdownProvider(), std::domain_error);
    EXPECT_FALSE(reached);
    EXPECT_EQ(factory.buildProvider(b), second);
}

TEST(PhysicalProviderFactory, ShutdownOfNothingDoesNothing)
{
    EXPECT_NO_THROW(RootFactory().shutdownProvider());
}

TEST(PhysicalProviderFactoryConcurrency, ManyThreadsBuildingOneKeyGetOneProvider)
{
    constexpr int threads = 32;
    for (int round = 0; round != 20; ++round) {
        RootFactory const factory;
        std::vector<std::shared_ptr<IProvider>> results(threads);
        inThreads(threads, [&](int i) { results[static_cast<std::size_t>(i)] = factory.buildProvider(a); });
        EXPECT_EQ(factory.built, 1);
        EXPECT_EQ(std::set(results.begin(), results.end()).size(), 1U);
    }
}

TEST(PhysicalProviderFactoryConcurrency, EveryProviderHasTheLastConfigurationWhenAllAreDone)
{
    constexpr int builders = 6;
    for (int round = 0; round != 20; ++round) {
        ConfigurableFactory factory;
        std::vector<std::shared_ptr<IProvider>> built(builders);
        inThreads(builders + 2, [&](int i) {
            if (i < builders) {
                StorageIRI const location(StorageIRI(u"s://h/"),
                                          std::u16string(1, static_cast<char16_t>(u'a' + i / 2)));
                built[static_cast<std::size_t>(i)] = factory.buildProvider(location);
            } else if (i == builders) {
                for (int version = 0; version != 10; ++version)
                    factory.configure(tree(std::to_string(version)));
            } else {
                factory.shutdownProvider();
            }
        });
        for (ConfigurableProvider const* const provider : factory.providers)
            EXPECT_EQ(provider->trees.back(), tree("9"));
    }
}

} // namespace
} // namespace foundation::storage::provider
