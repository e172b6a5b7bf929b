#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/provider/ExtendedFeature.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

void removeFileRemovesThatFileAlone(Harness const& harness)
{
    Scene const scene(harness,
                      {{u"file", "content"}, {u"file2", "other"}, {u"folder/", ""}, {u"folder/file", "inner"}});
    scene.provider().removeFile(scene.iri(u"file"));
    EXPECT_TRUE(scene.holds({{u"file2", "other"}, {u"folder/", ""}, {u"folder/file", "inner"}}));
    scene.provider().removeFile(scene.iri(u"folder/file"));
    EXPECT_TRUE(scene.holds({{u"file2", "other"}, {u"folder/", ""}}));
}

void removeFileNeedsAFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}, {u"full/", ""}, {u"full/inner", "inner"}});
    for (auto const* const path : {u"missing", u"missing/inner", u"file/inner", u"folder", u"full"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().removeFile(scene.iri(path)); }, ErrorCode::ResourceNotFound,
                                  scene.iri(path)));
}

void removeFolderRemovesAnEmptyFolder(Harness const& harness)
{
    Scene const scene(harness, {{u"folder/", ""}, {u"folder/inner/", ""}, {u"folder2/", ""}});
    scene.provider().removeFolder(scene.iri(u"folder/inner"));
    scene.provider().removeFolder(scene.iri(u"folder"));
    EXPECT_TRUE(scene.holds({{u"folder2/", ""}}));
}

void removeFolderRefusesAFullOne(Harness const& harness)
{
    Scene const scene(harness, {{u"a/", ""}, {u"a/file", "content"}, {u"b/", ""}, {u"b/folder/", ""}});
    for (auto const* const path : {u"a", u"b"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().removeFolder(scene.iri(path)); }, ErrorCode::FolderNotEmpty,
                                  scene.iri(path)));
}

void removeFolderNeedsAFolder(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (auto const* const path : {u"missing", u"missing/inner", u"file", u"file/inner", u"folder/missing"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().removeFolder(scene.iri(path)); }, ErrorCode::ResourceNotFound,
                                  scene.iri(path)));
}

void removeFileRemovesALinkAndNotItsTarget(Harness const& harness)
{
    Tree const content{{u"file", "content"}, {u"folder/", ""}, {u"folder/inner", "inner"}};
    Scene const scene(harness, content);
    harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"file"));
    harness.makers.symbolicLink(scene.iri(u"to folder"), scene.iri(u"folder"));
    harness.makers.symbolicLink(scene.iri(u"dangling"), scene.iri(u"missing"));
    for (auto const* const link : {u"link", u"to folder", u"dangling"})
        scene.provider().removeFile(scene.iri(link));
    EXPECT_TRUE(scene.holds(content));
}

void aLinkToAFolderIsNotRemovedAsAFolder(Harness const& harness)
{
    Scene const scene(harness, {{u"folder/", ""}});
    harness.makers.symbolicLink(scene.iri(u"link"), scene.iri(u"folder"));
    EXPECT_TRUE(scene.refuses([&] { scene.provider().removeFolder(scene.iri(u"link")); }, ErrorCode::InvalidLocation,
                              scene.iri(u"link")));
}

void removeFolderRecursivelyRemovesAllBelow(Harness const& harness)
{
    Scene const scene(harness, {{u"a/", ""},
                                {u"a/b/", ""},
                                {u"a/b/c/", ""},
                                {u"a/b/c/file", "deep"},
                                {u"a/file", "content"},
                                {u"ab/", ""},
                                {u"ab/file", "beside"},
                                {u"empty/", ""}});
    EXPECT_TRUE(scene.provider().hasFeature(ExtendedFeature::RecursiveFolderRemoval));
    scene.provider().removeFolderRecursively(scene.iri(u"a"));
    scene.provider().removeFolderRecursively(scene.iri(u"empty"));
    EXPECT_TRUE(scene.holds({{u"ab/", ""}, {u"ab/file", "beside"}}));
}

void removeFolderRecursivelyNeedsAFolder(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    for (auto const* const path : {u"missing", u"missing/inner", u"file", u"file/inner"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().removeFolderRecursively(scene.iri(path)); },
                                  ErrorCode::ResourceNotFound, scene.iri(path)));
}

void removeFolderRecursivelyLeavesWhatLinksLeadTo(Harness const& harness)
{
    Scene const scene(harness, {{u"outside/", ""}, {u"outside/file", "kept"}, {u"tree/", ""}});
    harness.makers.symbolicLink(scene.iri(u"tree/folder"), scene.iri(u"outside"));
    harness.makers.symbolicLink(scene.iri(u"tree/file"), scene.iri(u"outside/file"));
    harness.makers.symbolicLink(scene.iri(u"tree/dangling"), scene.iri(u"missing"));
    scene.provider().removeFolderRecursively(scene.iri(u"tree"));
    EXPECT_TRUE(scene.holds({{u"outside/", ""}, {u"outside/file", "kept"}}));
}

void removeFolderRecursivelyIsRefused(Harness const& harness)
{
    Scene const scene(harness, {{u"folder/", ""}, {u"folder/file", "content"}, {u"empty/", ""}});
    EXPECT_FALSE(scene.provider().hasFeature(ExtendedFeature::RecursiveFolderRemoval));
    for (auto const* const path : {u"folder", u"empty"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().removeFolderRecursively(scene.iri(path)); },
                                  ErrorCode::UnsupportedOperation, scene.iri(path)));
}

} // namespace

std::vector<Check> removalChecks()
{
    return Family("Removal")
        .forWritable({
            CHECK_FUNCTION(removeFileRemovesThatFileAlone),
            CHECK_FUNCTION(removeFileNeedsAFile),
            CHECK_FUNCTION(removeFolderRemovesAnEmptyFolder),
            CHECK_FUNCTION(removeFolderRefusesAFullOne),
            CHECK_FUNCTION(removeFolderNeedsAFolder),
        })
        .forWritable(makesLinks, {CHECK_FUNCTION(removeFileRemovesALinkAndNotItsTarget),
                                  CHECK_FUNCTION(aLinkToAFolderIsNotRemovedAsAFolder)})
        .forWritable(claims(&Capabilities::recursiveRemoval), {CHECK_FUNCTION(removeFolderRecursivelyRemovesAllBelow),
                                                               CHECK_FUNCTION(removeFolderRecursivelyNeedsAFolder)})
        .forWritable(both(claims(&Capabilities::recursiveRemoval), makesLinks),
                     {CHECK_FUNCTION(removeFolderRecursivelyLeavesWhatLinksLeadTo)})
        .forWritable(disclaims(&Capabilities::recursiveRemoval), {CHECK_FUNCTION(removeFolderRecursivelyIsRefused)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
