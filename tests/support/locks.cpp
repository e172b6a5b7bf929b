#include <tests/support/locks.hpp>

#include <dlfcn.h>
#include <pthread.h>
#include <utility>

namespace {

thread_local std::size_t calls = 0;
thread_local int nextError = 0;

} // namespace

namespace foundation::tests::support {

std::size_t locks()
{
    return calls;
}

FailingLock::FailingLock(int error)
{
    nextError = error;
}

FailingLock::~FailingLock()
{
    nextError = 0;
}

} // namespace foundation::tests::support

// Takes the place of the function of the C library, in the libraries of this process too.
extern "C" __attribute__((visibility("default"))) int pthread_mutex_lock(pthread_mutex_t* mutex) noexcept
{
    static auto const next = reinterpret_cast<int (*)(pthread_mutex_t*)>(dlsym(RTLD_NEXT, "pthread_mutex_lock"));
    ++calls;
    int const error = std::exchange(nextError, 0);
    return error != 0 ? error : next(mutex);
}
