#pragma once

#include <storage/memory/MemoryProvider.hpp>
#include <tests/support/TestStreamFailure.hpp>

#include <atomic>
#include <memory>
#include <optional>
#include <utility>

namespace foundation::storage::archive {

/// Files in memory, whose reading fails for as long as it is told to.
class FlakyStore final : public memory::MemoryProvider
{
public:
    using MemoryProvider::MemoryProvider;

    void failWith(provider::ErrorCode code) { *state_ = static_cast<int>(code); }
    void recover() { *state_ = fine; }

protected:
    std::unique_ptr<provider::ByteStream> doOpenReadOnlyStream(provider::StorageIRI const& iri) const override
    {
        return std::make_unique<Stream>(MemoryProvider::doOpenReadOnlyStream(iri), state_);
    }

private:
    static constexpr int fine = -1;
    using State = std::shared_ptr<std::atomic<int>>;

    class Stream final : public provider::ByteStream
    {
    public:
        Stream(std::unique_ptr<ByteStream> stream, State state) : stream_(std::move(stream)), state_(std::move(state))
        {}

    protected:
        long doRead(char* buffer, long count) override
        {
            if (*state_ != fine)
                throw tests::support::TestStreamFailure(static_cast<provider::ErrorCode>(state_->load()));
            return stream_->read(buffer, count);
        }

        long doWrite(char const* data, long count) override { return stream_->write(data, count); }
        long doSeek(long offset, std::ios_base::seekdir direction) override { return stream_->seek(offset, direction); }
        void doClose() override { stream_->close(); }

    private:
        std::unique_ptr<ByteStream> stream_;
        State state_;
    };

    State const state_ = std::make_shared<std::atomic<int>>(fine);
};

} // namespace foundation::storage::archive
