#include <storage/conformance/detail/copyFaults.hpp>

#include <utility>

namespace foundation::storage::conformance::detail {

using namespace provider;

std::shared_ptr<FaultInjectingProvider> withFaults(Scene const& scene, FaultPlan plan)
{
    plan.code = injected;
    return std::make_shared<FaultInjectingProvider>(scene.shared(), std::move(plan));
}

std::optional<CopyFailure> failureOfSource(std::string const& operation, CopyScene const& scene)
{
    if (operation.empty() || operation == "close")
        return std::nullopt;
    return CopyFailure{operation == "read" ? ErrorCode::IOError : injected, scene.from().getLocation()};
}

/// A write names the destination. What a transaction does at its end fails where it happens: a stream failure names the
/// source then, any other one the scratch file.
std::optional<CopyFailure> failureOfDestination(std::string const& operation, CopyMode mode, CopyScene const& scene)
{
    if (operation.empty() || (operation == "close" && !mode.isAtomic()))
        return std::nullopt;
    StorageIRI const to = scene.to().getLocation();
    if (operation == "write")
        return CopyFailure{ErrorCode::IOError, to};
    if (operation == "close" || operation == "commit" || operation == "abort")
        return CopyFailure{injected, scene.from().getLocation()};
    bool const ofScratchFile = operation == "openStream" || operation == "moveFile" || operation == "removeFile";
    return CopyFailure{injected, to, mode.isAtomic() && ofScratchFile};
}

testing::AssertionResult isContained(CopyScene const& scene, CopyMode mode, CopyOutcome const& outcome)
{
    if (outcome.status == TransactionStatus::Completed)
        return scene.isCopied();
    return mode.isAtomic() ? scene.isUntouched() : scene.hasNothingElse();
}

void forEachFailure(Scene const& scene, FaultPlan plan,
                    std::function<CopyOutcome(std::shared_ptr<IProvider> const& faulty)> const& attempt,
                    std::function<void(CopyOutcome const& outcome, std::string const& operation)> const& judge)
{
    bool fails = true;
    for (plan.failing = 1; fails; ++plan.failing) {
        auto const faulty = withFaults(scene, plan);
        CopyOutcome const outcome = attempt(faulty);
        fails = faulty->faults() != 0;
        std::string const operation = fails ? faulty->operations().at(plan.failing - 1) : "";
        SCOPED_TRACE(testing::Message() << (fails ? "when " + operation + " fails" : "when nothing fails")
                                        << (plan.composeTransactions ? ", transaction composed" : ""));
        judge(outcome, operation);
    }
}

} // namespace foundation::storage::conformance::detail
