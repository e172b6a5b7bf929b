#include <storage/archive/detail/ZipContent.hpp>

#include <storage/archive/detail/Fault.hpp>

#include <mutex>
#include <utility>

namespace foundation::storage::archive::detail {

ZipContent::ZipContent(std::unique_ptr<ZipArchive::Lease> lease, std::uint64_t number, bool isStored)
    : lease_(std::move(lease)), number_(number), isStored_(isStored)
{
    std::lock_guard const lock(lease_->handle().mutex());
    file_ = lease_->handle().open(number_);
}

ZipContent::~ZipContent()
{
    std::lock_guard const lock(lease_->handle().mutex());
    file_.reset();
}

std::size_t ZipContent::read(char* buffer, std::size_t count)
{
    std::lock_guard const lock(lease_->handle().mutex());
    if (file_ == nullptr)
        throw Fault(ArchiveException::Reason::Damaged);
    return lease_->handle().read(file_, buffer, count);
}

bool ZipContent::seek(std::uint64_t position)
{
    if (!isStored_ || file_ == nullptr)
        return false;
    std::lock_guard const lock(lease_->handle().mutex());
    lease_->handle().seek(file_, position);
    return true;
}

void ZipContent::restart()
{
    std::lock_guard const lock(lease_->handle().mutex());
    file_.reset();
    file_ = lease_->handle().open(number_);
}

/// libzip compares size and checksum when it finds the end.
void ZipContent::finish()
{
    char beyond;
    if (read(&beyond, 1) != 0)
        throw Fault(ArchiveException::Reason::Damaged);
}

} // namespace foundation::storage::archive::detail
