#pragma once

#include <storage/conformance/detail/FaultSource.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/IFolderEntryIterator.hpp>
#include <storage/provider/TransactionalStream.hpp>

#include <cstdint>
#include <memory>

namespace foundation::storage::conformance::detail {

/// A stream with the faults of a plan. It does not own the wrapped one, which outlives it.
class FaultyByteStream : public provider::ByteStream
{
public:
    FaultyByteStream(provider::ByteStream& wrapped, std::shared_ptr<FaultSource> faults);

protected:
    long doRead(char* buffer, long count) override;
    long doWrite(char const* data, long count) override;
    long doSeek(long offset, std::ios_base::seekdir direction) override;
    void doClose() override;

private:
    provider::ByteStream& wrapped_;
    std::shared_ptr<FaultSource> faults_;
    std::uint64_t read_ = 0;
    std::uint64_t written_ = 0;
};

/// The same, owning the wrapped stream.
std::unique_ptr<provider::ByteStream> faulty(std::unique_ptr<provider::ByteStream> wrapped,
                                             std::shared_ptr<FaultSource> faults);

std::unique_ptr<provider::TransactionalStream> faulty(std::unique_ptr<provider::TransactionalStream> wrapped,
                                                      std::shared_ptr<FaultSource> faults);

std::unique_ptr<provider::IFolderEntryIterator> faulty(std::unique_ptr<provider::IFolderEntryIterator> wrapped,
                                                       std::shared_ptr<FaultSource> faults,
                                                       provider::StorageIRI const& folder);

} // namespace foundation::storage::conformance::detail
