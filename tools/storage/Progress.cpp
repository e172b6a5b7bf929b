#include <tools/storage/Progress.hpp>

#include <tools/storage/format.hpp>

#include <algorithm>
#include <cmath>
#include <fmt/format.h>
#include <string_view>
#include <sys/ioctl.h>
#include <unistd.h>
#include <vector>

namespace foundation::storage::tool {

namespace {

using Seconds = std::chrono::duration<double>;

constexpr std::chrono::milliseconds delayOfDrawing{200};
constexpr std::chrono::seconds delayOfLine{1};

/// How long a change of the rate takes to be seen.
constexpr Seconds memoryOfRate{3};

/// A file takes about as long as so many bytes, besides those that it holds.
constexpr double bytesWorthOfAFile = 32 << 10;

/// Progress is decoration: what cannot be written is left out.
void show(std::string_view text)
{
    [[maybe_unused]] ssize_t const written = ::write(STDERR_FILENO, text.data(), text.size());
}

std::size_t terminalWidth()
{
    constexpr std::size_t usual = 80;
    winsize size{};
    return ::ioctl(STDERR_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : usual;
}

double workOf(Amount const& amount)
{
    return static_cast<double>(amount.bytes) + bytesWorthOfAFile * static_cast<double>(amount.files);
}

/// "1:02:03", "2:03", "0:03".
std::string formatDuration(double duration)
{
    auto const seconds = static_cast<std::uint64_t>(std::ceil(duration));
    constexpr std::uint64_t minute = 60;
    constexpr std::uint64_t hour = 60 * minute;
    if (seconds < hour)
        return fmt::format("{}:{:02}", seconds / minute, seconds % minute);
    return fmt::format("{}:{:02}:{:02}", seconds / hour, seconds % hour / minute, seconds % minute);
}

std::string filesPart(ProgressState const& state)
{
    std::uint64_t const found = std::max(state.found.files, state.done.files);
    char const* const noun = found == 1 ? "file" : "files";
    if (state.isAllFound)
        return fmt::format("{} of {} {}", state.done.files, found, noun);
    if (found > state.done.files)
        return fmt::format("{} of {}+ files", state.done.files, found);
    return fmt::format("{} {}", found, noun);
}

std::string bytesPart(ProgressState const& state)
{
    std::string const done = formatSize(state.done.bytes);
    if (!state.isAllFound)
        return done;
    return fmt::format("{} of {}", done, formatSize(std::max(state.found.bytes, state.done.bytes)));
}

std::vector<std::string> partsOf(ProgressState const& state)
{
    std::vector<std::string> parts;
    if (state.done.files + state.found.files > 0)
        parts.push_back(filesPart(state));
    if (state.done.bytes + state.found.bytes > 0) {
        parts.push_back(bytesPart(state));
        parts.push_back(formatSize(static_cast<std::uint64_t>(state.bytesPerSecond)) + "/s");
    }
    if (state.secondsLeft >= 0)
        parts.push_back(formatDuration(state.secondsLeft) + " left");
    return parts;
}

} // namespace

std::string progressLine(ProgressState const& state, std::size_t width)
{
    std::string line;
    for (std::string const& part : partsOf(state)) {
        std::string const separator = line.empty() ? "" : ", ";
        if (line.size() + separator.size() + part.size() > width)
            break;
        line += separator + part;
    }
    return line;
}

Progress::Progress(std::chrono::milliseconds delay)
    : begin_(start_ + delay), style_(::isatty(STDERR_FILENO) == 1 ? ProgressStyle::Redrawn : ProgressStyle::Hidden)
{}

Progress::~Progress()
{
    erase();
}

void Progress::showLines()
{
    if (style_ == ProgressStyle::Hidden)
        style_ = ProgressStyle::Lines;
}

bool Progress::isSoon() const
{
    return isShown() && Clock::now() >= start_ + (begin_ - start_) / 2;
}

void Progress::addBytes(long count)
{
    bytes_ += static_cast<std::uint64_t>(count);
    updateIfMine();
}

void Progress::addFile()
{
    ++files_;
    updateIfMine();
}

void Progress::skipFile(std::uint64_t size)
{
    ++skippedFiles_;
    skippedBytes_ += size;
    updateIfMine();
}

void Progress::setFound(Amount const& found, bool isAll)
{
    foundFiles_ = found.files;
    foundBytes_ = found.bytes;
    isAllFound_ = isAll;
}

std::optional<std::uint64_t> Progress::allFiles() const
{
    return isAllFound_ ? std::optional(foundFiles_.load()) : std::nullopt;
}

void Progress::updateIfMine()
{
    if (isShown() && std::this_thread::get_id() == owner_)
        update();
}

void Progress::erase()
{
    if (isDrawn_)
        show("\r\033[K");
    isDrawn_ = false;
}

void Progress::update()
{
    auto const now = Clock::now();
    if (!isShown() || now < nextDraw_)
        return;
    noteRate(now);
    ProgressState const current = state(now);
    if (style_ == ProgressStyle::Lines) {
        nextDraw_ = now + delayOfLine;
        show(progressLine(current, std::string::npos) + '\n');
        return;
    }
    nextDraw_ = now + delayOfDrawing;
    // A terminal whose last column is written may go to the next line.
    show("\r\033[K" + progressLine(current, terminalWidth() - 1));
    isDrawn_ = true;
}

ProgressState Progress::state(Clock::time_point now) const
{
    ProgressState result;
    result.done = {files_ + skippedFiles_, bytes_ + skippedBytes_};
    result.found = {foundFiles_, foundBytes_};
    result.isAllFound = isAllFound_;
    result.bytesPerSecond = bytesPerSecond_;
    result.secondsLeft = secondsLeft(result, now);
    return result;
}

void Progress::noteRate(Clock::time_point now)
{
    std::uint64_t const bytes = bytes_;
    Seconds const passed = now - lastNote_;
    double const rate = static_cast<double>(bytes - lastBytes_) / passed.count();
    double const weight = lastBytes_ == 0 ? 1 : 1 - std::exp(-passed / memoryOfRate);
    bytesPerSecond_ += weight * (rate - bytesPerSecond_);
    lastNote_ = now;
    lastBytes_ = bytes;
}

double Progress::secondsLeft(ProgressState const& state, Clock::time_point now) const
{
    double const worked = workOf({files_, bytes_});
    double const left = workOf(state.found) - workOf(state.done);
    if (!state.isAllFound || worked <= 0)
        return -1;
    return Seconds(now - start_).count() * std::max(left, 0.0) / worked;
}

} // namespace foundation::storage::tool
