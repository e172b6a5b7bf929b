#include <tools/storage/schemeText.hpp>

#include <gtest/gtest.h>

namespace foundation::storage::tool {
namespace {

TEST(SchemeText, BeginsWithALetterOrIsAShortName)
{
    EXPECT_EQ(schemeLength("file:///a"), 4U);
    EXPECT_EQ(schemeLength("a+b-c.d1:x"), 8U);
    EXPECT_EQ(schemeLength("7z:file:///a!/"), 2U);
    EXPECT_EQ(schemeLength("7Z:file:///a!/"), 2U);
    for (char const* const path : {"", ":", "file", "a/b:c", "1:b", "7:a", "7za:b", "./7z:a", "+a:b"})
        EXPECT_EQ(schemeLength(path), std::nullopt) << path;
}

TEST(SchemeText, IsWrittenOutAtEveryDepth)
{
    EXPECT_EQ(withKnownSchemes("7z:file:///a.7z!/b"), "sevenzip:file:///a.7z!/b");
    EXPECT_EQ(withKnownSchemes("TAR:7Z:zip:7z:File:///A!/7z:x"), "tar:sevenzip:zip:sevenzip:file:///A!/7z:x");
}

TEST(SchemeText, LeavesTheRestAsItIs)
{
    for (char const* const iri : {"file:///7z:B", "mem:///A", "zip:file:///7z:!/C:x", "file:///A:b"})
        EXPECT_EQ(withKnownSchemes(iri), iri);
}

} // namespace
} // namespace foundation::storage::tool
