#include <storage/local/detail/FileDescriptor.hpp>

#include <gtest/gtest.h>

#include <tests/storage/local/ReplacedSystemCalls.hpp>

#include <unistd.h>
#include <utility>

namespace foundation::storage::local::detail {
namespace {

using tests::support::failWith;
using tests::support::ReplacedSystemCalls;

int openSomething()
{
    return ::open("/", O_RDONLY | O_CLOEXEC);
}

bool isOpenInProcess(int descriptor)
{
    return ::fcntl(descriptor, F_GETFD) != -1;
}

TEST(FileDescriptor, ByDefaultOwnsNothing)
{
    FileDescriptor descriptor;
    EXPECT_FALSE(descriptor.isOpen());
    EXPECT_EQ(descriptor.close(), 0);
}

TEST(FileDescriptor, ClosesAtTheEndOfItsLife)
{
    int const number = openSomething();
    {
        FileDescriptor const descriptor(number);
        EXPECT_TRUE(isOpenInProcess(number));
    }
    EXPECT_FALSE(isOpenInProcess(number));
}

TEST(FileDescriptor, ClosesOnce)
{
    static int calls;
    calls = 0;
    FileDescriptor descriptor(openSomething());
    ReplacedSystemCalls replaced;
    replaced->close = [](int number) {
        ++calls;
        return ::close(number);
    };
    EXPECT_EQ(descriptor.close(), 0);
    EXPECT_EQ(descriptor.close(), 0);
    EXPECT_FALSE(descriptor.isOpen());
    EXPECT_EQ(calls, 1);
}

TEST(FileDescriptor, MovesItsOwnership)
{
    int const number = openSomething();
    FileDescriptor first(number);
    FileDescriptor second(std::move(first));
    EXPECT_EQ(second.get(), number);
    FileDescriptor third;
    third = std::move(second);
    EXPECT_EQ(third.get(), number);
    EXPECT_TRUE(isOpenInProcess(number));
    EXPECT_EQ(third.close(), 0);
    EXPECT_FALSE(isOpenInProcess(number));
}

TEST(FileDescriptor, ReportsAFailureToCloseAndIsClosedAllTheSame)
{
    FileDescriptor descriptor(openSomething());
    ReplacedSystemCalls replaced;
    replaced->close = [](int number) {
        ::close(number);
        return failWith(EIO);
    };
    EXPECT_EQ(descriptor.close(), EIO);
    EXPECT_FALSE(descriptor.isOpen());
}

TEST(FileDescriptor, TakesAnInterruptedCloseForDone)
{
    static int calls;
    calls = 0;
    FileDescriptor descriptor(openSomething());
    ReplacedSystemCalls replaced;
    replaced->close = [](int number) {
        ++calls;
        ::close(number);
        return failWith(EINTR);
    };
    EXPECT_EQ(descriptor.close(), 0);
    EXPECT_EQ(calls, 1);
}

} // namespace
} // namespace foundation::storage::local::detail
