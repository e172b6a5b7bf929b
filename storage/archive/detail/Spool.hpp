#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Source.hpp>
#include <storage/archive/detail/TemporaryFile.hpp>

#include <cstdint>
#include <memory>
#include <vector>

namespace foundation::storage::archive::detail {

/// A copy of a stream that can be read only from its beginning to its end.
///
/// It is kept in memory up to a limit, and beyond that in a temporary file.
class FOUNDATION_API Spool final : public Source
{
public:
    /// Reads the stream to its end. Throws `Fault`.
    Spool(provider::ByteStream& stream, ArchiveLimits const& limits);
    ~Spool() override;

    std::uint64_t size() const override { return size_; }
    std::size_t readAt(std::uint64_t offset, char* buffer, std::size_t count) const override;

    bool isInMemory() const { return file_ == nullptr; }

private:
    void append(char const* data, std::size_t count, ArchiveLimits const& limits);
    void moveToFile();

    std::vector<char> memory_;
    std::uint64_t size_ = 0;
    std::unique_ptr<TemporaryFile> file_;
};

} // namespace foundation::storage::archive::detail
