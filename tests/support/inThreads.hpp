#pragma once

#include <atomic>
#include <thread>
#include <vector>

namespace foundation::tests::support {

/// Runs `action(0)` … `action(count - 1)` at once, each in a thread of its own that starts when all are ready, and
/// waits for them.
template <class Action>
void inThreads(int count, Action action)
{
    std::atomic<int> waiting{count};
    std::vector<std::jthread> threads;
    for (int i = 0; i != count; ++i)
        threads.emplace_back([&waiting, &action, i] {
            if (--waiting == 0)
                waiting.notify_all();
            for (int left = waiting; left != 0; left = waiting)
                waiting.wait(left);
            action(i);
        });
}

} // namespace foundation::tests::support
