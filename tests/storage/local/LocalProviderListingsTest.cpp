#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/local/detail/SystemCalls.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <dirent.h>
#include <filesystem>
#include <set>
#include <string>
#include <string_view>
#include <sys/stat.h>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using detail::realSystemCalls;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

using Names = std::vector<std::string>;

/// The names that are left of a listing, those of folders with a "/" behind, in alphabetical order.
Names namesOf(IFolderEntryIterator& listing)
{
    Names names;
    for (FolderEntry const& entry : entries(listing)) {
        std::u16string const& name = entry.getName();
        names.push_back(std::string(name.begin(), name.end()) + (entry.isFile() ? "" : "/"));
    }
    std::sort(names.begin(), names.end());
    return names;
}

Names namesOf(IProvider::Listing const& listing)
{
    return namesOf(*listing);
}

/// How often the calls that cost most were made.
int statxCalls;
int getdents64Calls;

void countCalls(ReplacedSystemCalls& replaced)
{
    statxCalls = 0;
    getdents64Calls = 0;
    replaced->statx = [](int folder, char const* path, int flags, unsigned mask, struct statx* result) {
        ++statxCalls;
        return realSystemCalls.statx(folder, path, flags, mask, result);
    };
    replaced->getdents64 = [](int descriptor, void* buffer, std::size_t size) {
        ++getdents64Calls;
        return realSystemCalls.getdents64(descriptor, buffer, size);
    };
}

class LocalProviderListings : public testing::Test
{
protected:
    LocalProviderListings()
    {
        folder.write("file", "content");
        folder.write(".hidden", "");
        fs::create_directory(folder / "folder");
        folder.write("folder/inside", "");
        fs::create_symlink("file", folder / "link to file");
        fs::create_symlink("folder", folder / "link to folder");
        fs::create_symlink("nothing", folder / "broken link");
        fs::create_symlink("loop", folder / "loop");
        ::mkfifo((folder / "pipe").c_str(), 0600);
    }

    TemporaryFolder folder;
    LocalProvider const provider;

    Names const all{".hidden", "broken link", "file", "folder/", "link to file", "link to folder/", "loop", "pipe"};
    Names const files{".hidden", "broken link", "file", "link to file", "loop", "pipe"};
    Names const folders{"folder/", "link to folder/"};
};

TEST_F(LocalProviderListings, HoldWhatIsAskedFor)
{
    EXPECT_EQ(namesOf(provider.listAll(folder.iri())), all);
    EXPECT_EQ(namesOf(provider.listFiles(folder.iri())), files);
    EXPECT_EQ(namesOf(provider.listFolders(folder.iri())), folders);
    EXPECT_EQ(namesOf(provider.listAllNamesOnly(folder.iri())), all);
    EXPECT_EQ(namesOf(provider.listFilesNamesOnly(folder.iri())), files);
    EXPECT_EQ(namesOf(provider.listFoldersNamesOnly(folder.iri())), folders);
}

TEST_F(LocalProviderListings, HoldTheSameWhereTheFileSystemDoesNotTellTypes)
{
    ReplacedSystemCalls replaced;
    replaced->getdents64 = [](int descriptor, void* buffer, std::size_t size) {
        ssize_t const end = realSystemCalls.getdents64(descriptor, buffer, size);
        char* const records = static_cast<char*>(buffer);
        std::uint16_t length;
        for (ssize_t at = 0; at < end; at += length) {
            std::memcpy(&length, records + at + offsetof(dirent64, d_reclen), sizeof length);
            records[at + static_cast<ssize_t>(offsetof(dirent64, d_type))] = DT_UNKNOWN;
        }
        return end;
    };
    EXPECT_EQ(namesOf(provider.listAllNamesOnly(folder.iri())), all);
    EXPECT_EQ(namesOf(provider.listFoldersNamesOnly(folder.iri())), folders);
    EXPECT_EQ(namesOf(provider.listFiles(folder.iri())), files);
}

TEST_F(LocalProviderListings, OfAnEmptyFolderHaveNoEntry)
{
    fs::create_directory(folder / "empty");
    EXPECT_FALSE(provider.listAll(folder.iri(u"empty"))->hasEntry());
    EXPECT_FALSE(provider.listFoldersNamesOnly(folder.iri(u"empty"))->hasEntry());
}

TEST_F(LocalProviderListings, OfALinkAreThoseOfTheFolderThatItLeadsTo)
{
    EXPECT_EQ(namesOf(provider.listAll(folder.iri(u"link to folder"))), Names{"inside"});
}

TEST_F(LocalProviderListings, NeedAFolder)
{
    for (char16_t const* const name : {u"file", u"link to file", u"pipe", u"broken link", u"missing", u"file/name"}) {
        StorageIRI const iri = folder.iri(name);
        EXPECT_EQ(failureOf([&] { provider.listAll(iri); }), failure(ErrorCode::ResourceNotFound, iri));
        EXPECT_EQ(failureOf([&] { provider.listFilesNamesOnly(iri); }), failure(ErrorCode::ResourceNotFound, iri));
    }
}

TEST_F(LocalProviderListings, CarryAttributes)
{
    timespec const times[] = {{0, 0}, {1'234'567'890, 123'456'789}};
    for (char const* const name : {"file", "folder"})
        ASSERT_EQ(::utimensat(AT_FDCWD, (folder / name).c_str(), times, 0), 0);
    auto const modified = provider.getFileAttributes(folder.iri(u"file")).getLastModified();
    auto const listing = provider.listAll(folder.iri());
    for (FolderEntry const& entry : entries(*listing)) {
        ASSERT_EQ(entry.getFileAttributes().has_value(), entry.isFile());
        ASSERT_EQ(entry.getFolderAttributes().has_value(), !entry.isFile());
        if (entry.getName() == u"file" || entry.getName() == u"link to file") {
            EXPECT_EQ(entry.getFileAttributes()->getSize(), 7u);
            EXPECT_EQ(entry.getFileAttributes()->getLastModified(), modified);
            EXPECT_TRUE(entry.getFileAttributes()->isWritable());
        }
        if (!entry.isFile()) {
            EXPECT_EQ(entry.getFolderAttributes()->getLastModified(), modified);
            EXPECT_TRUE(entry.getFolderAttributes()->isWritable());
        }
        if (entry.getName() == u"broken link") {
            EXPECT_EQ(entry.getFileAttributes()->getSize(), 7u) << "that of the link, whose text is \"nothing\"";
            EXPECT_FALSE(entry.getFileAttributes()->isWritable());
        }
    }
}

TEST_F(LocalProviderListings, OfNamesOnlyCarryNoAttributes)
{
    auto const listing = provider.listAllNamesOnly(folder.iri());
    for (FolderEntry const& entry : entries(*listing)) {
        EXPECT_FALSE(entry.getFileAttributes().has_value());
        EXPECT_FALSE(entry.getFolderAttributes().has_value());
    }
}

TEST_F(LocalProviderListings, OfTheRootKnowWhatIsWritable)
{
    auto const listing = provider.listFolders(StorageIRI(u"file:///"));
    while (listing->hasEntry() && listing->entry().getName() != u"dev")
        listing->next();
    ASSERT_TRUE(listing->hasEntry());
    EXPECT_EQ(listing->entry().getFolderAttributes()->isWritable(),
              provider.getFolderAttributes(StorageIRI(u"file:///dev")).isWritable());
}

TEST_F(LocalProviderListings, OfNamesOnlyAskAboutLinksAlone)
{
    ReplacedSystemCalls replaced;
    countCalls(replaced);
    namesOf(provider.listAllNamesOnly(folder.iri()));
    EXPECT_EQ(statxCalls, 4);
    statxCalls = 0;
    namesOf(provider.listAllNamesOnly(folder.iri(u"folder")));
    EXPECT_EQ(statxCalls, 0);
}

TEST_F(LocalProviderListings, WithAttributesAskOncePerEntryAndOnceMoreForABrokenLink)
{
    ReplacedSystemCalls replaced;
    countCalls(replaced);
    namesOf(provider.listAll(folder.iri()));
    EXPECT_EQ(statxCalls, 8 + 2);
}

TEST_F(LocalProviderListings, AskNothingAboutWhatIsNotWanted)
{
    ReplacedSystemCalls replaced;
    countCalls(replaced);
    namesOf(provider.listFolders(folder.iri()));
    EXPECT_EQ(statxCalls, 1 + 4 + 2) << "the folder and four links, two of them broken";
}

TEST_F(LocalProviderListings, MountNothing)
{
    static int mountingCalls;
    mountingCalls = 0;
    ReplacedSystemCalls replaced;
    replaced->statx = [](int at, char const* path, int flags, unsigned mask, struct statx* result) {
        mountingCalls += (flags & AT_NO_AUTOMOUNT) == 0;
        return realSystemCalls.statx(at, path, flags, mask, result);
    };
    EXPECT_EQ(namesOf(provider.listAll(folder.iri())), all);
    EXPECT_EQ(mountingCalls, 0);
}

/// A folder with more entries than fit into several buffers.
class LocalProviderLargeListings : public testing::Test
{
protected:
    LocalProviderLargeListings()
    {
        for (int i = 1000; i < 1000 + count; ++i) {
            std::string const name = std::string(200, 'x') + std::to_string(i);
            folder.write(name, "");
            names.insert(name);
        }
    }

    static constexpr int count = 600;
    TemporaryFolder folder;
    LocalProvider const provider;
    std::set<std::string> names;
};

TEST_F(LocalProviderLargeListings, HoldEveryEntryOnce)
{
    Names const listed = namesOf(provider.listAllNamesOnly(folder.iri()));
    EXPECT_EQ(listed, Names(names.begin(), names.end()));
}

TEST_F(LocalProviderLargeListings, StartAgainFromAnywhere)
{
    auto const listing = provider.listAllNamesOnly(folder.iri());
    for (int const steps : {0, 1, count / 2, count - 1}) {
        for (int i = 0; i < steps; ++i)
            listing->next();
        listing->reset();
    }
    EXPECT_EQ(namesOf(*listing), Names(names.begin(), names.end()));
    EXPECT_FALSE(listing->hasEntry());
    listing->reset();
    EXPECT_EQ(namesOf(*listing), Names(names.begin(), names.end()));
}

TEST_F(LocalProviderLargeListings, AreReadAsTheyAreWalked)
{
    ReplacedSystemCalls replaced;
    countCalls(replaced);
    auto const listing = provider.listAll(folder.iri());
    EXPECT_EQ(getdents64Calls, 1);
    EXPECT_EQ(statxCalls, 1);
    namesOf(*listing);
    EXPECT_GT(getdents64Calls, 3);
}

TEST_F(LocalProviderLargeListings, SurviveTheRemovalOfTheirEntries)
{
    auto const listing = provider.listAll(folder.iri());
    std::size_t walked = 0;
    for (; listing->hasEntry(); listing->next()) {
        if (++walked == 10)
            for (std::string const& name : names)
                fs::remove(folder / name);
    }
    EXPECT_EQ(walked, 10u);
}

TEST_F(LocalProviderListings, EndWhereTheFolderIsRemoved)
{
    fs::create_directory(folder / "removed");
    auto const listing = provider.listAll(folder.iri(u"removed"));
    fs::remove(folder / "removed");
    listing->reset();
    EXPECT_FALSE(listing->hasEntry());
}

TEST_F(LocalProviderListings, PassOverWhatVanishesBeforeItIsAskedAbout)
{
    ReplacedSystemCalls replaced;
    replaced->statx = [](int at, char const* path, int flags, unsigned mask, struct statx* result) {
        return std::string_view(path) == "folder" ? realSystemCalls.statx(at, path, flags, mask, result)
                                                  : failWith(ENOENT);
    };
    EXPECT_EQ(namesOf(provider.listAll(folder.iri())), Names{"folder/"});
    EXPECT_EQ(namesOf(provider.listFoldersNamesOnly(folder.iri())), Names{"folder/"});
}

TEST_F(LocalProviderListings, SeeWhatBecameOfTheFolderWhenTheyStartAgain)
{
    auto const listing = provider.listAll(folder.iri(u"folder"));
    folder.write("folder/new", "");
    listing->reset();
    EXPECT_EQ(namesOf(*listing), (Names{"inside", "new"}));
}

TEST_F(LocalProviderListings, ReportWhatTheFolderCannotDeliver)
{
    auto const listing = provider.listAll(folder.iri());
    ReplacedSystemCalls replaced;
    replaced->getdents64 = [](int, void*, std::size_t) -> ssize_t { return failWith(EIO); };
    auto const failed = failure(ErrorCode::IOError, folder.iri());
    EXPECT_EQ(failureOf([&] { namesOf(*listing); }), failed);
    EXPECT_FALSE(listing->hasEntry());
    EXPECT_EQ(failureOf([&] { listing->reset(); }), failed);
    EXPECT_EQ(failureOf([&] { provider.listAll(folder.iri()); }), failed);
}

TEST_F(LocalProviderListings, NameTheEntryThatCannotBeAskedAbout)
{
    ReplacedSystemCalls replaced;
    replaced->statx = [](int, char const*, int, unsigned, struct statx*) { return failWith(EIO); };
    EXPECT_EQ(failureOf([&] { provider.listAll(folder.iri(u"folder")); }),
              failure(ErrorCode::IOError, folder.iri(u"folder/inside")));
}

TEST_F(LocalProviderListings, GoOnWhenASignalInterrupts)
{
    static int interruptions;
    interruptions = 3;
    ReplacedSystemCalls replaced;
    replaced->getdents64 = [](int descriptor, void* buffer, std::size_t size) {
        return interruptions-- > 0 ? failWith(EINTR) : realSystemCalls.getdents64(descriptor, buffer, size);
    };
    EXPECT_EQ(namesOf(provider.listAll(folder.iri())), all);
}

} // namespace
} // namespace foundation::storage::local
