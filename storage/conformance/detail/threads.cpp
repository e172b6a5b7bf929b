#include <storage/conformance/detail/threads.hpp>

#include <storage/conformance/detail/describe.hpp>

#include <gtest/gtest.h>

#include <exception>
#include <latch>
#include <stdexcept>
#include <thread>
#include <vector>

namespace foundation::storage::conformance::detail {

void onThreads(std::function<void(int thread)> const& action)
{
    std::latch start(threadCount);
    std::vector<std::exception_ptr> thrown(threadCount);
    {
        std::vector<std::jthread> threads;
        for (int thread = 0; thread < threadCount; ++thread)
            threads.emplace_back([&, thread] {
                start.arrive_and_wait();
                try {
                    action(thread);
                } catch (...) {
                    thrown[static_cast<std::size_t>(thread)] = std::current_exception();
                }
            });
    }
    for (std::exception_ptr const& exception : thrown) {
        if (exception)
            ADD_FAILURE() << "A thread ended by " << describe(exception);
    }
}

void requireThat(bool condition, std::string const& what)
{
    if (!condition)
        throw std::runtime_error("it does not hold that " + what);
}

} // namespace foundation::storage::conformance::detail
