// Copying a file from one item to another.

#include <storage/provider/StorageItem.hpp>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <storage/provider/ReasonInfo.hpp>

#include <boost/exception/get_error_info.hpp>

#include <algorithm>
#include <utility>

namespace foundation::storage::provider {

namespace {

/// Passes the words of a failure on that has some.
[[noreturn]] void throwInstead(ByteStreamFailure const& failure, ErrorCode code, StorageIRI const& location)
{
    Exception exception(code, location);
    if (auto const* const reason = boost::get_error_info<ReasonInfo>(failure))
        exception << ReasonInfo(*reason);
    throw exception;
}

constexpr std::size_t bufferSize = 1048576;

constexpr ByteStreamOpenOptions destinationOptions{ByteStreamAccess::ReadWrite, ByteStreamCreate::Create,
                                                   ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite};

InterruptSignal neverInterrupt()
{
    return InterruptSignal::Continue;
}

/// Closes what a copy no longer needs: its bytes are read, or were written as far as they go.
void closeQuietly(ByteStreamDevice const& device)
{
    try {
        device.close();
    } catch (...) {
        // The outcome of the copy stands.
    }
}

void requireReplaceable(StorageItem const& destination, ReplacementPolicy policy)
{
    bool const fileExists = destination.fileExists();
    bool const preserves = policy == ReplacementPolicy::Preserve || policy == ReplacementPolicy::NoClobber;
    if ((fileExists && preserves) || destination.folderExists())
        throw Exception(ErrorCode::ResourceAlreadyExists, destination.getLocation());
}

/// One step of a copy: a stream failure and a count that the step does not accept are failures of the item worked on.
template <typename Step, typename Accept>
long checked(Step const& step, Accept const& accept, StorageItem const& item)
{
    long moved = 0;
    try {
        moved = step();
    } catch (ByteStreamFailure const& failure) {
        throwInstead(failure, ErrorCode::IOError, item.getLocation());
    }
    if (!accept(moved))
        throw Exception(ErrorCode::IOError, item.getLocation());
    return moved;
}

} // namespace

TransactionStatus StorageItem::copyFile(StorageItem const& destination, CopyFileOptions const& options) const
{
    bool const atomic = options.transactionPolicy == TransactionPolicy::Atomic;
    bool const interruptible = static_cast<bool>(options.interruptFunction);
    requireReplaceable(destination, options.replacementPolicy);
    if (hasSameProviderInstance(destination)) {
        if (!atomic && !interruptible) {
            provider_->copyFile(location_, destination.location_, options.replacementPolicy);
            return TransactionStatus::Completed;
        }
        if (atomic && provider_->hasFeature(ExtendedFeature::AtomicFileCopy))
            return provider_->copyFileAtomic(location_, destination.location_, options.replacementPolicy,
                                             options.interruptFunction);
    }
    try {
        std::unique_ptr<ByteStream> stream = openReadOnlyStream();
        ByteStreamDevice const source(stream);
        IProvider::Interrupt const never = neverInterrupt;
        IProvider::Interrupt const& interrupt = interruptible ? options.interruptFunction : never;
        TransactionStatus const status =
            atomic ? bufferedTransactionalCopy(source, destination, destinationOptions, interrupt)
                   : bufferedCopy(source, destination, destinationOptions, interrupt);
        closeQuietly(source);
        return status;
    } catch (ByteStreamFailure const& failure) {
        throwInstead(failure, failure.getErrorCode(), location_);
    }
}

TransactionStatus StorageItem::copyFile(StorageItem const& destination, ReplacementPolicy const& policy) const
{
    return copyFile(destination, CopyFileOptions{policy, TransactionPolicy::NonAtomic, {}});
}

long StorageItem::copyToBuffer(ByteStreamDevice const& source, std::vector<char>& buffer) const
{
    long const capacity = static_cast<long>(std::min(buffer.size(), bufferSize));
    long const count =
        checked([&] { return source.read(buffer.data(), capacity); },
                [&](long read) { return read == -1 || (std::min(1L, capacity) <= read && read <= capacity); }, *this);
    return std::max(count, 0L);
}

template <typename Device>
long StorageItem::copyFromBuffer(Device const& target, StorageItem const& destination, std::vector<char> const& buffer,
                                 long count) const
{
    return checked([&] { return target.write(buffer.data(), count); }, [&](long written) { return written == count; },
                   destination);
}

template long StorageItem::copyFromBuffer(ByteStreamDevice const&, StorageItem const&, std::vector<char> const&,
                                          long) const;
template long StorageItem::copyFromBuffer(TransactionalStreamDevice const&, StorageItem const&,
                                          std::vector<char> const&, long) const;

/// The source is read before the destination is opened, so that a source that cannot be read changes nothing.
template <typename Device, typename Open>
std::pair<Device, TransactionStatus> StorageItem::copyChunks(ByteStreamDevice const& source,
                                                             StorageItem const& destination, Open const& open,
                                                             IProvider::Interrupt const& interrupt) const
{
    std::vector<char> buffer(bufferSize);
    long count = copyToBuffer(source, buffer);
    auto stream = open();
    Device const target(stream);
    for (;;) {
        long const written = copyFromBuffer(target, destination, buffer, count);
        if (interrupt() != InterruptSignal::Continue)
            return {target, TransactionStatus::Aborted};
        if (written < 1)
            break;
        count = copyToBuffer(source, buffer);
        if (count == 0)
            break;
    }
    return {target, TransactionStatus::Completed};
}

TransactionStatus StorageItem::bufferedCopy(ByteStreamDevice const& source, StorageItem const& destination,
                                            ByteStreamOpenOptions const& options,
                                            IProvider::Interrupt const& interrupt) const
{
    auto const [target, status] = copyChunks<ByteStreamDevice>(
        source, destination, [&] { return destination.openStream(options); }, interrupt);
    closeQuietly(target);
    return status;
}

TransactionStatus StorageItem::bufferedTransactionalCopy(ByteStreamDevice const& source, StorageItem const& destination,
                                                         ByteStreamOpenOptions const& options,
                                                         IProvider::Interrupt const& interrupt) const
{
    auto const [target, status] = copyChunks<TransactionalStreamDevice>(
        source, destination, [&] { return destination.openTransactionalStream(options); }, interrupt);
    target.close(status == TransactionStatus::Completed ? StreamClosePolicy::Commit : StreamClosePolicy::Abort);
    return status;
}

} // namespace foundation::storage::provider
