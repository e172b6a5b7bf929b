#include <storage/provider/detail/Lazy.hpp>

#include <tests/support/inThreads.hpp>

#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <memory>
#include <stdexcept>
#include <type_traits>
#include <utility>

namespace foundation::storage::provider::detail {
namespace {

using tests::support::inThreads;
using Value = boost::variant<bool, std::function<bool()>>;

static_assert(std::is_constructible_v<Lazy<bool>, Value>);
static_assert(!std::is_convertible_v<Value, Lazy<bool>>);
static_assert(std::is_copy_constructible_v<Lazy<bool>>);
static_assert(std::is_same_v<decltype(&Lazy<bool>::operator()), bool (Lazy<bool>::*)()>);

Lazy<bool> lazy(std::function<bool()> compute)
{
    return Lazy<bool>(Value(std::move(compute)));
}

TEST(Lazy, AnswersTheValueGiven)
{
    EXPECT_TRUE(Lazy<bool>(Value(true))());
    EXPECT_FALSE(Lazy<bool>(Value(false))());
}

TEST(Lazy, AnswersWhatTheFunctionAnswers)
{
    EXPECT_TRUE(lazy([] { return true; })());
    EXPECT_FALSE(lazy([] { return false; })());
}

TEST(Lazy, CallsTheFunctionOnceAndNotBeforeAsked)
{
    int calls = 0;
    Lazy<bool> flag = lazy([&calls] { return ++calls > 0; });
    EXPECT_EQ(calls, 0);
    EXPECT_TRUE(flag());
    EXPECT_TRUE(flag());
    EXPECT_EQ(calls, 1);
}

TEST(Lazy, ReleasesTheFunctionOnceTheAnswerIsKnown)
{
    auto const held = std::make_shared<int>(0);
    Lazy<bool> flag = lazy([held] { return true; });
    EXPECT_EQ(held.use_count(), 2);
    EXPECT_TRUE(flag());
    EXPECT_EQ(held.use_count(), 1);
}

TEST(Lazy, EmptyFunctionThrowsEachTime)
{
    Lazy<bool> flag = lazy({});
    EXPECT_THROW(flag(), std::bad_function_call);
    EXPECT_THROW(flag(), std::bad_function_call);
}

TEST(Lazy, FunctionThatThrowsIsCalledAgain)
{
    int calls = 0;
    Lazy<bool> flag = lazy([&calls] {
        if (++calls < 3)
            throw std::runtime_error("not now");
        return true;
    });
    EXPECT_THROW(flag(), std::runtime_error);
    EXPECT_THROW(flag(), std::runtime_error);
    EXPECT_TRUE(flag());
    EXPECT_TRUE(flag());
    EXPECT_EQ(calls, 3);
}

TEST(Lazy, CopyMadeBeforeTheAnswerComputesForItself)
{
    int calls = 0;
    Lazy<bool> original = lazy([&calls] { return ++calls == 1; });
    Lazy<bool> copy(original);
    EXPECT_TRUE(original());
    EXPECT_FALSE(copy());
    EXPECT_TRUE(original());
    EXPECT_EQ(calls, 2);
}

TEST(Lazy, CopyMadeAfterTheAnswerCarriesIt)
{
    int calls = 0;
    Lazy<bool> original = lazy([&calls] { return ++calls > 0; });
    EXPECT_TRUE(original());
    Lazy<bool> copy(original);
    EXPECT_TRUE(copy());
    EXPECT_EQ(calls, 1);
}

TEST(Lazy, CopyAnswersOutOfItselfAndNotOutOfTheOriginal)
{
    auto original = std::make_unique<Lazy<bool>>(Value(true));
    Lazy<bool> copy(*original);
    original.reset();
    EXPECT_TRUE(copy());
}

TEST(Lazy, CopyMadeAfterAFailureComputesForItself)
{
    bool failing = true;
    Lazy<bool> original = lazy([&failing] {
        if (failing)
            throw std::runtime_error("not now");
        return true;
    });
    EXPECT_THROW(original(), std::runtime_error);
    Lazy<bool> copy(original);
    failing = false;
    EXPECT_TRUE(copy());
}

TEST(Lazy, MovedOneTakesTheFunctionAlong)
{
    auto const counter = std::make_shared<int>(0);
    Lazy<bool> original = lazy([counter] { return ++*counter == 1; });
    long const owners = counter.use_count();
    Lazy<bool> moved(std::move(original));
    EXPECT_EQ(counter.use_count(), owners);
    EXPECT_TRUE(moved());
    EXPECT_TRUE(moved());
    EXPECT_EQ(*counter, 1);
}

TEST(Lazy, MovedOneAnswersOutOfItself)
{
    auto original = std::make_unique<Lazy<bool>>(Value(true));
    Lazy<bool> moved(std::move(*original));
    original.reset();
    EXPECT_TRUE(moved());
}

TEST(LazyConcurrency, FunctionIsCalledOnceHoweverManyThreadsAsk)
{
    for (int round = 0; round < 20; ++round) {
        int calls = 0; // not atomic: the one call is exclusive
        Lazy<bool> flag = lazy([&calls] { return ++calls > 0; });
        inThreads(32, [&flag](int) { EXPECT_TRUE(flag()); });
        EXPECT_EQ(calls, 1);
    }
}

TEST(LazyConcurrency, FunctionThatThrowsIsCalledAgainByOneThreadAtATime)
{
    int calls = 0;
    std::atomic<int> failures = 0;
    Lazy<bool> flag = lazy([&calls] {
        if (++calls <= 5)
            throw std::runtime_error("not now");
        return true;
    });
    inThreads(32, [&](int) {
        try {
            EXPECT_TRUE(flag());
        } catch (std::runtime_error const&) {
            ++failures;
        }
    });
    EXPECT_EQ(failures, 5);
    EXPECT_EQ(calls, 6);
}

TEST(LazyConcurrency, CopiesCanBeMadeWhileOtherThreadsEvaluate)
{
    for (int round = 0; round < 20; ++round) {
        std::atomic<int> calls = 0;
        Lazy<bool> flag = lazy([&calls] { return ++calls > 0; });
        inThreads(32, [&](int thread) {
            if (thread % 2 == 0) {
                EXPECT_TRUE(flag());
            } else {
                Lazy<bool> copy(flag);
                EXPECT_TRUE(copy());
            }
        });
        EXPECT_GE(calls, 1);
        EXPECT_LE(calls, 17); // the original once, and each of the 16 copies at most once
    }
}

} // namespace
} // namespace foundation::storage::provider::detail
