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

/// The content of an open file, which a subclass owns.
class DescriptorStream : public provider::ByteStream
{
protected:
    /// `path` is what failures name.
    DescriptorStream(int descriptor, std::string path);

    long doRead(char* buffer, long count) override;
    long doWrite(char const* data, long count) override;

    /// Positions beyond the end are allowed; what is written there leaves a hole that reads as zeros.
    long doSeek(long offset, std::ios_base::seekdir direction) override;

    /// From then on everything fails with `IOError`.
    void forgetDescriptor() { descriptor_ = -1; }

    std::string const& path() const { return path_; }

private:
    void requireOpen(char const* attempt, long count = 0) const;

    int descriptor_;
    std::string path_;
};

/// The content of a file of its own.
class LocalByteStream final : public DescriptorStream
{
public:
    LocalByteStream(FileDescriptor file, std::string path);

protected:
    /// Reports what the operating system could not write back; the stream is closed all the same.
    void doClose() override;

private:
    FileDescriptor file_;
};

/// What `open` is given for these options.
int openFlags(provider::ByteStreamOpenOptions const& options);

/// Both throw `Exception`: `ResourceNotFound` for a folder, `UnsupportedOperation` for what is neither file nor folder.
std::unique_ptr<provider::ByteStream> openForReading(Root const& root, provider::StorageIRI const& iri);
std::unique_ptr<provider::ByteStream> openForWriting(Root const& root, provider::StorageIRI const& iri,
                                                     provider::ByteStreamOpenOptions const& options);

} // namespace foundation::storage::local::detail
