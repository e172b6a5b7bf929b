#include <storage/provider/detail/LazyField.hpp>

#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <vector>

#include <tests/support/inThreads.hpp>

namespace foundation::storage::provider::detail {
namespace {

using tests::support::inThreads;
using Text = std::u16string;

TEST(LazyField, IsNeitherCopiedNorMoved)
{
    EXPECT_FALSE(std::is_copy_constructible_v<LazyField<Text>>);
    EXPECT_FALSE(std::is_move_constructible_v<LazyField<Text>>);
    EXPECT_FALSE(std::is_copy_assignable_v<LazyField<Text>>);
}

TEST(LazyField, HoldsAValueFromTheStart)
{
    LazyField<Text> const field(Text(u"value"));
    EXPECT_TRUE(field.isPresent());
    EXPECT_EQ(field.get(), u"value");
}

TEST(LazyField, ComputesOnFirstRequestAndKeepsTheValue)
{
    int computed = 0;
    LazyField<Text> const field(std::function<Text()>([&computed] {
        ++computed;
        return Text(u"value");
    }));
    EXPECT_FALSE(field.isPresent());
    EXPECT_EQ(computed, 0);
    Text const* const first = &field.get();
    EXPECT_TRUE(field.isPresent());
    EXPECT_EQ(*first, u"value");
    EXPECT_EQ(&field.get(), first);
    EXPECT_EQ(computed, 1);
}

TEST(LazyField, GivesAccessToTheValueItself)
{
    LazyField<Text> const field(Text(u"value"));
    field.get() = u"changed";
    EXPECT_EQ(field.get(), u"changed");
}

TEST(LazyField, ReleasesTheFunctionOnceTheValueIsPresent)
{
    auto const held = std::make_shared<int>(0);
    LazyField<Text> const field(std::function<Text()>([held] { return Text(); }));
    EXPECT_EQ(held.use_count(), 2);
    static_cast<void>(field.get());
    EXPECT_EQ(held.use_count(), 1);
}

TEST(LazyField, StaysPendingAfterAFailureAndTriesAgain)
{
    int attempts = 0;
    LazyField<int> const field(std::function<int()>([&attempts] {
        if (++attempts < 3)
            throw std::runtime_error("not yet");
        return attempts;
    }));
    EXPECT_THROW(field.get(), std::runtime_error);
    EXPECT_FALSE(field.isPresent());
    EXPECT_THROW(field.get(), std::runtime_error);
    EXPECT_EQ(field.get(), 3);
    EXPECT_EQ(field.get(), 3);
    EXPECT_EQ(attempts, 3);
}

TEST(LazyField, RefusesAnEmptyFunctionAndReleasesItsLock)
{
    LazyField<Text> const field{std::function<Text()>()};
    EXPECT_THROW(field.get(), std::bad_function_call);
    EXPECT_THROW(field.get(), std::bad_function_call);
    EXPECT_FALSE(field.isPresent());
}

TEST(LazyField, FunctionMayGetOtherFields)
{
    LazyField<int> const inner(std::function<int()>([] { return 20; }));
    LazyField<int> const outer(std::function<int()>([&inner] { return inner.get() + 1; }));
    EXPECT_EQ(outer.get(), 21);
    EXPECT_TRUE(inner.isPresent());
}

TEST(LazyFieldConcurrency, ThirtyTwoThreadsShareOneComputation)
{
    for (int round = 0; round != 20; ++round) {
        std::atomic<int> computed{0};
        LazyField<Text> const field(std::function<Text()>([&computed] {
            ++computed;
            return Text(100, u'x');
        }));
        std::vector<Text const*> seen(32);
        inThreads(32, [&](int i) {
            Text const& value = field.get();
            EXPECT_EQ(value.size(), 100u);
            seen[static_cast<std::size_t>(i)] = &value;
        });
        EXPECT_EQ(computed, 1);
        EXPECT_EQ(seen, std::vector<Text const*>(32, seen.front()));
    }
}

TEST(LazyFieldConcurrency, FailureReachesTheThreadThatComputedAndTheNextTriesAgain)
{
    for (int round = 0; round != 20; ++round) {
        std::atomic<int> attempts{0};
        std::atomic<int> failures{0};
        LazyField<int> const field(std::function<int()>([&attempts] {
            if (++attempts <= 5)
                throw std::runtime_error("not yet");
            return 7;
        }));
        inThreads(32, [&](int) {
            try {
                EXPECT_EQ(field.get(), 7);
            } catch (std::runtime_error const&) {
                ++failures;
            }
        });
        EXPECT_EQ(attempts, 6);
        EXPECT_EQ(failures, 5);
        EXPECT_EQ(field.get(), 7);
    }
}

} // namespace
} // namespace foundation::storage::provider::detail
