#include <storage/archive/detail/Archive.hpp>

#include <storage/archive/detail/CursorArchive.hpp>
#include <storage/archive/detail/Fault.hpp>
#include <storage/archive/detail/Source.hpp>
#include <storage/archive/detail/ZipArchive.hpp>
#include <storage/archive/detail/time.hpp>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

bool isLimit(Reason reason)
{
    return errorCodeOf(reason) == provider::ErrorCode::FileTooLarge;
}

/// libzip refuses a zip as a whole for whatever is wrong with one of its entries; libarchive takes entries one by one.
std::shared_ptr<Archive const> openZip(std::shared_ptr<Source const> const& source, ArchiveLimits const& limits,
                                       std::int64_t modified)
{
    try {
        return std::make_shared<ZipArchive>(source, limits, modified);
    } catch (Fault const& refusal) {
        if (refusal.reason != Reason::Damaged)
            throw;
        try {
            auto archive = std::make_shared<CursorArchive>(ArchiveFormat::Zip, source, limits, modified);
            if (archive->index().size() > 1)
                return archive;
        } catch (Fault const& fault) {
            if (fault.reason == Reason::StoreFailed || isLimit(fault.reason))
                throw;
        }
        throw Fault(refusal);
    }
}

} // namespace

std::shared_ptr<Archive const> openArchive(ArchiveFormat format, provider::StorageItem const& container,
                                           ArchiveLimits const& limits)
{
    std::int64_t const modified = toMicroseconds(container.getFileAttributes().getLastModified());
    bool const hasChecksums = format == ArchiveFormat::Zip || format == ArchiveFormat::SevenZip;
    std::shared_ptr<Source const> const source =
        openSource(container, limits, hasChecksums ? Checksums::Inside : Checksums::Outside);
    switch (format) {
    case ArchiveFormat::Zip:
        return openZip(source, limits, modified);
    case ArchiveFormat::Tar:
    case ArchiveFormat::SevenZip:
    case ArchiveFormat::Iso:
    case ArchiveFormat::Cpio:
        return std::make_shared<CursorArchive>(format, source, limits, modified);
    }
    throw Fault(Reason::UnsupportedMethod);
}

void requireRatio(ArchiveLimits const& limits, std::uint64_t size, std::uint64_t sizeInArchive)
{
    if (size > limits.bytesOfAnyRatio && (limits.ratio == 0 || size / limits.ratio > sizeInArchive))
        throw Fault(Reason::RatioTooHigh);
}

void requireWithinLimits(ArchiveLimits const& limits, std::uint64_t size, std::uint64_t sizeInArchive)
{
    if (size > limits.entryBytes)
        throw Fault(Reason::EntryTooLarge);
    requireRatio(limits, size, sizeInArchive);
}

} // namespace foundation::storage::archive::detail
