// What a provider tells of changes in the folders that it watches.

#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/provider/ChangeEventExceptions.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/storage/local/WatchedFolder.hpp>
#include <tests/storage/local/namelessFiles.hpp>

#include <boost/property_tree/ptree.hpp>

#include <array>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <functional>
#include <unistd.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using events::Kind;

class LocalProviderEventsConcurrency : public tests::support::WatchedFolder
{
protected:
    /// By one write, which is one change.
    void append(std::string const& name, std::string const& content) const
    {
        std::ofstream(folder / name, std::ios::app) << content;
    }
};

TEST_F(LocalProviderEventsConcurrency, TellOfEveryOperationInAFolder)
{
    struct Row
    {
        std::function<void()> run;
        Texts expected;
    };
    watchFolder(u"");
    for (Row const& row : {
             Row{[&] { provider->createFile(at(u"a")); }, {"created file a"}},
             Row{[&] { provider->createFolder(at(u"f")); }, {"created folder f"}},
             Row{[&] { append("a", "content"); }, {"modified file a"}},
             Row{[&] { append("b", "content"); }, {"created file b", "modified file b"}},
             Row{[&] { fs::resize_file(folder / "b", 2); }, {"modified file b"}},
             Row{[&] { folder.read("a"); }, {}},
             Row{[&] { fs::permissions(folder / "a", fs::perms::owner_read); }, {"attributes file a"}},
             Row{[&] { fs::permissions(folder / "f", fs::perms::owner_all); }, {"attributes folder f"}},
             Row{[&] { fs::permissions(folder.path(), fs::perms::owner_all); }, {"attributes folder ."}},
             Row{[&] { provider->moveFile(at(u"a"), at(u"b"), ReplacementPolicy::Overwrite); }, {"moved file a to b"}},
             Row{[&] { provider->moveFolder(at(u"f"), at(u"g"), ReplacementPolicy::Preserve); },
                 {"moved folder f to g"}},
             Row{[&] { fs::create_symlink("b", folder / "link"); }, {"created file link"}},
             Row{[&] { fs::create_hard_link(folder / "b", folder / "second"); }, {"created file second"}},
             Row{[&] { provider->removeFile(at(u"link")); }, {"removed file link"}},
             Row{[&] { provider->removeFolder(at(u"g")); }, {"removed folder g"}},
         })
    {
        row.run();
        EXPECT_EQ(told(), row.expected);
    }
}

TEST_F(LocalProviderEventsConcurrency, OfAFolderLeaveOutWhatLiesDeeper)
{
    makeFolder("a");
    watchFolder(u"");
    folder.write("a/file", "content");
    EXPECT_EQ(told(), Texts());
}

TEST_F(LocalProviderEventsConcurrency, AreOfTheKindsAskedForAlone)
{
    watchFolder(u"", {Kind::Removed});
    watchFolder(u"", {});
    folder.write("file", "content");
    remove("file");
    EXPECT_EQ(told(), Texts{"removed file file"});
}

TEST_F(LocalProviderEventsConcurrency, HaveNamesThatAreNotUTF8)
{
    watchFolder(u"");
    folder.write("\xff", "");
    EXPECT_EQ(told(), Texts{"created file \xff"});
}

TEST_F(LocalProviderEventsConcurrency, OfAMoveReachBothFolders)
{
    makeFolder("from");
    makeFolder("to");
    folder.write("from/file", "");
    watchFolder(u"from");
    watchFolder(u"to");
    rename("from/file", "to/other");
    EXPECT_EQ(told(), Texts(2, "moved file from/file to to/other"));
}

TEST_F(LocalProviderEventsConcurrency, OfAMoveOutOfWhatIsWatchedTellOfARemoval)
{
    makeFolder("watched");
    folder.write("watched/file", "");
    watchFolder(u"watched");
    rename("watched/file", "file");
    folder.write("watched/file", "");
    EXPECT_EQ(told(), (Texts{"removed file watched/file", "created file watched/file"}));
}

TEST_F(LocalProviderEventsConcurrency, OfAMoveIntoWhatIsWatchedTellOfACreation)
{
    makeFolder("watched");
    makeFolder("folder");
    watchFolder(u"watched");
    rename("folder", "watched/folder");
    EXPECT_EQ(told(), Texts{"created folder watched/folder"});
}

TEST_F(LocalProviderEventsConcurrency, OfAMoveBetweenFoldersAreNotMissedByThoseWhoDidNotAskForMoves)
{
    makeFolder("from");
    makeFolder("to");
    folder.write("from/file", "");
    watchFolder(u"from", {Kind::Created, Kind::Removed});
    watchFolder(u"to", {Kind::Created, Kind::Removed});
    rename("from/file", "to/file");
    EXPECT_EQ(told(), (Texts{"removed file from/file", "created file to/file"}));
}

TEST_F(LocalProviderEventsConcurrency, OfAFileLeaveOutAllOthers)
{
    watchFile(u"file");
    append("other", "content");
    append("file", "content");
    remove("other");
    remove("file");
    EXPECT_EQ(told(), (Texts{"created file file", "modified file file", "removed file file"}));
}

TEST_F(LocalProviderEventsConcurrency, OfAFileGoOnWhenItIsReplaced)
{
    folder.write("file", "old");
    folder.write("new", "new");
    watchFile(u"file");
    rename("new", "file");
    append("file", "newer");
    EXPECT_EQ(told(), (Texts{"moved file new to file", "modified file file"}));
}

TEST_F(LocalProviderEventsConcurrency, OfAReplacedFileReachThoseWhoAskedForModificationsAlone)
{
    makeFolder("watched");
    folder.write("watched/file", "old");
    folder.write("watched/beside", "new");
    folder.write("elsewhere", "newer");
    watchFile(u"watched/file", {Kind::Modified});
    rename("watched/beside", "watched/file");
    EXPECT_EQ(told(), Texts{"modified file watched/file"});
    rename("elsewhere", "watched/file");
    EXPECT_EQ(told(), Texts{"modified file watched/file"});
}

TEST_F(LocalProviderEventsConcurrency, OfACommitTellOfTheMoveOntoTheTarget)
{
    watchFile(u"file", {Kind::Created, Kind::Modified, Kind::Moved});
    auto const stream = provider->openTransactionalStream(at(u"file"), {});
    stream->write("x", 1);
    stream->close(StreamClosePolicy::Commit);
    Texts const texts = told();
    ASSERT_EQ(texts.size(), 1U);
    EXPECT_TRUE(texts[0].starts_with("moved file ") && texts[0].ends_with(".tmp.bak to file")) << texts[0];
}

TEST_F(LocalProviderEventsConcurrency, OfACopyToANewNameTellThatItIsThere)
{
    if (!tests::support::hasNamelessFiles(folder.path()))
        GTEST_SKIP() << "the file system has no files without names";
    boost::property_tree::ptree settings;
    settings.put("durability", "none");
    provider->configure(settings);
    folder.write("file", "content");
    watchFolder(u"");
    provider->copyFileAtomic(at(u"file"), at(u"copy"), ReplacementPolicy::Preserve, {});
    EXPECT_EQ(told(), Texts{"created file copy"});
}

TEST_F(LocalProviderEventsConcurrency, OfManyWritesAreFewerThanTheWrites)
{
    folder.write("a", "");
    folder.write("b", "");
    std::array const files{::open((folder / "a").c_str(), O_WRONLY | O_CLOEXEC),
                           ::open((folder / "b").c_str(), O_WRONLY | O_CLOEXEC)};
    std::mutex busy;
    std::unique_lock writing(busy);
    watchFolder(u"", {Kind::Modified});
    auto const wait = [&](auto const&...) { std::lock_guard const lock(busy); };
    provider->publishFileEventsFor(at(u"begin"), wait, {Kind::Created});
    folder.write("begin", "");
    for (int round = 0; round < 500; ++round)
        ASSERT_EQ(::write(files[static_cast<std::size_t>(round % 2)], "x", 1), 1);
    writing.unlock();
    EXPECT_LE(told().size(), 4U);
    ::close(files[0]);
    ::close(files[1]);
}

TEST_F(LocalProviderEventsConcurrency, OfOneFolderUnderSeveralNamesHaveThoseNames)
{
    makeFolder("folder");
    fs::create_directory_symlink("folder", folder / "link");
    watchFolder(u"folder");
    watchFolder(u"link");
    watchFile(u"link/file", {Kind::Removed});
    folder.write("folder/file", "");
    remove("folder/file");
    EXPECT_EQ(told(), (Texts{"created file folder/file", "created file link/file", "removed file folder/file",
                             "removed file link/file", "removed file link/file"}));
}

TEST_F(LocalProviderEventsConcurrency, OfOneFolderUnderSeveralNamesEndOneByOne)
{
    makeFolder("folder");
    fs::create_directory_symlink("folder", folder / "link");
    watchFolder(u"folder");
    watchFolder(u"link");
    provider->stopPublishingFolderEventsFor(at(u"folder"));
    folder.write("folder/a", "");
    EXPECT_EQ(told(), Texts{"created file link/a"});
    provider->stopPublishingFolderEventsFor(at(u"link"));
    folder.write("folder/b", "");
    EXPECT_EQ(told(), Texts());
}

TEST_F(LocalProviderEventsConcurrency, OfAFolderAreAskedForSeveralTimesWithOtherKinds)
{
    watchFolder(u"", {Kind::Created});
    watchFolder(u"", {Kind::Modified});
    append("file", "content");
    EXPECT_EQ(told(), (Texts{"created file file", "modified file file"}));
}

TEST_F(LocalProviderEventsConcurrency, OfAFileEndWithThoseOfItsFolder)
{
    makeFolder("folder");
    watchFile(u"folder/file");
    watchFolder(u"folder");
    watchFile(u"kept");
    provider->stopPublishingFileEventsFor(at(u"folder/other"));
    folder.write("folder/file", "");
    folder.write("kept", "");
    EXPECT_EQ(told(), Texts{"created file kept"});
}

TEST_F(LocalProviderEventsConcurrency, EndHoweverTheLocationIsWritten)
{
    makeFolder("folder");
    watchFolder(u"folder");
    StorageIRI const other(u"file:" + StorageIRI(folder.iri(), u"folder").getPath() + u"//./");
    provider->stopPublishingFolderEventsFor(other);
    folder.write("folder/file", "");
    EXPECT_EQ(told(), Texts());
}

TEST_F(LocalProviderEventsConcurrency, AreNotPublishedWithoutAFolderOrACallback)
{
    folder.write("file", "");
    auto const ignore = [](auto const&...) {};
    auto const kinds = tests::support::allEventKinds();
    using Refusal = ChangeEventsSubscriptionException;
    EXPECT_THROW(provider->publishFolderEventsFor(at(u"missing"), ignore, kinds), Refusal);
    EXPECT_THROW(provider->publishFolderEventsFor(at(u"file"), ignore, kinds), Refusal);
    EXPECT_THROW(provider->publishFileEventsFor(at(u"missing/file"), ignore, kinds), Refusal);
    EXPECT_THROW(provider->publishFileEventsFor(StorageIRI(u"file:///"), ignore, kinds), Refusal);
    EXPECT_THROW(provider->publishFolderEventsFor(at(u""), {}, kinds), Refusal);
    EXPECT_THROW(provider->publishFileEventsFor(at(u"file"), {}, kinds), Refusal);
}

TEST_F(LocalProviderEventsConcurrency, NameTheLocationThatIsRefused)
{
    try {
        provider->publishFileEventsFor(at(u"missing/file"), log.callback(), {Kind::Created});
        FAIL() << "no failure";
    } catch (ChangeEventsSubscriptionException const& refusal) {
        EXPECT_EQ(refusal.getStorageIRI(), at(u"missing/file"));
    }
}

TEST_F(LocalProviderEventsConcurrency, OfAConfinedProviderDoNotLeaveItsRoot)
{
    makeFolder("root");
    makeFolder("root/inside");
    makeFolder("outside");
    fs::create_directory_symlink(folder / "outside", folder / "root/link");
    boost::property_tree::ptree settings;
    settings.put("root", (folder / "root").native());
    provider->configure(settings);
    EXPECT_THROW(watchFolder(u"root/link"), ChangeEventsSubscriptionException);
    EXPECT_THROW(watchFolder(u"outside"), Exception);
    watchFolder(u"root/inside");
    folder.write("outside/file", "");
    folder.write("root/inside/file", "");
    provider->configure({}); // what is subscribed stays, and the marks can be watched
    EXPECT_EQ(told(), Texts{"created file root/inside/file"});
}

} // namespace
} // namespace foundation::storage::local
