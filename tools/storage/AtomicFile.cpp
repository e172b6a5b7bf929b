#include <tools/storage/AtomicFile.hpp>

#include <storage/local/scratchFiles.hpp>
#include <storage/provider/Exception.hpp>

namespace foundation::storage::tool {

using provider::ErrorCode;
using provider::ReplacementPolicy;

namespace {

constexpr provider::ByteStreamOpenOptions newFile{
    provider::ByteStreamAccess::WriteOnly, provider::ByteStreamCreate::Create,
    provider::ByteStreamTruncate::TruncateExisting, provider::ByteStreamAppend::Overwrite};

} // namespace

AtomicFile::AtomicFile(provider::StorageItem const& target, Replace replace) : TargetFile(target)
{
    if (replace == Replace::Files) {
        transaction_ = target.openTransactionalStream(newFile);
        return;
    }
    scratch_.emplace(target.getParent(), local::makeScratchName());
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

void AtomicFile::publish()
{
    if (transaction_ != nullptr) {
        transaction_->close(provider::StreamClosePolicy::Commit);
    } else {
        scratchStream_->close();
        moveToTarget();
    }
    isFinished_ = true;
}

/// A store that cannot move without replacing can make a file without replacing: that takes the name first.
void AtomicFile::moveToTarget()
{
    try {
        return scratch_->moveFile(target().getLocation(), ReplacementPolicy::NoClobber);
    } catch (provider::Exception const& error) {
        if (error.getErrorCode() != ErrorCode::UnsupportedOperation)
            throw;
    }
    target().createFile();
    try {
        scratch_->moveFile(target().getLocation(), ReplacementPolicy::Overwrite);
    } catch (...) {
        if (scratch_->fileExists())
            target().removeFile();
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
            return true;
        }
        scratchStream_.reset();
        // A move that failed may have taken place, and be uncertain to last.
        if (scratch_->fileExists())
            scratch_->removeFile();
        return true;
    } catch (...) {
        return false;
    }
}

} // namespace foundation::storage::tool
