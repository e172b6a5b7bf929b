#include <storage/local/detail/scratchName.hpp>

#include <gtest/gtest.h>

#include <set>

namespace foundation::storage::local::detail {
namespace {

TEST(ScratchName, HasTheFormThatItIsKnownBy)
{
    for (int i = 0; i < 1000; ++i)
        ASSERT_TRUE(isScratchName(scratchName())) << scratchName();
}

TEST(ScratchName, IsNeverTheSameTwice)
{
    std::set<std::string> names;
    for (int i = 0; i < 1000; ++i)
        EXPECT_TRUE(names.insert(scratchName()).second);
}

TEST(ScratchName, IsOnlyAUuidOfVersionFourInLowerCaseWithItsEnding)
{
    EXPECT_TRUE(isScratchName("7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak"));
    EXPECT_TRUE(isScratchName("7e9f4b5e-0000-4000-b000-0123456789ab.tmp.bak"));
    for (char const* const name :
         {"", ".tmp.bak", "7e9f4b5e-0000-4000-8000-0123456789ab", "7e9f4b5e-0000-4000-8000-0123456789ab.tmp",
          "7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bakx", "x7e9f4b5e-0000-4000-8000-0123456789ab.tmp.bak",
          "7E9F4B5E-0000-4000-8000-0123456789AB.tmp.bak", "7e9f4b5e-0000-1000-8000-0123456789ab.tmp.bak",
          "7e9f4b5e-0000-4000-c000-0123456789ab.tmp.bak", "7e9f4b5e-0000-4000-8000-0123456789ag.tmp.bak",
          "7e9f4b5e00000-4000-8000-0123456789ab.tmp.bak", "7e9f4b5e-0000-4000-8000-0123456789ab.TMP.BAK"})
        EXPECT_FALSE(isScratchName(name)) << name;
}

} // namespace
} // namespace foundation::storage::local::detail
