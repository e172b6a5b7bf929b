#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/aliases.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/policies.hpp>
#include <storage/provider/ExtendedFeature.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr std::size_t severalChunks = 3000001;

InterruptSignal goOn()
{
    return InterruptSignal::Continue;
}

/// Interrupts when it is asked for the n-th time.
IProvider::Interrupt interruptAt(int n, int& asked)
{
    return [n, &asked] { return ++asked == n ? InterruptSignal::Abort : InterruptSignal::Continue; };
}

void theFeatureIsAnnounced(Harness const& harness)
{
    EXPECT_TRUE(Scene(harness).provider().hasFeature(ExtendedFeature::AtomicFileCopy));
}

void aFreeNameIsTakenUnderEveryPolicy(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}, {u"folder/", ""}});
    for (ReplacementPolicy const policy : allPolicies)
        for (IProvider::Interrupt const& interrupt : {IProvider::Interrupt(), IProvider::Interrupt(goOn)}) {
            SCOPED_TRACE(policy);
            EXPECT_EQ(scene.provider().copyFileAtomic(scene.iri(u"from"), scene.iri(u"folder/to"), policy, interrupt),
                      TransactionStatus::Completed);
            EXPECT_TRUE(scene.holds({{u"from", "content"}, {u"folder/", ""}, {u"folder/to", "content"}}));
            scene.provider().removeFile(scene.iri(u"folder/to"));
        }
}

void filesOfEverySizeAreCopiedWhole(Harness const& harness)
{
    for (std::size_t const size : {std::size_t{0}, std::size_t{1}, std::size_t{4096}, severalChunks}) {
        std::string const content = someContent(size);
        Scene const scene(harness, {{u"from", content}});
        EXPECT_EQ(
            scene.provider().copyFileAtomic(scene.iri(u"from"), scene.iri(u"to"), ReplacementPolicy::Preserve, {}),
            TransactionStatus::Completed);
        EXPECT_TRUE(scene.holds({{u"from", content}, {u"to", content}})) << size << " bytes";
    }
}

void aPreservingPolicyKeepsTheTarget(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "new"}, {u"to", "old"}});
    for (ReplacementPolicy const policy : preservingPolicies)
        EXPECT_TRUE(
            scene.refuses([&] { scene.provider().copyFileAtomic(scene.iri(u"from"), scene.iri(u"to"), policy, {}); },
                          ErrorCode::ResourceAlreadyExists, scene.iri(u"to")));
}

void aReplacingPolicyReplacesTheTarget(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "new"}});
    for (ReplacementPolicy const policy : replacingPolicies) {
        SCOPED_TRACE(policy);
        scene.write(u"to", "old, and longer than the new content");
        EXPECT_EQ(scene.provider().copyFileAtomic(scene.iri(u"from"), scene.iri(u"to"), policy, goOn),
                  TransactionStatus::Completed);
        EXPECT_TRUE(scene.holds({{u"from", "new"}, {u"to", "new"}}));
    }
}

void aFolderIsNeverReplaced(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}, {u"empty/", ""}, {u"full/", ""}, {u"full/inner", "inner"}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const to : {u"empty", u"full"})
            EXPECT_TRUE(
                scene.refuses([&] { scene.provider().copyFileAtomic(scene.iri(u"from"), scene.iri(to), policy, {}); },
                              ErrorCode::ResourceAlreadyExists, scene.iri(to)));
}

void theSourceHasToBeAFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const from : {u"missing", u"missing/inner", u"file/inner", u"folder"})
            EXPECT_TRUE(
                scene.refuses([&] { scene.provider().copyFileAtomic(scene.iri(from), scene.iri(u"new"), policy, {}); },
                              ErrorCode::ResourceNotFound, scene.iri(from)));
}

void theTargetNeedsAFolderToStandIn(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}, {u"file", "other"}});
    for (auto const* const to : {u"missing/to", u"file/to"})
        EXPECT_TRUE(scene.refuses(
            [&] {
                scene.provider().copyFileAtomic(scene.iri(u"from"), scene.iri(to), ReplacementPolicy::Overwrite, {});
            },
            ErrorCode::ResourceNotFound, scene.iri(to)));
}

void ontoItselfChangesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (StorageIRI const& alias : spellingsOf(scene, u"file")) {
        SCOPED_TRACE(testing::Message() << "as " << alias);
        for (ReplacementPolicy const policy : replacingPolicies) {
            EXPECT_EQ(scene.provider().copyFileAtomic(scene.iri(u"file"), alias, policy, {}),
                      TransactionStatus::Completed);
            EXPECT_TRUE(scene.holds({{u"file", "content"}, {u"folder/", ""}}));
        }
        for (ReplacementPolicy const policy : preservingPolicies)
            EXPECT_TRUE(scene.refuses([&] { scene.provider().copyFileAtomic(scene.iri(u"file"), alias, policy, {}); },
                                      ErrorCode::ResourceAlreadyExists, alias));
    }
}

void ontoAnotherNameKeepsTheContent(Harness const& harness)
{
    Tree const content{{u"file", "content"}, {u"second", "content"}, {u"link", "content"}};
    for (auto const* const from : {u"file", u"second", u"link"})
        for (auto const* const to : {u"file", u"second", u"link"}) {
            SCOPED_TRACE(testing::Message() << testing::PrintToString(std::u16string(from)) << " onto "
                                            << testing::PrintToString(std::u16string(to)));
            Scene const scene(harness, {{u"file", "content"}});
            harness.makers.secondName(scene.iri(u"second"), scene.iri(u"file"));
            harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"file"));
            EXPECT_EQ(scene.provider().copyFileAtomic(scene.iri(from), scene.iri(to), ReplacementPolicy::Overwrite, {}),
                      TransactionStatus::Completed);
            EXPECT_TRUE(scene.holds(content));
        }
}

void anInterruptionAtEveryChunkLeavesTheTargetAsItWas(Harness const& harness)
{
    std::string const content = someContent(severalChunks);
    for (Tree const& before : {Tree{{u"from", content}}, Tree{{u"from", content}, {u"to", "old"}}}) {
        Scene const scene(harness, before);
        TransactionStatus status = TransactionStatus::Aborted;
        for (int chunk = 1; status == TransactionStatus::Aborted; ++chunk) {
            int asked = 0;
            status = scene.provider().copyFileAtomic(scene.iri(u"from"), scene.iri(u"to"), ReplacementPolicy::Overwrite,
                                                     interruptAt(chunk, asked));
            EXPECT_EQ(status == TransactionStatus::Aborted, asked == chunk) << "asked " << asked << " times";
            if (status == TransactionStatus::Aborted)
                EXPECT_TRUE(scene.holds(before)) << "interrupted at chunk " << chunk;
            else
                EXPECT_GT(chunk, 1) << "the interrupt function was never asked";
        }
        EXPECT_TRUE(scene.holds({{u"from", content}, {u"to", content}}));
    }
}

void atomicCopiesAreRefused(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}, {u"to", "old"}});
    EXPECT_FALSE(scene.provider().hasFeature(ExtendedFeature::AtomicFileCopy));
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const to : {u"new", u"to"})
            EXPECT_TRUE(
                scene.refuses([&] { scene.provider().copyFileAtomic(scene.iri(u"from"), scene.iri(to), policy, goOn); },
                              ErrorCode::UnsupportedOperation, scene.iri(u"from")));
}

} // namespace

std::vector<Check> atomicCopyChecks()
{
    return Family("AtomicCopy")
        .forWritable(claims(&Capabilities::atomicCopy),
                     {
                         CHECK_FUNCTION(theFeatureIsAnnounced),
                         CHECK_FUNCTION(aFreeNameIsTakenUnderEveryPolicy),
                         CHECK_FUNCTION(filesOfEverySizeAreCopiedWhole),
                         CHECK_FUNCTION(aPreservingPolicyKeepsTheTarget),
                         CHECK_FUNCTION(aReplacingPolicyReplacesTheTarget),
                         CHECK_FUNCTION(aFolderIsNeverReplaced),
                         CHECK_FUNCTION(theSourceHasToBeAFile),
                         CHECK_FUNCTION(theTargetNeedsAFolderToStandIn),
                         CHECK_FUNCTION(ontoItselfChangesNothing),
                         CHECK_FUNCTION(anInterruptionAtEveryChunkLeavesTheTargetAsItWas),
                     })
        .forWritable(both(claims(&Capabilities::atomicCopy), both(makesLinks, makesSecondNames)),
                     {CHECK_FUNCTION(ontoAnotherNameKeepsTheContent)})
        .when(disclaims(&Capabilities::atomicCopy), {CHECK_FUNCTION(atomicCopiesAreRefused)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
