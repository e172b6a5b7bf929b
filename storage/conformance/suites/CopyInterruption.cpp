// Copies from one provider to another that are interrupted.

#include <storage/conformance/detail/CopyFamily.hpp>
#include <storage/conformance/detail/CopyScene.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/provider/InterruptSignal.hpp>

#include <stdexcept>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

/// Of three chunks; a copy asks after each whether to go on.
constexpr std::size_t severalChunks = 2 * copyChunk + 12345;

void afterEveryChunkAnAtomicCopyCanBeGivenUp(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(severalChunks));
    for (Tree const& before : copyDestinations) {
        scene.prepare(before);
        for (int chunk = 1; chunk <= 3; ++chunk) {
            int asked = 0;
            EXPECT_TRUE(copied(scene.from(), scene.to(),
                               {ReplacementPolicy::Overwrite, TransactionPolicy::Atomic, interruptAt(chunk, asked)})
                            .is(TransactionStatus::Aborted));
            EXPECT_EQ(asked, chunk);
            EXPECT_TRUE(scene.isUntouched()) << "interrupted after chunk " << chunk;
        }
    }
}

void afterEveryChunkAPlainCopyHasWhatWasCopied(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(severalChunks));
    for (Tree const& before : copyDestinations)
        for (std::size_t chunk = 1; chunk <= 3; ++chunk) {
            scene.prepare(before);
            int asked = 0;
            EXPECT_TRUE(copied(scene.from(), scene.to(),
                               {ReplacementPolicy::Overwrite, TransactionPolicy::NonAtomic,
                                interruptAt(static_cast<int>(chunk), asked)})
                            .is(TransactionStatus::Aborted));
            EXPECT_EQ(asked, static_cast<int>(chunk));
            EXPECT_TRUE(scene.isCopiedUpTo(chunk * copyChunk)) << "interrupted after chunk " << chunk;
        }
}

void aCopyThatIsNeverInterruptedAsksAfterEachChunk(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(severalChunks));
    for (auto const transaction : {TransactionPolicy::NonAtomic, TransactionPolicy::Atomic}) {
        scene.prepare({{u"to", "old"}});
        int asked = 0;
        EXPECT_TRUE(copied(scene.from(), scene.to(), {ReplacementPolicy::Overwrite, transaction, interruptAt(0, asked)})
                        .is(TransactionStatus::Completed));
        EXPECT_EQ(asked, 3);
        EXPECT_TRUE(scene.isCopied());
    }
}

/// One who interrupts at once does so before the copy has found out that there is nothing to copy.
void aCopyOfNothingCanBeInterrupted(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, "");
    for (Tree const& before : copyDestinations)
        for (auto const transaction : {TransactionPolicy::NonAtomic, TransactionPolicy::Atomic}) {
            scene.prepare(before);
            int asked = 0;
            EXPECT_TRUE(
                copied(scene.from(), scene.to(), {ReplacementPolicy::Overwrite, transaction, interruptAt(1, asked)})
                    .is(TransactionStatus::Aborted));
            EXPECT_TRUE(transaction == TransactionPolicy::Atomic ? scene.isUntouched() : scene.isCopied());
        }
}

void whatTheInterruptFunctionThrowsPasses(Harness const& source, Harness const& destination)
{
    CopyScene scene(source, destination, someContent(severalChunks));
    for (Tree const& before : copyDestinations)
        for (auto const transaction : {TransactionPolicy::NonAtomic, TransactionPolicy::Atomic})
            for (int chunk = 1; chunk <= 3; ++chunk) {
                scene.prepare(before);
                int asked = 0;
                auto const throwing = [&]() -> InterruptSignal {
                    return ++asked < chunk ? InterruptSignal::Continue : throw std::out_of_range("tired of waiting");
                };
                EXPECT_THROW(scene.from().copyFile(scene.to(), {ReplacementPolicy::Overwrite, transaction, throwing}),
                             std::out_of_range);
                EXPECT_TRUE(transaction == TransactionPolicy::Atomic ? scene.isUntouched() : scene.hasNothingElse());
            }
}

} // namespace

std::vector<Check> copyInterruptionChecks(Harness const& source)
{
    return copyFamily("CopyInterruption", source,
                      {
                          COPY_CHECK_FUNCTION(afterEveryChunkAnAtomicCopyCanBeGivenUp),
                          COPY_CHECK_FUNCTION(afterEveryChunkAPlainCopyHasWhatWasCopied),
                          COPY_CHECK_FUNCTION(aCopyThatIsNeverInterruptedAsksAfterEachChunk),
                          COPY_CHECK_FUNCTION(aCopyOfNothingCanBeInterrupted),
                          COPY_CHECK_FUNCTION(whatTheInterruptFunctionThrowsPasses),
                      });
}

} // namespace foundation::storage::conformance::detail
