#pragma once

#include <storage/conformance/Harness.hpp>

namespace foundation::storage::conformance {

/// Tries the provider of this machine's files in a temporary folder.
Harness localHarness();

/// The same, confined to that folder.
Harness confinedLocalHarness();

} // namespace foundation::storage::conformance
