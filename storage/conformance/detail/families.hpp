#pragma once

#include <storage/conformance/Check.hpp>

#include <vector>

namespace foundation::storage::conformance::detail {

std::vector<Check> creationChecks();
std::vector<Check> existenceChecks();
std::vector<Check> removalChecks();
std::vector<Check> attributesChecks();
std::vector<Check> locationChecks();
std::vector<Check> nameChecks();
std::vector<Check> listingChecks();
std::vector<Check> patternChecks();
std::vector<Check> openOptionsChecks();
std::vector<Check> streamChecks();
std::vector<Check> transactionChecks();
std::vector<Check> moveFileChecks();
std::vector<Check> moveFolderChecks();
std::vector<Check> copyFileChecks();
std::vector<Check> atomicCopyChecks();
std::vector<Check> changeEventChecks();
std::vector<Check> concurrencyChecks();
std::vector<Check> readOnlyChecks();
std::vector<Check> itemCopyChecks();

/// Each family stands in a file of its own in suites/.
inline constexpr std::vector<Check> (*families[])() = {
    creationChecks,    existenceChecks,   removalChecks,    attributesChecks,  locationChecks,
    nameChecks,        listingChecks,     patternChecks,    openOptionsChecks, streamChecks,
    transactionChecks, moveFileChecks,    moveFolderChecks, copyFileChecks,    atomicCopyChecks,
    changeEventChecks, concurrencyChecks, readOnlyChecks,   itemCopyChecks,
};

std::vector<Check> copyPolicyChecks(Harness const& source);
std::vector<Check> copyInterruptionChecks(Harness const& source);
std::vector<Check> copyFaultChecks(Harness const& source);
std::vector<Check> copyStreamChecks(Harness const& source);
std::vector<Check> copyConcurrencyChecks(Harness const& source);

/// The same for copies from one provider to another.
inline constexpr std::vector<Check> (*copyFamilies[])(Harness const& source) = {
    copyPolicyChecks, copyInterruptionChecks, copyFaultChecks, copyStreamChecks, copyConcurrencyChecks,
};

} // namespace foundation::storage::conformance::detail
