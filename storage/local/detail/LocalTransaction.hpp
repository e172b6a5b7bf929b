#pragma once

#include <storage/local/detail/LocalByteStream.hpp>
#include <storage/local/detail/ScratchFile.hpp>
#include <storage/local/detail/Settings.hpp>
#include <storage/provider/TransactionalStream.hpp>

#include <atomic>
#include <memory>

namespace foundation::storage::local::detail {

/// What is written to a scratch file and takes the target's place when it is committed, by `ScratchFile::commit`.
class LocalTransaction final : public provider::TransactionalStream
{
public:
    /// With a new scratch file beside the target.
    LocalTransaction(std::shared_ptr<Settings const> settings, provider::StorageIRI const& target,
                     provider::ByteStreamOpenOptions const& options);
    LocalTransaction(std::shared_ptr<Settings const> settings, provider::StorageIRI const& target,
                     provider::StorageIRI const& scratch, provider::ByteStreamOpenOptions const& options);
    ~LocalTransaction() override;

protected:
    void doClose(provider::StreamClosePolicy const& policy) override;
    provider::ByteStream* doByteStream() override { return &content_; }

private:
    /// Its file stays open when it is closed, for the commit to sync it.
    class Content final : public DescriptorStream
    {
    public:
        Content(FileDescriptor const& file, std::string path, provider::ByteStreamAccess access);

    protected:
        long doRead(char* buffer, long count) override;
        void doClose() override { forgetDescriptor(); }

    private:
        bool const isReadable_;
    };

    void finish(provider::StreamClosePolicy policy);

    std::shared_ptr<Settings const> const settings_;
    ScratchFile file_;
    Content content_;
    std::atomic<bool> closed_{false};
};

} // namespace foundation::storage::local::detail
