#include <storage/conformance/registerConformance.hpp>
#include <tests/storage/conformance/LocalHarness.hpp>

namespace foundation::storage::conformance {

FOUNDATION_STORAGE_CONFORMANCE(Local, localHarness());
FOUNDATION_STORAGE_CONFORMANCE(ConfinedLocal, confinedLocalHarness());

} // namespace foundation::storage::conformance
