#include <storage/conformance/registerConformance.hpp>
#include <tests/storage/conformance/LocalHarness.hpp>

namespace foundation::storage::conformance {

FOUNDATION_STORAGE_CONFORMANCE(Local, localHarness());

} // namespace foundation::storage::conformance
