#include <storage/archive/detail/Index.hpp>

#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/IndexBuilder.hpp>

#include <gmock/gmock.h>

#include <functional>
#include <string>
#include <vector>

namespace foundation::storage::archive::detail {
namespace {

using testing::ElementsAre;
using testing::UnorderedElementsAre;
using LastLink = Index::LastLink;
using Reason = ArchiveException::Reason;

Index indexOf(std::vector<EntryRecord> const& records, ArchiveLimits const& limits = {})
{
    IndexBuilder builder(limits, 7);
    for (EntryRecord const& record : records)
        builder.add(record);
    return builder.finish();
}

EntryRecord file(std::u16string_view path, std::uint64_t locator = 0)
{
    return {.path = path, .kind = EntryKind::File, .size = 10, .modified = 1, .locator = locator};
}

EntryRecord folder(std::u16string_view path)
{
    return {.path = path, .kind = EntryKind::Folder, .modified = 2};
}

EntryRecord link(std::u16string_view path, std::u16string_view target)
{
    return {.path = path, .kind = EntryKind::SymbolicLink, .target = target};
}

EntryRecord hardLink(std::u16string_view path, std::u16string_view target, std::uint64_t size = 0)
{
    return {.path = path, .kind = EntryKind::HardLink, .size = size, .locator = 99, .target = target};
}

/// Every path in the tree, in the order of the folders; those of folders end in '/'.
std::vector<std::u16string> pathsOf(Index const& index)
{
    std::vector<std::u16string> paths;
    std::function<void(Index::Id, std::u16string const&)> const visit = [&](Index::Id id, std::u16string const& path) {
        for (Index::Id child = index.at(id).firstChild; child != Node::none; child = index.at(child).nextSibling) {
            bool const isFolder = index.at(child).kind == EntryKind::Folder;
            paths.push_back(path + std::u16string(index.name(child)) + (isFolder ? u"/" : u""));
            visit(child, paths.back());
        }
    };
    visit(Index::root, u"");
    return paths;
}

std::uint64_t locatorOf(Index const& index, std::u16string_view path)
{
    return index.at(index.find(path, LastLink::Follow).id.value()).locator;
}

Reason reasonAgainst(std::vector<EntryRecord> const& records, ArchiveLimits const& limits)
{
    try {
        indexOf(records, limits);
    } catch (Fault const& fault) {
        return fault.reason;
    }
    throw std::logic_error("not refused");
}

TEST(Index, HoldsEntriesInTheirOrder)
{
    EXPECT_THAT(pathsOf(indexOf({file(u"b"), folder(u"f/"), file(u"a"), file(u"f/c")})),
                ElementsAre(u"b", u"f/", u"f/c", u"a"));
}

TEST(Index, FoldersThatOnlyPathsNameAreThereWithTheTimeOfTheArchive)
{
    Index const index = indexOf({file(u"a/b/c")});
    EXPECT_THAT(pathsOf(index), ElementsAre(u"a/", u"a/b/", u"a/b/c"));
    EXPECT_EQ(index.at(*index.child(Index::root, u"a")).modified, 7);
}

TEST(Index, AFolderThatComesAfterItsFilesGivesItsTime)
{
    Index const index = indexOf({file(u"a/b"), folder(u"a/"), folder(u"./")});
    EXPECT_THAT(pathsOf(index), ElementsAre(u"a/", u"a/b"));
    EXPECT_EQ(index.at(*index.child(Index::root, u"a")).modified, 2);
    EXPECT_EQ(index.at(Index::root).modified, 2);
}

TEST(Index, NoNameLeadsOutOfTheTree)
{
    EXPECT_THAT(pathsOf(indexOf({file(u"/etc/passwd"), file(u"../../x"), file(u"a/../b"), file(u"./c"), file(u"/"),
                                 file(u".."), file(u"..\\y"), file(u"c:\\z")})),
                UnorderedElementsAre(u"etc/", u"etc/passwd", u"%2E%2E/", u"%2E%2E/%2E%2E/", u"%2E%2E/%2E%2E/x", u"a/",
                                     u"a/%2E%2E/", u"a/%2E%2E/b", u"c", u"%2F", u"%2E%2E~1", u"..\\y", u"c:\\z"));
}

TEST(Index, OfEqualNamesTheLastIsShownAndTheOthersBesideIt)
{
    Index const index = indexOf({file(u"a", 1), file(u"a", 2), file(u"a", 3), file(u"a~1", 4)});
    EXPECT_THAT(pathsOf(index), UnorderedElementsAre(u"a", u"a~1", u"a~2", u"a~1~1"));
    EXPECT_EQ(locatorOf(index, u"a"), 3u);
    EXPECT_EQ(locatorOf(index, u"a~2"), 2u);
    EXPECT_EQ(locatorOf(index, u"a~1"), 4u);
    EXPECT_EQ(locatorOf(index, u"a~1~1"), 1u);
}

TEST(Index, AFileGivesWayToAFolderOfItsName)
{
    for (auto const& records : {std::vector{file(u"a", 1), file(u"a/b")}, std::vector{file(u"a/b"), file(u"a", 1)}}) {
        Index const index = indexOf(records);
        EXPECT_THAT(pathsOf(index), UnorderedElementsAre(u"a/", u"a/b", u"a~1"));
        EXPECT_EQ(locatorOf(index, u"a~1"), 1u);
    }
}

TEST(Index, NothingIsPutBehindALink)
{
    Index const index = indexOf({link(u"a", u"/etc"), file(u"a/passwd")});
    EXPECT_THAT(pathsOf(index), UnorderedElementsAre(u"a/", u"a/passwd", u"a~1"));
}

TEST(Index, FindsAmongManyThousands)
{
    std::vector<std::u16string> paths;
    for (char16_t i = 0; i != 20'000; ++i)
        paths.push_back(std::u16string(u"folder") + static_cast<char16_t>(u'0' + i % 7) + u'/' +
                        static_cast<char16_t>(0x4E00 + i));
    std::vector<EntryRecord> records;
    for (std::u16string const& path : paths)
        records.push_back(file(path, records.size()));
    Index const index = indexOf(records);
    for (std::size_t i = 0; i != paths.size(); ++i)
        ASSERT_EQ(locatorOf(index, paths[i]), i);
    EXPECT_FALSE(index.find(u"folder0/none", LastLink::Follow).id);
}

TEST(Index, PathsMeanWhatTheyMeanToPOSIX)
{
    Index const index = indexOf({file(u"f/a", 5), file(u"b")});
    for (auto const* const path : {u"/f/a", u"f/a", u"//f//a", u"/./f/./a", u"/../f/a", u"/f/../f/a"})
        EXPECT_EQ(locatorOf(index, path), 5u);
    for (auto const* const path : {u"/b/.", u"/b/..", u"/b/x", u"/missing/../b"})
        EXPECT_FALSE(index.find(path, LastLink::Follow).id);
    EXPECT_EQ(index.find(u"/", LastLink::Follow).id, Index::root);
}

TEST(Index, LinksAreFollowedWithinTheTree)
{
    Index const index = indexOf({file(u"f/a", 5), link(u"toFile", u"f/a"), link(u"toFolder", u"./f/"),
                                 link(u"f/up", u"../toFile"), link(u"chain", u"toFolder/up")});
    for (auto const* const path : {u"toFile", u"toFolder/a", u"f/up", u"chain", u"toFolder/../f/a"})
        EXPECT_EQ(locatorOf(index, path), 5u);
    EXPECT_EQ(index.at(*index.find(u"toFile", LastLink::Keep).id).kind, EntryKind::SymbolicLink);
    EXPECT_EQ(index.at(*index.find(u"toFolder/", LastLink::Keep).id).kind, EntryKind::SymbolicLink);
    EXPECT_EQ(index.at(*index.find(u"toFolder/.", LastLink::Keep).id).kind, EntryKind::Folder);
}

TEST(Index, LinksThatPointOutOfTheTreeLeadNowhere)
{
    Index const index = indexOf({file(u"f/a"), link(u"absolute", u"/f/a"), link(u"above", u"../f/a"),
                                 link(u"f/above", u"../../f/a"), link(u"missing", u"x"), link(u"empty", u"")});
    for (auto const* const path : {u"absolute", u"above", u"f/above", u"missing", u"empty"}) {
        EXPECT_FALSE(index.find(path, LastLink::Follow).id);
        EXPECT_FALSE(index.find(path, LastLink::Follow).isLoop);
        EXPECT_TRUE(index.find(path, LastLink::Keep).id);
    }
}

TEST(Index, LinksThatLeadToEachOtherAreALoop)
{
    Index const index = indexOf({link(u"a", u"b"), link(u"b", u"a"), link(u"c", u"./c/c")});
    for (auto const* const path : {u"a", u"b/x", u"c"}) {
        Index::Place const place = index.find(path, LastLink::Follow);
        EXPECT_FALSE(place.id);
        EXPECT_TRUE(place.isLoop);
    }
    EXPECT_TRUE(index.follow(*index.child(Index::root, u"a")).isLoop);
}

TEST(Index, HardLinksHaveTheContentOfTheirFile)
{
    Index const index = indexOf({file(u"a", 5), hardLink(u"b", u"./a"), hardLink(u"c", u"b")});
    for (auto const* const path : {u"a", u"b", u"c"}) {
        EXPECT_EQ(locatorOf(index, path), 5u);
        EXPECT_EQ(index.at(*index.find(path, LastLink::Follow).id).kind, EntryKind::File);
        EXPECT_EQ(index.at(*index.find(path, LastLink::Follow).id).size, 10u);
    }
}

TEST(Index, TheLastOfHardLinksMayHoldTheContent)
{
    EntryRecord first = file(u"a", 5);
    first.size = 0;
    Index const index = indexOf({first, hardLink(u"b", u"a"), hardLink(u"c", u"a", 10)});
    for (auto const* const path : {u"a", u"b", u"c"}) {
        EXPECT_EQ(locatorOf(index, path), 99u);
        EXPECT_EQ(index.at(*index.find(path, LastLink::Follow).id).size, 10u);
    }
}

TEST(Index, HardLinksWithoutAFileStayHardLinks)
{
    Index const index = indexOf(
        {folder(u"f/"), hardLink(u"a", u"x"), hardLink(u"b", u"b"), hardLink(u"c", u"f"), hardLink(u"d", u"../e")});
    for (auto const* const path : {u"a", u"b", u"c", u"d"})
        EXPECT_EQ(index.at(*index.find(path, LastLink::Follow).id).kind, EntryKind::HardLink);
}

TEST(Index, WhatLiesTooDeepIsInTheRoot)
{
    ArchiveLimits const limits{.depth = 3};
    Index const index = indexOf({file(u"/a/b/./d", 1), file(u"a//b/c", 2), hardLink(u"h", u"a/b/./d")}, limits);
    EXPECT_THAT(pathsOf(index), ElementsAre(u"a%2Fb%2F.%2Fd", u"a/", u"a/b/", u"a/b/c", u"h"));
    EXPECT_EQ(locatorOf(index, u"h"), 1u);
}

TEST(Index, RefusesMoreEntriesThanAllowedWhoeverNamesThem)
{
    ArchiveLimits const limits{.entries = 3};
    EXPECT_EQ(indexOf({file(u"a/b/c")}, limits).size(), 4u);
    EXPECT_EQ(reasonAgainst({file(u"a/b/c/d")}, limits), Reason::TooManyEntries);
    EXPECT_EQ(reasonAgainst({file(u"a"), file(u"a"), file(u"a"), file(u"a")}, limits), Reason::TooManyEntries);
}

TEST(Index, RefusesNamesAndTargetsThatTakeMoreMemoryThanAllowed)
{
    ArchiveLimits const limits{.indexBytes = 10'000};
    std::u16string const longText(10'000, u'a');
    EXPECT_EQ(reasonAgainst({file(longText)}, limits), Reason::IndexTooLarge);
    EXPECT_EQ(reasonAgainst({link(u"a", longText)}, limits), Reason::IndexTooLarge);
    EXPECT_EQ(reasonAgainst(std::vector(1000, file(u"a")), limits), Reason::IndexTooLarge);
}

} // namespace
} // namespace foundation::storage::archive::detail
