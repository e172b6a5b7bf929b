#pragma once

#include <foundation/export.hpp>
#include <storage/provider/ByteStream.hpp>

#include <memory>

namespace foundation::storage::provider::detail {

/// Guards a provider's stream by the access that it was opened with.
class FOUNDATION_API SafeByteStream final : public ByteStream
{
public:
    SafeByteStream(std::unique_ptr<ByteStream> inner, bool readable, bool writable);

protected:
    /// Without read access -1, as at the end of the file.
    long doRead(char* buffer, long count) override;

    /// Without write access throws `ByteStreamWriteFailure`, whatever the count.
    long doWrite(char const* data, long count) override;

    long doSeek(long offset, std::ios_base::seekdir direction) override;
    void doClose() override;

private:
    std::unique_ptr<ByteStream> inner_;
    bool readable_;
    bool writable_;
};

} // namespace foundation::storage::provider::detail
