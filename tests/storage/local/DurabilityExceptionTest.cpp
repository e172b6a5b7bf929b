#include <storage/local/DurabilityException.hpp>

#include <gtest/gtest.h>

#include <memory>

namespace foundation::storage::local {
namespace {

using namespace provider;

StorageIRI const file(u"file:///a/b");

TEST(DurabilityException, SaysThatTheContentIsInPlaceAndNotCertainToSurvive)
{
    DurabilityException const error(ErrorCode::IOError, file);
    EXPECT_STREQ(error.what(), "foundation::storage::local::DurabilityException");
    EXPECT_EQ(error.ToUstringImpl(),
              u"foundation::storage::local::DurabilityException{StorageIRI=\"file:///a/b\", "
              u"ErrorCode=\"ErrorCode::IOError\"}: The new content is in place, but it is not certain to survive a "
              u"power failure.");
}

TEST(DurabilityException, IsAFailureOfTheStoreToThoseWhoKnowNoMore)
{
    try {
        throw DurabilityException(ErrorCode::NoSpaceLeft, file);
    } catch (Exception const& error) {
        EXPECT_EQ(error.getErrorCode(), ErrorCode::NoSpaceLeft);
        EXPECT_EQ(error.getStorageIRI(), file);
    }
}

TEST(DurabilityException, CanBeKeptAndThrownAgain)
{
    std::unique_ptr<core::except::IException> const kept(DurabilityException(ErrorCode::IOError, file).clone());
    EXPECT_THROW(kept->rethrow(), DurabilityException);
}

} // namespace
} // namespace foundation::storage::local
