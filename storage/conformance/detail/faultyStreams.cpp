#include <storage/conformance/detail/faultyStreams.hpp>

#include <storage/provider/StreamClosePolicy.hpp>

#include <algorithm>
#include <optional>
#include <utility>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

/// How many bytes a call may move: no more than asked for, than a plan lets through at once, and than are left before
/// the failure.
long allowed(long asked, long longest, std::optional<std::uint64_t> limit, std::uint64_t moved)
{
    long const count = std::min(asked, longest);
    if (!limit)
        return count;
    return static_cast<long>(std::min(static_cast<std::uint64_t>(count), *limit - moved));
}

bool isExhausted(long asked, std::optional<std::uint64_t> limit, std::uint64_t moved)
{
    return asked > 0 && limit && moved >= *limit;
}

class OwningFaultyByteStream final : public FaultyByteStream
{
public:
    OwningFaultyByteStream(std::unique_ptr<ByteStream> wrapped, std::shared_ptr<FaultSource> faults)
        : FaultyByteStream(*wrapped, std::move(faults)), owned_(std::move(wrapped))
    {}

private:
    std::unique_ptr<ByteStream> owned_;
};

class FaultyTransactionalStream final : public TransactionalStream
{
public:
    FaultyTransactionalStream(std::unique_ptr<TransactionalStream> wrapped, std::shared_ptr<FaultSource> faults)
        : wrapped_(std::move(wrapped)), faults_(std::move(faults)), stream_(*wrapped_->byteStream(), faults_)
    {}

protected:
    void doClose(StreamClosePolicy const& policy) override
    {
        faults_->beforeStream(policy == StreamClosePolicy::Commit ? "commit" : "abort");
        if (faults_->plan().closeFails)
            faults_->failStream();
        wrapped_->close(policy);
    }

    ByteStream* doByteStream() override { return &stream_; }

private:
    std::unique_ptr<TransactionalStream> wrapped_;
    std::shared_ptr<FaultSource> faults_;
    FaultyByteStream stream_;
};

class FaultyListing final : public IFolderEntryIterator
{
public:
    FaultyListing(std::unique_ptr<IFolderEntryIterator> wrapped, std::shared_ptr<FaultSource> faults, StorageIRI folder)
        : wrapped_(std::move(wrapped)), faults_(std::move(faults)), folder_(std::move(folder))
    {}

    bool hasEntry() const override { return wrapped_->hasEntry(); }
    FolderEntry const& entry() const override { return wrapped_->entry(); }

    void next() override
    {
        faults_->before("next", folder_);
        wrapped_->next();
    }

    void reset() override
    {
        faults_->before("reset", folder_);
        wrapped_->reset();
    }

private:
    std::unique_ptr<IFolderEntryIterator> wrapped_;
    std::shared_ptr<FaultSource> faults_;
    StorageIRI folder_;
};

} // namespace

FaultyByteStream::FaultyByteStream(ByteStream& wrapped, std::shared_ptr<FaultSource> faults)
    : wrapped_(wrapped), faults_(std::move(faults))
{}

long FaultyByteStream::doRead(char* buffer, long count)
{
    faults_->beforeStream("read");
    FaultPlan const& plan = faults_->plan();
    if (isExhausted(count, plan.readFailsAfter, read_))
        faults_->failStream();
    long const moved = wrapped_.read(buffer, allowed(count, plan.longestRead, plan.readFailsAfter, read_));
    read_ += static_cast<std::uint64_t>(std::max(moved, 0L));
    return moved;
}

long FaultyByteStream::doWrite(char const* data, long count)
{
    faults_->beforeStream("write");
    FaultPlan const& plan = faults_->plan();
    if (isExhausted(count, plan.writeFailsAfter, written_))
        faults_->failStream();
    long const moved = wrapped_.write(data, allowed(count, plan.longestWrite, plan.writeFailsAfter, written_));
    written_ += static_cast<std::uint64_t>(std::max(moved, 0L));
    return moved;
}

long FaultyByteStream::doSeek(long offset, std::ios_base::seekdir direction)
{
    faults_->beforeStream("seek");
    long const position = wrapped_.seek(offset, direction);
    if (direction == std::ios_base::end && faults_->plan().claimedSize)
        return static_cast<long>(*faults_->plan().claimedSize) + offset;
    return position;
}

void FaultyByteStream::doClose()
{
    faults_->beforeStream("close");
    wrapped_.close();
    if (faults_->plan().closeFails)
        faults_->failStream();
}

std::unique_ptr<ByteStream> faulty(std::unique_ptr<ByteStream> wrapped, std::shared_ptr<FaultSource> faults)
{
    return std::make_unique<OwningFaultyByteStream>(std::move(wrapped), std::move(faults));
}

std::unique_ptr<TransactionalStream> faulty(std::unique_ptr<TransactionalStream> wrapped,
                                            std::shared_ptr<FaultSource> faults)
{
    return std::make_unique<FaultyTransactionalStream>(std::move(wrapped), std::move(faults));
}

std::unique_ptr<IFolderEntryIterator> faulty(std::unique_ptr<IFolderEntryIterator> wrapped,
                                             std::shared_ptr<FaultSource> faults, StorageIRI const& folder)
{
    return std::make_unique<FaultyListing>(std::move(wrapped), std::move(faults), folder);
}

} // namespace foundation::storage::conformance::detail
