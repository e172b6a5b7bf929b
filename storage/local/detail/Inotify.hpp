#pragma once

#include <foundation/export.hpp>
#include <storage/local/detail/FileDescriptor.hpp>

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace foundation::storage::local::detail {

/// What the kernel says in one event; see inotify(7).
struct RawEvent
{
    int watch;
    std::uint32_t mask;
    std::uint32_t cookie;
    std::string name;
};

/// The events in a buffer that the kernel filled.
FOUNDATION_API std::vector<RawEvent> parseEvents(std::string_view buffer);

/// A queue of changes in watched folders. Calls answer 0 or `errno`.
///
/// Threads: one that reads, any number that add and remove.
class FOUNDATION_API Inotify
{
public:
    [[nodiscard]] int open();
    void close() { static_cast<void>(queue_.close()); }

    /// Watches a folder, or adds to what is watched of one that is. Two descriptors get the same number if and only if
    /// they are of the same folder.
    [[nodiscard]] int add(FileDescriptor const& folder, std::uint32_t mask, int& watch);

    /// For a watch that the kernel has dropped by itself this does nothing.
    void remove(int watch);

    /// Waits until there are events, the counter `wake` is not zero, or the time is over; -1 waits for ever.
    [[nodiscard]] int wait(FileDescriptor const& wake, int milliseconds) const;

    /// What there is at once, which may be nothing.
    [[nodiscard]] int read(std::vector<RawEvent>& events);

private:
    FileDescriptor queue_;
};

} // namespace foundation::storage::local::detail
