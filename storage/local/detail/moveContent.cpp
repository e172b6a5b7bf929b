#include <storage/local/detail/moveContent.hpp>

#include <storage/local/detail/SystemCalls.hpp>
#include <storage/local/detail/copyFailure.hpp>
#include <storage/local/detail/errorCode.hpp>
#include <storage/local/detail/metadata.hpp>
#include <storage/local/detail/sync.hpp>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstring>
#include <fcntl.h>
#include <memory>
#include <span>
#include <unistd.h>
#include <utility>

namespace foundation::storage::local::detail {

namespace {

constexpr std::size_t bufferSize = std::size_t{1} << 20U;

bool isSameTime(statx_timestamp const& left, statx_timestamp const& right)
{
    return left.tv_sec == right.tv_sec && left.tv_nsec == right.tv_nsec;
}

CopyResult atSource(int error)
{
    return error == 0 ? CopyResult() : CopyResult{CopyOutcome::SourceFailed, error};
}

CopyResult atTarget(int error)
{
    return error == 0 ? CopyResult() : CopyResult{CopyOutcome::TargetFailed, error};
}

bool hasFailed(CopyResult const& result)
{
    return result.outcome != CopyOutcome::Completed;
}

/// Fills the buffer unless the file ends before. Answers 0 or `errno`.
int readFully(FileDescriptor const& file, std::span<char> buffer, std::size_t& size)
{
    size = 0;
    while (size < buffer.size()) {
        ssize_t const count =
            retried([&] { return systemCalls().read(file.get(), buffer.data() + size, buffer.size() - size); });
        if (count == -1)
            return errno;
        if (count == 0)
            return 0;
        size += static_cast<std::size_t>(count);
    }
    return 0;
}

int rewind(FileDescriptor const& file)
{
    return systemCalls().lseek(file.get(), 0, SEEK_SET) == -1 ? errno : 0;
}

/// A part of a file that is told of as it is done.
class Share
{
public:
    Share(MoveWatch const& watch, std::uint64_t size) : watch_(watch), rest_(size) {}

    void add(std::uint64_t count)
    {
        count = std::min(count, rest_);
        rest_ -= count;
        watch_.tellBytes(count);
    }

    void addRest() { add(rest_); }

private:
    MoveWatch const& watch_;
    std::uint64_t rest_;
};

CopyResult copyWatched(FileDescriptor const& file, Status const& source, FileDescriptor const& target,
                       MoveWatch const& watch)
{
    Share share(watch, source.stx_size / 2);
    bool hasBegun = false;
    CopyResult const result = copyContent(file, source, target, [&] {
        watch.check();
        if (std::exchange(hasBegun, true))
            share.add(bufferSize / 2);
        return provider::InterruptSignal::Continue;
    });
    if (!hasFailed(result))
        share.addRest();
    return result;
}

/// What the disk holds is to be compared, not what was kept in memory while it was written.
CopyResult readBack(FileDescriptor const& source, std::uint64_t size, FileDescriptor const& target,
                    MoveWatch const& watch)
{
    Share share(watch, size - size / 2);
    static_cast<void>(systemCalls().fadvise(target.get(), 0, 0, POSIX_FADV_DONTNEED));
    if (int const error = rewind(source))
        return atSource(error);
    if (int const error = rewind(target))
        return atTarget(error);
    std::size_t const half = std::clamp<std::uint64_t>(size + 1, 1, bufferSize);
    auto const buffers = std::make_unique_for_overwrite<char[]>(2 * half);
    std::span<char> const expected(buffers.get(), half);
    std::span<char> const found(buffers.get() + half, half);
    std::uint64_t total = 0;
    for (std::size_t expectedSize = half; expectedSize == half;) {
        watch.check();
        std::size_t foundSize = 0;
        if (int const error = readFully(source, expected, expectedSize))
            return atSource(error);
        if (int const error = readFully(target, found, foundSize))
            return atTarget(error);
        if (foundSize != expectedSize || std::memcmp(expected.data(), found.data(), foundSize) != 0)
            return atTarget(EIO);
        total += foundSize;
        share.add(foundSize / 2);
    }
    share.addRest();
    return total == size ? CopyResult() : atSource(EBUSY);
}

CopyResult copyAll(FileDescriptor const& file, Status const& source, FileDescriptor const& target,
                   MoveWatch const& watch)
{
    CopyResult result = copyWatched(file, source, target, watch);
    if (!hasFailed(result))
        result = atTarget(keepOwnerAndMode(target.get(), source));
    if (!hasFailed(result))
        result = keepUserAttributes(file.get(), target.get());
    if (!hasFailed(result))
        result = atTarget(sync(target, target));
    if (!hasFailed(result))
        result = readBack(file, source.stx_size, target, watch);
    // Reading may have touched the times.
    return hasFailed(result) ? result : atTarget(keepTimes(target.get(), source));
}

int readLink(At const& link, std::string& text)
{
    text.resize(PATH_MAX);
    ssize_t const size =
        retried([&] { return systemCalls().readlinkat(link.folder, link.path, text.data(), text.size()); });
    text.resize(size == -1 ? 0 : static_cast<std::size_t>(size));
    return size == -1 ? errno : 0;
}

CopyResult finishLink(At const& link, Status const& source, std::string const& text, At const& target)
{
    std::string copied;
    Status now;
    int error = keepOwnerOfLink(target, source);
    if (error == 0)
        error = readLink(target, copied);
    if (error == 0 && copied != text)
        error = EIO;
    if (error == 0)
        error = keepTimesOfLink(target, source);
    if (error != 0)
        return atTarget(error);
    error = getFullStatus(link, Links::Keep, now);
    return atSource(error == 0 && !isUnchanged(source, now) ? EBUSY : error);
}

} // namespace

void throwAtSource(int error, provider::StorageIRI const& source)
{
    if (error == EBUSY)
        throwError(error, source, u"changed while it was moved, and stays");
    if (error == EOPNOTSUPP)
        throwError(error, source, u"a special file, which cannot be moved to another file system");
    throwError(error, source);
}

void requireMoved(CopyResult const& result, provider::StorageIRI const& from, provider::StorageIRI const& to)
{
    if (result.outcome == CopyOutcome::SourceFailed)
        throwAtSource(result.error, from);
    requireCopied(result, from, to);
}

bool isUnchanged(Status const& before, Status const& now)
{
    return hasSameContent(before, now) && isSameTime(before.stx_ctime, now.stx_ctime);
}

bool hasSameContent(Status const& before, Status const& now)
{
    return isSameFile(before, now) && before.stx_mode == now.stx_mode && before.stx_size == now.stx_size &&
           isSameTime(before.stx_mtime, now.stx_mtime);
}

/// A difference is the fault of a source that changed meanwhile, if it did.
CopyResult moveContent(FileDescriptor const& file, Status const& source, FileDescriptor const& target,
                       MoveWatch const& watch)
{
    CopyResult const result = copyAll(file, source, target, watch);
    bool const isDifferent = result.outcome == CopyOutcome::TargetFailed && result.error == EIO;
    if (hasFailed(result) && !isDifferent)
        return result;
    Status now;
    int const error = getFullStatus(file, now);
    if (error != 0 || !isUnchanged(source, now))
        return atSource(error != 0 ? error : EBUSY);
    if (!hasFailed(result))
        watch.tellFile();
    return result;
}

CopyResult moveLink(At const& link, Status const& source, At const& target)
{
    std::string text;
    if (int const error = readLink(link, text))
        return atSource(error);
    int const error = errorOf([&] { return systemCalls().symlinkat(text.c_str(), target.folder, target.path); });
    if (error != 0)
        return atTarget(error);
    return finishLink(link, source, text, target);
}

} // namespace foundation::storage::local::detail
