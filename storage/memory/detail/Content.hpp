#pragma once

#include <foundation/export.hpp>
#include <storage/memory/detail/Block.hpp>

#include <cstddef>
#include <cstdint>
#include <vector>

namespace foundation::storage::memory::detail {

/// The bytes of a file, in blocks.
///
/// A copy shares the blocks, and whoever writes to a shared block first makes its own of it: a copy stays what it was,
/// and costs a pointer per block. Blocks nobody has written take no memory and read as zeros. Sizes are in bytes.
/// Threads: each copy is for one thread at a time; copies that share blocks are for several.
class FOUNDATION_API Content
{
public:
    /// What a write after a copy costs at most, and what a content of several blocks is made of.
    static constexpr std::size_t blockSize = std::size_t{256} * 1024;

    std::uint64_t size() const noexcept { return size_; }

    /// Reads up to `count` bytes; answers how many, 0 at the end and beyond.
    std::size_t read(std::uint64_t offset, char* buffer, std::size_t count) const noexcept;

    /// Writes all bytes, also beyond the end, where the gap becomes zeros.
    /// Throws `std::bad_alloc`; the content is then what it was.
    /// Cost: what is written, and one block for each end that lies in a shared one. A small content grows by doubling.
    void write(std::uint64_t offset, char const* data, std::size_t count);

    /// Becomes the first `size` bytes of `source`, whose beginning it has to be; `size` is a multiple of `blockSize` or
    /// all of the source.
    void extendFrom(Content const& source, std::uint64_t size);

private:
    void makeWritable(std::size_t index, std::size_t end);

    std::vector<BlockPtr> blocks_;
    std::uint64_t size_ = 0;
};

} // namespace foundation::storage::memory::detail
