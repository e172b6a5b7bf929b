#pragma once

#include <storage/local/detail/FileDescriptor.hpp>
#include <storage/local/detail/Root.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/ByteStreamOpenOptions.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <memory>
#include <string>

namespace foundation::storage::local::detail {

/// A failure of the operating system, or the use of a closed stream: what was attempted, on which path, and why it
/// failed.
class FOUNDATION_API LocalStreamFailure final : public provider::ByteStreamFailure
{
public:
    LocalStreamFailure(std::string const& attempt, std::string const& path, int error);

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
};

/// The content of an open file.
class LocalByteStream final : public provider::ByteStream
{
public:
    /// `path` is what failures name.
    LocalByteStream(FileDescriptor file, std::string path);

protected:
    long doRead(char* buffer, long count) override;
    long doWrite(char const* data, long count) override;

    /// Positions beyond the end are allowed; what is written there leaves a hole that reads as zeros.
    long doSeek(long offset, std::ios_base::seekdir direction) override;

    /// Reports what the operating system could not write back; the stream is closed all the same.
    void doClose() override;

private:
    void requireOpen(char const* attempt, long count = 0) const;

    FileDescriptor file_;
    std::string path_;
};

/// Both throw `Exception`: `ResourceNotFound` for a folder, `UnsupportedOperation` for what is neither file nor folder.
std::unique_ptr<provider::ByteStream> openForReading(Root const& root, provider::StorageIRI const& iri);
std::unique_ptr<provider::ByteStream> openForWriting(Root const& root, provider::StorageIRI const& iri,
                                                     provider::ByteStreamOpenOptions const& options);

} // namespace foundation::storage::local::detail
