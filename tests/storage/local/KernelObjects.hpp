#pragma once

#include <chrono>
#include <cstddef>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <ostream>
#include <string>
#include <thread>
#include <unistd.h>

namespace foundation::tests::support {

/// What this process holds in the kernel.
struct KernelObjects
{
    std::ptrdiff_t threads = 0;
    std::ptrdiff_t descriptors = 0;
    int watches = 0;

    bool operator==(KernelObjects const&) const = default;

    friend std::ostream& operator<<(std::ostream& stream, KernelObjects const& objects)
    {
        return stream << objects.threads << " threads, " << objects.descriptors << " descriptors, " << objects.watches
                      << " watches";
    }
};

inline std::ptrdiff_t countEntriesOf(std::filesystem::path const& folder)
{
    return std::distance(std::filesystem::directory_iterator(folder), {});
}

inline int countWatches()
{
    int watches = 0;
    for (auto const& descriptor : std::filesystem::directory_iterator("/proc/self/fdinfo")) {
        std::ifstream info(descriptor.path());
        for (std::string line; std::getline(info, line);)
            watches += line.starts_with("inotify ") ? 1 : 0;
    }
    return watches;
}

/// Has a thread come and go. With the first one a sanitizer starts a thread of its own, which is not to be counted as
/// one of ours.
inline bool startFirstThread()
{
    std::filesystem::path task;
    std::thread([&task] { task = "/proc/self/task/" + std::to_string(::gettid()); }).join();
    while (std::filesystem::exists(task))
        std::this_thread::yield();
    return true;
}

inline KernelObjects kernelObjects()
{
    [[maybe_unused]] static bool const hasThreads = startFirstThread();
    return {countEntriesOf("/proc/self/task"), countEntriesOf("/proc/self/fd"), countWatches()};
}

/// Waits until this process holds what it is to hold, for what ends on its own, and a thread that was joined may still
/// be listed for a moment. Answers what it holds in the end.
inline KernelObjects kernelObjectsSettledTo(KernelObjects const& expected)
{
    auto const deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    KernelObjects objects = kernelObjects();
    while (objects != expected && std::chrono::steady_clock::now() < deadline) {
        std::this_thread::yield();
        objects = kernelObjects();
    }
    return objects;
}

} // namespace foundation::tests::support
