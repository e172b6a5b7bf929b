#include <storage/provider/FolderEntry.hpp>

#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

using boost::posix_time::ptime;
using EntryType = FolderEntry::EntryType;

static_assert(std::is_same_v<std::underlying_type_t<EntryType>, std::int32_t>);
static_assert(!std::is_convertible_v<EntryType, int>);
static_assert(static_cast<int>(EntryType::File) == 0);
static_assert(static_cast<int>(EntryType::Folder) == 1);
static_assert(std::is_same_v<decltype(&FolderEntry::getName), std::u16string const& (FolderEntry::*)() const>);
static_assert(std::is_same_v<decltype(&FolderEntry::isFile), bool (FolderEntry::*)() const>);
static_assert(std::is_same_v<decltype(&FolderEntry::getFileAttributes),
                             boost::optional<FileAttributes> const& (FolderEntry::*)() const>);
static_assert(std::is_same_v<decltype(&FolderEntry::getFolderAttributes),
                             boost::optional<FolderAttributes> const& (FolderEntry::*)() const>);

TEST(FolderEntry, FromFileAttributesIsAFileThatHasThem)
{
    FolderEntry const entry(u"a.txt", FileAttributes(42, ptime(), true));
    EXPECT_EQ(entry.getName(), u"a.txt");
    EXPECT_TRUE(entry.isFile());
    ASSERT_TRUE(entry.getFileAttributes());
    EXPECT_EQ(entry.getFileAttributes()->getSize(), 42u);
    EXPECT_FALSE(entry.getFolderAttributes());
}

TEST(FolderEntry, FromFolderAttributesIsAFolderThatHasThem)
{
    FolderEntry const entry(u"docs", FolderAttributes(ptime(), true));
    EXPECT_EQ(entry.getName(), u"docs");
    EXPECT_FALSE(entry.isFile());
    EXPECT_FALSE(entry.getFileAttributes());
    ASSERT_TRUE(entry.getFolderAttributes());
    EXPECT_TRUE(entry.getFolderAttributes()->isWritable());
}

TEST(FolderEntry, FromATypeAloneHasNoAttributes)
{
    FolderEntry const file(u"a", EntryType::File);
    EXPECT_TRUE(file.isFile());
    EXPECT_FALSE(file.getFileAttributes());
    EXPECT_FALSE(file.getFolderAttributes());

    FolderEntry const folder(u"b", EntryType::Folder);
    EXPECT_FALSE(folder.isFile());
    EXPECT_FALSE(folder.getFileAttributes());
    EXPECT_FALSE(folder.getFolderAttributes());
}

TEST(FolderEntry, NameIsMovedIn)
{
    std::u16string name(1000, u'x');
    char16_t const* const text = name.data();
    FolderEntry const entry(std::move(name), EntryType::File);
    EXPECT_EQ(entry.getName().data(), text);
}

TEST(FolderEntry, MakingAndCopyingAsksNoDeferredFlag)
{
    int calls = 0;
    FolderEntry const entry(u"a", FileAttributes(0, ptime(), [&calls] { return ++calls > 0; }));
    FolderEntry const copy = entry;
    EXPECT_EQ(calls, 0);
    EXPECT_TRUE(copy.getFileAttributes()->isWritable());
    EXPECT_EQ(calls, 1);
}

} // namespace
} // namespace foundation::storage::provider
