#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/aliases.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/policies.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

void aFreeNameIsTakenUnderEveryPolicy(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}, {u"folder/", ""}});
    for (ReplacementPolicy const policy : allPolicies) {
        SCOPED_TRACE(policy);
        scene.provider().copyFile(scene.iri(u"from"), scene.iri(u"folder/to"), policy);
        EXPECT_TRUE(scene.holds({{u"from", "content"}, {u"folder/", ""}, {u"folder/to", "content"}}));
        scene.provider().removeFile(scene.iri(u"folder/to"));
    }
}

void filesOfEverySizeAreCopiedWhole(Harness const& harness)
{
    for (std::size_t const size : {0u, 1u, 4095u, 4096u, 4097u, 3000001u}) {
        std::string const content = someContent(size);
        Scene const scene(harness, {{u"from", content}});
        scene.provider().copyFile(scene.iri(u"from"), scene.iri(u"to"), ReplacementPolicy::Preserve);
        EXPECT_TRUE(scene.holds({{u"from", content}, {u"to", content}})) << size << " bytes";
    }
}

void aCopyIsAFileOfItsOwn(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}});
    scene.provider().copyFile(scene.iri(u"from"), scene.iri(u"to"), ReplacementPolicy::Preserve);
    scene.write(u"from", "changed");
    EXPECT_TRUE(scene.holds({{u"from", "changed"}, {u"to", "content"}}));
    scene.provider().removeFile(scene.iri(u"from"));
    EXPECT_TRUE(scene.holds({{u"to", "content"}}));
}

void aPreservingPolicyKeepsTheTarget(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "new"}, {u"to", "old"}});
    for (ReplacementPolicy const policy : preservingPolicies)
        for (auto const* const from : {u"from", u"missing"})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().copyFile(scene.iri(from), scene.iri(u"to"), policy); },
                                      ErrorCode::ResourceAlreadyExists, scene.iri(u"to")));
}

void aReplacingPolicyReplacesTheTarget(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "new"}});
    for (ReplacementPolicy const policy : replacingPolicies) {
        SCOPED_TRACE(policy);
        scene.write(u"to", "old, and longer than the new content");
        scene.provider().copyFile(scene.iri(u"from"), scene.iri(u"to"), policy);
        EXPECT_TRUE(scene.holds({{u"from", "new"}, {u"to", "new"}}));
    }
}

void aFolderIsNeverReplaced(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}, {u"empty/", ""}, {u"full/", ""}, {u"full/inner", "inner"}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const to : {u"empty", u"full"})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().copyFile(scene.iri(u"from"), scene.iri(to), policy); },
                                      ErrorCode::ResourceAlreadyExists, scene.iri(to)));
}

void theSourceHasToBeAFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const from : {u"missing", u"missing/inner", u"file/inner", u"folder"})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().copyFile(scene.iri(from), scene.iri(u"new"), policy); },
                                      ErrorCode::ResourceNotFound, scene.iri(from)));
}

void aMissingSourceLeavesTheTargetAsItIs(Harness const& harness)
{
    Scene const scene(harness, {{u"to", "old"}});
    for (ReplacementPolicy const policy : replacingPolicies)
        EXPECT_TRUE(scene.refuses([&] { scene.provider().copyFile(scene.iri(u"missing"), scene.iri(u"to"), policy); },
                                  ErrorCode::ResourceNotFound, scene.iri(u"missing")));
}

void theTargetNeedsAFolderToStandIn(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}, {u"file", "other"}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const to : {u"missing/to", u"file/to", u"from/to"})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().copyFile(scene.iri(u"from"), scene.iri(to), policy); },
                                      ErrorCode::ResourceNotFound, scene.iri(to)));
}

void aPreservingPolicyKeepsTheFileItself(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (StorageIRI const& alias : spellingsOf(scene, u"file"))
        for (ReplacementPolicy const policy : preservingPolicies)
            EXPECT_TRUE(scene.refuses([&] { scene.provider().copyFile(scene.iri(u"file"), alias, policy); },
                                      ErrorCode::ResourceAlreadyExists, alias));
}

void ontoItselfChangesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (StorageIRI const& alias : spellingsOf(scene, u"file")) {
        SCOPED_TRACE(testing::Message() << "as " << alias);
        for (ReplacementPolicy const policy : replacingPolicies) {
            scene.provider().copyFile(scene.iri(u"file"), alias, policy);
            EXPECT_TRUE(scene.holds({{u"file", "content"}, {u"folder/", ""}}));
        }
    }
}

void ontoItselfLeavesAnEmptyFile(Harness const& harness)
{
    Scene const scene(harness, {{u"folder/", ""}});
    scene.write(u"file", "content");
    for (StorageIRI const& alias : spellingsOf(scene, u"file")) {
        scene.write(u"file", "content");
        scene.provider().copyFile(scene.iri(u"file"), alias, ReplacementPolicy::Overwrite);
        EXPECT_TRUE(scene.holds({{u"file", ""}, {u"folder/", ""}}));
    }
}

void ontoAnotherNameChangesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    if (harness.makers.secondName)
        harness.makers.secondName(scene.iri(u"second"), scene.iri(u"file"));
    if (harness.makers.symbolicLink)
        harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"file"));
    Tree const before = scene.tree();
    for (auto const* const name : {u"second", u"link"}) {
        for (ReplacementPolicy const policy : replacingPolicies) {
            if (!before.contains(name))
                continue;
            scene.provider().copyFile(scene.iri(u"file"), scene.iri(name), policy);
            EXPECT_TRUE(scene.holds(before));
            scene.provider().copyFile(scene.iri(name), scene.iri(u"file"), policy);
            EXPECT_TRUE(scene.holds(before));
        }
    }
}

void linksAreReadAndWrittenThrough(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"new", "new"}});
    harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"file"));
    scene.provider().copyFile(scene.iri(u"link"), scene.iri(u"copy"), ReplacementPolicy::Preserve);
    EXPECT_EQ(scene.provider().existsExtended(scene.iri(u"copy")), ExistenceTypeExtended::RegularFile);
    scene.provider().copyFile(scene.iri(u"new"), scene.iri(u"link"), ReplacementPolicy::Overwrite);
    EXPECT_TRUE(scene.holds({{u"file", "new"}, {u"new", "new"}, {u"link", "new"}, {u"copy", "content"}}));
}

bool keepsAFileCopiedOntoItself(Harness const& harness)
{
    return harness.capabilities.copyOntoItself == CopyOntoItself::ChangesNothing;
}

bool emptiesAFileCopiedOntoItself(Harness const& harness)
{
    return !keepsAFileCopiedOntoItself(harness);
}

bool makesOtherNames(Harness const& harness)
{
    return makesLinks(harness) || makesSecondNames(harness);
}

} // namespace

std::vector<Check> copyFileChecks()
{
    return Family("CopyFile")
        .forWritable({
            CHECK_FUNCTION(aFreeNameIsTakenUnderEveryPolicy),
            CHECK_FUNCTION(filesOfEverySizeAreCopiedWhole),
            CHECK_FUNCTION(aCopyIsAFileOfItsOwn),
            CHECK_FUNCTION(aPreservingPolicyKeepsTheTarget),
            CHECK_FUNCTION(aReplacingPolicyReplacesTheTarget),
            CHECK_FUNCTION(aFolderIsNeverReplaced),
            CHECK_FUNCTION(theSourceHasToBeAFile),
            CHECK_FUNCTION(aMissingSourceLeavesTheTargetAsItIs),
            CHECK_FUNCTION(theTargetNeedsAFolderToStandIn),
            CHECK_FUNCTION(aPreservingPolicyKeepsTheFileItself),
        })
        .forWritable(keepsAFileCopiedOntoItself, {CHECK_FUNCTION(ontoItselfChangesNothing)})
        .forWritable(emptiesAFileCopiedOntoItself, {CHECK_FUNCTION(ontoItselfLeavesAnEmptyFile)})
        .forWritable(both(keepsAFileCopiedOntoItself, makesOtherNames), {CHECK_FUNCTION(ontoAnotherNameChangesNothing)})
        .forWritable(makesLinks, {CHECK_FUNCTION(linksAreReadAndWrittenThrough)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
