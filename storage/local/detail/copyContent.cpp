#include <storage/local/detail/copyContent.hpp>

#include <storage/local/detail/SystemCalls.hpp>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <memory>
#include <new>
#include <optional>
#include <span>
#include <unistd.h>

namespace foundation::storage::local::detail {

using provider::InterruptSignal;
using provider::IProvider;

namespace {

constexpr std::size_t pageSize = 4096;
constexpr off_t chunkSize = off_t{1} << 20;

/// Up to here one read and one write take less time than the kernel needs to set up a copy of its own.
constexpr off_t smallSize = 16384;

/// In which `st_blocks` counts, whatever the file system allocates.
constexpr off_t blockSize = 512;

/// Whole pages, as the kernel copies them fastest.
class AlignedBuffer
{
public:
    explicit AlignedBuffer(std::size_t size)
        : size_((size + pageSize - 1) / pageSize * pageSize),
          bytes_(static_cast<char*>(::operator new (size_, std::align_val_t{pageSize})))
    {}

    std::span<char> bytes() const { return {bytes_.get(), size_}; }

private:
    struct Delete
    {
        void operator()(char* bytes) const { ::operator delete (bytes, std::align_val_t{pageSize}); }
    };

    std::size_t size_;
    std::unique_ptr<char, Delete> bytes_;
};

/// Nothing while there is more to do.
using Ending = std::optional<CopyResult>;

CopyResult sourceFailed()
{
    return {CopyOutcome::SourceFailed, errno};
}

CopyResult targetFailed(int error)
{
    return {CopyOutcome::TargetFailed, error};
}

/// Answers 0 or `errno`.
int writeAll(FileDescriptor const& target, std::span<char const> bytes)
{
    while (!bytes.empty()) {
        ssize_t const written = retried([&] { return systemCalls().write(target.get(), bytes.data(), bytes.size()); });
        if (written <= 0)
            return written == 0 ? EIO : errno;
        bytes = bytes.subspan(static_cast<std::size_t>(written));
    }
    return 0;
}

class ContentCopy
{
public:
    ContentCopy(FileDescriptor const& source, off_t size, FileDescriptor const& target,
                IProvider::Interrupt const& interrupt)
        : source_(source), target_(target), interrupt_(interrupt), size_(size)
    {}

    CopyResult copySmall();
    CopyResult copyLarge(bool isSparse);
    CopyResult copySparse();

private:
    bool isStopped() const { return interrupt_ && interrupt_() != InterruptSignal::Continue; }

    bool share() const;
    bool hasHole() const;

    /// Both ends stand where the copy goes on. What is left of `rest` lies beyond the end of the source.
    Ending copyRange(off_t& rest);
    Ending copyStep(off_t count, off_t& copied);
    Ending readAndWrite(std::span<char> buffer, off_t count, off_t& copied);

    Ending copyExtent(off_t begin, off_t end);
    CopyResult endAt(off_t end) const;

    std::span<char> buffer();

    FileDescriptor const& source_;
    FileDescriptor const& target_;
    IProvider::Interrupt const& interrupt_;
    off_t size_;
    bool kernelCopies_ = true;
    std::optional<AlignedBuffer> buffer_;
};

std::span<char> ContentCopy::buffer()
{
    if (!buffer_)
        buffer_.emplace(static_cast<std::size_t>(std::min(size_, chunkSize)));
    return buffer_->bytes();
}

/// Only a file that does not tell its size is read to the end.
CopyResult ContentCopy::copySmall()
{
    alignas(pageSize) std::array<char, smallSize> buffer;
    off_t rest = size_;
    off_t copied = 0;
    do {
        if (isStopped())
            return {CopyOutcome::Aborted};
        off_t const count = size_ == 0 ? smallSize : rest;
        if (Ending const ending = readAndWrite(buffer, count, copied))
            return *ending;
        rest -= copied;
    } while (copied > 0 && (size_ == 0 || rest > 0));
    return {};
}

bool ContentCopy::share() const
{
    return errorOf([&] { return systemCalls().ficlone(target_.get(), source_.get()); }) == 0;
}

/// The number of blocks does not tell where some lie beyond the end of the file.
bool ContentCopy::hasHole() const
{
    off_t const hole = systemCalls().lseek(source_.get(), 0, SEEK_HOLE);
    if (hole == -1)
        return false;
    return hole < size_ || systemCalls().lseek(source_.get(), 0, SEEK_SET) == -1;
}

CopyResult ContentCopy::copyLarge(bool isSparse)
{
    if (isStopped())
        return {CopyOutcome::Aborted};
    if (share())
        return {};
    if (isSparse || hasHole())
        return copySparse();
    off_t rest = size_;
    return copyRange(rest).value_or(CopyResult());
}

Ending ContentCopy::copyRange(off_t& rest)
{
    while (rest > 0) {
        if (isStopped())
            return CopyResult{CopyOutcome::Aborted};
        off_t copied = 0;
        if (Ending const ending = copyStep(std::min(rest, chunkSize), copied))
            return ending;
        if (copied == 0)
            return std::nullopt;
        rest -= copied;
    }
    return std::nullopt;
}

/// What the kernel does not copy, for whatever reason, is tried by reading and writing, which also tells the end at
/// which it fails. Nothing copied says little: some file systems answer that for files that hold something.
Ending ContentCopy::copyStep(off_t count, off_t& copied)
{
    if (kernelCopies_) {
        copied = retried([&] {
            return systemCalls().copy_file_range(source_.get(), nullptr, target_.get(), nullptr,
                                                 static_cast<std::size_t>(count), 0);
        });
        if (copied > 0)
            return std::nullopt;
        kernelCopies_ = false;
    }
    return readAndWrite(buffer(), count, copied);
}

Ending ContentCopy::readAndWrite(std::span<char> buffer, off_t count, off_t& copied)
{
    std::size_t const wanted = std::min(buffer.size(), static_cast<std::size_t>(count));
    copied = retried([&] { return systemCalls().read(source_.get(), buffer.data(), wanted); });
    if (copied == -1)
        return sourceFailed();
    if (int const error = writeAll(target_, buffer.first(static_cast<std::size_t>(copied))))
        return targetFailed(error);
    return std::nullopt;
}

CopyResult ContentCopy::copySparse()
{
    for (off_t position = 0; position < size_;) {
        off_t begin = systemCalls().lseek(source_.get(), position, SEEK_DATA);
        if (begin == -1 && errno == ENXIO)
            break;
        // A file system that knows no holes has data alone.
        off_t const hole = begin == -1 ? -1 : systemCalls().lseek(source_.get(), begin, SEEK_HOLE);
        begin = begin == -1 ? position : begin;
        position = hole == -1 ? size_ : std::min(hole, size_);
        if (Ending const ending = copyExtent(begin, position))
            return *ending;
    }
    return endAt(size_);
}

/// Ends the copy, too, when the source ends before the extent does.
Ending ContentCopy::copyExtent(off_t begin, off_t end)
{
    if (systemCalls().lseek(source_.get(), begin, SEEK_SET) == -1)
        return sourceFailed();
    if (systemCalls().lseek(target_.get(), begin, SEEK_SET) == -1)
        return targetFailed(errno);
    off_t rest = end - begin;
    if (Ending const ending = copyRange(rest))
        return ending;
    return rest > 0 ? Ending(endAt(end - rest)) : std::nullopt;
}

/// The source may have become shorter meanwhile, and what it ends with may be a hole.
CopyResult ContentCopy::endAt(off_t end) const
{
    off_t const sourceEnd = systemCalls().lseek(source_.get(), 0, SEEK_END);
    end = sourceEnd == -1 ? end : std::min(end, sourceEnd);
    int const error = errorOf([&] { return systemCalls().ftruncate(target_.get(), end); });
    return error == 0 ? CopyResult() : targetFailed(error);
}

} // namespace

CopyResult copyContent(FileDescriptor const& source, Status const& status, FileDescriptor const& target,
                       IProvider::Interrupt const& interrupt)
{
    auto const size = static_cast<off_t>(status.stx_size);
    bool const isSparse = static_cast<off_t>(status.stx_blocks) < size / blockSize;
    ContentCopy copy(source, size, target, interrupt);
    return isSparse || size > smallSize ? copy.copyLarge(isSparse) : copy.copySmall();
}

} // namespace foundation::storage::local::detail
