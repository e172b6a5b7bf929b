// Change events when the system is out of something, loses events, or fails.

#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/provider/ChangeEventExceptions.hpp>
#include <tests/storage/local/HeldCallback.hpp>
#include <tests/storage/local/KernelObjects.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/storage/local/WatchedFolder.hpp>

#include <algorithm>
#include <atomic>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <sys/eventfd.h>
#include <sys/inotify.h>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

using namespace provider;
using detail::realSystemCalls;
using events::Kind;
using tests::support::failWith;
using tests::support::HeldCallback;
using tests::support::kernelObjects;
using tests::support::kernelObjectsSettledTo;
using tests::support::ReplacedSystemCalls;

std::atomic<bool> isTriggered;
std::atomic<int> calls;

class LocalProviderEventsFaultConcurrency : public tests::support::WatchedFolder
{
protected:
    LocalProviderEventsFaultConcurrency()
    {
        isTriggered = false;
        calls = 0;
    }

    /// Ends the thread of the provider, which may be about to look for a call.
    ~LocalProviderEventsFaultConcurrency() override { provider.reset(); }

    void expectRefusalWithoutLeak()
    {
        auto const before = kernelObjects();
        EXPECT_THROW(watchFolder(u""), ChangeEventsSubscriptionException);
        EXPECT_THROW(watchFile(u"file"), ChangeEventsSubscriptionException);
        EXPECT_EQ(kernelObjects(), before);
    }

    ReplacedSystemCalls system;
};

TEST_F(LocalProviderEventsFaultConcurrency, WithoutWatchesLeftRefusesASubscription)
{
    system->inotify_add_watch = [](int, char const*, std::uint32_t) { return failWith(ENOSPC); };
    expectRefusalWithoutLeak();
}

TEST_F(LocalProviderEventsFaultConcurrency, WithoutQueuesLeftRefusesASubscription)
{
    system->inotify_init1 = [](int) { return failWith(EMFILE); };
    expectRefusalWithoutLeak();
}

TEST_F(LocalProviderEventsFaultConcurrency, WithoutDescriptorsLeftRefusesASubscription)
{
    system->eventfd = [](unsigned, int) { return failWith(EMFILE); };
    expectRefusalWithoutLeak();
}

TEST_F(LocalProviderEventsFaultConcurrency, ARefusalLeavesOtherSubscriptionsAlone)
{
    makeFolder("other");
    watchFolder(u"");
    system->inotify_add_watch = [](int, char const*, std::uint32_t) { return failWith(ENOSPC); };
    EXPECT_THROW(watchFolder(u"other"), ChangeEventsSubscriptionException);
    system->inotify_add_watch = realSystemCalls.inotify_add_watch;
    folder.write("file", "");
    EXPECT_EQ(told(), Texts{"created file file"});
}

TEST_F(LocalProviderEventsFaultConcurrency, SignalsInterruptNothing)
{
    system->poll = [](pollfd* wanted, nfds_t count, int timeout) {
        return ++calls % 2 == 1 ? failWith(EINTR) : realSystemCalls.poll(wanted, count, timeout);
    };
    system->read = [](int descriptor, void* buffer, std::size_t size) {
        return ++calls % 2 == 1 ? failWith(EINTR) : realSystemCalls.read(descriptor, buffer, size);
    };
    watchFolder(u"");
    folder.write("file", "");
    EXPECT_EQ(told(), Texts{"created file file"});
}

TEST_F(LocalProviderEventsFaultConcurrency, AFailureToWaitEndsSubscriptions)
{
    auto const before = kernelObjects();
    system->poll = [](pollfd* wanted, nfds_t count, int timeout) {
        return isTriggered ? failWith(ENOMEM) : realSystemCalls.poll(wanted, count, timeout);
    };
    watchFolder(u"", {Kind::Removed});
    watchFile(u"file", {Kind::Removed});
    isTriggered = true;
    folder.write("wakes", "");
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
    EXPECT_EQ(log.take(), Texts(2, "removed folder ."));
    isTriggered = false;
    watchFolder(u"");
    folder.write("file", "");
    EXPECT_EQ(told(), Texts{"created file file"});
}

TEST_F(LocalProviderEventsFaultConcurrency, AFailureToReadEndsSubscriptions)
{
    auto const before = kernelObjects();
    system->read = [](int, void*, std::size_t) { return ssize_t{failWith(EIO)}; };
    watchFolder(u"");
    folder.write("file", "");
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
    EXPECT_EQ(log.take(), Texts{"removed folder ."});
}

/// As the kernel does it: what was to be told next is lost.
ssize_t readLossOnce(int descriptor, void* buffer, std::size_t size)
{
    ssize_t const count = realSystemCalls.read(descriptor, buffer, size);
    if (count <= 0 || !isTriggered.exchange(false))
        return count;
    inotify_event loss{};
    loss.wd = -1;
    loss.mask = IN_Q_OVERFLOW;
    std::memcpy(buffer, &loss, sizeof loss);
    return sizeof loss;
}

TEST_F(LocalProviderEventsFaultConcurrency, AFullQueueIsToldToEverybody)
{
    system->read = readLossOnce;
    makeFolder("other");
    watchFolder(u"other", {});
    watchFile(u"file", {Kind::Created});
    isTriggered = true;
    folder.write("file", "");
    EXPECT_TRUE(log.waitFor("modified folder other overflow=true"));
    EXPECT_TRUE(log.waitFor("modified unknown file overflow=true"));
    log.take();
    std::filesystem::remove(folder / "file");
    folder.write("file", "");
    EXPECT_EQ(told(), Texts{"created file file"});
}

TEST_F(LocalProviderEventsFaultConcurrency, AFullQueueDoesNotHideThatAFolderIsGone)
{
    system->read = readLossOnce;
    makeFolder("gone");
    makeFolder("replaced");
    makeFolder("kept");
    for (char16_t const* const name : {u"gone", u"replaced", u"kept"})
        watchFolder(name, {Kind::Removed});
    int const before = kernelObjects().watches;
    {
        HeldCallback held;
        provider->publishFileEventsFor(marks.iri(u"hold"), held.callback(), {Kind::Created});
        marks.write("hold", "");
        held.waitUntilRunning();
        remove("gone");
        remove("replaced");
        makeFolder("replaced");
        isTriggered = true;
    }
    EXPECT_TRUE(log.waitFor("removed folder gone"));
    EXPECT_TRUE(log.waitFor("removed folder replaced"));
    Texts texts = told();
    std::sort(texts.begin(), texts.end());
    EXPECT_EQ(texts,
              (Texts{"modified folder gone overflow=true", "modified folder kept overflow=true",
                     "modified folder replaced overflow=true", "removed folder gone", "removed folder replaced"}));
    provider->stopPublishingFolderEventsFor(marks.iri());
    EXPECT_EQ(kernelObjects().watches, before - 2);
}

TEST_F(LocalProviderEventsFaultConcurrency, AFullQueueOfTheKernelItselfIsTold)
{
    int limit = 0;
    std::ifstream("/proc/sys/fs/inotify/max_queued_events") >> limit;
    if (limit <= 0 || limit > 100'000)
        GTEST_SKIP() << "the queue is too long to be filled";
    folder.write("a", "");
    watchFolder(u"", {Kind::Created});
    {
        HeldCallback held;
        provider->publishFileEventsFor(marks.iri(u"hold"), held.callback(), {Kind::Created});
        marks.write("hold", "");
        held.waitUntilRunning();
        for (int i = 0; i <= limit; i += 4) { // a move is two events
            rename("a", "b");
            rename("b", "a");
        }
    }
    EXPECT_TRUE(log.waitFor("modified folder . overflow=true"));
    log.take();
    folder.write("later", "");
    EXPECT_EQ(told(), Texts{"created file later"});
}

} // namespace
} // namespace foundation::storage::local
