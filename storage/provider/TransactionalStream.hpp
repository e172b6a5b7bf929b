#pragma once

#include <foundation/export.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/StreamClosePolicy.hpp>

namespace foundation::storage::provider {

/// A byte stream whose end decides about what was written: `Commit` makes it take effect at the target, `Abort` throws
/// it away. One that is dropped without a close never commits.
///
/// Ownership: refers to the provider that opened it, which must outlive it.
/// Threads: `close` may be called by any number of threads, one of which does the work; all else by one at a time.
class FOUNDATION_API TransactionalStream
{
public:
    TransactionalStream() = default;
    TransactionalStream(TransactionalStream const&) = delete;
    TransactionalStream& operator=(TransactionalStream const&) = delete;
    virtual ~TransactionalStream() = default;

    /// As those of `ByteStream`.
    long read(char* buffer, long count) { return doRead(buffer, count); }
    long write(char const* data, long count) { return doWrite(data, count); }
    long seek(long offset, std::ios_base::seekdir direction) { return doSeek(offset, direction); }

    /// The stream underneath, which stays owned by this one.
    ByteStream* byteStream() { return doByteStream(); }

    /// Closes the stream underneath and then commits or aborts. A failed close leaves the stream open, to be closed
    /// again with either policy; after a successful one, further calls do nothing.
    void close(StreamClosePolicy const& policy) { doClose(policy); }

protected:
    /// These three go to `byteStream()`.
    virtual long doRead(char* buffer, long count);
    virtual long doWrite(char const* data, long count);
    virtual long doSeek(long offset, std::ios_base::seekdir direction);

    /// Must take effect at most once, however often and from however many threads it is called.
    virtual void doClose(StreamClosePolicy const& policy) = 0;
    virtual ByteStream* doByteStream() = 0;
};

} // namespace foundation::storage::provider
