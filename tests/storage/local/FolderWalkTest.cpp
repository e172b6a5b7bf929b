#include <storage/local/FolderWalk.hpp>

#include <gtest/gtest.h>

#include <storage/local/LocalProvider.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/deepFolders.hpp>
#include <tests/support/failureOf.hpp>

#include <cerrno>
#include <filesystem>
#include <map>
#include <string>
#include <sys/stat.h>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using provider::ErrorCode;
using provider::ExistenceTypeExtended;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

class FolderWalks : public testing::Test
{
protected:
    FolderWalks()
    {
        fs::create_directories(folder / "tree/inner/deep");
        folder.write("tree/file", "content");
        folder.write("tree/inner/within", "");
    }

    FolderWalk begin(WalkedDetail detail = WalkedDetail::Names) const
    {
        return FolderWalk(folder.iri(u"tree"), detail);
    }

    static std::map<std::u16string, WalkedEntry> rest(FolderWalk& walk)
    {
        std::map<std::u16string, WalkedEntry> entries;
        while (auto const entry = walk.next())
            entries.emplace(entry->name, *entry);
        return entries;
    }

    TemporaryFolder const folder;
};

TEST_F(FolderWalks, TellWhatEachEntryIs)
{
    fs::create_symlink("file", folder / "tree/to file");
    fs::create_symlink("inner", folder / "tree/to folder");
    fs::create_symlink("nowhere", folder / "tree/broken");
    ASSERT_EQ(::mkfifo((folder / "tree/pipe").c_str(), 0600), 0);
    for (auto const detail : {WalkedDetail::Names, WalkedDetail::Attributes}) {
        FolderWalk walk = begin(detail);
        auto const entries = rest(walk);
        EXPECT_EQ(entries.size(), 6u);
        EXPECT_EQ(entries.at(u"file").type, ExistenceTypeExtended::RegularFile);
        EXPECT_EQ(entries.at(u"inner").type, ExistenceTypeExtended::RegularFolder);
        EXPECT_EQ(entries.at(u"to file").type, ExistenceTypeExtended::SymlinkToFile);
        EXPECT_EQ(entries.at(u"to folder").type, ExistenceTypeExtended::SymlinkToFolder);
        EXPECT_EQ(entries.at(u"broken").type, ExistenceTypeExtended::BrokenSymlink);
        EXPECT_EQ(entries.at(u"pipe").type, ExistenceTypeExtended::SpecialFile);
        EXPECT_EQ(entries.at(u"file").size.has_value(), detail == WalkedDetail::Attributes);
        EXPECT_EQ(entries.at(u"to file").size.value_or(7), 7u);
        EXPECT_FALSE(entries.at(u"inner").size);
    }
}

TEST_F(FolderWalks, AreLedIntoFoldersAndBack)
{
    FolderWalk walk = begin();
    ASSERT_TRUE(walk.enter(u"inner"));
    EXPECT_EQ(walk.depth(), 1u);
    EXPECT_EQ(rest(walk).size(), 2u);
    ASSERT_TRUE(walk.enter(u"deep"));
    EXPECT_TRUE(rest(walk).empty());
    walk.leave();
    walk.leave();
    EXPECT_EQ(walk.depth(), 0u);
    EXPECT_EQ(rest(walk).size(), 2u);
}

TEST_F(FolderWalks, EnterNothingButFolders)
{
    fs::create_symlink("inner", folder / "tree/link");
    FolderWalk walk = begin();
    EXPECT_FALSE(walk.enter(u"link"));
    EXPECT_FALSE(walk.enter(u"file"));
    EXPECT_FALSE(walk.enter(u"missing"));
    EXPECT_EQ(walk.depth(), 0u);
}

TEST_F(FolderWalks, TellOfAFolderThatWasMovedAway)
{
    tests::support::makeDeepFolders(folder / "tree", 200);
    FolderWalk walk = begin();
    for (int level = 0; level < 150; ++level)
        ASSERT_TRUE(walk.enter(u"d"));
    fs::rename(folder / "tree/d/d/d/d/d/d", folder / "away");
    fs::rename(folder / "tree/d/d/d", folder / "away too");
    std::string told;
    while (walk.depth() > 2 && told.empty()) {
        std::string const outcome = failureOf([&] { walk.leave(); });
        told = outcome == "no failure" ? "" : outcome;
    }
    EXPECT_EQ(told, failure(ErrorCode::ResourceNotFound, folder.iri(u"tree/d/d/d")));
    EXPECT_EQ(walk.depth(), 2u);
}

TEST_F(FolderWalks, AreThroughWithAFolderThatCannotBeRead)
{
    FolderWalk walk = begin();
    ASSERT_TRUE(walk.enter(u"inner"));
    {
        ReplacedSystemCalls replaced;
        replaced->getdents64 = [](int, void*, std::size_t) -> ssize_t { return failWith(EIO); };
        EXPECT_EQ(failureOf([&] { walk.next(); }), failure(ErrorCode::IOError, folder.iri(u"tree/inner")));
    }
    EXPECT_FALSE(walk.next());
    walk.leave();
    EXPECT_EQ(rest(walk).size(), 2u);
}

TEST_F(FolderWalks, HoldFoldersThatAreFoundWhereverTheyAreMoved)
{
    FolderWalk walk = begin();
    ASSERT_TRUE(walk.enter(u"inner"));
    HeldFolder const held = walk.hold();
    fs::rename(folder / "tree/inner", folder / "moved");
    fs::create_directory_symlink("/", folder / "tree/inner");
    LocalProvider const provider;
    EXPECT_TRUE(provider.fileExists(provider::StorageIRI(held.location(), u"within")));
    EXPECT_EQ(provider.existsExtended(held.location()), ExistenceTypeExtended::RegularFolder);
    provider.createFile(provider::StorageIRI(held.location(), u"new"));
    EXPECT_TRUE(fs::exists(folder / "moved/new"));
}

TEST_F(FolderWalks, BeginInFoldersAlone)
{
    EXPECT_EQ(failureOf([&] { FolderWalk(folder.iri(u"tree/file"), WalkedDetail::Names); }),
              failure(ErrorCode::ResourceNotFound, folder.iri(u"tree/file")));
}

} // namespace
} // namespace foundation::storage::local
