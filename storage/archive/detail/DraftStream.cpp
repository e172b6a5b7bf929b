#include <storage/archive/detail/DraftStream.hpp>

#include <storage/archive/detail/EntryStream.hpp>
#include <storage/archive/detail/Fault.hpp>

#include <utility>

namespace foundation::storage::archive::detail {

using namespace provider;

DraftStream::DraftStream(StorageIRI const& iri, std::shared_ptr<Draft> draft, Manner manner, Watcher watcher)
    : iri_(iri), draft_(std::move(draft)), manner_(manner), watcher_(std::move(watcher))
{}

DraftStream::~DraftStream()
{
    try {
        close();
    } catch (...) {
        // Nobody is left to hear of it, and what was written stays written.
    }
}

void DraftStream::requireOpen(char const* attempt, long count) const
{
    if (!isOpen_)
        throw ArchiveStreamFailure(attempt, iri_, std::errc::bad_file_descriptor);
    if (count < 0)
        throw ArchiveStreamFailure(attempt, iri_, std::errc::invalid_argument);
}

long DraftStream::doRead(char* buffer, long count)
{
    requireOpen("read", count);
    if (!manner_.isReadable)
        return -1;
    try {
        std::size_t const read = draft_->read(position_, buffer, static_cast<std::size_t>(count));
        position_ += read;
        return read == 0 && count > 0 ? -1 : static_cast<long>(read);
    } catch (Fault const& fault) {
        throw ArchiveStreamFailure("read", iri_, fault);
    }
}

long DraftStream::doWrite(char const* data, long count)
{
    requireOpen("write", count);
    if (count == 0)
        return 0;
    try {
        auto const offset = manner_.appends ? std::nullopt : std::optional(position_);
        position_ = draft_->write(offset, data, static_cast<std::size_t>(count));
        watcher_.written();
    } catch (Fault const& fault) {
        throw ArchiveStreamFailure("write", iri_, fault);
    }
    return count;
}

long DraftStream::doSeek(long offset, std::ios_base::seekdir direction)
{
    requireOpen("seek in");
    std::uint64_t const origin = direction == std::ios_base::beg   ? 0
                                 : direction == std::ios_base::cur ? position_
                                                                   : draft_->size();
    long position;
    if (__builtin_add_overflow(origin, offset, &position) || position < 0)
        throw ArchiveStreamFailure("seek in", iri_, std::errc::invalid_argument);
    position_ = static_cast<std::uint64_t>(position);
    return position;
}

void DraftStream::doClose()
{
    if (!std::exchange(isOpen_, false))
        return;
    try {
        watcher_.closed();
    } catch (Fault const& fault) {
        throw ArchiveStreamFailure("close", iri_, fault);
    }
}

DraftTransaction::DraftTransaction(StorageIRI const& iri, std::shared_ptr<Draft> draft, DraftStream::Manner manner,
                                   std::function<void()> commit)
    : commit_(std::move(commit)), stream_(iri, std::move(draft), manner, {[] {}, [] {}})
{}

void DraftTransaction::doClose(StreamClosePolicy const& policy)
{
    std::lock_guard const lock(mutex_);
    if (isClosed_)
        return;
    stream_.close();
    if (policy == StreamClosePolicy::Commit)
        commit_();
    isClosed_ = true;
    commit_ = {};
}

} // namespace foundation::storage::archive::detail
