#include <storage/local/detail/Subscription.hpp>

#include <gtest/gtest.h>

namespace foundation::storage::local::detail {
namespace {

TEST(FolderKey, IsOneForAllSpellingsOfAPath)
{
    for (char const* const path : {"/a/b", "/a//b", "//a/b/", "/./a/b", "/a/./b/.", "/a/b//."})
        EXPECT_EQ(folderKey(path), "/a/b") << path;
    for (char const* const path : {"/", "//", "/.", "/./"})
        EXPECT_EQ(folderKey(path), "/") << path;
}

TEST(FolderKey, KeepsWhatOnlyTheSystemCanResolve)
{
    EXPECT_EQ(folderKey("/a/../b"), "/a/../b");
    EXPECT_EQ(folderKey("/a/.b/..c"), "/a/.b/..c");
}

} // namespace
} // namespace foundation::storage::local::detail
