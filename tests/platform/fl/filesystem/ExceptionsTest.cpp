#include <fl/filesystem/exceptions.hpp>

#include <gtest/gtest.h>

#include <exception>
#include <string>
#include <type_traits>

namespace fl::filesystem {
namespace {

// Denied and missing at once.
struct Both : AccessDenied, PathNotFound
{
    Both() : FsysExceptionBase("both"), AccessDenied("denied"), PathNotFound("missing") {}
};

template <class Kind>
class FsysExceptions : public testing::Test
{};

using Kinds = testing::Types<FsysExceptionBase, AccessDenied, SystemError, PathNotFound, InvalidArgument>;
TYPED_TEST_SUITE(FsysExceptions, Kinds);

TYPED_TEST(FsysExceptions, SaysItsMessage)
{
    EXPECT_STREQ(TypeParam(std::string("message")).what(), "message");
}

TYPED_TEST(FsysExceptions, IsCaughtAsAFailureOfThePathLibrary)
{
    EXPECT_THROW(throw TypeParam("message"), FsysExceptionBase);
    EXPECT_THROW(throw TypeParam("message"), std::exception);
}

TYPED_TEST(FsysExceptions, IsMadeFromAMessageExplicitly)
{
    EXPECT_TRUE((std::is_constructible_v<TypeParam, std::string const&>));
    EXPECT_FALSE((std::is_convertible_v<std::string, TypeParam>));
}

TYPED_TEST(FsysExceptions, CopiesWithoutThrowing)
{
    EXPECT_TRUE(std::is_nothrow_copy_constructible_v<TypeParam>);
}

TEST(FsysExceptionKinds, KindsDoNotCatchOneAnother)
{
    EXPECT_FALSE((std::is_base_of_v<AccessDenied, PathNotFound>));
    EXPECT_FALSE((std::is_base_of_v<SystemError, InvalidArgument>));
}

TEST(FsysExceptionKinds, AnExceptionOfTwoKindsIsCaughtAsEachAndAsTheBase)
{
    EXPECT_THROW(throw Both(), AccessDenied);
    EXPECT_THROW(throw Both(), PathNotFound);
    EXPECT_THROW(throw Both(), FsysExceptionBase);
    EXPECT_STREQ(Both().what(), "both");
}

} // namespace
} // namespace fl::filesystem
