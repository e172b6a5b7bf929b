// Callbacks that come back to the provider, fail, or are stopped while they run.

#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/HeldCallback.hpp>
#include <tests/storage/local/KernelObjects.hpp>
#include <tests/storage/local/WatchedFolder.hpp>

#include <atomic>
#include <future>
#include <stdexcept>
#include <thread>
#include <vector>

namespace foundation::storage::local {
namespace {

using namespace provider;
using events::Kind;
using tests::support::allEventKinds;
using tests::support::HeldCallback;
using tests::support::kernelObjects;
using tests::support::kernelObjectsSettledTo;

class LocalProviderEventsStopConcurrency : public tests::support::WatchedFolder
{};

TEST_F(LocalProviderEventsStopConcurrency, CanComeFromTheCallbackItself)
{
    int told = 0;
    auto const stop = [&](auto const&...) {
        ++told;
        provider->stopPublishingFolderEventsFor(at(u""));
    };
    provider->publishFolderEventsFor(at(u""), stop, allEventKinds());
    provider->publishFolderEventsFor(at(u""), stop, allEventKinds());
    folder.write("a", "");
    folder.write("b", "");
    settle();
    EXPECT_EQ(told, 1);
}

TEST_F(LocalProviderEventsStopConcurrency, OfTheLastOneFromItsCallbackLeavesNothingInTheKernel)
{
    auto const before = kernelObjects();
    std::promise<void> stopped;
    auto const stop = [&](auto const&...) {
        provider->stopPublishingFolderEventsFor(at(u""));
        stopped.set_value();
    };
    provider->publishFolderEventsFor(at(u""), stop, allEventKinds());
    folder.write("file", "");
    stopped.get_future().wait();
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
}

TEST_F(LocalProviderEventsStopConcurrency, CanComeFromTheCallbackOfAnother)
{
    makeFolder("a");
    makeFolder("b");
    auto const stop = [&](auto const&...) { provider->stopPublishingFolderEventsFor(at(u"b")); };
    provider->publishFolderEventsFor(at(u"a"), stop, allEventKinds());
    watchFolder(u"b");
    folder.write("a/file", "");
    folder.write("b/file", "");
    EXPECT_EQ(told(), Texts());
}

TEST_F(LocalProviderEventsStopConcurrency, MayBeFollowedByANewBeginningInTheSameCallback)
{
    auto const restart = [&](auto const&...) {
        provider->stopPublishingFolderEventsFor(at(u""));
        watchFolder(u"");
    };
    provider->publishFolderEventsFor(at(u""), restart, {Kind::Created});
    folder.write("a", "");
    settle();
    remove("a");
    EXPECT_EQ(told(), Texts{"removed file a"});
}

TEST_F(LocalProviderEventsStopConcurrency, IsNotNeededToAskForMoreInACallback)
{
    auto const more = [&](auto const&...) { watchFolder(u""); };
    provider->publishFolderEventsFor(at(u""), more, {Kind::Created});
    folder.write("a", "");
    settle();
    remove("a");
    EXPECT_EQ(told(), Texts{"removed file a"});
}

TEST_F(LocalProviderEventsStopConcurrency, WaitsForACallbackThatRuns)
{
    HeldCallback held;
    std::atomic<bool> isStopped = false;
    std::atomic<bool> hasEnded = false;
    auto const callback = [&, hold = held.callback()](auto const&... event) {
        hold(event...);
        EXPECT_FALSE(isStopped);
        hasEnded = true;
    };
    provider->publishFolderEventsFor(at(u""), callback, {Kind::Created});
    folder.write("a", "");
    held.waitUntilRunning();
    std::jthread const stopping([&] {
        provider->stopPublishingFolderEventsFor(at(u""));
        EXPECT_TRUE(hasEnded);
        isStopped = true;
    });
    // Only one that is stopped and removed from the kernel leaves no watch: then it is the callback that is waited for.
    while (kernelObjects().watches != 0)
        std::this_thread::yield();
    held.release();
}

TEST_F(LocalProviderEventsStopConcurrency, DoesNotWaitForCallbacksOfOthers)
{
    makeFolder("a");
    makeFolder("b");
    HeldCallback held;
    provider->publishFolderEventsFor(at(u"a"), held.callback(), {Kind::Created});
    watchFolder(u"b");
    folder.write("a/file", "");
    held.waitUntilRunning();
    folder.write("b/file", "");
    provider->stopPublishingFolderEventsFor(at(u"b"));
    held.release();
    EXPECT_EQ(told(), Texts());
}

TEST_F(LocalProviderEventsStopConcurrency, IsNoConsequenceOfWhatACallbackThrows)
{
    int calls = 0;
    auto const fail = [&](auto const&...) {
        ++calls;
        throw std::runtime_error("no more");
    };
    provider->publishFolderEventsFor(at(u""), fail, {Kind::Created});
    watchFolder(u"");
    folder.write("a", "");
    folder.write("b", "");
    EXPECT_EQ(told(), (Texts{"created file a", "created file b"}));
    EXPECT_EQ(calls, 2);
}

TEST_F(LocalProviderEventsStopConcurrency, DestroysTheCallback)
{
    auto const held = std::make_shared<int>();
    provider->publishFolderEventsFor(at(u""), [held](auto const&...) {}, {Kind::Created});
    EXPECT_EQ(held.use_count(), 2);
    folder.write("a", "");
    settle();
    provider->stopPublishingFolderEventsFor(at(u""));
    EXPECT_EQ(held.use_count(), 1);
}

TEST_F(LocalProviderEventsStopConcurrency, OfAllCanComeFromACallback)
{
    auto const before = kernelObjects();
    std::promise<void> stopped;
    auto const stop = [&](auto const&...) {
        provider->shutdown();
        stopped.set_value();
    };
    provider->publishFolderEventsFor(at(u""), stop, {Kind::Created});
    watchFolder(u"", {Kind::Created});
    folder.write("a", "");
    stopped.get_future().wait();
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
    EXPECT_EQ(log.take(), Texts());
}

TEST_F(LocalProviderEventsStopConcurrency, ComesWithAProviderThatItsCallbackDestroys)
{
    auto const before = kernelObjects();
    std::promise<void> destroyed;
    auto const destroy = [&](auto const&...) {
        provider.reset();
        destroyed.set_value();
    };
    provider->publishFolderEventsFor(at(u""), destroy, {Kind::Created});
    watchFolder(u"", {Kind::Created});
    folder.write("a", "");
    destroyed.get_future().wait();
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
    EXPECT_EQ(log.take(), Texts());
}

TEST_F(LocalProviderEventsStopConcurrency, ComesWithAProviderThatOnlyItsCallbackHolds)
{
    auto const before = kernelObjects();
    makeFolder("folder");
    std::weak_ptr<LocalProvider> const weak = provider;
    provider->publishFolderEventsFor(at(u"folder"), [held = provider](auto const&...) {}, {Kind::Created});
    provider.reset();
    EXPECT_FALSE(weak.expired());
    remove("folder");
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
    EXPECT_TRUE(weak.expired());
}

TEST_F(LocalProviderEventsStopConcurrency, AndBeginningsByManyThreadsLeaveNothing)
{
    auto const before = kernelObjects();
    std::atomic<int> late = 0;
    {
        std::vector<std::jthread> threads;
        for (int number = 0; number < 8; ++number)
            threads.emplace_back([&, number] {
                std::string const name = "folder" + std::to_string(number);
                makeFolder(name);
                StorageIRI const location = at(std::u16string(name.begin(), name.end()));
                for (int round = 0; round < 50; ++round) {
                    auto const isStopped = std::make_shared<std::atomic<bool>>(false);
                    provider->publishFolderEventsFor(
                        location, [&late, isStopped](auto const&...) { late += *isStopped; }, allEventKinds());
                    folder.write(name + "/file", "");
                    remove(name + "/file");
                    provider->stopPublishingFolderEventsFor(location);
                    *isStopped = true;
                }
            });
    }
    EXPECT_EQ(late, 0);
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
}

} // namespace
} // namespace foundation::storage::local
