#pragma once

#include <foundation/export.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/TransactionalStream.hpp>

#include <boost/iostreams/categories.hpp>
#include <boost/shared_ptr.hpp>

#include <ios>
#include <memory>

namespace foundation::storage::provider {

/// A stream as a seekable, closable device of Boost.Iostreams.
///
/// Ownership: copies of a device share the one stream, which goes with the last of them.
template <typename T>
class GenericByteStreamDevice
{
public:
    using char_type = char;
    struct category : boost::iostreams::seekable_device_tag, boost::iostreams::closable_tag
    {};

    /// Takes the stream out of `stream`; it is destroyed when sharing it fails.
    explicit GenericByteStreamDevice(std::unique_ptr<T>& stream) : stream_(stream.release()) {}

    long read(char* buffer, long count) const { return stream_->read(buffer, count); }
    long write(char const* data, long count) const { return stream_->write(data, count); }
    long seek(long offset, std::ios_base::seekdir direction) const { return stream_->seek(offset, direction); }

    /// Closes the shared stream; a transactional one commits.
    void close() const { closeStream(*stream_); }

protected:
    T& stream() const { return *stream_; }

private:
    static void closeStream(ByteStream& stream) { stream.close(); }
    static void closeStream(TransactionalStream& stream) { stream.close(StreamClosePolicy::Commit); }

    boost::shared_ptr<T> stream_;
};

class FOUNDATION_API ByteStreamDevice : public GenericByteStreamDevice<ByteStream>
{
public:
    using GenericByteStreamDevice::GenericByteStreamDevice;
};

/// Boost.Iostreams closes through `close()`, so that its copies and streams commit even when an exception ends them;
/// who wants to abort calls the other form first.
class FOUNDATION_API TransactionalStreamDevice : public GenericByteStreamDevice<TransactionalStream>
{
public:
    using GenericByteStreamDevice::close;
    using GenericByteStreamDevice::GenericByteStreamDevice;

    void close(StreamClosePolicy const& policy) const { stream().close(policy); }
};

} // namespace foundation::storage::provider
