#include <storage/provider/FolderAttributes.hpp>

#include <tests/support/inThreads.hpp>

#include <gtest/gtest.h>

#include <functional>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>

namespace foundation::storage::provider {
namespace {

using boost::gregorian::date;
using boost::posix_time::microseconds;
using boost::posix_time::ptime;

static_assert(std::is_constructible_v<FolderAttributes, ptime const&, bool>);
static_assert(std::is_constructible_v<FolderAttributes, ptime const&, std::function<bool()>>);
static_assert(!std::is_convertible_v<ptime, FolderAttributes>);
static_assert(std::is_same_v<decltype(&FolderAttributes::getLastModified), ptime (FolderAttributes::*)() const>);
static_assert(std::is_same_v<decltype(&FolderAttributes::isWritable), bool (FolderAttributes::*)() const>);
static_assert(std::is_copy_constructible_v<FolderAttributes> && std::is_copy_assignable_v<FolderAttributes>);

// Neither a pointer nor a function of another kind becomes a flag.
template <class Value>
constexpr bool isFlag = std::is_constructible_v<FolderAttributes, ptime const&, Value>;

static_assert(isFlag<bool> && isFlag<bool (*)()> && isFlag<int (*)()> && isFlag<std::function<bool()> const&>);
static_assert(!isFlag<void (*)()> && !isFlag<bool (*)(int)> && !isFlag<char const*> && !isFlag<int*>);
static_assert(!isFlag<decltype([] {})> && !isFlag<std::function<void()>> && !isFlag<std::string>);

FolderAttributes withFlag(std::function<bool()> writable)
{
    return FolderAttributes(ptime(), std::move(writable));
}

bool never()
{
    return false;
}

TEST(FolderAttributes, TimeIsThatGiven)
{
    ptime const time(date(1601, 1, 1), microseconds(1));
    EXPECT_EQ(FolderAttributes(time, true).getLastModified(), time);
}

TEST(FolderAttributes, WritableIsTheFlagGiven)
{
    EXPECT_TRUE(FolderAttributes(ptime(), true).isWritable());
    EXPECT_FALSE(FolderAttributes(ptime(), false).isWritable());
}

TEST(FolderAttributes, WhateverCanBeCalledSelectsTheFunctionForm)
{
    EXPECT_FALSE(withFlag([] { return false; }).isWritable());
    EXPECT_FALSE(FolderAttributes(ptime(), [] { return false; }).isWritable());
    EXPECT_FALSE(FolderAttributes(ptime(), &never).isWritable());
    EXPECT_FALSE(FolderAttributes(ptime(), never).isWritable());
}

TEST(FolderAttributes, FunctionIsCalledOnceAndNotBeforeAsked)
{
    int calls = 0;
    FolderAttributes const attributes = withFlag([&calls] { return ++calls > 0; });
    EXPECT_EQ(calls, 0);
    EXPECT_TRUE(attributes.isWritable());
    EXPECT_TRUE(attributes.isWritable());
    EXPECT_EQ(calls, 1);
}

TEST(FolderAttributes, EmptyFunctionThrows)
{
    EXPECT_THROW(withFlag({}).isWritable(), std::bad_function_call);
}

TEST(FolderAttributes, FunctionThatThrowsIsCalledAgain)
{
    bool failing = true;
    FolderAttributes const attributes = withFlag([&failing] {
        if (std::exchange(failing, false))
            throw std::runtime_error("not now");
        return true;
    });
    EXPECT_THROW(attributes.isWritable(), std::runtime_error);
    EXPECT_TRUE(attributes.isWritable());
}

TEST(FolderAttributes, CopiesCarryTheAnswerOnceItIsKnown)
{
    int calls = 0;
    FolderAttributes const original = withFlag([&calls] { return ++calls > 0; });
    FolderAttributes const early = original;
    EXPECT_TRUE(original.isWritable());
    FolderAttributes const late = original;
    EXPECT_TRUE(late.isWritable());
    EXPECT_EQ(calls, 1);
    EXPECT_TRUE(early.isWritable());
    EXPECT_EQ(calls, 2);
}

TEST(FolderAttributesConcurrency, FunctionIsCalledOnceHoweverManyThreadsAsk)
{
    int calls = 0; // not atomic: the attributes make the one call exclusive
    FolderAttributes const attributes = withFlag([&calls] { return ++calls > 0; });
    tests::support::inThreads(32, [&attributes](int) { EXPECT_TRUE(attributes.isWritable()); });
    EXPECT_EQ(calls, 1);
}

} // namespace
} // namespace foundation::storage::provider
