#pragma once

#include <storage/memory/MemoryProvider.hpp>
#include <tests/support/TestStreamFailure.hpp>

#include <atomic>
#include <memory>
#include <utility>

namespace foundation::storage::archive {

/// Files in memory, of which is counted how often they are opened and how much is read, and which cannot seek if they
/// are told so.
class ObservedStore final : public memory::MemoryProvider
{
public:
    enum class Seeking
    {
        Possible,
        Impossible,
    };

    explicit ObservedStore(provider::StorageIRI const& root, Seeking seeking = Seeking::Possible)
        : MemoryProvider(root), seeking_(seeking)
    {}

    struct Counts
    {
        std::atomic<int> opened = 0;
        std::atomic<long> bytes = 0;
    };

    Counts const& counts() const { return *counts_; }

protected:
    std::unique_ptr<provider::ByteStream> doOpenReadOnlyStream(provider::StorageIRI const& iri) const override
    {
        ++counts_->opened;
        return std::make_unique<Stream>(MemoryProvider::doOpenReadOnlyStream(iri), counts_, seeking_);
    }

private:
    class Stream final : public provider::ByteStream
    {
    public:
        Stream(std::unique_ptr<ByteStream> stream, std::shared_ptr<Counts> counts, Seeking seeking)
            : stream_(std::move(stream)), counts_(std::move(counts)), seeking_(seeking)
        {}

    protected:
        long doRead(char* buffer, long count) override
        {
            long const read = stream_->read(buffer, count);
            counts_->bytes += read > 0 ? read : 0;
            return read;
        }

        long doWrite(char const* data, long count) override { return stream_->write(data, count); }

        long doSeek(long offset, std::ios_base::seekdir direction) override
        {
            if (seeking_ == Seeking::Impossible)
                throw tests::support::TestStreamFailure(provider::ErrorCode::UnsupportedOperation);
            return stream_->seek(offset, direction);
        }

        void doClose() override { stream_->close(); }

    private:
        std::unique_ptr<ByteStream> stream_;
        std::shared_ptr<Counts> counts_;
        Seeking const seeking_;
    };

    Seeking const seeking_;
    std::shared_ptr<Counts> const counts_ = std::make_shared<Counts>();
};

} // namespace foundation::storage::archive
