#include <storage/provider/TransactionalStream.hpp>

namespace foundation::storage::provider {

long TransactionalStream::doRead(char* buffer, long count)
{
    return byteStream()->read(buffer, count);
}

long TransactionalStream::doWrite(char const* data, long count)
{
    return byteStream()->write(data, count);
}

long TransactionalStream::doSeek(long offset, std::ios_base::seekdir direction)
{
    return byteStream()->seek(offset, direction);
}

} // namespace foundation::storage::provider
