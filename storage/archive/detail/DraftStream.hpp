#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Draft.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/StorageIRI.hpp>
#include <storage/provider/TransactionalStream.hpp>

#include <functional>
#include <memory>
#include <mutex>

namespace foundation::storage::archive::detail {

/// Writes a draft, and reads what it holds by then.
class FOUNDATION_API DraftStream final : public provider::ByteStream
{
public:
    struct Manner
    {
        bool isReadable = true;
        bool appends = false;
    };

    /// What the owner of the draft wants to know; neither may be empty.
    struct Watcher
    {
        std::function<void()> written; ///< after each write; a failure is one of writing
        std::function<void()> closed;  ///< once; a failure is one of closing
    };

    DraftStream(provider::StorageIRI const& iri, std::shared_ptr<Draft> draft, Manner manner, Watcher watcher);

    /// Closes, and keeps failures to itself.
    ~DraftStream() override;

protected:
    long doRead(char* buffer, long count) override;
    long doWrite(char const* data, long count) override;
    long doSeek(long offset, std::ios_base::seekdir direction) override;
    void doClose() override;

private:
    void requireOpen(char const* attempt, long count = 0) const;

    provider::StorageIRI const iri_;
    std::shared_ptr<Draft> const draft_;
    Manner const manner_;
    Watcher const watcher_;
    std::uint64_t position_ = 0;
    bool isOpen_ = true;
};

/// A draft that becomes the content of a file when it is committed, and never else.
class FOUNDATION_API DraftTransaction final : public provider::TransactionalStream
{
public:
    DraftTransaction(provider::StorageIRI const& iri, std::shared_ptr<Draft> draft, DraftStream::Manner manner,
                     std::function<void()> commit);

protected:
    void doClose(provider::StreamClosePolicy const& policy) override;
    provider::ByteStream* doByteStream() override { return &stream_; }

private:
    std::mutex mutex_;
    bool isClosed_ = false;
    std::function<void()> commit_;
    DraftStream stream_;
};

} // namespace foundation::storage::archive::detail
