#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/families.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

StorageIRI topOf(StorageIRI location)
{
    while (location.hasParent())
        location = location.getParent();
    return location;
}

/// What the top is refused with when it would have to be made.
ErrorCode refusalOfTop(Harness const& harness)
{
    return harness.capabilities.servesTop ? ErrorCode::ResourceAlreadyExists : ErrorCode::PermissionDenied;
}

void createFileMakesAnEmptyFile(Harness const& harness)
{
    Scene const scene(harness, {{u"other", "content"}});
    scene.provider().createFile(scene.iri(u"new"));
    EXPECT_TRUE(scene.holds({{u"new", ""}, {u"other", "content"}}));
}

void createFileRefusesATakenName(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}, {u"folder/inner", "inner"}});
    for (auto const* const name : {u"file", u"folder"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().createFile(scene.iri(name)); },
                                  ErrorCode::ResourceAlreadyExists, scene.iri(name)));
    StorageIRI const top = topOf(scene.iri());
    EXPECT_TRUE(fails([&] { scene.provider().createFile(top); }, refusalOfTop(harness), top));
}

void createFileNeedsAFolderToStandIn(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    for (auto const* const name : {u"missing/new", u"missing/other/new", u"file/new"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().createFile(scene.iri(name)); }, ErrorCode::ResourceNotFound,
                                  scene.iri(name)));
}

void createFolderMakesAnEmptyFolder(Harness const& harness)
{
    Scene const scene(harness, {{u"other", "content"}});
    scene.provider().createFolder(scene.iri(u"new"));
    EXPECT_TRUE(scene.holds({{u"new/", ""}, {u"other", "content"}}));
    scene.provider().createFolder(scene.iri(u"new/inner"));
    EXPECT_TRUE(scene.holds({{u"new/", ""}, {u"new/inner/", ""}, {u"other", "content"}}));
}

void createFolderRefusesATakenName(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}, {u"folder/inner", "inner"}});
    for (auto const* const name : {u"file", u"folder"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().createFolder(scene.iri(name)); },
                                  ErrorCode::ResourceAlreadyExists, scene.iri(name)));
    StorageIRI const top = topOf(scene.iri());
    EXPECT_TRUE(fails([&] { scene.provider().createFolder(top); }, refusalOfTop(harness), top));
}

void createFolderNeedsAFolderToStandIn(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    for (auto const* const name : {u"missing/new", u"missing/other/new", u"file/new"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().createFolder(scene.iri(name)); }, ErrorCode::ResourceNotFound,
                                  scene.iri(name)));
}

void createFolderRecursiveMakesEveryMissingAncestor(Harness const& harness)
{
    Scene const scene(harness, {{u"a/", ""}, {u"a/file", "content"}});
    scene.provider().createFolderRecursive(scene.iri(u"a/b/c/d"));
    scene.provider().createFolderRecursive(scene.iri(u"e"));
    EXPECT_TRUE(scene.holds(
        {{u"a/", ""}, {u"a/file", "content"}, {u"a/b/", ""}, {u"a/b/c/", ""}, {u"a/b/c/d/", ""}, {u"e/", ""}}));
}

void createFolderRecursiveRefusesWhatExists(Harness const& harness)
{
    Scene const scene(harness, {{u"folder/", ""}, {u"folder/inner/", ""}, {u"folder/file", "content"}});
    for (auto const* const name : {u"folder", u"folder/inner", u"folder/file"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().createFolderRecursive(scene.iri(name)); },
                                  ErrorCode::ResourceAlreadyExists, scene.iri(name)));
}

void createFolderRecursiveNamesTheFolderAskedForWhenAnAncestorIsAFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    for (auto const* const name : {u"file/a", u"file/a/b"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().createFolderRecursive(scene.iri(name)); },
                                  ErrorCode::ResourceAlreadyExists, scene.iri(name)));
}

void createFolderRecursiveNeverMakesATop(Harness const& harness)
{
    Scene const scene(harness);
    StorageIRI const top = topOf(scene.iri());
    EXPECT_TRUE(scene.refuses([&] { scene.provider().createFolderRecursive(top); }, refusalOfTop(harness), top));
}

} // namespace

std::vector<Check> creationChecks()
{
    return Family("Creation")
        .forWritable({
            CHECK_FUNCTION(createFileMakesAnEmptyFile),
            CHECK_FUNCTION(createFileRefusesATakenName),
            CHECK_FUNCTION(createFileNeedsAFolderToStandIn),
            CHECK_FUNCTION(createFolderMakesAnEmptyFolder),
            CHECK_FUNCTION(createFolderRefusesATakenName),
            CHECK_FUNCTION(createFolderNeedsAFolderToStandIn),
            CHECK_FUNCTION(createFolderRecursiveMakesEveryMissingAncestor),
            CHECK_FUNCTION(createFolderRecursiveRefusesWhatExists),
            CHECK_FUNCTION(createFolderRecursiveNamesTheFolderAskedForWhenAnAncestorIsAFile),
            CHECK_FUNCTION(createFolderRecursiveNeverMakesATop),
        })
        .checks();
}

} // namespace foundation::storage::conformance::detail
