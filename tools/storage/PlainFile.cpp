#include <tools/storage/PlainFile.hpp>

#include <storage/provider/Exception.hpp>

namespace foundation::storage::tool {

using provider::ErrorCode;

namespace {

/// A new file is empty, and is not emptied: ext4 writes a file that was emptied to the disk when it is closed.
provider::ByteStreamOpenOptions openOptions(bool isNew)
{
    return {provider::ByteStreamAccess::WriteOnly, provider::ByteStreamCreate::NeverCreate,
            isNew ? provider::ByteStreamTruncate::PreserveExisting : provider::ByteStreamTruncate::TruncateExisting,
            provider::ByteStreamAppend::Overwrite};
}

/// Answers false where a file stands that may be replaced.
bool makeFile(provider::StorageItem const& target, Replace replace)
{
    try {
        target.createFile();
        return true;
    } catch (provider::Exception const& error) {
        if (replace == Replace::Never || error.getErrorCode() != ErrorCode::ResourceAlreadyExists)
            throw;
        return false;
    }
}

} // namespace

PlainFile::PlainFile(provider::StorageItem const& target, Replace replace)
    : TargetFile(target), isNew_(makeFile(target, replace))
{
    try {
        stream_ = target.openStream(openOptions(isNew_));
    } catch (...) {
        isFinished_ = !isNew_;
        discard();
        throw;
    }
}

PlainFile::~PlainFile()
{
    discard();
}

void PlainFile::publish()
{
    stream_->close();
    isFinished_ = true;
}

bool PlainFile::discard() noexcept
{
    if (isFinished_)
        return true;
    isFinished_ = true;
    try {
        stream_.reset();
        if (isNew_)
            target().removeFile();
        return isNew_;
    } catch (...) {
        return false;
    }
}

} // namespace foundation::storage::tool
