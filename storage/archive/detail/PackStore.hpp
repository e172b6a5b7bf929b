#pragma once

#include <foundation/export.hpp>
#include <storage/archive/detail/TemporaryFile.hpp>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <vector>

namespace foundation::storage::archive::detail {

/// Where packed content is kept that is in no archive yet: in memory up to a limit for all of it, beyond that in one
/// temporary file.
///
/// Threads: any number at once.
class FOUNDATION_API PackStore
{
public:
    /// A piece of content; `memory` is empty where it lies in the file.
    struct Piece
    {
        std::vector<char> memory = {};
        std::uint64_t offset = 0;
        std::size_t size = 0;
    };

    explicit PackStore(std::size_t memoryLimit) : memoryLeft_(memoryLimit) {}

    /// Throws `Fault`.
    Piece keep(char const* data, std::size_t count);

    void read(Piece const& piece, std::size_t offset, char* buffer, std::size_t count) const;
    void drop(Piece const& piece) noexcept;

private:
    TemporaryFile& reserve(std::size_t count, std::uint64_t& offset);

    mutable std::mutex mutex_;
    std::size_t memoryLeft_;
    std::unique_ptr<TemporaryFile> file_; ///< as long as a piece lies in it
    std::uint64_t fileSize_ = 0;
    std::size_t piecesInFile_ = 0;
};

} // namespace foundation::storage::archive::detail
