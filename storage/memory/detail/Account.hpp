#pragma once

#include <foundation/export.hpp>

#include <atomic>
#include <cstdint>
#include <limits>

namespace foundation::storage::memory::detail {

/// What the files of a tree take together, in bytes of content, and the limit to it.
///
/// Threads: any number at once.
class FOUNDATION_API Account
{
public:
    static constexpr std::uint64_t unlimited = std::numeric_limits<std::uint64_t>::max();

    /// Takes what a file grows by; answers false, and takes nothing, where that is beyond the limit.
    [[nodiscard]] bool charge(std::uint64_t bytes) noexcept;

    /// Gives back what was taken.
    void release(std::uint64_t bytes) noexcept { used_ -= bytes; }

    /// A limit below what is in use takes nothing away; it refuses growth.
    void setLimit(std::uint64_t bytes) noexcept { limit_ = bytes; }

    std::uint64_t used() const noexcept { return used_; }

private:
    std::atomic<std::uint64_t> used_ = 0;
    std::atomic<std::uint64_t> limit_ = unlimited;
};

} // namespace foundation::storage::memory::detail
