// Copies between two items of one provider, which choose between the provider's own copies and a buffer.

#include <storage/conformance/detail/CopyScene.hpp>
#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/copyFaults.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/policies.hpp>

#include <algorithm>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr std::size_t twoChunks = copyChunk + 1;

void everyPolicyHoldsInEveryMode(Harness const& harness)
{
    CopyScene scene(harness, someContent(twoChunks));
    for (CopyMode const mode : copyModes)
        for (ReplacementPolicy const policy : allPolicies)
            for (Tree const& before : copyDestinations) {
                SCOPED_TRACE(testing::Message() << mode << ", " << policy);
                scene.prepare(before);
                bool const preserves =
                    std::find(preservingPolicies.begin(), preservingPolicies.end(), policy) != preservingPolicies.end();
                CopyOutcome const outcome = copied(scene.from(), scene.to(), mode.options(policy));
                if (preserves && before.contains(u"to")) {
                    EXPECT_TRUE(outcome.is(CopyFailure{ErrorCode::ResourceAlreadyExists, scene.to().getLocation()}));
                    EXPECT_TRUE(scene.isUntouched());
                } else {
                    EXPECT_TRUE(outcome.is(TransactionStatus::Completed));
                    EXPECT_TRUE(scene.isCopied());
                }
            }
}

void anAtomicCopyOntoItselfChangesNothing(Harness const& harness)
{
    CopyScene scene(harness, someContent(twoChunks));
    scene.prepare({});
    for (bool const interruptible : {false, true}) {
        CopyMode const mode{TransactionPolicy::Atomic, interruptible};
        EXPECT_TRUE(copied(scene.from(), scene.from(), mode.options()).is(TransactionStatus::Completed));
        EXPECT_TRUE(scene.isUntouched());
    }
}

void anInterruptionAtEveryChunkIsHeeded(Harness const& harness)
{
    CopyScene scene(harness, someContent(twoChunks));
    for (CopyMode const mode : copyModes) {
        bool const native = mode.isAtomic() && harness.capabilities.atomicCopy;
        int const chunks = mode.interruptible ? native ? 1 : 2 : 0;
        for (int chunk = 1; chunk <= chunks; ++chunk) {
            scene.prepare(copyDestinations[0]);
            int asked = 0;
            EXPECT_TRUE(copied(scene.from(), scene.to(),
                               {ReplacementPolicy::Overwrite, mode.transaction, interruptAt(chunk, asked)})
                            .is(TransactionStatus::Aborted));
            EXPECT_EQ(asked, chunk);
            EXPECT_TRUE(mode.isAtomic() ? scene.isUntouched()
                                        : scene.isCopiedUpTo(static_cast<std::size_t>(chunk) * copyChunk));
        }
    }
}

/// The source is closed last, when the copy is done.
std::optional<CopyFailure> failureOf(std::string const& operation, bool isLast, CopyMode mode, CopyScene const& scene)
{
    if (operation == "copyFile" || operation == "copyFileAtomic" || operation == "openReadOnlyStream" ||
        operation == "read")
        return failureOfSource(operation, scene);
    return isLast ? std::nullopt : failureOfDestination(operation, mode, scene);
}

void everyFailureIsToldAndContained(Harness const& harness)
{
    CopyScene scene(harness, someContent(twoChunks));
    for (bool const composed : {false, true})
        for (CopyMode const mode : copyModes) {
            SCOPED_TRACE(mode);
            bool isDone = false;
            forEachFailure(
                scene.destination(), {.composeTransactions = composed},
                [&](std::shared_ptr<IProvider> const& faulty) {
                    scene.prepare(copyDestinations[0]);
                    CopyOutcome outcome = copied(scene.from(faulty), scene.to(faulty), mode.options());
                    isDone = outcome.status.has_value();
                    return outcome;
                },
                [&](CopyOutcome const& outcome, std::string const& operation) {
                    EXPECT_TRUE(outcome.is(failureOf(operation, isDone && operation == "close", mode, scene)));
                    EXPECT_TRUE(isContained(scene, mode, outcome));
                });
        }
}

} // namespace

std::vector<Check> itemCopyChecks()
{
    return Family("ItemCopy")
        .forWritable({
            CHECK_FUNCTION(everyPolicyHoldsInEveryMode),
            CHECK_FUNCTION(anAtomicCopyOntoItselfChangesNothing),
            CHECK_FUNCTION(anInterruptionAtEveryChunkIsHeeded),
            CHECK_FUNCTION(everyFailureIsToldAndContained),
        })
        .checks();
}

} // namespace foundation::storage::conformance::detail
