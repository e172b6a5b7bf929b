#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Draft.hpp>
#include <storage/provider/StorageItem.hpp>
#include <storage/provider/TransactionalStream.hpp>

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

namespace foundation::storage::archive::detail {

/// What is to become of a file, all at once or not at all. Nothing is seen of it before it is committed, and what is
/// dropped leaves nothing behind.
///
/// Where the store cannot seek in what it writes, everything is put together in a temporary place first.
/// Errors: `Fault`.
class FOUNDATION_API RewriteTarget
{
public:
    /// `beforeCommit` throws a `Fault` to prevent it.
    RewriteTarget(provider::StorageItem const& file, std::function<void()> beforeCommit);
    ~RewriteTarget();
    RewriteTarget(RewriteTarget const&) = delete;
    RewriteTarget& operator=(RewriteTarget const&) = delete;

    void write(char const* data, std::size_t count);
    void seek(std::uint64_t position);
    std::uint64_t position() const { return position_; }
    std::uint64_t size() const { return size_; }

    /// May be tried once.
    void commit();

    /// Whether the store was told to put the file in place. It may have done so even when it says that it failed.
    bool isSent() const { return isSent_; }

private:
    void flushBuffer();
    void writeToStream(char const* data, std::size_t count);
    void sendDraft();

    std::function<void()> beforeCommit_;
    std::unique_ptr<provider::TransactionalStream> stream_;
    std::unique_ptr<Draft> draft_; ///< where the stream does not seek

    /// The part that is written most, so that going back a little costs nothing.
    std::vector<char> buffer_;
    std::uint64_t bufferBegin_ = 0;
    std::uint64_t streamPosition_ = 0;
    std::uint64_t position_ = 0;
    std::uint64_t size_ = 0;
    bool isSent_ = false;
};

} // namespace foundation::storage::archive::detail
