#include <storage/archive/detail/PendingTree.hpp>

#include <fl/i18n/convert.hpp>

#include <gtest/gtest.h>

#include <map>
#include <random>
#include <string>

namespace foundation::storage::archive::detail {
namespace {

using Id = Index::Id;

std::u16string nameOf(unsigned number)
{
    return fl::i18n::to_ustring(std::to_string(number));
}

TEST(PendingTree, FindsWhatIsThereAndNothingElseWhateverCameAndWent)
{
    PendingTree tree(nullptr, {});
    std::map<unsigned, Id> present;
    std::mt19937 random(1);
    std::uniform_int_distribution<unsigned> numbers(0, 499);
    for (int step = 0; step != 20'000; ++step) {
        unsigned const number = numbers(random);
        auto const found = present.find(number);
        unsigned const other = numbers(random);
        if (found == present.end()) {
            present[number] = tree.add(Index::root, nameOf(number), EntryKind::File);
        } else if (!present.contains(other)) {
            tree.move(found->second, Index::root, nameOf(other));
            present[other] = found->second;
            present.erase(found);
        } else {
            tree.remove(found->second);
            present.erase(found);
        }
    }
    for (unsigned number = 0; number != 500; ++number) {
        auto const found = tree.index().child(Index::root, nameOf(number));
        ASSERT_EQ(found.has_value(), present.contains(number)) << number;
        if (found) {
            EXPECT_EQ(*found, present[number]);
        }
    }
    EXPECT_EQ(tree.children(Index::root).size(), present.size());
}

TEST(PendingTree, RemovesAFolderWithAllBelowIt)
{
    PendingTree tree(nullptr, {});
    Id const folder = tree.add(Index::root, u"a", EntryKind::Folder);
    Id const inner = tree.add(folder, u"b", EntryKind::Folder);
    Id const file = tree.add(inner, u"c", EntryKind::File);
    tree.remove(folder);
    EXPECT_FALSE(tree.isAlive(inner));
    EXPECT_FALSE(tree.isAlive(file));
    EXPECT_TRUE(tree.isEmpty(Index::root));
}

TEST(PendingTree, MovesAFolderWithAllBelowIt)
{
    PendingTree tree(nullptr, {});
    Id const folder = tree.add(Index::root, u"a", EntryKind::Folder);
    Id const file = tree.add(folder, u"b", EntryKind::File);
    Id const other = tree.add(Index::root, u"other", EntryKind::Folder);
    tree.move(folder, other, u"moved");
    EXPECT_EQ(tree.path(file), u"other/moved/b");
    EXPECT_EQ(tree.index().find(u"/other/moved/b", Index::LastLink::Keep).id, file);
    EXPECT_FALSE(tree.index().find(u"/a", Index::LastLink::Keep).id);
}

} // namespace
} // namespace foundation::storage::archive::detail
