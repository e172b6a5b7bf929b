#include <storage/provider/CopyFileOptions.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <type_traits>

namespace foundation::storage::provider {
namespace {

static_assert(std::is_aggregate_v<CopyFileOptions>);
static_assert(std::is_same_v<decltype(CopyFileOptions::replacementPolicy), ReplacementPolicy>);
static_assert(std::is_same_v<decltype(CopyFileOptions::transactionPolicy), TransactionPolicy>);
static_assert(std::is_same_v<decltype(CopyFileOptions::interruptFunction), std::function<InterruptSignal()>>);

TEST(CopyFileOptions, AllFieldsAreZeroOrEmptyUnlessGiven)
{
    CopyFileOptions const options;
    EXPECT_EQ(options.replacementPolicy, ReplacementPolicy::Preserve);
    EXPECT_EQ(options.transactionPolicy, TransactionPolicy::NonAtomic);
    EXPECT_FALSE(options.interruptFunction);
}

TEST(CopyFileOptions, FieldsAreGivenInOrder)
{
    CopyFileOptions const options{ReplacementPolicy::Clobber, TransactionPolicy::Atomic,
                                  [] { return InterruptSignal::Abort; }};
    EXPECT_EQ(options.replacementPolicy, ReplacementPolicy::Clobber);
    EXPECT_EQ(options.transactionPolicy, TransactionPolicy::Atomic);
    EXPECT_EQ(options.interruptFunction(), InterruptSignal::Abort);
}

} // namespace
} // namespace foundation::storage::provider
