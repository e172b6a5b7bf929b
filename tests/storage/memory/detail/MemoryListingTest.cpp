#include <storage/memory/detail/MemoryListing.hpp>

#include <gtest/gtest.h>

#include <tests/storage/memory/MemoryStore.hpp>

#include <functional>

namespace foundation::storage::memory {
namespace {

using namespace provider;

using Operation = IProvider::Listing (IProvider::*)(StorageIRI const&, std::u16string) const;

struct Row
{
    char const* name;
    Operation list;
    bool attributes;
    Names all;
    Names matching; ///< those that match "[ab]*.t?t"
};

void PrintTo(Row const& row, std::ostream* stream)
{
    *stream << row.name;
}

class MemoryListing : public testing::TestWithParam<Row>
{
protected:
    MemoryListing()
    {
        store.createFolderRecursive(at(u"/top/b.tat/inner"));
        store.createFolder(at(u"/top/x"));
        store.createFile(at(u"/top/a.txt"));
        store.createFile(at(u"/top/A.txt"));
        store.createFile(at(u"/top/b.tat/b.txt"));
        store.createFile(at(u"/top/b.tat/inner/a.t.t"));
    }

    IProvider::Listing list(std::u16string const& pattern = {}) const
    {
        return (store.*GetParam().list)(at(u"/top"), pattern);
    }

    MemoryStore store;
};

Names const everything{u"A.txt", u"a.txt", u"b.tat/", u"b.tat/b.txt", u"b.tat/inner/", u"b.tat/inner/a.t.t", u"x/"};
Names const everythingMatching{u"a.txt", u"b.tat/", u"b.tat/b.txt", u"b.tat/inner/a.t.t"};

INSTANTIATE_TEST_SUITE_P(
    Every, MemoryListing,
    testing::Values(
        Row{"All", &IProvider::listAll, true, {u"A.txt", u"a.txt", u"b.tat/", u"x/"}, {u"a.txt", u"b.tat/"}},
        Row{"Files", &IProvider::listFiles, true, {u"A.txt", u"a.txt"}, {u"a.txt"}},
        Row{"Folders", &IProvider::listFolders, true, {u"b.tat/", u"x/"}, {u"b.tat/"}},
        Row{"AllNames",
            &IProvider::listAllNamesOnly,
            false,
            {u"A.txt", u"a.txt", u"b.tat/", u"x/"},
            {u"a.txt", u"b.tat/"}},
        Row{"FileNames", &IProvider::listFilesNamesOnly, false, {u"A.txt", u"a.txt"}, {u"a.txt"}},
        Row{"FolderNames", &IProvider::listFoldersNamesOnly, false, {u"b.tat/", u"x/"}, {u"b.tat/"}},
        Row{"Recursive", &IProvider::listAllRecursive, true, everything, everythingMatching},
        Row{"RecursiveNames", &IProvider::listAllRecursiveNamesOnly, false, everything, everythingMatching}),
    [](auto const& row) { return row.param.name; });

TEST_P(MemoryListing, GivesEveryEntryOfItsKindInOrder)
{
    EXPECT_EQ(namesOf(*list()), GetParam().all);
}

TEST_P(MemoryListing, GivesWhatMatchesThePattern)
{
    EXPECT_EQ(namesOf(*list(u"[ab]*.t?t")), GetParam().matching);
}

TEST_P(MemoryListing, GivesEverythingForAStar)
{
    EXPECT_EQ(namesOf(*list(u"*")), GetParam().all);
}

TEST_P(MemoryListing, GivesNothingWhenNothingMatches)
{
    EXPECT_EQ(namesOf(*list(u"nothing")), Names());
}

TEST_P(MemoryListing, TellsAttributesUnlessForNamesOnly)
{
    auto const listing = list();
    for (FolderEntry const& entry : entries(*listing)) {
        EXPECT_EQ(entry.getFileAttributes().has_value(), GetParam().attributes && entry.isFile());
        EXPECT_EQ(entry.getFolderAttributes().has_value(), GetParam().attributes && !entry.isFile());
    }
}

TEST_P(MemoryListing, StartsAgainAtEveryPoint)
{
    for (std::size_t steps = 0; steps <= GetParam().all.size(); ++steps) {
        auto const listing = list();
        for (std::size_t step = 0; step < steps; ++step)
            listing->next();
        listing->reset();
        EXPECT_EQ(namesOf(*listing), GetParam().all);
    }
}

TEST_P(MemoryListing, StartsAgainWithTheFolderAsItIs)
{
    auto const listing = list();
    store.removeFolderRecursively(at(u"/top"));
    listing->reset();
    EXPECT_FALSE(listing->hasEntry());
}

TEST_P(MemoryListing, OfAnEmptyFolderHasNoEntry)
{
    EXPECT_FALSE((store.*GetParam().list)(at(u"/top/x"), {})->hasEntry());
}

TEST_P(MemoryListing, FindsNoFolder)
{
    for (std::u16string const path : {u"/top/a.txt", u"/missing"})
        EXPECT_EQ(failureOf([&] { (store.*GetParam().list)(at(path), {}); }),
                  failure(ErrorCode::ResourceNotFound, at(path)));
}

TEST_P(MemoryListing, GivesOnceWhatStaysWhileOthersComeAndGo)
{
    auto const listing = list(u"*.t*t");
    Names seen;
    for (FolderEntry const& entry : entries(*listing)) {
        seen.push_back(entry.getName());
        store.createFile(at(u"/top/" + std::u16string(seen.size(), u'z')));
        store.removeFile(at(u"/top/" + std::u16string(seen.size(), u'z')));
        store.createFile(at(u"/top/0" + std::u16string(seen.size(), u'z')));
    }
    Names expected;
    for (auto const& entry : namesOf(*list(u"*.t*t")))
        expected.push_back(entry.ends_with(u'/') ? entry.substr(0, entry.size() - 1) : entry);
    EXPECT_EQ(seen, expected);
}

TEST(MemoryListingAttributes, AreThoseOfTheEntries)
{
    MemoryStore const store;
    store.write(u"/file", "content");
    store.createFolder(at(u"/folder"));
    store.setWritable(at(u"/folder"), false);
    auto const listing = store.listAll(at(u"/"));
    EXPECT_EQ(listing->entry().getFileAttributes()->getSize(), 7u);
    EXPECT_EQ(listing->entry().getFileAttributes()->getLastModified(),
              store.getFileAttributes(at(u"/file")).getLastModified());
    listing->next();
    EXPECT_FALSE(listing->entry().getFolderAttributes()->isWritable());
    EXPECT_EQ(listing->entry().getFolderAttributes()->getLastModified(),
              store.getFolderAttributes(at(u"/folder")).getLastModified());
}

TEST(MemoryListingWhileChanging, PassesOverWhatIsRemovedAhead)
{
    MemoryStore const store;
    for (std::u16string const path : {u"/a", u"/b", u"/c"})
        store.createFile(at(path));
    auto const listing = store.listAll(at(u"/"));
    store.removeFile(at(u"/a"));
    store.removeFile(at(u"/b"));
    EXPECT_EQ(listing->entry().getName(), u"a");
    listing->next();
    EXPECT_EQ(listing->entry().getName(), u"c");
}

TEST(MemoryListingWhileChanging, LeavesAFolderThatIsRemoved)
{
    MemoryStore const store;
    store.createFolderRecursive(at(u"/a/b/c"));
    store.createFile(at(u"/z"));
    auto const listing = store.listAllRecursive(at(u"/"));
    listing->next();
    EXPECT_EQ(listing->entry().getName(), u"a/b");
    store.removeFolderRecursively(at(u"/a"));
    listing->next();
    EXPECT_EQ(listing->entry().getName(), u"z");
}

TEST(MemoryListingWhileChanging, OutlivesTheStore)
{
    IProvider::Listing listing;
    {
        MemoryStore const store;
        store.createFile(at(u"/a"));
        store.createFile(at(u"/b"));
        listing = store.listAll(at(u"/"));
    }
    EXPECT_EQ(namesOf(*listing), (Names{u"a", u"b"}));
}

} // namespace
} // namespace foundation::storage::memory
