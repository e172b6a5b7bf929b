#include <storage/memory/MemoryProvider.hpp>

#include <storage/conformance/registerConformance.hpp>
#include <tests/storage/conformance/MemoryHarness.hpp>

namespace foundation::storage::conformance {

FOUNDATION_STORAGE_CONFORMANCE(Memory, memoryHarness());

} // namespace foundation::storage::conformance
