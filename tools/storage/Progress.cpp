#include <tools/storage/Progress.hpp>

#include <tools/storage/format.hpp>

#include <fmt/format.h>
#include <string_view>
#include <unistd.h>

namespace foundation::storage::tool {

namespace {

constexpr std::chrono::seconds delayOfFirst{1};
constexpr std::chrono::milliseconds delayOfNext{200};

/// Progress is decoration: what cannot be written is left out.
void show(std::string_view text)
{
    [[maybe_unused]] ssize_t const written = ::write(STDERR_FILENO, text.data(), text.size());
}

} // namespace

Progress::Progress() : isShown_(::isatty(STDERR_FILENO) == 1), nextDraw_(start_ + delayOfFirst) {}

Progress::~Progress()
{
    erase();
}

void Progress::addBytes(long count)
{
    bytes_ += static_cast<std::uint64_t>(count);
    if (isShown_)
        draw();
}

void Progress::addFile()
{
    ++files_;
    if (isShown_)
        draw();
}

void Progress::erase()
{
    if (isDrawn_)
        show("\r\033[K");
    isDrawn_ = false;
}

void Progress::draw()
{
    auto const now = Clock::now();
    if (now < nextDraw_)
        return;
    nextDraw_ = now + delayOfNext;
    show("\r\033[K" + line(now));
    isDrawn_ = true;
}

std::string Progress::line(Clock::time_point now) const
{
    std::chrono::duration<double> const elapsed = now - start_;
    auto const rate = static_cast<std::uint64_t>(static_cast<double>(bytes_) / elapsed.count());
    return fmt::format("{}, {}/s, {} {} done", formatSize(bytes_), formatSize(rate), files_,
                       files_ == 1 ? "file" : "files");
}

} // namespace foundation::storage::tool
