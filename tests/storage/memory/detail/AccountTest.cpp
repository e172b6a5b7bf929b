#include <storage/memory/detail/Account.hpp>

#include <gtest/gtest.h>

namespace foundation::storage::memory::detail {
namespace {

TEST(MemoryAccount, ChargesUpToItsLimit)
{
    Account account;
    account.setLimit(10);
    EXPECT_TRUE(account.charge(4));
    EXPECT_TRUE(account.charge(6));
    EXPECT_FALSE(account.charge(1));
    EXPECT_EQ(account.used(), 10u);
}

TEST(MemoryAccount, ChargesAgainWhatIsReleased)
{
    Account account;
    account.setLimit(10);
    EXPECT_TRUE(account.charge(10));
    account.release(3);
    EXPECT_FALSE(account.charge(4));
    EXPECT_TRUE(account.charge(3));
}

TEST(MemoryAccount, TakesNothingWhenItRefuses)
{
    Account account;
    account.setLimit(10);
    EXPECT_TRUE(account.charge(5));
    EXPECT_FALSE(account.charge(Account::unlimited));
    EXPECT_EQ(account.used(), 5u);
}

TEST(MemoryAccount, ChargesNothingWhateverTheLimit)
{
    Account account;
    EXPECT_TRUE(account.charge(5));
    account.setLimit(0);
    EXPECT_TRUE(account.charge(0));
    EXPECT_FALSE(account.charge(1));
}

TEST(MemoryAccount, HasNoLimitAtFirst)
{
    Account account;
    EXPECT_TRUE(account.charge(Account::unlimited));
}

} // namespace
} // namespace foundation::storage::memory::detail
