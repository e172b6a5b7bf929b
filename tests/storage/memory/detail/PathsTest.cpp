#include <storage/memory/detail/paths.hpp>

#include <gtest/gtest.h>

#include <vector>

namespace foundation::storage::memory::detail {
namespace {

TEST(MemoryPaths, AreSplitIntoComponents)
{
    std::vector<std::u16string_view> components;
    forEachComponent(u"//a/./b c/", [&](std::u16string_view component) { components.push_back(component); });
    EXPECT_EQ(components, (std::vector<std::u16string_view>{u"a", u".", u"b c"}));
}

TEST(MemoryPaths, HaveOneWayToBeWritten)
{
    struct Row
    {
        char16_t const* path;
        char16_t const* canonical;
    };
    for (auto const& [path, canonical] :
         {Row{u"/", u"/"}, Row{u"//", u"/"}, Row{u"/a", u"/a"}, Row{u"/a/", u"/a"}, Row{u"/a//b", u"/a/b"},
          Row{u"/a/./b", u"/a/b"}, Row{u"/a/../b", u"/b"}, Row{u"/..", u"/"}, Row{u"/a/..", u"/"},
          Row{u"/a/b/..", u"/a"}, Row{u"/a/.../b", u"/a/.../b"}, Row{u"/a/..b", u"/a/..b"}})
        EXPECT_EQ(canonicalPath(path), canonical);
}

TEST(MemoryPaths, LieInAFolder)
{
    EXPECT_EQ(parentPath(u"/a/b"), u"/a");
    EXPECT_EQ(parentPath(u"/a"), u"/");
    EXPECT_EQ(parentPath(u"/"), u"");
}

TEST(MemoryPaths, LieBelowEveryFolderOnTheWay)
{
    EXPECT_TRUE(isBelow(u"/a", u"/"));
    EXPECT_TRUE(isBelow(u"/a/b", u"/a"));
    EXPECT_TRUE(isBelow(u"/a/b/c", u"/a"));
    EXPECT_FALSE(isBelow(u"/a", u"/a"));
    EXPECT_FALSE(isBelow(u"/", u"/"));
    EXPECT_FALSE(isBelow(u"/ab", u"/a"));
    EXPECT_FALSE(isBelow(u"/a", u"/a/b"));
}

} // namespace
} // namespace foundation::storage::memory::detail
