#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Source.hpp>
#include <storage/provider/FileAttributes.hpp>

#include <condition_variable>
#include <cstddef>
#include <memory>
#include <mutex>
#include <vector>

namespace foundation::storage::archive::detail {

/// Reads a file through as many of its streams as are read at once.
///
/// Streams that are opened later find the file as it was. Once it is another one, readers take turns with the streams
/// that there are, and fail with `Reason::Changed` when there is none.
class FOUNDATION_API StreamSource final : public Source
{
public:
    using Stream = std::unique_ptr<provider::ByteStream>;

    StreamSource(provider::StorageItem const& file, Stream first, std::uint64_t size);
    ~StreamSource() override;

    std::uint64_t size() const override { return size_; }
    std::size_t readAt(std::uint64_t offset, char* buffer, std::size_t count) const override;

private:
    Stream borrow() const;
    Stream openAnother() const;
    void giveBack(Stream stream) const noexcept;

    provider::StorageItem file_;
    provider::FileAttributes attributes_;
    std::uint64_t size_;
    mutable std::mutex mutex_;
    mutable std::condition_variable returned_;
    mutable std::vector<Stream> idle_;
    mutable std::size_t lent_ = 0;
    mutable bool isReplaced_ = false; ///< the file is another one by now
};

} // namespace foundation::storage::archive::detail
