#pragma once

#include <storage/conformance/FaultInjectingProvider.hpp>
#include <storage/conformance/detail/CopyScene.hpp>

#include <functional>
#include <memory>
#include <optional>
#include <string>

namespace foundation::storage::conformance::detail {

/// The code of injected failures; none that a copy makes by itself.
inline constexpr provider::ErrorCode injected = provider::ErrorCode::ResourceInUse;

std::shared_ptr<FaultInjectingProvider> withFaults(Scene const& scene, FaultPlan plan);

/// What the interface says of a copy in which this operation of the source, or of the destination, fails; nothing where
/// the copy is none the worse for it.
std::optional<CopyFailure> failureOfSource(std::string const& operation, CopyScene const& scene);
std::optional<CopyFailure> failureOfDestination(std::string const& operation, CopyMode mode, CopyScene const& scene);

/// Whether the stores are as they have to be after a copy, failed or not.
testing::AssertionResult isContained(CopyScene const& scene, CopyMode mode, CopyOutcome const& outcome);

/// Makes a provider of which the first operation fails, then one of which the second does, and so on until none is left
/// to fail; `attempt` copies with it. `judge` gets what came of it, with the name of the operation that failed.
void forEachFailure(Scene const& scene, FaultPlan plan,
                    std::function<CopyOutcome(std::shared_ptr<provider::IProvider> const& faulty)> const& attempt,
                    std::function<void(CopyOutcome const& outcome, std::string const& operation)> const& judge);

} // namespace foundation::storage::conformance::detail
