#pragma once

#include <foundation/export.hpp>
#include <storage/conformance/Harness.hpp>

#include <string>

namespace foundation::storage::conformance {

/// Registers with GoogleTest every check that applies, as the test `<provider>/<family>.<check>`; answers how many.
///
/// To be called before `RUN_ALL_TESTS`. `provider` names what is tested, in letters and digits.
FOUNDATION_API std::size_t registerConformance(std::string const& provider, Harness const& harness);

/// The same for copies from one provider to another, which may be of the same kind. The destination must be writable.
FOUNDATION_API std::size_t registerCopyConformance(std::string const& pair, Harness const& source,
                                                   Harness const& destination);

} // namespace foundation::storage::conformance

/// Registers the checks for a provider when the test program starts; to be written once per provider, at namespace
/// scope, with an expression for the harness.
#define FOUNDATION_STORAGE_CONFORMANCE(provider, harness)                                                              \
    [[maybe_unused]] static std::size_t const conformanceChecksOf##provider =                                          \
        ::foundation::storage::conformance::registerConformance(#provider, harness)

/// The same for copies from one provider to another: `FOUNDATION_STORAGE_COPY_CONFORMANCE(MineToLocal, mine(),
/// local());`
#define FOUNDATION_STORAGE_COPY_CONFORMANCE(pair, source, destination)                                                 \
    [[maybe_unused]] static std::size_t const conformanceChecksOf##pair =                                              \
        ::foundation::storage::conformance::registerCopyConformance(#pair, source, destination)
