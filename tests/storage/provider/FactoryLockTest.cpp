// Which operations of a factory lock it, and what happens when that fails.

#include <storage/provider/PhysicalProviderFactory.hpp>

#include <tests/support/MinimalProvider.hpp>
#include <tests/support/locks.hpp>

#include <gtest/gtest.h>

#include <cerrno>
#include <functional>
#include <memory>
#include <system_error>

namespace foundation::storage::provider {
namespace {

using tests::support::FailingLock;
using tests::support::locksOf;
using tests::support::MinimalProvider;

/// Has one provider for everything, whose key locks nothing.
class OneKeyFactory : public PhysicalProviderFactory
{
protected:
    std::shared_ptr<IProvider> doBuildProvider(StorageIRI const&) const override
    {
        return std::make_shared<MinimalProvider>();
    }
    StorageIRI doGetKey(StorageIRI const&) const override { return key_; }

private:
    StorageIRI const key_{u"s://h/"};
};

StorageIRI const here(u"s://h/a");

TEST(FactoryLock, KeyNeedsNone)
{
    OneKeyFactory const factory;
    EXPECT_EQ(locksOf([&] { (void)factory.getKey(here); }), 0u);
}

TEST(FactoryLock, FindingALiveProviderTakesOne)
{
    OneKeyFactory const factory;
    auto const provider = factory.buildProvider(here);
    (void)factory.buildProvider(here);
    EXPECT_EQ(locksOf([&] { EXPECT_EQ(factory.buildProvider(here), provider); }), 1u);
}

TEST(FactoryLock, LockThatFailsIsReported)
{
    OneKeyFactory factory;
    auto const provider = factory.buildProvider(here);
    std::function<void()> const operations[] = {
        [&] { (void)factory.buildProvider(here); },
        [&] { factory.configure({}); },
        [&] { factory.shutdownProvider(); },
    };
    for (auto const& operation : operations) {
        FailingLock const failing(EAGAIN);
        try {
            operation();
            ADD_FAILURE() << "nothing was thrown";
        } catch (std::system_error const& error) {
            EXPECT_EQ(error.code(), std::errc::resource_unavailable_try_again);
        }
    }
    EXPECT_EQ(factory.buildProvider(here), provider);
}

} // namespace
} // namespace foundation::storage::provider
