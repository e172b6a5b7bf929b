// Copies from one provider to another in which one operation fails, whichever it is.

#include <storage/conformance/detail/CopyFamily.hpp>
#include <storage/conformance/detail/CopyScene.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/copyFaults.hpp>
#include <storage/conformance/detail/families.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr std::size_t twoChunks = copyChunk + 1;

using Faulty = std::shared_ptr<IProvider>;

void everyFailureOfTheSourceIsToldAndContained(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(twoChunks));
    for (Tree const& before : copyDestinations)
        for (CopyMode const mode : copyModes) {
            SCOPED_TRACE(mode);
            forEachFailure(
                scene.source(), {},
                [&](Faulty const& faulty) {
                    scene.prepare(before);
                    return copied(scene.from(faulty), scene.to(), mode.options());
                },
                [&](CopyOutcome const& outcome, std::string const& operation) {
                    EXPECT_TRUE(outcome.is(failureOfSource(operation, scene)));
                    EXPECT_TRUE(isContained(scene, mode, outcome));
                });
        }
}

/// A plain stream that could not be closed may have lost what was written to it.
bool mayHaveLostContent(std::string const& operation, CopyMode mode)
{
    return operation == "close" && !mode.isAtomic();
}

void everyFailureOfTheDestinationIsToldAndContained(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(twoChunks));
    for (bool const composed : {false, true})
        for (Tree const& before : copyDestinations)
            for (CopyMode const mode : copyModes) {
                SCOPED_TRACE(mode);
                forEachFailure(
                    scene.destination(), {.composeTransactions = composed},
                    [&](Faulty const& faulty) {
                        scene.prepare(before);
                        return copied(scene.from(), scene.to(faulty), mode.options());
                    },
                    [&](CopyOutcome const& outcome, std::string const& operation) {
                        EXPECT_TRUE(outcome.is(failureOfDestination(operation, mode, scene)));
                        EXPECT_TRUE(mayHaveLostContent(operation, mode) ? scene.hasNothingElse()
                                                                        : isContained(scene, mode, outcome));
                    });
            }
}

void everyFailureOfAnInterruptedCopyIsContained(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(twoChunks));
    CopyMode const mode{TransactionPolicy::Atomic, true};
    for (bool const composed : {false, true})
        for (Tree const& before : copyDestinations)
            forEachFailure(
                scene.destination(), {.composeTransactions = composed},
                [&](Faulty const& faulty) {
                    scene.prepare(before);
                    int asked = 0;
                    return copied(scene.from(), scene.to(faulty),
                                  {ReplacementPolicy::Overwrite, mode.transaction, interruptAt(1, asked)});
                },
                [&](CopyOutcome const& outcome, std::string const& operation) {
                    EXPECT_TRUE(operation.empty() ? outcome.is(TransactionStatus::Aborted)
                                                  : outcome.is(failureOfDestination(operation, mode, scene)));
                    EXPECT_TRUE(scene.isUntouched());
                });
}

void fromAnyOperationOnABrokenDestinationKeepsTheOldFile(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(twoChunks));
    for (bool const composed : {false, true})
        for (Tree const& before : copyDestinations)
            for (bool const interruptible : {false, true}) {
                CopyMode const mode{TransactionPolicy::Atomic, interruptible};
                forEachFailure(
                    scene.destination(), {.broken = true, .composeTransactions = composed},
                    [&](Faulty const& faulty) {
                        scene.prepare(before);
                        return copied(scene.from(), scene.to(faulty), mode.options());
                    },
                    [&](CopyOutcome const& outcome, std::string const& operation) {
                        EXPECT_TRUE(outcome.is(failureOfDestination(operation, mode, scene)));
                        scene.removeScratchFiles();
                        EXPECT_TRUE(isContained(scene, mode, outcome));
                    });
            }
}

} // namespace

std::vector<Check> copyFaultChecks(Harness const& source)
{
    return copyFamily("CopyFaults", source,
                      {
                          COPY_CHECK_FUNCTION(everyFailureOfTheSourceIsToldAndContained),
                          COPY_CHECK_FUNCTION(everyFailureOfTheDestinationIsToldAndContained),
                          COPY_CHECK_FUNCTION(everyFailureOfAnInterruptedCopyIsContained),
                          COPY_CHECK_FUNCTION(fromAnyOperationOnABrokenDestinationKeepsTheOldFile),
                      });
}

} // namespace foundation::storage::conformance::detail
