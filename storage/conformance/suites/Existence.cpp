#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/families.hpp>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

/// All ways of asking agree on what stands at a path.
void expectAt(Scene const& scene, std::u16string const& path, ExistenceType type, ExistenceTypeExtended extended)
{
    StorageIRI const iri = path.empty() ? scene.iri() : scene.iri(path);
    SCOPED_TRACE(testing::Message() << "at " << iri);
    IProvider const& provider = scene.provider();
    EXPECT_EQ(provider.exists(iri), type);
    EXPECT_EQ(provider.fileExists(iri), type == ExistenceType::AsFile);
    EXPECT_EQ(provider.folderExists(iri), type == ExistenceType::AsFolder);
    EXPECT_EQ(provider.existsExtended(iri), extended);
}

void filesAreFiles(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"empty", ""}, {u"folder/", ""}, {u"folder/inner", "inner"}});
    for (auto const* const path : {u"file", u"empty", u"folder/inner"})
        expectAt(scene, path, ExistenceType::AsFile, ExistenceTypeExtended::RegularFile);
}

void foldersAreFolders(Harness const& harness)
{
    Scene const scene(harness, {{u"folder/", ""}, {u"folder/inner/", ""}});
    for (auto const* const path : {u"", u"folder", u"folder/inner"})
        expectAt(scene, path, ExistenceType::AsFolder, ExistenceTypeExtended::RegularFolder);
}

void nothingIsWhereNothingIs(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (auto const* const path : {u"missing", u"missing/inner", u"folder/missing", u"file/inner", u"file/inner/most"})
        expectAt(scene, path, ExistenceType::AsNeither, ExistenceTypeExtended::None);
}

void askingForExistenceMakesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    expectAt(scene, u"missing", ExistenceType::AsNeither, ExistenceTypeExtended::None);
    EXPECT_TRUE(scene.holds({{u"file", "content"}}));
}

void whatWasRemovedIsGone(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    scene.provider().removeFile(scene.iri(u"file"));
    scene.provider().removeFolder(scene.iri(u"folder"));
    for (auto const* const path : {u"file", u"folder"})
        expectAt(scene, path, ExistenceType::AsNeither, ExistenceTypeExtended::None);
}

void aNameCanTurnFromFileToFolder(Harness const& harness)
{
    Scene const scene(harness, {{u"name", "content"}});
    scene.provider().removeFile(scene.iri(u"name"));
    scene.provider().createFolder(scene.iri(u"name"));
    expectAt(scene, u"name", ExistenceType::AsFolder, ExistenceTypeExtended::RegularFolder);
    scene.provider().removeFolder(scene.iri(u"name"));
    scene.provider().createFile(scene.iri(u"name"));
    expectAt(scene, u"name", ExistenceType::AsFile, ExistenceTypeExtended::RegularFile);
}

void linksAreWhatTheyLeadTo(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}, {u"folder/inner", "inner"}});
    auto const& link = harness.makers.symbolicLink;
    link(scene.iri(u"to file"), scene.iri(u"file"));
    link(scene.iri(u"to folder"), scene.iri(u"folder"));
    link(scene.iri(u"to link"), scene.iri(u"to file"));
    expectAt(scene, u"to file", ExistenceType::AsFile, ExistenceTypeExtended::SymlinkToFile);
    expectAt(scene, u"to link", ExistenceType::AsFile, ExistenceTypeExtended::SymlinkToFile);
    expectAt(scene, u"to folder", ExistenceType::AsFolder, ExistenceTypeExtended::SymlinkToFolder);
    expectAt(scene, u"to folder/inner", ExistenceType::AsFile, ExistenceTypeExtended::RegularFile);
    EXPECT_EQ(scene.read(u"to file"), "content");
    EXPECT_EQ(scene.read(u"to folder/inner"), "inner");
}

void brokenLinksAreNeitherFileNorFolder(Harness const& harness)
{
    Scene const scene(harness);
    harness.makers.symbolicLink(scene.iri(u"dangling"), scene.iri(u"missing"));
    harness.makers.symbolicLink(scene.iri(u"loop"), scene.iri(u"loop"));
    for (auto const* const path : {u"dangling", u"loop"})
        expectAt(scene, path, ExistenceType::AsNeither, ExistenceTypeExtended::BrokenSymlink);
    expectAt(scene, u"dangling/inner", ExistenceType::AsNeither, ExistenceTypeExtended::None);
}

void specialFilesAreFiles(Harness const& harness)
{
    Scene const scene(harness);
    harness.makers.specialFile(scene.iri(u"special"));
    expectAt(scene, u"special", ExistenceType::AsFile, ExistenceTypeExtended::SpecialFile);
    scene.provider().removeFile(scene.iri(u"special"));
    EXPECT_TRUE(scene.holds({}));
}

void specialFilesAreNotOpened(Harness const& harness)
{
    Scene const scene(harness);
    StorageIRI const special = scene.iri(u"special");
    harness.makers.specialFile(special);
    EXPECT_TRUE(fails([&] { scene.provider().openReadOnlyStream(special); }, ErrorCode::UnsupportedOperation, special));
    EXPECT_TRUE(fails([&] { scene.provider().openStream(special, {}); }, ErrorCode::UnsupportedOperation, special));
    scene.provider().removeFile(special);
}

} // namespace

std::vector<Check> existenceChecks()
{
    return Family("Existence")
        .forAll({
            CHECK_FUNCTION(filesAreFiles),
            CHECK_FUNCTION(foldersAreFolders),
            CHECK_FUNCTION(nothingIsWhereNothingIs),
            CHECK_FUNCTION(askingForExistenceMakesNothing),
        })
        .forWritable({
            CHECK_FUNCTION(whatWasRemovedIsGone),
            CHECK_FUNCTION(aNameCanTurnFromFileToFolder),
        })
        .when(makesLinks, {CHECK_FUNCTION(linksAreWhatTheyLeadTo), CHECK_FUNCTION(brokenLinksAreNeitherFileNorFolder)})
        .forWritable(makesSpecialFiles,
                     {CHECK_FUNCTION(specialFilesAreFiles), CHECK_FUNCTION(specialFilesAreNotOpened)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
