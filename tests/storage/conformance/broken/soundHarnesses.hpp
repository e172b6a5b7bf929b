#pragma once

#include <storage/conformance/Harness.hpp>
#include <tests/storage/conformance/LocalHarness.hpp>
#include <tests/storage/conformance/MemoryHarness.hpp>

namespace foundation::storage::conformance::broken {

/// A provider that overrides nothing but the pure operations, over local files.
Harness plainHarness();

/// A provider that never changes.
Harness readOnlyHarness();

/// Local files, links among them, with recursive listing and removal, and without patterns.
Harness recursiveHarness();

/// Local files, links among them, with atomic copies.
Harness atomicHarness();

/// Stores that do not tell names apart by letter case, or by normalisation.
Harness caselessHarness();
Harness unnormalisedHarness();

/// A store in which "." and ".." name nothing.
Harness dotlessHarness();

/// A store that cannot hold the name "con".
Harness pickyHarness();

} // namespace foundation::storage::conformance::broken
