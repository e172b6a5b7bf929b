#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/Fault.hpp>

#include <cstddef>
#include <cstdint>

namespace foundation::storage::archive::detail {

/// A file without a name in the folder for temporary files; it goes with the program at the latest.
///
/// Errors: `Fault` with `Reason::StoreFailed`.
/// Threads: any number at once, on parts of the file that differ.
class FOUNDATION_API TemporaryFile
{
public:
    TemporaryFile();
    ~TemporaryFile();
    TemporaryFile(TemporaryFile const&) = delete;
    TemporaryFile& operator=(TemporaryFile const&) = delete;

    void writeAt(std::uint64_t offset, char const* data, std::size_t count);

    /// All of `count` bytes, which must be there.
    void readAt(std::uint64_t offset, char* buffer, std::size_t count) const;

    /// Gives the space of a part back, where the file system can do that.
    void forget(std::uint64_t offset, std::uint64_t count) noexcept;

private:
    int file_;
};

} // namespace foundation::storage::archive::detail
