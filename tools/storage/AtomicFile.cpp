#include <tools/storage/AtomicFile.hpp>

#include <storage/provider/Exception.hpp>
#include <tools/storage/scratchName.hpp>

#include <utility>
#include <vector>

namespace foundation::storage::tool {

using provider::ErrorCode;
using provider::ReplacementPolicy;

namespace {

constexpr provider::ByteStreamOpenOptions newFile{
    provider::ByteStreamAccess::WriteOnly, provider::ByteStreamCreate::Create,
    provider::ByteStreamTruncate::TruncateExisting, provider::ByteStreamAppend::Overwrite};

} // namespace

AtomicFile::AtomicFile(provider::StorageItem const& target, Replace replace) : target_(target)
{
    if (replace == Replace::Files) {
        transaction_ = target_.openTransactionalStream(newFile);
        return;
    }
    scratch_.emplace(target_.getParent(), makeScratchName());
    scratchStream_ = scratch_->openStream(newFile);
}

AtomicFile::~AtomicFile()
{
    discard();
}

provider::ByteStream& AtomicFile::stream()
{
    return transaction_ != nullptr ? *transaction_->byteStream() : *scratchStream_;
}

void AtomicFile::write(char const* data, long count)
{
    endHole();
    while (count > 0) {
        long const written = stream().write(data, count);
        if (written <= 0 || written > count)
            throw provider::Exception(ErrorCode::IOError, target_.getLocation());
        data += written;
        count -= written;
    }
}

void AtomicFile::writeZeros(long count)
{
    if (target_.getScheme() == u"file")
        hole_ += count;
    else
        write(std::vector<char>(static_cast<std::size_t>(count)).data(), count);
}

/// The last byte of a hole is written, so that the file reaches as far.
void AtomicFile::endHole()
{
    long const hole = std::exchange(hole_, 0);
    if (hole == 0)
        return;
    stream().seek(hole - 1, std::ios_base::cur);
    write("", 1);
}

void AtomicFile::commit(long expectedSize)
{
    endHole();
    if (stream().seek(0, std::ios_base::end) != expectedSize)
        throw provider::Exception(ErrorCode::IOError, target_.getLocation());
    if (transaction_ != nullptr) {
        transaction_->close(provider::StreamClosePolicy::Commit);
    } else {
        scratchStream_->close();
        publish();
    }
    isFinished_ = true;
}

/// A store that cannot move without replacing can make a file without replacing: that takes the name first.
void AtomicFile::publish()
{
    try {
        return scratch_->moveFile(target_.getLocation(), ReplacementPolicy::NoClobber);
    } catch (provider::Exception const& error) {
        if (error.getErrorCode() != ErrorCode::UnsupportedOperation)
            throw;
    }
    target_.createFile();
    try {
        scratch_->moveFile(target_.getLocation(), ReplacementPolicy::Overwrite);
    } catch (...) {
        target_.removeFile();
        throw;
    }
}

bool AtomicFile::discard() noexcept
{
    if (isFinished_)
        return true;
    isFinished_ = true;
    try {
        if (transaction_ != nullptr) {
            transaction_->close(provider::StreamClosePolicy::Abort);
        } else {
            scratchStream_.reset();
            scratch_->removeFile();
        }
        return true;
    } catch (...) {
        return false;
    }
}

} // namespace foundation::storage::tool
