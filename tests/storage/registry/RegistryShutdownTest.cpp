#include <storage/registry/Registry.hpp>

#include <tests/storage/registry/FakeFactory.hpp>
#include <tests/support/CallLog.hpp>
#include <tests/support/thrown.hpp>

#include <gtest/gtest.h>

#include <stdexcept>

namespace foundation::storage::registry {
namespace {

using namespace provider;
using namespace tests::support;

/// Two stores and two kinds of containers, which note down that they are shut down.
struct RegistryToShutDown : testing::Test
{
    RegistryToShutDown()
    {
        registry.add(u"a", a);
        registry.add(u"b", b);
        registry.add(u"tar", tar);
        registry.add(u"zip", zip);
        a->onShutdown = [this] { log.push_back("a"); };
        b->onShutdown = [this] { log.push_back("b"); };
        tar->onShutdown = [this] { log.push_back("tar"); };
        zip->onShutdown = [this] { log.push_back("zip"); };
    }

    CallLog log;
    std::shared_ptr<FakePhysicalFactory> a = std::make_shared<FakePhysicalFactory>();
    std::shared_ptr<FakePhysicalFactory> b = std::make_shared<FakePhysicalFactory>();
    std::shared_ptr<FakeContainerFactory> tar = std::make_shared<FakeContainerFactory>();
    std::shared_ptr<FakeContainerFactory> zip = std::make_shared<FakeContainerFactory>();
    Registry registry;
};

TEST_F(RegistryToShutDown, ReachesEveryFactoryThoseOfContainersFirst)
{
    StorageItem const first = registry.open(u"zip:a:/x!/y");
    StorageItem const second = registry.open(u"tar:b:/x!/y");
    registry.shutdown();
    EXPECT_EQ(log, (CallLog{"tar", "zip", "a", "b"}));
}

TEST_F(RegistryToShutDown, PassesOverProvidersThatAreGone)
{
    registry.open(u"zip:a:/x!/y");
    StorageItem const item = registry.open(u"b:/x");
    registry.shutdown();
    EXPECT_EQ(log, CallLog{"b"});
}

TEST_F(RegistryToShutDown, DoesNothingWhereNothingIsOpen)
{
    registry.shutdown();
    EXPECT_TRUE(log.empty());
}

TEST_F(RegistryToShutDown, GoesOnAfterAFailureAndThrowsTheFirst)
{
    tar->onShutdown = [] { throw std::domain_error("first"); };
    a->onShutdown = [] { throw std::runtime_error("second"); };
    StorageItem const first = registry.open(u"zip:a:/x!/y");
    StorageItem const second = registry.open(u"tar:b:/x!/y");
    EXPECT_EQ(textOf<std::domain_error>([&] { registry.shutdown(); }), "first");
    EXPECT_EQ(log, (CallLog{"zip", "b"}));
}

TEST_F(RegistryToShutDown, OpensOnAfterwards)
{
    StorageItem const item = registry.open(u"a:/x");
    registry.shutdown();
    EXPECT_EQ(registry.open(u"a:/x"), item);
}

} // namespace
} // namespace foundation::storage::registry
