#include <storage/memory/detail/Folder.hpp>

#include <gtest/gtest.h>

#include <tests/storage/memory/MemoryStore.hpp>

namespace foundation::storage::memory::detail {
namespace {

Node newFile()
{
    static Account account;
    return std::make_shared<File>(account);
}

TEST(Folder, FindsWhatItHolds)
{
    FolderPtr const folder = Folder::create();
    Node const file = newFile();
    folder->put(u"name", file);
    ASSERT_NE(folder->find(u"name"), nullptr);
    EXPECT_EQ(*folder->find(u"name"), file);
    EXPECT_EQ(folder->find(u"Name"), nullptr);
}

TEST(Folder, AnswersWhatANameStoodForBefore)
{
    FolderPtr const folder = Folder::create();
    Node const first = newFile();
    Node const second = newFile();
    EXPECT_EQ(folder->put(u"name", first), Node());
    EXPECT_EQ(folder->put(u"name", second), first);
    EXPECT_EQ(folder->take(u"name"), second);
    EXPECT_EQ(folder->find(u"name"), nullptr);
}

TEST(Folder, HasAnotherVersionAfterEachChange)
{
    FolderPtr const folder = Folder::create();
    std::uint64_t const empty = folder->version();
    folder->put(u"name", newFile());
    std::uint64_t const filled = folder->version();
    folder->take(u"name");
    EXPECT_NE(filled, empty);
    EXPECT_NE(folder->version(), filled);
    EXPECT_NE(folder->version(), empty);
}

TEST(Folder, GoesHoweverDeepItsSubfoldersLie)
{
    FolderPtr top = Folder::create();
    for (int depth = 0; depth < 200000; ++depth) {
        FolderPtr above = Folder::create();
        above->put(u"a", Node(std::move(top)));
        above->put(u"b", Folder::create());
        top = std::move(above);
    }
    std::weak_ptr<Folder> const watched = top;
    top.reset();
    EXPECT_TRUE(watched.expired());
}

TEST(Folder, TakesAlongAllThatItHolds)
{
    FolderPtr const top = Folder::create();
    FolderPtr sub = Folder::create();
    Node const file = newFile();
    sub->put(u"file", file);
    top->put(u"sub", Node(std::move(sub)));
    top->take(u"sub");
    EXPECT_EQ(std::get<FilePtr>(file).use_count(), 1);
}

} // namespace
} // namespace foundation::storage::memory::detail
