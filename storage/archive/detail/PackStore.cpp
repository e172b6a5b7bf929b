#include <storage/archive/detail/PackStore.hpp>

#include <cstring>

namespace foundation::storage::archive::detail {

namespace {

/// Of most file systems, which give only whole ones back.
constexpr std::uint64_t block = 4096;

std::uint64_t wholeBlocks(std::uint64_t size)
{
    return (size + block - 1) / block * block;
}

} // namespace

PackStore::Piece PackStore::keep(char const* data, std::size_t count)
{
    Piece piece;
    piece.size = count;
    {
        std::lock_guard const lock(mutex_);
        if (count <= memoryLeft_) {
            piece.memory.assign(data, data + count);
            memoryLeft_ -= count;
            return piece;
        }
    }
    TemporaryFile& file = reserve(count, piece.offset);
    try {
        file.writeAt(piece.offset, data, count);
    } catch (...) {
        drop(piece);
        throw;
    }
    return piece;
}

TemporaryFile& PackStore::reserve(std::size_t count, std::uint64_t& offset)
{
    std::lock_guard const lock(mutex_);
    if (file_ == nullptr)
        file_ = std::make_unique<TemporaryFile>();
    offset = fileSize_;
    fileSize_ += wholeBlocks(count);
    ++piecesInFile_;
    return *file_;
}

void PackStore::read(Piece const& piece, std::size_t offset, char* buffer, std::size_t count) const
{
    if (!piece.memory.empty()) {
        std::memcpy(buffer, piece.memory.data() + offset, count);
        return;
    }
    TemporaryFile const* file;
    {
        std::lock_guard const lock(mutex_);
        file = file_.get();
    }
    file->readAt(piece.offset + offset, buffer, count);
}

void PackStore::drop(Piece const& piece) noexcept
{
    std::lock_guard const lock(mutex_);
    memoryLeft_ += piece.memory.size();
    if (!piece.memory.empty())
        return;
    file_->forget(piece.offset, wholeBlocks(piece.size));
    if (--piecesInFile_ > 0)
        return;
    file_.reset();
    fileSize_ = 0;
}

} // namespace foundation::storage::archive::detail
