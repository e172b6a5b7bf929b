#include <storage/local/detail/LocalTransaction.hpp>

#include <fcntl.h>
#include <utility>

namespace foundation::storage::local::detail {

using namespace provider;

LocalTransaction::Content::Content(FileDescriptor const& file, std::string path, ByteStreamAccess access)
    : DescriptorStream(file.get(), std::move(path)), isReadable_(access == ByteStreamAccess::ReadWrite)
{}

long LocalTransaction::Content::doRead(char* buffer, long count)
{
    return isReadable_ ? DescriptorStream::doRead(buffer, count) : -1;
}

LocalTransaction::LocalTransaction(std::shared_ptr<Settings const> settings, StorageIRI const& target,
                                   ByteStreamOpenOptions const& options)
    : settings_(std::move(settings)),
      file_(settings_->root, target, settings_->durability, openFlags(options) & ~(O_CREAT | O_TRUNC)),
      content_(file_.file(), file_.targetPath(), options.access)
{}

LocalTransaction::LocalTransaction(std::shared_ptr<Settings const> settings, StorageIRI const& target,
                                   StorageIRI const& scratch, ByteStreamOpenOptions const& options)
    : settings_(std::move(settings)),
      file_(settings_->root, target, scratch, settings_->durability, openFlags(options)),
      content_(file_.file(), settings_->root.pathOf(scratch), options.access)
{}

LocalTransaction::~LocalTransaction()
{
    try {
        close(StreamClosePolicy::Abort);
    } catch (...) {
        // Nobody is left to hear of it.
    }
}

void LocalTransaction::doClose(StreamClosePolicy const& policy)
{
    if (closed_.exchange(true))
        return;
    try {
        content_.close();
        finish(policy);
    } catch (...) {
        closed_.store(false);
        throw;
    }
}

void LocalTransaction::finish(StreamClosePolicy policy)
{
    if (policy == StreamClosePolicy::Commit)
        file_.commit(ReplacementPolicy::Overwrite);
    else
        file_.discard();
}

} // namespace foundation::storage::local::detail
