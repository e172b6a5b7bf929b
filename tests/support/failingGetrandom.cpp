#include <tests/support/failingGetrandom.hpp>

#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <utility>

namespace foundation::tests::support {

namespace {

thread_local std::deque<int> errorsToCome;

} // namespace

FailingGetrandom::FailingGetrandom(std::deque<int> errors)
{
    errorsToCome = std::move(errors);
}

FailingGetrandom::~FailingGetrandom()
{
    errorsToCome.clear();
}

bool FailingGetrandom::hasFailed() const
{
    return errorsToCome.empty();
}

// Takes the place of the function of the C library, in the libraries of this process too.
extern "C" __attribute__((visibility("default"))) ssize_t getrandom(void* buffer, std::size_t size, unsigned flags)
{
    if (errorsToCome.empty())
        return syscall(SYS_getrandom, buffer, size, flags);
    errno = errorsToCome.front();
    errorsToCome.pop_front();
    return -1;
}

} // namespace foundation::tests::support
