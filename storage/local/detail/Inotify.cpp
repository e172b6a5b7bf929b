#include <storage/local/detail/Inotify.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <array>
#include <cstring>
#include <sys/inotify.h>

namespace foundation::storage::local::detail {

namespace {

constexpr std::size_t bufferSize = std::size_t{64} << 10U;

} // namespace

std::vector<RawEvent> parseEvents(std::string_view buffer)
{
    std::vector<RawEvent> events;
    while (buffer.size() >= sizeof(inotify_event)) {
        inotify_event event{};
        std::memcpy(&event, buffer.data(), sizeof event);
        buffer.remove_prefix(sizeof event);
        std::string_view const padded = buffer.substr(0, event.len);
        buffer.remove_prefix(padded.size());
        events.push_back({event.wd, event.mask, event.cookie, std::string(padded.substr(0, padded.find('\0')))});
    }
    return events;
}

int Inotify::open()
{
    int const queue = systemCalls().inotify_init1(IN_CLOEXEC | IN_NONBLOCK);
    int const error = queue == -1 ? errno : 0;
    queue_ = FileDescriptor(queue);
    return error;
}

/// By the descriptor, so that the folder is the very one that was opened, wherever its path leads by now.
int Inotify::add(FileDescriptor const& folder, std::uint32_t mask, int& watch)
{
    std::string const path = "/proc/self/fd/" + std::to_string(folder.get());
    watch = retried(
        [&] { return systemCalls().inotify_add_watch(queue_.get(), path.c_str(), mask | IN_ONLYDIR | IN_MASK_ADD); });
    return watch == -1 ? errno : 0;
}

void Inotify::remove(int watch)
{
    static_cast<void>(systemCalls().inotify_rm_watch(queue_.get(), watch));
}

int Inotify::wait(FileDescriptor const& wake, int milliseconds) const
{
    std::array<pollfd, 2> wanted{pollfd{queue_.get(), POLLIN, 0}, pollfd{wake.get(), POLLIN, 0}};
    return errorOf([&] { return systemCalls().poll(wanted.data(), wanted.size(), milliseconds); });
}

int Inotify::read(std::vector<RawEvent>& events)
{
    events.clear();
    std::array<char, bufferSize> buffer;
    ssize_t const size = retried([&] { return systemCalls().read(queue_.get(), buffer.data(), buffer.size()); });
    if (size == -1)
        return errno == EAGAIN ? 0 : errno;
    events = parseEvents({buffer.data(), static_cast<std::size_t>(size)});
    return 0;
}

} // namespace foundation::storage::local::detail
