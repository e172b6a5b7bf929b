#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/aliases.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/policies.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

void aFolderMovesWithAllItHolds(Harness const& harness)
{
    for (ReplacementPolicy const policy : allPolicies) {
        SCOPED_TRACE(policy);
        Scene const scene(harness, {{u"from/", ""},
                                    {u"from/file", "content"},
                                    {u"from/inner/", ""},
                                    {u"from/inner/file", "inner"},
                                    {u"from2", "beside"},
                                    {u"other/", ""}});
        scene.provider().moveFolder(scene.iri(u"from"), scene.iri(u"other/to"), policy);
        EXPECT_TRUE(scene.holds({{u"from2", "beside"},
                                 {u"other/", ""},
                                 {u"other/to/", ""},
                                 {u"other/to/file", "content"},
                                 {u"other/to/inner/", ""},
                                 {u"other/to/inner/file", "inner"}}));
        scene.provider().moveFolder(scene.iri(u"other/to/inner"), scene.iri(u"inner"), policy);
        EXPECT_EQ(scene.read(u"inner/file"), "inner");
        EXPECT_FALSE(scene.provider().folderExists(scene.iri(u"other/to/inner")));
    }
}

void nothingIsEverReplaced(Harness const& harness)
{
    Scene const scene(harness, {{u"from/", ""},
                                {u"from/file", "content"},
                                {u"file", "other"},
                                {u"empty/", ""},
                                {u"full/", ""},
                                {u"full/inner", "inner"}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const to : {u"file", u"empty", u"full"})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFolder(scene.iri(u"from"), scene.iri(to), policy); },
                                      ErrorCode::ResourceAlreadyExists, scene.iri(to)));
}

void theSourceHasToBeAFolder(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"to/", ""}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const from : {u"missing", u"missing/inner", u"file/inner", u"file"})
            for (auto const* const to : {u"new", u"to"})
                EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFolder(scene.iri(from), scene.iri(to), policy); },
                                          ErrorCode::ResourceNotFound, scene.iri(from)));
}

void theTargetNeedsAFolderToStandIn(Harness const& harness)
{
    Scene const scene(harness, {{u"from/", ""}, {u"from/inner", "inner"}, {u"file", "content"}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const to : {u"missing/to", u"file/to"})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFolder(scene.iri(u"from"), scene.iri(to), policy); },
                                      ErrorCode::ResourceNotFound, scene.iri(to)));
}

void aFolderDoesNotMoveBelowItself(Harness const& harness)
{
    Scene const scene(harness, {{u"from/", ""}, {u"from/inner/", ""}});
    for (ReplacementPolicy const policy : allPolicies)
        for (auto const* const to : {u"from/new", u"from/inner", u"from/inner/new"})
            EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFolder(scene.iri(u"from"), scene.iri(to), policy); },
                                      ErrorCode::InvalidLocation, scene.iri(to)));
}

void aFolderDoesNotMoveBelowItselfByADetour(Harness const& harness)
{
    Scene const scene(harness, {{u"from/", ""}, {u"folder/", ""}});
    for (StorageIRI const& alias : spellingsOf(scene, u"from")) {
        StorageIRI const to(alias, u"new");
        EXPECT_TRUE(
            scene.refuses([&] { scene.provider().moveFolder(scene.iri(u"from"), to, ReplacementPolicy::Preserve); },
                          ErrorCode::InvalidLocation, to));
    }
}

void ontoItselfChangesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"moved/", ""}, {u"moved/file", "content"}, {u"folder/", ""}});
    Tree const before = scene.tree();
    for (StorageIRI const& alias : spellingsOf(scene, u"moved")) {
        SCOPED_TRACE(testing::Message() << "as " << alias);
        for (ReplacementPolicy const policy : replacingPolicies) {
            scene.provider().moveFolder(scene.iri(u"moved"), alias, policy);
            EXPECT_TRUE(scene.holds(before));
        }
        for (ReplacementPolicy const policy : preservingPolicies)
            EXPECT_TRUE(scene.refuses([&] { scene.provider().moveFolder(scene.iri(u"moved"), alias, policy); },
                                      ErrorCode::ResourceAlreadyExists, alias));
    }
}

void aLinkToAFolderIsNotThatFolder(Harness const& harness)
{
    Scene const scene(harness, {{u"folder/", ""}, {u"folder/inner", "inner"}});
    harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"folder"));
    EXPECT_TRUE(scene.refuses(
        [&] { scene.provider().moveFolder(scene.iri(u"link"), scene.iri(u"new"), ReplacementPolicy::Preserve); },
        ErrorCode::InvalidLocation, scene.iri(u"link")));
    EXPECT_TRUE(scene.refuses(
        [&] { scene.provider().moveFolder(scene.iri(u"folder"), scene.iri(u"link/new"), ReplacementPolicy::Preserve); },
        ErrorCode::InvalidLocation, scene.iri(u"link/new")));
}

void ontoALinkToItselfChangesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"folder/", ""}, {u"folder/inner", "inner"}});
    harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"folder"));
    Tree const before = scene.tree();
    for (ReplacementPolicy const policy : replacingPolicies) {
        scene.provider().moveFolder(scene.iri(u"folder"), scene.iri(u"link"), policy);
        EXPECT_TRUE(scene.holds(before));
    }
    for (ReplacementPolicy const policy : preservingPolicies)
        EXPECT_TRUE(
            scene.refuses([&] { scene.provider().moveFolder(scene.iri(u"folder"), scene.iri(u"link"), policy); },
                          ErrorCode::ResourceAlreadyExists, scene.iri(u"link")));
}

} // namespace

std::vector<Check> moveFolderChecks()
{
    return Family("MoveFolder")
        .forWritable({
            CHECK_FUNCTION(aFolderMovesWithAllItHolds),
            CHECK_FUNCTION(nothingIsEverReplaced),
            CHECK_FUNCTION(theSourceHasToBeAFolder),
            CHECK_FUNCTION(theTargetNeedsAFolderToStandIn),
            CHECK_FUNCTION(aFolderDoesNotMoveBelowItself),
            CHECK_FUNCTION(aFolderDoesNotMoveBelowItselfByADetour),
            CHECK_FUNCTION(ontoItselfChangesNothing),
        })
        .forWritable(makesLinks,
                     {CHECK_FUNCTION(aLinkToAFolderIsNotThatFolder), CHECK_FUNCTION(ontoALinkToItselfChangesNothing)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
