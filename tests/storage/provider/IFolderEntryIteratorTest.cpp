#include <storage/provider/IFolderEntryIterator.hpp>

#include <tests/support/VectorListing.hpp>
#include <tests/support/slotOf.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <ranges>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

namespace foundation::storage::provider {
namespace {

using tests::support::slotOf;
using tests::support::VectorListing;

static_assert(std::is_abstract_v<IFolderEntryIterator>);
static_assert(std::has_virtual_destructor_v<IFolderEntryIterator>);
static_assert(sizeof(IFolderEntryIterator) == sizeof(void*));
static_assert(std::is_same_v<decltype(&IFolderEntryIterator::hasEntry), bool (IFolderEntryIterator::*)() const>);
static_assert(
    std::is_same_v<decltype(&IFolderEntryIterator::entry), FolderEntry const& (IFolderEntryIterator::*)() const>);
static_assert(std::is_same_v<decltype(&IFolderEntryIterator::next), void (IFolderEntryIterator::*)()>);
static_assert(std::is_same_v<decltype(&IFolderEntryIterator::reset), void (IFolderEntryIterator::*)()>);
static_assert(std::ranges::input_range<FolderEntryRange>);
static_assert(std::is_same_v<std::ranges::range_reference_t<FolderEntryRange>, FolderEntry const&>);

VectorListing listingOf(std::vector<std::u16string> const& names)
{
    std::vector<FolderEntry> entries;
    for (std::u16string const& name : names)
        entries.emplace_back(name, FolderEntry::EntryType::File);
    return VectorListing(std::move(entries));
}

std::vector<std::u16string> namesIn(IFolderEntryIterator& listing)
{
    std::vector<std::u16string> names;
    for (FolderEntry const& entry : entries(listing))
        names.push_back(entry.getName());
    return names;
}

TEST(IFolderEntryIterator, OperationsStandBeforeTheDestructorInOrder)
{
    EXPECT_EQ(slotOf(&IFolderEntryIterator::hasEntry), 0u);
    EXPECT_EQ(slotOf(&IFolderEntryIterator::entry), 1u);
    EXPECT_EQ(slotOf(&IFolderEntryIterator::next), 2u);
    EXPECT_EQ(slotOf(&IFolderEntryIterator::reset), 3u);
}

TEST(FolderEntryRange, ShowsEveryEntryInOrder)
{
    VectorListing listing = listingOf({u"b", u"a", u"c"});
    EXPECT_EQ(namesIn(listing), (std::vector<std::u16string>{u"b", u"a", u"c"}));
    EXPECT_FALSE(listing.hasEntry());
}

TEST(FolderEntryRange, OfAnEmptyListingIsEmpty)
{
    VectorListing listing = listingOf({});
    EXPECT_TRUE(namesIn(listing).empty());
}

TEST(FolderEntryRange, GoesOnFromWhereTheListingStands)
{
    VectorListing listing = listingOf({u"a", u"b", u"c"});
    listing.next();
    EXPECT_EQ(namesIn(listing), (std::vector<std::u16string>{u"b", u"c"}));
    listing.reset();
    EXPECT_EQ(namesIn(listing), (std::vector<std::u16string>{u"a", u"b", u"c"}));
}

TEST(FolderEntryRange, LeavingTheLoopLeavesTheListingOnThatEntry)
{
    VectorListing listing = listingOf({u"a", u"b", u"c"});
    for (FolderEntry const& entry : entries(listing)) {
        if (entry.getName() == u"b")
            break;
    }
    EXPECT_EQ(listing.entry().getName(), u"b");
}

TEST(FolderEntryRange, ServesTheAlgorithmsOfTheStandardLibrary)
{
    VectorListing listing = listingOf({u"a", u"bb", u"cc"});
    auto const isLong = [](FolderEntry const& entry) { return entry.getName().size() == 2; };
    FolderEntryRange const range = entries(listing);
    auto const found = std::ranges::find_if(range, isLong);
    EXPECT_EQ(found->getName(), u"bb");
}

} // namespace
} // namespace foundation::storage::provider
