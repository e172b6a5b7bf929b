#include <storage/provider/FileAttributes.hpp>

#include <tests/support/inThreads.hpp>

#include <gtest/gtest.h>

#include <cstdint>
#include <functional>
#include <limits>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>

namespace foundation::storage::provider {
namespace {

using boost::gregorian::date;
using boost::posix_time::hours;
using boost::posix_time::microseconds;
using boost::posix_time::ptime;

static_assert(std::is_constructible_v<FileAttributes, std::uint64_t, ptime const&, bool>);
static_assert(std::is_constructible_v<FileAttributes, std::uint64_t, ptime const&, std::function<bool()>>);
static_assert(std::is_same_v<decltype(&FileAttributes::getSize), std::uint64_t (FileAttributes::*)() const>);
static_assert(std::is_same_v<decltype(&FileAttributes::getLastModified), ptime (FileAttributes::*)() const>);
static_assert(std::is_same_v<decltype(&FileAttributes::isWritable), bool (FileAttributes::*)() const>);
static_assert(std::is_copy_constructible_v<FileAttributes> && std::is_copy_assignable_v<FileAttributes>);

// Neither a pointer nor a function of another kind becomes a flag.
template <class Value>
constexpr bool isFlag = std::is_constructible_v<FileAttributes, std::uint64_t, ptime const&, Value>;

static_assert(isFlag<bool> && isFlag<bool (*)()> && isFlag<int (*)()> && isFlag<std::function<bool()> const&>);
static_assert(!isFlag<void (*)()> && !isFlag<bool (*)(int)> && !isFlag<char const*> && !isFlag<int*>);
static_assert(!isFlag<decltype([] {})> && !isFlag<std::function<void()>> && !isFlag<std::string>);

FileAttributes withFlag(std::function<bool()> writable)
{
    return FileAttributes(0, ptime(), std::move(writable));
}

bool never()
{
    return false;
}

TEST(FileAttributes, SizeAndTimeAreThoseGiven)
{
    ptime const time(date(2024, 2, 29), hours(12) + microseconds(789012));
    FileAttributes const attributes(std::numeric_limits<std::uint64_t>::max(), time, true);
    EXPECT_EQ(attributes.getSize(), std::numeric_limits<std::uint64_t>::max());
    EXPECT_EQ(attributes.getLastModified(), time);
}

TEST(FileAttributes, WritableIsTheFlagGiven)
{
    EXPECT_TRUE(FileAttributes(0, ptime(), true).isWritable());
    EXPECT_FALSE(FileAttributes(0, ptime(), false).isWritable());
}

TEST(FileAttributes, WritableIsWhatTheFunctionAnswers)
{
    EXPECT_TRUE(withFlag([] { return true; }).isWritable());
    EXPECT_FALSE(withFlag([] { return false; }).isWritable());
}

TEST(FileAttributes, WhateverCanBeCalledSelectsTheFunctionForm)
{
    struct Callable
    {
        bool operator()() const { return false; }
        operator bool() const { return true; } // NOLINT(google-explicit-constructor)
    };
    std::function<int()> const answersANumber = [] { return 0; };
    EXPECT_FALSE(FileAttributes(0, ptime(), [] { return false; }).isWritable());
    EXPECT_FALSE(FileAttributes(0, ptime(), [calls = 0]() mutable { return ++calls > 1; }).isWritable());
    EXPECT_FALSE(FileAttributes(0, ptime(), &never).isWritable());
    EXPECT_FALSE(FileAttributes(0, ptime(), never).isWritable());
    EXPECT_FALSE(FileAttributes(0, ptime(), Callable()).isWritable());
    EXPECT_FALSE(FileAttributes(0, ptime(), answersANumber).isWritable());
}

TEST(FileAttributes, FunctionIsNotCalledUnlessAsked)
{
    int calls = 0;
    FileAttributes const attributes = withFlag([&calls] { return ++calls > 0; });
    FileAttributes const copy = attributes;
    EXPECT_EQ(copy.getSize(), 0u);
    EXPECT_EQ(calls, 0);
}

TEST(FileAttributes, FunctionIsCalledOnce)
{
    int calls = 0;
    FileAttributes const attributes = withFlag([&calls] { return ++calls > 0; });
    for (int i = 0; i < 100; ++i)
        EXPECT_TRUE(attributes.isWritable());
    EXPECT_EQ(calls, 1);
}

TEST(FileAttributes, EmptyFunctionThrowsEachTime)
{
    FileAttributes const attributes = withFlag({});
    EXPECT_THROW(attributes.isWritable(), std::bad_function_call);
    EXPECT_THROW(attributes.isWritable(), std::bad_function_call);
    bool (*const nowhere)() = nullptr;
    EXPECT_THROW(FileAttributes(0, ptime(), nowhere).isWritable(), std::bad_function_call);
}

TEST(FileAttributes, FunctionThatThrowsIsCalledAgain)
{
    int calls = 0;
    FileAttributes const attributes = withFlag([&calls] {
        if (++calls == 1)
            throw std::runtime_error("not now");
        return true;
    });
    EXPECT_THROW(attributes.isWritable(), std::runtime_error);
    EXPECT_TRUE(attributes.isWritable());
    EXPECT_TRUE(attributes.isWritable());
    EXPECT_EQ(calls, 2);
}

TEST(FileAttributes, CopyMadeBeforeTheFirstCallAsksForItself)
{
    int calls = 0;
    FileAttributes const original = withFlag([&calls] { return ++calls > 0; });
    FileAttributes const copy = original;
    EXPECT_TRUE(original.isWritable());
    EXPECT_TRUE(copy.isWritable());
    EXPECT_EQ(calls, 2);
}

TEST(FileAttributes, CopyMadeAfterTheFirstCallCarriesTheAnswer)
{
    int calls = 0;
    FileAttributes const original = withFlag([&calls] { return ++calls > 0; });
    EXPECT_TRUE(original.isWritable());
    FileAttributes const copy = original;
    EXPECT_TRUE(copy.isWritable());
    EXPECT_EQ(calls, 1);
}

TEST(FileAttributesConcurrency, FunctionIsCalledOnceHoweverManyThreadsAsk)
{
    int calls = 0; // not atomic: the attributes make the one call exclusive
    FileAttributes const attributes = withFlag([&calls] { return ++calls > 0; });
    tests::support::inThreads(32, [&attributes](int) { EXPECT_TRUE(attributes.isWritable()); });
    EXPECT_EQ(calls, 1);
}

} // namespace
} // namespace foundation::storage::provider
