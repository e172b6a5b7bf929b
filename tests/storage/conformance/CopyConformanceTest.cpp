#include <storage/conformance/registerConformance.hpp>
#include <tests/storage/conformance/LocalHarness.hpp>
#include <tests/storage/conformance/MemoryHarness.hpp>

namespace foundation::storage::conformance {

FOUNDATION_STORAGE_COPY_CONFORMANCE(MemoryToMemory, memoryHarness(), memoryHarness());
FOUNDATION_STORAGE_COPY_CONFORMANCE(MemoryToLocal, memoryHarness(), localHarness());
FOUNDATION_STORAGE_COPY_CONFORMANCE(LocalToMemory, localHarness(), memoryHarness());
FOUNDATION_STORAGE_COPY_CONFORMANCE(LocalToLocal, localHarness(), localHarness());

} // namespace foundation::storage::conformance
