#pragma once

#include <storage/provider/TransactionalStream.hpp>

#include <atomic>
#include <functional>
#include <memory>
#include <utility>

namespace foundation::storage::provider::detail {

/// A transactional stream over a stream and the action that commits or aborts.
template <typename Stream>
class FOUNDATION_API GenericTransactionalStream final : public TransactionalStream
{
public:
    using Finisher = std::function<void(StreamClosePolicy const&)>;

    GenericTransactionalStream(std::unique_ptr<Stream> stream, Finisher finisher)
        : stream_(std::move(stream)), finisher_(std::move(finisher))
    {}

    ~GenericTransactionalStream() override
    {
        try {
            close(StreamClosePolicy::Abort);
        } catch (...) {
            // Nobody is left to hear of it, and the target is as it was.
        }
    }

protected:
    /// Closes the stream before the finisher runs, so that all bytes written are in the scratch file by then.
    void doClose(StreamClosePolicy const& policy) override
    {
        if (closed_.exchange(true))
            return;
        try {
            stream_->close();
            finisher_(policy);
        } catch (...) {
            closed_.store(false);
            throw;
        }
    }

    ByteStream* doByteStream() override { return stream_.get(); }

private:
    std::shared_ptr<Stream> stream_;
    Finisher finisher_;
    std::atomic<bool> closed_{false};
};

extern template class GenericTransactionalStream<ByteStream>;

} // namespace foundation::storage::provider::detail
