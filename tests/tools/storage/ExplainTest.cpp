#include <tools/storage/explain.hpp>

#include <gtest/gtest.h>

#include <storage/local/DurabilityException.hpp>
#include <storage/provider/ReasonInfo.hpp>
#include <tests/support/TestStreamFailure.hpp>

namespace foundation::storage::tool {
namespace {

using provider::ErrorCode;
using provider::StorageIRI;

StorageIRI const location(u"file:///tmp/x");

TEST(Explain, GivesTheWordsForACode)
{
    EXPECT_EQ(explain(provider::Exception(ErrorCode::NoSpaceLeft, location)), "no space left");
}

TEST(Explain, PrefersWhatTheFailureSays)
{
    provider::Exception error(ErrorCode::IOError, location);
    error << provider::ReasonInfo(u"the \u00fcbermittlung ended");
    EXPECT_EQ(explain(error), "the \xC3\xBC"
                              "bermittlung ended");
}

TEST(Explain, GivesTheWordsOfAFailureOfAStreamToo)
{
    tests::support::TestStreamFailure failure(ErrorCode::IOError);
    EXPECT_EQ(explain(failure), "reading or writing failed");
    failure << provider::ReasonInfo(u"damaged");
    EXPECT_EQ(explain(failure), "damaged");
}

TEST(Explain, TellsThatAChangeTookPlaceThoughItMayNotLast)
{
    EXPECT_EQ(explain(local::DurabilityException(ErrorCode::IOError, location)),
              "the new content is in place, but it is not certain to survive a power failure");
}

} // namespace
} // namespace foundation::storage::tool
