#include <storage/provider/detail/SafeByteStream.hpp>

#include <storage/provider/ByteStreamFailure.hpp>

#include <utility>

namespace foundation::storage::provider::detail {

SafeByteStream::SafeByteStream(std::unique_ptr<ByteStream> inner, bool readable, bool writable)
    : inner_(std::move(inner)), readable_(readable), writable_(writable)
{}

long SafeByteStream::doRead(char* buffer, long count)
{
    return readable_ ? inner_->read(buffer, count) : -1;
}

long SafeByteStream::doWrite(char const* data, long count)
{
    if (!writable_)
        throw ByteStreamWriteFailure();
    return inner_->write(data, count);
}

long SafeByteStream::doSeek(long offset, std::ios_base::seekdir direction)
{
    return inner_->seek(offset, direction);
}

void SafeByteStream::doClose()
{
    inner_->close();
}

} // namespace foundation::storage::provider::detail
