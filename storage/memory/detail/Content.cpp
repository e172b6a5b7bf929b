#include <storage/memory/detail/Content.hpp>

#include <algorithm>
#include <cstring>

namespace foundation::storage::memory::detail {

namespace {

constexpr std::size_t blockSize = Content::blockSize;

/// The part of a range of bytes that lies in one block.
struct Piece
{
    std::size_t block;
    std::size_t offset;
    std::size_t count;
};

Piece firstPiece(std::uint64_t offset, std::size_t count)
{
    std::size_t const inBlock = offset % blockSize;
    return {offset / blockSize, inBlock, std::min(count, blockSize - inBlock)};
}

template <typename Step>
void forEachPiece(std::uint64_t offset, std::size_t count, Step const& step)
{
    while (count > 0) {
        Piece const piece = firstPiece(offset, count);
        step(piece);
        offset += piece.count;
        count -= piece.count;
    }
}

std::size_t blocksFor(std::uint64_t size)
{
    return (size + blockSize - 1) / blockSize;
}

void readBlock(Block const* block, std::size_t offset, char* buffer, std::size_t count)
{
    std::size_t const length = block == nullptr ? 0 : block->length();
    std::size_t const written = offset < length ? std::min(count, length - offset) : 0;
    if (written > 0)
        std::memcpy(buffer, block->data() + offset, written);
    std::memset(buffer + written, 0, count - written);
}

} // namespace

std::size_t Content::read(std::uint64_t offset, char* buffer, std::size_t count) const noexcept
{
    if (offset >= size_)
        return 0;
    count = std::min<std::uint64_t>(count, size_ - offset);
    forEachPiece(offset, count, [&](Piece const& piece) {
        readBlock(blocks_[piece.block].get(), piece.offset, buffer, piece.count);
        buffer += piece.count;
    });
    return count;
}

void Content::write(std::uint64_t offset, char const* data, std::size_t count)
{
    std::uint64_t const end = offset + count;
    if (blocks_.size() < blocksFor(end))
        blocks_.resize(blocksFor(end));
    // Everything that can fail comes first.
    forEachPiece(offset, count, [&](Piece const& piece) { makeWritable(piece.block, piece.offset + piece.count); });
    forEachPiece(offset, count, [&](Piece const& piece) {
        blocks_[piece.block]->write(piece.offset, data, piece.count);
        data += piece.count;
    });
    size_ = std::max(size_, end);
}

void Content::makeWritable(std::size_t index, std::size_t end)
{
    BlockPtr& block = blocks_[index];
    std::size_t const length = block ? block->length() : 0;
    if (block && block->isUnshared() && end <= block->capacity())
        return;
    bool const grows = length > 0 && end > length;
    BlockPtr const larger = Block::create(std::min(blockSize, std::max({end, length, grows ? 2 * length : 0})));
    if (length > 0)
        larger->write(0, block->data(), length);
    block = larger;
}

void Content::extendFrom(Content const& source, std::uint64_t size)
{
    auto const first = source.blocks_.begin();
    blocks_.insert(blocks_.end(), first + static_cast<std::ptrdiff_t>(blocks_.size()),
                   first + static_cast<std::ptrdiff_t>(blocksFor(size)));
    size_ = size;
}

} // namespace foundation::storage::memory::detail
