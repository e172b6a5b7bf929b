#include <storage/archive/detail/CursorContent.hpp>

#include <storage/archive/detail/Fault.hpp>

#include <new>
#include <utility>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

CursorContent::CursorContent(std::shared_ptr<CursorArchive const> archive, std::uint64_t number, std::uint64_t size)
    : archive_(std::move(archive)), number_(number), size_(size), cursor_(archive_->takeCursor(number_, size_))
{}

CursorContent::~CursorContent()
{
    giveBack();
}

/// Without memory for that nobody gets the cursor.
void CursorContent::giveBack() noexcept
{
    if (cursor_ == nullptr)
        return;
    try {
        archive_->giveBack(std::move(cursor_));
    } catch (std::bad_alloc const&) {
        cursor_.reset();
    }
}

std::size_t CursorContent::read(char* buffer, std::size_t count)
{
    if (cursor_ == nullptr)
        throw Fault(Reason::Damaged);
    try {
        return cursor_->read(buffer, count);
    } catch (...) {
        cursor_.reset();
        throw;
    }
}

void CursorContent::restart()
{
    giveBack();
    cursor_ = archive_->takeCursor(number_, size_);
}

void CursorContent::finish()
{
    char beyond;
    if (read(&beyond, 1) != 0)
        throw Fault(Reason::Damaged);
}

} // namespace foundation::storage::archive::detail
