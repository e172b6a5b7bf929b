#pragma once

#include <cstdint>

namespace bench {

/// Allocations by `operator new` of this process so far.
std::uint64_t allocations();

/// Bytes that the heap has handed out and not got back, its own overhead included.
std::uint64_t heapBytes();

} // namespace bench
