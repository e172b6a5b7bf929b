// What a store tells about its changes.

#include <storage/memory/detail/Subscriptions.hpp>

#include <gtest/gtest.h>

#include <foundation/ustring.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>
#include <tests/storage/memory/MemoryStore.hpp>

#include <sstream>
#include <stdexcept>
#include <thread>

namespace foundation::storage::memory {
namespace {

using namespace provider;
using events::EntryType;
using events::Kind;

std::vector<Kind> const allKinds{Kind::Created, Kind::Removed, Kind::Modified, Kind::AttributesChanged, Kind::Moved};

char const* textOf(Kind kind)
{
    char const* const names[] = {"created", "removed", "modified", "attributes", "moved"};
    return names[static_cast<int>(kind)];
}

using Events = std::vector<std::string>;

/// Keeps each event as text, such as "created file /a" or "moved folder /a /b".
ChangeEventCallback keepIn(Events& events)
{
    return [&events](Kind const& kind, StorageIRI const& first, StorageIRI const& second, EntryType const& type,
                     boost::property_tree::ptree const& details) {
        EXPECT_TRUE(details.empty());
        std::ostringstream text;
        text << textOf(kind) << (type == EntryType::File ? " file " : " folder ");
        ustring::insert(text, first.getPath());
        if (kind == Kind::Moved)
            ustring::insert(text << ' ', second.getPath());
        else
            EXPECT_EQ(first, second);
        events.push_back(text.str());
    };
}

class MemoryChangeEvents : public testing::Test
{
protected:
    void watchFolder(std::u16string const& path, std::vector<Kind> const& kinds = allKinds)
    {
        store.publishFolderEventsFor(at(path), keepIn(events), kinds);
    }

    void watchFile(std::u16string const& path, std::vector<Kind> const& kinds = allKinds)
    {
        store.publishFileEventsFor(at(path), keepIn(events), kinds);
    }

    MemoryStore store;
    Events events;
};

TEST_F(MemoryChangeEvents, TellOfEveryOperationInAFolder)
{
    using boost::posix_time::time_from_string;
    auto const overwrite = ReplacementPolicy::Overwrite;
    struct Row
    {
        std::function<void()> run;
        Events expected;
    };
    watchFolder(u"/");
    for (Row const& row : {
             Row{[&] { store.createFile(at(u"/a")); }, {"created file /a"}},
             Row{[&] { store.createFolder(at(u"/f")); }, {"created folder /f"}},
             Row{[&] { store.write(u"/a", ""); }, {}},
             Row{[&] { store.write(u"/a", "content"); }, {"modified file /a"}},
             Row{[&] { store.write(u"/a", ""); }, {"modified file /a"}},
             Row{[&] { store.write(u"/b", "content"); }, {"created file /b", "modified file /b"}},
             Row{[&] { store.read(u"/a"); }, {}},
             Row{[&] { store.copyFile(at(u"/a"), at(u"/c"), overwrite); }, {"created file /c"}},
             Row{[&] { store.copyFile(at(u"/a"), at(u"/c"), overwrite); }, {"modified file /c"}},
             Row{[&] { store.copyFile(at(u"/a"), at(u"/a"), overwrite); }, {}},
             Row{[&] { store.copyFileAtomic(at(u"/a"), at(u"/d"), overwrite, {}); }, {"created file /d"}},
             Row{[&] { store.copyFileAtomic(at(u"/a"), at(u"/d"), overwrite, {}); }, {"modified file /d"}},
             Row{[&] { store.setWritable(at(u"/a"), true); }, {"attributes file /a"}},
             Row{[&] { store.setLastModified(at(u"/f"), time_from_string("2020-01-01 00:00:00")); },
                 {"attributes folder /f"}},
             Row{[&] { store.moveFile(at(u"/a"), at(u"/b"), overwrite); }, {"moved file /a /b"}},
             Row{[&] { store.moveFile(at(u"/b"), at(u"/b"), overwrite); }, {}},
             Row{[&] { store.moveFolder(at(u"/f"), at(u"/g"), overwrite); }, {"moved folder /f /g"}},
             Row{[&] { store.removeFile(at(u"/b")); }, {"removed file /b"}},
             Row{[&] { store.removeFolder(at(u"/g")); }, {"removed folder /g"}},
             Row{[&] { store.createFolderRecursive(at(u"/h/i")); }, {"created folder /h"}},
             Row{[&] { store.removeFolderRecursively(at(u"/h")); }, {"removed folder /h"}},
             Row{[&] { EXPECT_NE(failureOf([&] { store.removeFile(at(u"/gone")); }), "no failure"); }, {}},
         })
    {
        events.clear();
        row.run();
        EXPECT_EQ(events, row.expected);
    }
}

TEST_F(MemoryChangeEvents, OfAFolderLeaveOutWhatLiesDeeper)
{
    store.createFolderRecursive(at(u"/a/b"));
    watchFolder(u"/a");
    store.createFile(at(u"/a/b/file"));
    store.createFile(at(u"/file"));
    EXPECT_EQ(events, Events());
}

TEST_F(MemoryChangeEvents, OfAFileLeaveOutAllOthers)
{
    watchFile(u"/file");
    store.createFile(at(u"/other"));
    store.createFile(at(u"/file"));
    store.removeFile(at(u"/other"));
    EXPECT_EQ(events, Events{"created file /file"});
}

TEST_F(MemoryChangeEvents, AreOfTheKindsAskedForAlone)
{
    watchFolder(u"/", {Kind::Removed});
    watchFolder(u"/", {});
    store.createFile(at(u"/file"));
    store.removeFile(at(u"/file"));
    EXPECT_EQ(events, Events{"removed file /file"});
}

TEST_F(MemoryChangeEvents, OfAMoveReachBothFolders)
{
    store.createFolder(at(u"/from"));
    store.createFolder(at(u"/to"));
    store.createFile(at(u"/from/file"));
    watchFolder(u"/from");
    watchFolder(u"/to");
    store.moveFile(at(u"/from/file"), at(u"/to/file"), ReplacementPolicy::Preserve);
    EXPECT_EQ(events, Events(2, "moved file /from/file /to/file"));
}

TEST_F(MemoryChangeEvents, TellOfAFolderThatTakesTheWatchedPlaceAlong)
{
    store.createFolderRecursive(at(u"/a/b"));
    watchFolder(u"/a/b");
    watchFile(u"/a/b/file");
    store.moveFolder(at(u"/a"), at(u"/c"), ReplacementPolicy::Preserve);
    EXPECT_EQ(events, Events(2, "moved folder /a /c"));
}

TEST_F(MemoryChangeEvents, NameTheCanonicalLocation)
{
    store.createFolder(at(u"/a"));
    watchFolder(u"/");
    store.createFile(at(u"/./a//../file"));
    EXPECT_EQ(events, Events{"created file /file"});
}

TEST_F(MemoryChangeEvents, OfAnUnclosedStreamComeWhenItIsDropped)
{
    store.createFile(at(u"/file"));
    watchFile(u"/file");
    auto stream = store.openStream(at(u"/file"), update);
    writeAll(*stream, "content");
    EXPECT_EQ(events, Events());
    stream.reset();
    EXPECT_EQ(events, Events{"modified file /file"});
}

TEST_F(MemoryChangeEvents, OfACommitTellOfTheMoveOntoTheTarget)
{
    watchFile(u"/file", {Kind::Created, Kind::Modified, Kind::Moved});
    auto const stream = store.openTransactionalStream(at(u"/file"), rewrite);
    stream->write("x", 1);
    stream->close(StreamClosePolicy::Commit);
    ASSERT_EQ(events.size(), 1u);
    EXPECT_TRUE(events[0].starts_with("moved file ") && events[0].ends_with(".tmp.bak /file")) << events[0];
}

TEST_F(MemoryChangeEvents, EndWhenTheFolderIsStopped)
{
    watchFolder(u"/");
    watchFolder(u"/");
    store.stopPublishingFolderEventsFor(at(u"/"));
    store.createFile(at(u"/file"));
    EXPECT_EQ(events, Events());
}

TEST_F(MemoryChangeEvents, OfAFileEndWithThoseOfItsFolder)
{
    store.createFolder(at(u"/folder"));
    watchFile(u"/folder/file");
    watchFolder(u"/folder");
    watchFile(u"/kept");
    store.stopPublishingFileEventsFor(at(u"/folder/file"));
    store.createFile(at(u"/folder/file"));
    store.createFile(at(u"/kept"));
    EXPECT_EQ(events, Events{"created file /kept"});
}

TEST_F(MemoryChangeEvents, EndWithShutdown)
{
    watchFolder(u"/");
    store.shutdown();
    store.createFile(at(u"/file"));
    EXPECT_EQ(events, Events());
}

TEST_F(MemoryChangeEvents, CanBeAskedForAgainAfterShutdown)
{
    store.shutdown();
    watchFolder(u"/");
    store.createFile(at(u"/file"));
    EXPECT_EQ(events, Events{"created file /file"});
}

TEST_F(MemoryChangeEvents, AreNotPublishedWithoutAFolderOrACallback)
{
    store.createFile(at(u"/file"));
    auto const ignore = [](auto const&...) {};
    EXPECT_THROW(store.publishFolderEventsFor(at(u"/missing"), ignore, allKinds), ChangeEventsSubscriptionException);
    EXPECT_THROW(store.publishFolderEventsFor(at(u"/file"), ignore, allKinds), ChangeEventsSubscriptionException);
    EXPECT_THROW(store.publishFileEventsFor(at(u"/missing/file"), ignore, allKinds), ChangeEventsSubscriptionException);
    EXPECT_THROW(store.publishFolderEventsFor(at(u"/"), {}, allKinds), ChangeEventsSubscriptionException);
    EXPECT_THROW(store.publishFileEventsFor(at(u"/file"), {}, allKinds), ChangeEventsSubscriptionException);
}

TEST_F(MemoryChangeEvents, ComeInTheThreadThatMadeTheChange)
{
    std::thread::id told;
    auto const keep = [&](auto const&...) { told = std::this_thread::get_id(); };
    store.publishFolderEventsFor(at(u"/"), keep, allKinds);
    store.createFile(at(u"/file"));
    EXPECT_EQ(told, std::this_thread::get_id());
}

TEST_F(MemoryChangeEvents, FindTheChangeMadeAndTheStoreFree)
{
    auto const work = [&](Kind const&, StorageIRI const& iri, auto const&...) {
        EXPECT_TRUE(store.fileExists(iri));
        store.removeFile(iri);
    };
    store.publishFolderEventsFor(at(u"/"), work, {Kind::Created});
    store.createFile(at(u"/file"));
    EXPECT_FALSE(store.fileExists(at(u"/file")));
}

TEST_F(MemoryChangeEvents, CanBeStoppedFromInside)
{
    int told = 0;
    auto const stop = [&](auto const&...) {
        ++told;
        store.stopPublishingFolderEventsFor(at(u"/"));
    };
    store.publishFolderEventsFor(at(u"/"), stop, allKinds);
    store.publishFolderEventsFor(at(u"/"), stop, allKinds);
    store.createFile(at(u"/a"));
    store.createFile(at(u"/b"));
    EXPECT_EQ(told, 1);
}

TEST_F(MemoryChangeEvents, CanBeAskedForFromInside)
{
    auto const more = [&](auto const&...) { watchFolder(u"/"); };
    store.publishFolderEventsFor(at(u"/"), more, {Kind::Created});
    store.createFile(at(u"/a"));
    store.removeFile(at(u"/a"));
    EXPECT_EQ(events, Events{"removed file /a"});
}

TEST_F(MemoryChangeEvents, LoseWhatACallbackThrows)
{
    auto const fail = [](auto const&...) { throw std::runtime_error("no more"); };
    store.publishFolderEventsFor(at(u"/"), fail, allKinds);
    watchFolder(u"/");
    EXPECT_NO_THROW(store.createFile(at(u"/file")));
    EXPECT_EQ(events, Events{"created file /file"});
}

} // namespace
} // namespace foundation::storage::memory
