#pragma once

#include <foundation/export.hpp>
#include <storage/memory/detail/Tree.hpp>
#include <storage/provider/ByteStream.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/StorageIRI.hpp>

#include <cstdint>
#include <memory>
#include <string>
#include <system_error>

namespace foundation::storage::memory::detail {

/// A stream that is closed or cannot hold what it is given: what was attempted, where, and why it failed.
class FOUNDATION_API MemoryStreamFailure final : public provider::ByteStreamFailure
{
public:
    MemoryStreamFailure(std::string const& attempt, StorageIRI const& iri, std::errc error);

    core::except::IException* clone() const override;
    [[noreturn]] void rethrow() const override;
};

/// What the streams of a file have in common: a position, which may lie beyond the end, until they are closed.
class MemoryStream : public provider::ByteStream
{
protected:
    explicit MemoryStream(StorageIRI const& iri) : iri_(iri) {}

    long doSeek(long offset, std::ios_base::seekdir direction) final;

    /// Throws for a closed stream and for a negative count.
    void requireOpen(char const* attempt, long count = 0) const;

    virtual std::uint64_t size() const = 0;

    StorageIRI const iri_;
    std::uint64_t position_ = 0;
    bool open_ = true;
};

/// Reads the content that a file had when it was opened.
class MemoryReadStream final : public MemoryStream
{
public:
    MemoryReadStream(StorageIRI const& iri, Content content);

protected:
    long doRead(char* buffer, long count) override;
    [[noreturn]] long doWrite(char const* data, long count) override;
    void doClose() override;
    std::uint64_t size() const override { return content_.size(); }

private:
    Content content_;
};

/// Writes to a file, and reads what it holds by then, wherever it has been moved and even when it has been removed.
class MemoryWriteStream final : public MemoryStream
{
public:
    MemoryWriteStream(std::shared_ptr<Tree> tree, StorageIRI const& iri, Tree::OpenedFile opened, bool appends);
    ~MemoryWriteStream() override;

protected:
    long doRead(char* buffer, long count) override;

    /// Writes everything or fails.
    long doWrite(char const* data, long count) override;

    /// Tells those who want to know that the file was modified, if it was.
    void doClose() override;
    std::uint64_t size() const override { return file_->size(); }

private:
    void finish() noexcept;

    std::shared_ptr<Tree> tree_;
    FilePtr file_;
    bool changed_;
    bool const appends_;
};

} // namespace foundation::storage::memory::detail
