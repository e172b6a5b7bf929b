// Copies from one provider to another over streams that do no more than they must, or less.

#include <storage/conformance/detail/CopyFamily.hpp>
#include <storage/conformance/detail/CopyScene.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/copyFaults.hpp>
#include <storage/conformance/detail/families.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr std::size_t twoChunks = copyChunk + 4097;

/// Bytes at which streams fail: round the start, the page, the chunk and the end.
constexpr std::array<std::uint64_t, 8> failingBytes{
    0, 1, 4096, copyChunk - 1, copyChunk, copyChunk + 1, twoChunks - 1, twoChunks};

/// Copies in every mode, onto an old file and onto none by turns, between providers with these faults.
template <typename Judge>
void forEachCopy(CopyScene& scene, FaultPlan const& sourcePlan, FaultPlan const& destinationPlan, Judge const& judge)
{
    for (CopyMode const mode : copyModes) {
        SCOPED_TRACE(mode);
        scene.prepare(copyDestinations.at(mode.interruptible ? 0 : 1));
        judge(copied(scene.from(withFaults(scene.source(), sourcePlan)),
                     scene.to(withFaults(scene.destination(), destinationPlan)), mode.options()),
              mode);
    }
}

void expectFailure(CopyScene& scene, FaultPlan const& sourcePlan, FaultPlan const& destinationPlan,
                   CopyFailure const& failure)
{
    forEachCopy(scene, sourcePlan, destinationPlan, [&](CopyOutcome const& outcome, CopyMode mode) {
        EXPECT_TRUE(outcome.is(failure));
        EXPECT_TRUE(isContained(scene, mode, outcome));
    });
}

void expectCopied(CopyScene& scene, FaultPlan const& sourcePlan, FaultPlan const& destinationPlan)
{
    forEachCopy(scene, sourcePlan, destinationPlan, [&](CopyOutcome const& outcome, CopyMode) {
        EXPECT_TRUE(outcome.is(TransactionStatus::Completed));
        EXPECT_TRUE(scene.isCopied());
    });
}

void readingThatFailsAtAByteNamesTheSource(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(twoChunks));
    for (std::uint64_t const byte : failingBytes) {
        SCOPED_TRACE(testing::Message() << "at byte " << byte);
        expectFailure(scene, {.readFailsAfter = byte}, {}, {ErrorCode::IOError, scene.from().getLocation()});
    }
}

void aSourceThatCannotBeReadAtAllChangesNothing(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, "content");
    forEachCopy(scene, {.readFailsAfter = 0}, {},
                [&](CopyOutcome const&, CopyMode) { EXPECT_TRUE(scene.isUntouched()); });
}

void writingThatFailsAtAByteNamesTheDestination(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(twoChunks));
    for (std::uint64_t const byte : failingBytes)
        for (bool const composed : {false, true}) {
            if (byte == twoChunks)
                continue;
            SCOPED_TRACE(testing::Message() << "at byte " << byte);
            expectFailure(scene, {}, {.writeFailsAfter = byte, .composeTransactions = composed},
                          {ErrorCode::IOError, scene.to().getLocation()});
        }
}

void shortReadsAreCopiedWhole(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(twoChunks));
    for (long const longest : {100003L, 524288L})
        expectCopied(scene, {.longestRead = longest}, {});
}

void aReadOfNothingNamesTheSource(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, "content");
    expectFailure(scene, {.longestRead = 0}, {}, {ErrorCode::IOError, scene.from().getLocation()});
}

void aShortWriteNamesTheDestination(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(twoChunks));
    for (long const longest : {0L, 1L, 4096L, static_cast<long>(copyChunk) - 1})
        for (bool const composed : {false, true})
            expectFailure(scene, {}, {.longestWrite = longest, .composeTransactions = composed},
                          {ErrorCode::IOError, scene.to().getLocation()});
}

void aSourceThatFailsToCloseIsCopiedAllTheSame(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, "content");
    expectCopied(scene, {.closeFails = true}, {});
}

/// The plain destination has its content before it is closed; the transaction that cannot be closed never commits.
void aDestinationThatFailsToCloseIsNotReplacedAtomically(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, "content");
    for (bool const composed : {false, true})
        forEachCopy(scene, {}, {.closeFails = true, .composeTransactions = composed},
                    [&](CopyOutcome const& outcome, CopyMode mode) {
                        EXPECT_TRUE(outcome.is(failureOfDestination("close", mode, scene)));
                        if (composed)
                            scene.removeScratchFiles();
                        EXPECT_TRUE(isContained(scene, mode, outcome));
                    });
}

void sizesAreNotBelieved(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(twoChunks));
    for (std::uint64_t const claimed : {std::uint64_t{0}, std::uint64_t{copyChunk}, std::uint64_t{1} << 40})
        expectCopied(scene, {.claimedSize = claimed}, {.claimedSize = claimed});
}

} // namespace

std::vector<Check> copyStreamChecks(Harness const& source)
{
    return copyFamily("CopyStreams", source,
                      {
                          COPY_CHECK_FUNCTION(readingThatFailsAtAByteNamesTheSource),
                          COPY_CHECK_FUNCTION(aSourceThatCannotBeReadAtAllChangesNothing),
                          COPY_CHECK_FUNCTION(writingThatFailsAtAByteNamesTheDestination),
                          COPY_CHECK_FUNCTION(shortReadsAreCopiedWhole),
                          COPY_CHECK_FUNCTION(aReadOfNothingNamesTheSource),
                          COPY_CHECK_FUNCTION(aShortWriteNamesTheDestination),
                          COPY_CHECK_FUNCTION(aSourceThatFailsToCloseIsCopiedAllTheSame),
                          COPY_CHECK_FUNCTION(aDestinationThatFailsToCloseIsNotReplacedAtomically),
                          COPY_CHECK_FUNCTION(sizesAreNotBelieved),
                      });
}

} // namespace foundation::storage::conformance::detail
