// What becomes of subscriptions whose folder goes away, and of those that are stopped.

#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/HeldCallback.hpp>
#include <tests/storage/local/KernelObjects.hpp>
#include <tests/storage/local/WatchedFolder.hpp>

#include <filesystem>
#include <sys/mount.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using events::Kind;
using tests::support::HeldCallback;
using tests::support::kernelObjects;
using tests::support::kernelObjectsSettledTo;

class LocalProviderEventsEndConcurrency : public tests::support::WatchedFolder
{
protected:
    /// Keeps the thread of the provider busy, so that several changes come to it at once.
    void hold(HeldCallback& held)
    {
        provider->publishFileEventsFor(marks.iri(u"hold"), held.callback(), {Kind::Created});
        marks.write("hold", "");
        held.waitUntilRunning();
    }
};

TEST_F(LocalProviderEventsEndConcurrency, ComesWithTheRemovalOfTheFolder)
{
    makeFolder("folder");
    watchFolder(u"folder");
    watchFile(u"folder/file", {Kind::Removed});
    remove("folder");
    EXPECT_EQ(told(), Texts(2, "removed folder folder"));
    makeFolder("folder");
    folder.write("folder/file", "");
    EXPECT_EQ(told(), Texts());
}

TEST_F(LocalProviderEventsEndConcurrency, IsNotToldToThoseWhoDidNotAsk)
{
    makeFolder("folder");
    watchFolder(u"folder", {Kind::Created, Kind::Moved});
    remove("folder");
    EXPECT_EQ(told(), Texts());
}

TEST_F(LocalProviderEventsEndConcurrency, ComesWithAMoveOfTheFolder)
{
    makeFolder("folder");
    watchFolder(u"");
    watchFolder(u"folder");
    rename("folder", "moved");
    EXPECT_EQ(told(), (Texts{"moved folder folder to moved", "removed folder folder"}));
    folder.write("moved/file", "");
    EXPECT_EQ(told(), Texts());
}

TEST_F(LocalProviderEventsEndConcurrency, DoesNotComeWhereTheFolderIsBackByThen)
{
    makeFolder("folder");
    watchFolder(u"folder");
    {
        HeldCallback held;
        hold(held);
        rename("folder", "moved");
        rename("moved", "folder");
    }
    folder.write("folder/file", "");
    EXPECT_EQ(told(), Texts{"created file folder/file"});
}

TEST_F(LocalProviderEventsEndConcurrency, ComesOnlyToThoseWhosePathNoLongerLeadsToTheFolder)
{
    makeFolder("folder");
    watchFolder(u"folder");
    {
        HeldCallback held;
        hold(held);
        rename("folder", "moved");
        watchFolder(u"moved");
    }
    folder.write("moved/file", "");
    EXPECT_EQ(told(), (Texts{"removed folder folder", "created file moved/file"}));
}

TEST_F(LocalProviderEventsEndConcurrency, ComesWithTheUnmountingOfTheFolder)
{
    makeFolder("mounted");
    if (::mount("none", (folder / "mounted").c_str(), "tmpfs", 0, nullptr) != 0)
        GTEST_SKIP() << "file systems may not be mounted here";
    watchFolder(u"mounted");
    folder.write("mounted/file", "");
    EXPECT_EQ(told(), Texts{"created file mounted/file"});
    ASSERT_EQ(::umount((folder / "mounted").c_str()), 0);
    EXPECT_EQ(told(), Texts{"removed folder mounted"});
}

TEST_F(LocalProviderEventsEndConcurrency, CanBeFollowedByANewBeginning)
{
    makeFolder("folder");
    watchFolder(u"folder");
    remove("folder");
    EXPECT_EQ(told(), Texts{"removed folder folder"});
    provider->stopPublishingFolderEventsFor(at(u"folder"));
    makeFolder("folder");
    watchFolder(u"folder");
    folder.write("folder/file", "");
    EXPECT_EQ(told(), Texts{"created file folder/file"});
}

TEST_F(LocalProviderEventsEndConcurrency, OfTheLastOneLeavesNothingInTheKernel)
{
    auto const before = kernelObjects();
    watchFolder(u"");
    watchFolder(u"");
    watchFile(u"file");
    EXPECT_EQ(kernelObjects().watches, before.watches + 1);
    provider->stopPublishingFolderEventsFor(at(u""));
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
}

TEST_F(LocalProviderEventsEndConcurrency, OfTheLastFolderLeavesNothingInTheKernel)
{
    auto const before = kernelObjects();
    makeFolder("folder");
    watchFolder(u"folder");
    remove("folder");
    EXPECT_TRUE(log.waitFor("removed folder folder"));
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
    watchFolder(u"");
    folder.write("file", "");
    EXPECT_EQ(told(), (Texts{"removed folder folder", "created file file"}));
}

TEST_F(LocalProviderEventsEndConcurrency, GivesWatchesBackOneByOne)
{
    makeFolder("a");
    makeFolder("b");
    watchFolder(u"");
    int const before = kernelObjects().watches;
    watchFolder(u"a");
    watchFolder(u"b");
    EXPECT_EQ(kernelObjects().watches, before + 2);
    provider->stopPublishingFolderEventsFor(at(u"a"));
    EXPECT_EQ(kernelObjects().watches, before + 1);
    remove("b");
    settle();
    EXPECT_EQ(kernelObjects().watches, before);
}

TEST_F(LocalProviderEventsEndConcurrency, OfManyFoldersGivesBackOneThreadAndOneQueue)
{
    constexpr int folders = 50;
    auto const before = kernelObjects();
    for (int i = 0; i < folders; ++i) {
        std::string const name = std::to_string(i);
        makeFolder(name);
        watchFolder(std::u16string(name.begin(), name.end()));
    }
    auto const watching = kernelObjects();
    EXPECT_EQ(watching.threads, before.threads + 1);
    EXPECT_EQ(watching.descriptors, before.descriptors + 2) << "the queue, and what wakes the thread";
    EXPECT_EQ(watching.watches, before.watches + folders);
    provider->shutdown();
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
}

TEST_F(LocalProviderEventsEndConcurrency, ComesWithShutdownOnceAndForAll)
{
    auto const before = kernelObjects();
    watchFolder(u"");
    makeFolder("folder");
    watchFolder(u"folder");
    provider->shutdown();
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
    log.take();
    folder.write("file", "");
    watchFolder(u"folder");
    folder.write("folder/file", "");
    EXPECT_EQ(told(), Texts{"created file folder/file"});
}

TEST_F(LocalProviderEventsEndConcurrency, ComesWithTheProvider)
{
    auto const before = kernelObjects();
    watchFolder(u"");
    provider.reset();
    EXPECT_EQ(kernelObjectsSettledTo(before), before);
    folder.write("file", "");
    EXPECT_EQ(log.take(), Texts());
}

TEST_F(LocalProviderEventsEndConcurrency, DoesNothingWhereNothingRuns)
{
    auto const before = kernelObjects();
    provider->stopPublishingFolderEventsFor(at(u""));
    provider->stopPublishingFileEventsFor(at(u"file"));
    provider->shutdown();
    EXPECT_EQ(kernelObjects(), before);
}

} // namespace
} // namespace foundation::storage::local
