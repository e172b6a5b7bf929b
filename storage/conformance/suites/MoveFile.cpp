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
    Scene const scene(harness, {{u"folder/", ""}});
    for (ReplacementPolicy const policy : allPolicies) {
        SCOPED_TRACE(policy);
        scene.write(u"from", "content");
        scene.provider().moveFile(scene.iri(u"from"), scene.iri(u"to"), policy);
        EXPECT_TRUE(scene.holds({{u"to", "content"}, {u"folder/", ""}}));
        scene.provider().moveFile(scene.iri(u"to"), scene.iri(u"folder/to"), policy);
        EXPECT_TRUE(scene.holds({{u"folder/", ""}, {u"folder/to", "content"}}));
        scene.provider().removeFile(scene.iri(u"folder/to"));
    }
}

void anEmptyAndALargeFileMoveWhole(Harness const& harness)
{
    std::string const large = someContent(3000001);
    Scene const scene(harness, {{u"empty", ""}, {u"large", large}});
    scene.provider().moveFile(scene.iri(u"empty"), scene.iri(u"empty2"), ReplacementPolicy::Preserve);
    scene.provider().moveFile(scene.iri(u"large"), scene.iri(u"large2"), ReplacementPolicy::Preserve);
    EXPECT_TRUE(scene.holds({{u"empty2", ""}, {u"large2", large}}));
}

void aPreservingPolicyKeepsTheTarget(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "new"}, {u"to", "old"}});
    for (ReplacementPolicy const policy : preservingPolicies)
        EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFile(scene.iri(u"from"), scene.iri(u"to"), policy); },
                                  ErrorCode::ResourceAlreadyExists, scene.iri(u"to")));
}

void aReplacingPolicyReplacesTheTarget(Harness const& harness)
{
    Scene const scene(harness, {{u"to", "old, and longer than the new content"}});
    for (ReplacementPolicy const policy : replacingPolicies) {
        SCOPED_TRACE(policy);
        scene.write(u"from", "new");
        scene.provider().moveFile(scene.iri(u"from"), scene.iri(u"to"), policy);
        EXPECT_TRUE(scene.holds({{u"to", "new"}}));
    }
}

void aFolderIsNeverReplaced(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}, {u"empty/", ""}, {u"full/", ""}, {u"full/inner", "inner"}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const to : {u"empty", u"full"})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFile(scene.iri(u"from"), scene.iri(to), policy); },
                                      ErrorCode::ResourceAlreadyExists, scene.iri(to)));
}

void theSourceHasToBeAFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"to", "old"}, {u"folder/", ""}, {u"folder/inner", "inner"}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const from : {u"missing", u"missing/inner", u"file/inner", u"folder"})
            for (auto const* const to : {u"new", u"to"})
                EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFile(scene.iri(from), scene.iri(to), policy); },
                                          ErrorCode::ResourceNotFound, scene.iri(from)));
}

void theTargetNeedsAFolderToStandIn(Harness const& harness)
{
    Scene const scene(harness, {{u"from", "content"}, {u"file", "other"}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const to : {u"missing/to", u"file/to", u"from/to"})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFile(scene.iri(u"from"), scene.iri(to), policy); },
                                      ErrorCode::ResourceNotFound, scene.iri(to)));
}

void ontoItselfChangesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (StorageIRI const& alias : spellingsOf(scene, u"file")) {
        SCOPED_TRACE(testing::Message() << "as " << alias);
        for (ReplacementPolicy const policy : replacingPolicies) {
            scene.provider().moveFile(scene.iri(u"file"), alias, policy);
            EXPECT_TRUE(scene.holds({{u"file", "content"}, {u"folder/", ""}}));
            scene.provider().moveFile(alias, scene.iri(u"file"), policy);
            EXPECT_TRUE(scene.holds({{u"file", "content"}, {u"folder/", ""}}));
        }
        for (ReplacementPolicy const policy : preservingPolicies)
            EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFile(scene.iri(u"file"), alias, policy); },
                                      ErrorCode::ResourceAlreadyExists, alias));
    }
}

void ontoItsSecondNameKeepsTheContent(Harness const& harness)
{
    for (ReplacementPolicy const policy : replacingPolicies) {
        SCOPED_TRACE(policy);
        Scene const scene(harness, {{u"first", "content"}});
        harness.makers.secondName(scene.iri(u"second"), scene.iri(u"first"));
        scene.provider().moveFile(scene.iri(u"first"), scene.iri(u"second"), policy);
        EXPECT_TRUE(scene.holds({{u"second", "content"}}));
    }
}

void aPreservingPolicyKeepsASecondName(Harness const& harness)
{
    Scene const scene(harness, {{u"first", "content"}});
    harness.makers.secondName(scene.iri(u"second"), scene.iri(u"first"));
    for (ReplacementPolicy const policy : preservingPolicies)
        EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFile(scene.iri(u"first"), scene.iri(u"second"), policy); },
                                  ErrorCode::ResourceAlreadyExists, scene.iri(u"second")));
}

void linksAreMovedThemselves(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"file"));
    scene.provider().moveFile(scene.iri(u"link"), scene.iri(u"moved"), ReplacementPolicy::Preserve);
    EXPECT_EQ(scene.provider().existsExtended(scene.iri(u"moved")), ExistenceTypeExtended::SymlinkToFile);
    EXPECT_TRUE(scene.holds({{u"file", "content"}, {u"moved", "content"}}));
}

void aFileReplacesALinkAndNotWhatItLeadsTo(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"new", "new"}});
    harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"file"));
    scene.provider().moveFile(scene.iri(u"new"), scene.iri(u"link"), ReplacementPolicy::Overwrite);
    EXPECT_EQ(scene.provider().existsExtended(scene.iri(u"link")), ExistenceTypeExtended::RegularFile);
    EXPECT_TRUE(scene.holds({{u"file", "content"}, {u"link", "new"}}));
}

void aFileReplacesALinkToItself(Harness const& harness)
{
    for (ReplacementPolicy const policy : replacingPolicies) {
        Scene const scene(harness, {{u"file", "content"}});
        harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"file"));
        scene.provider().moveFile(scene.iri(u"file"), scene.iri(u"link"), policy);
        EXPECT_EQ(scene.provider().existsExtended(scene.iri(u"link")), ExistenceTypeExtended::RegularFile);
        EXPECT_TRUE(scene.holds({{u"link", "content"}}));
    }
}

/// In place of the file the link would lead to itself, and the content be lost.
void aLinkDoesNotReplaceWhatItLeadsTo(Harness const& harness)
{
    for (ReplacementPolicy const policy : replacingPolicies) {
        Scene const scene(harness, {{u"file", "content"}});
        harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"file"));
        scene.provider().moveFile(scene.iri(u"link"), scene.iri(u"file"), policy);
        EXPECT_EQ(scene.provider().existsExtended(scene.iri(u"file")), ExistenceTypeExtended::RegularFile);
        EXPECT_TRUE(scene.holds({{u"file", "content"}}));
    }
}

} // namespace

std::vector<Check> moveFileChecks()
{
    return Family("MoveFile")
        .forWritable({
            CHECK_FUNCTION(aFreeNameIsTakenUnderEveryPolicy),
            CHECK_FUNCTION(anEmptyAndALargeFileMoveWhole),
            CHECK_FUNCTION(aPreservingPolicyKeepsTheTarget),
            CHECK_FUNCTION(aReplacingPolicyReplacesTheTarget),
            CHECK_FUNCTION(aFolderIsNeverReplaced),
            CHECK_FUNCTION(theSourceHasToBeAFile),
            CHECK_FUNCTION(theTargetNeedsAFolderToStandIn),
            CHECK_FUNCTION(ontoItselfChangesNothing),
        })
        .forWritable(makesSecondNames, {CHECK_FUNCTION(ontoItsSecondNameKeepsTheContent),
                                        CHECK_FUNCTION(aPreservingPolicyKeepsASecondName)})
        .forWritable(makesLinks,
                     {CHECK_FUNCTION(linksAreMovedThemselves), CHECK_FUNCTION(aFileReplacesALinkAndNotWhatItLeadsTo),
                      CHECK_FUNCTION(aFileReplacesALinkToItself), CHECK_FUNCTION(aLinkDoesNotReplaceWhatItLeadsTo)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
