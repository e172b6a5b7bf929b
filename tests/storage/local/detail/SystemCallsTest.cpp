#include <storage/local/detail/SystemCalls.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>

namespace foundation::storage::local::detail {
namespace {

using tests::support::failWith;
using tests::support::ReplacedSystemCalls;

TEST(SystemCalls, AreTheRealOnesUntilReplacedAndAgainAfterwards)
{
    EXPECT_EQ(&systemCalls(), &realSystemCalls);
    {
        ReplacedSystemCalls replaced;
        EXPECT_NE(&systemCalls(), &realSystemCalls);
    }
    EXPECT_EQ(&systemCalls(), &realSystemCalls);
}

TEST(Retried, CallsAgainForAsLongAsASignalInterrupts)
{
    int calls = 0;
    EXPECT_EQ(retried([&] { return ++calls < 3 ? failWith(EINTR) : 7; }), 7);
    EXPECT_EQ(calls, 3);
}

TEST(Retried, PassesOtherFailuresOn)
{
    int calls = 0;
    EXPECT_EQ(retried([&] {
                  ++calls;
                  return failWith(EIO);
              }),
              -1);
    EXPECT_EQ(calls, 1);
    EXPECT_EQ(errno, EIO);
}

} // namespace
} // namespace foundation::storage::local::detail
