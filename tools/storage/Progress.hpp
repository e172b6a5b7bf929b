#pragma once

#include <atomic>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <thread>

namespace foundation::storage::tool {

/// How much there is of something, in files and bytes.
struct Amount
{
    std::uint64_t files = 0;
    std::uint64_t bytes = 0;
};

/// What a line of progress tells.
struct ProgressState
{
    Amount done;
    Amount found;              ///< with `done`; looking further may find more
    bool isAllFound = false;   ///< `found` is all there is to do
    double bytesPerSecond = 0; ///< of late
    double secondsLeft = -1;   ///< negative while nobody can tell
};

/// "120 of 400 files, 1.2 GiB of 4.0 GiB, 35 MiB/s, 1:23 left", without what is not known, and without its last parts
/// where `width` is too small.
std::string progressLine(ProgressState const& state, std::size_t width);

/// Where lines of progress go.
enum class ProgressStyle
{
    Hidden,
    Redrawn, ///< one line of a terminal, erased before anything else is written and at the end
    Lines,   ///< a line of its own each second
};

/// Tells on standard error how far a long piece of work is.
///
/// Threads: any number may add at once. Only the one that made the object writes, whenever it adds something or calls
/// `update`.
class Progress
{
public:
    /// Redrawn where standard error is a terminal, else hidden. Nothing is told of work that takes no longer than
    /// `delay`.
    explicit Progress(std::chrono::milliseconds delay = std::chrono::seconds(1));
    ~Progress();
    Progress(Progress const&) = delete;
    Progress& operator=(Progress const&) = delete;

    /// Writes lines where standard error is no terminal.
    void showLines();

    bool isShown() const { return style_ != ProgressStyle::Hidden; }

    /// Whether the time has come to find out how much there is to do: a moment before the first line.
    bool isSoon() const;

    void addBytes(long count);
    void addFile();

    /// Counts a file of this size as done that needed no work.
    void skipFile(std::uint64_t size);

    /// Tells what was found to do, of which all that is done is a part.
    void setFound(Amount const& found, bool isAll);

    /// The number of all files there are to do, when it is known.
    std::optional<std::uint64_t> allFiles() const;

    /// Writes a line when one is due.
    void update();

    /// Makes room for other output on the terminal.
    void erase();

private:
    using Clock = std::chrono::steady_clock;

    void updateIfMine();
    ProgressState state(Clock::time_point now) const;
    void noteRate(Clock::time_point now);
    double secondsLeft(ProgressState const& state, Clock::time_point now) const;

    std::thread::id const owner_ = std::this_thread::get_id();
    Clock::time_point const start_ = Clock::now();
    Clock::time_point const begin_;
    ProgressStyle style_;
    bool isDrawn_ = false;
    Clock::time_point nextDraw_ = begin_;
    Clock::time_point lastNote_ = start_;
    std::uint64_t lastBytes_ = 0;
    double bytesPerSecond_ = 0;

    std::atomic<std::uint64_t> files_ = 0;
    std::atomic<std::uint64_t> bytes_ = 0;
    std::atomic<std::uint64_t> skippedFiles_ = 0;
    std::atomic<std::uint64_t> skippedBytes_ = 0;
    std::atomic<std::uint64_t> foundFiles_ = 0;
    std::atomic<std::uint64_t> foundBytes_ = 0;
    std::atomic<bool> isAllFound_ = false;
};

} // namespace foundation::storage::tool
