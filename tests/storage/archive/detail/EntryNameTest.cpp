#include <storage/archive/detail/entryName.hpp>

#include <gtest/gtest.h>

#include <vector>

namespace foundation::storage::archive::detail {
namespace {

std::vector<std::u16string> namesOf(std::u16string_view path)
{
    std::vector<std::u16string> names;
    for (std::u16string_view name = takeName(path); !name.empty(); name = takeName(path))
        names.emplace_back(name);
    return names;
}

using Names = std::vector<std::u16string>;

TEST(EntryName, TakeNameSplitsAtSeparatorsAndPassesOverEmptyNames)
{
    EXPECT_EQ(namesOf(u"a/b"), (Names{u"a", u"b"}));
    EXPECT_EQ(namesOf(u"//a///b//"), (Names{u"a", u"b"}));
    EXPECT_EQ(namesOf(u"./../.a"), (Names{u".", u"..", u".a"}));
    EXPECT_EQ(namesOf(u"/"), Names{});
    EXPECT_EQ(namesOf(u""), Names{});
}

TEST(EntryName, EveryNameThatADiskCouldHoldIsSafe)
{
    for (auto const* const name :
         {u"a", u"...", u".a", u"..a", u"a..", u"c:", u"c:\\a", u"..\\a", u"\x01\n", u"\xEFFF"}) {
        EXPECT_TRUE(isSafe(name));
        EXPECT_EQ(safeName(name), name);
    }
}

TEST(EntryName, WhatWouldMeanAnotherPlaceIsEscaped)
{
    for (std::u16string const& name :
         {std::u16string(), std::u16string(u"."), std::u16string(u".."), std::u16string(u"a\0b", 3)})
        EXPECT_FALSE(isSafe(name));
    EXPECT_EQ(safeName(u""), u"%2F");
    EXPECT_EQ(safeName(u"."), u"%2F");
    EXPECT_EQ(safeName(u".."), u"%2E%2E");
    EXPECT_EQ(safeName(std::u16string(u"a\0b", 3)), u"a%00b");
}

} // namespace
} // namespace foundation::storage::archive::detail
