#pragma once

#include <foundation/export.hpp>

#include <boost/smart_ptr/intrusive_ptr.hpp>

#include <atomic>
#include <cstddef>
#include <cstdint>

namespace foundation::storage::memory::detail {

class Block;
using BlockPtr = boost::intrusive_ptr<Block>;

FOUNDATION_API void intrusive_ptr_add_ref(Block* block) noexcept;
FOUNDATION_API void intrusive_ptr_release(Block* block) noexcept;

/// A piece of a file's content: its bytes in one allocation with their count.
///
/// Threads: a block that several contents hold is only read. Whoever finds itself the only holder may change it.
class FOUNDATION_API Block
{
public:
    /// An empty block with room for so many bytes.
    static BlockPtr create(std::size_t capacity);

    /// Whether nobody else holds it. What others did while they held it has happened before.
    bool isUnshared() const noexcept { return holders_.load(std::memory_order_acquire) == 1; }

    std::size_t capacity() const noexcept { return capacity_; }

    /// How many bytes have been written; what follows reads as zeros.
    std::size_t length() const noexcept { return length_; }

    char const* data() const noexcept { return reinterpret_cast<char const*>(this + 1); }

    /// Writes within the capacity; what is skipped becomes zeros.
    void write(std::size_t offset, char const* data, std::size_t count) noexcept;

private:
    friend FOUNDATION_API void intrusive_ptr_add_ref(Block* block) noexcept;
    friend FOUNDATION_API void intrusive_ptr_release(Block* block) noexcept;

    explicit Block(std::uint32_t capacity) noexcept : capacity_(capacity) {}

    std::atomic<std::uint32_t> holders_ = 0;
    std::uint32_t capacity_;
    std::uint32_t length_ = 0;
};

} // namespace foundation::storage::memory::detail
