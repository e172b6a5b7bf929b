#include <storage/memory/detail/Block.hpp>

#include <algorithm>
#include <cstring>
#include <new>

namespace foundation::storage::memory::detail {

void intrusive_ptr_add_ref(Block* block) noexcept
{
    block->holders_.fetch_add(1, std::memory_order_relaxed);
}

void intrusive_ptr_release(Block* block) noexcept
{
    if (block->holders_.fetch_sub(1, std::memory_order_acq_rel) != 1)
        return;
    block->~Block();
    ::operator delete(block);
}

BlockPtr Block::create(std::size_t capacity)
{
    void* const memory = ::operator new(sizeof(Block) + capacity);
    return BlockPtr(new (memory) Block(static_cast<std::uint32_t>(capacity)));
}

void Block::write(std::size_t offset, char const* data, std::size_t count) noexcept
{
    char* const bytes = reinterpret_cast<char*>(this + 1);
    if (offset > length_)
        std::memset(bytes + length_, 0, offset - length_);
    std::memcpy(bytes + offset, data, count);
    length_ = static_cast<std::uint32_t>(std::max<std::size_t>(length_, offset + count));
}

} // namespace foundation::storage::memory::detail
