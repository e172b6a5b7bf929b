#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/conformance/detail/listings.hpp>

#include <algorithm>
#include <set>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

void expectAllListed(Harness const& harness, bool recursive)
{
    Scene const scene(harness, listingContent());
    forEachListing(recursive, [&](ListingOperation const& operation) {
        EXPECT_EQ(namesOf(list(scene, operation, scene.iri())), expectedNames(operation));
    });
}

void eachOperationListsItsKind(Harness const& harness)
{
    expectAllListed(harness, false);
}

void recursiveListingsGiveAllBelowByPath(Harness const& harness)
{
    expectAllListed(harness, true);
}

void anEmptyFolderHasNoEntry(Harness const& harness)
{
    Scene const scene(harness, {{u"empty/", ""}});
    forEachListing(false, [&](ListingOperation const& operation) {
        EXPECT_FALSE(list(scene, operation, scene.iri(u"empty"))->hasEntry());
        EXPECT_FALSE(list(scene, operation, scene.iri(u"empty"), u"*")->hasEntry());
    });
}

void subfoldersAreListedByTheirOwnLocation(Harness const& harness)
{
    Scene const scene(harness, listingContent());
    EXPECT_EQ(namesOf(scene.provider().listAll(scene.iri(u"folder"))), (Names{u"d.txt", u"inner/"}));
    EXPECT_EQ(namesOf(scene.provider().listAll(scene.iri(u"folder/inner"))), (Names{u"e.md"}));
}

void expectAFolderNeeded(Harness const& harness, bool recursive)
{
    Scene const scene(harness, {{u"file", "content"}});
    forEachListing(recursive, [&](ListingOperation const& operation) {
        for (auto const* const path : {u"missing", u"missing/inner", u"file", u"file/inner"}) {
            for (auto const* const pattern : {u"", u"*"})
                EXPECT_TRUE(scene.refuses([&] { list(scene, operation, scene.iri(path), pattern); },
                                          ErrorCode::ResourceNotFound, scene.iri(path)));
        }
    });
}

void listingsNeedAFolder(Harness const& harness)
{
    expectAFolderNeeded(harness, false);
}

void recursiveListingsNeedAFolder(Harness const& harness)
{
    expectAFolderNeeded(harness, true);
}

void expectAttributes(FolderEntry const& entry, StorageItem const& item)
{
    if (!entry.isFile()) {
        EXPECT_FALSE(entry.getFileAttributes());
        ASSERT_TRUE(entry.getFolderAttributes());
        EXPECT_EQ(entry.getFolderAttributes()->getLastModified(), item.getFolderAttributes().getLastModified());
        EXPECT_EQ(entry.getFolderAttributes()->isWritable(), item.getFolderAttributes().isWritable());
        return;
    }
    EXPECT_FALSE(entry.getFolderAttributes());
    ASSERT_TRUE(entry.getFileAttributes());
    EXPECT_EQ(entry.getFileAttributes()->getSize(), item.getFileAttributes().getSize());
    EXPECT_EQ(entry.getFileAttributes()->getLastModified(), item.getFileAttributes().getLastModified());
    EXPECT_EQ(entry.getFileAttributes()->isWritable(), item.getFileAttributes().isWritable());
}

void expectAttributesListed(Harness const& harness, bool recursive)
{
    Scene const scene(harness, listingContent());
    forEachListing(recursive, [&](ListingOperation const& operation) {
        IProvider::Listing const listing = list(scene, operation, scene.iri());
        for (FolderEntry const& entry : entries(*listing)) {
            if (operation.attributes)
                expectAttributes(entry, scene.item(entry.getName()));
        }
    });
}

void fullListingsGiveTheAttributesOfEachEntry(Harness const& harness)
{
    expectAttributesListed(harness, false);
}

void fullRecursiveListingsGiveTheAttributesOfEachEntry(Harness const& harness)
{
    expectAttributesListed(harness, true);
}

void resetStartsAgain(Harness const& harness)
{
    Scene const scene(harness, listingContent());
    forEachListing(false, [&](ListingOperation const& operation) {
        IProvider::Listing const listing = list(scene, operation, scene.iri());
        for (int round = 0; round < 3; ++round) {
            EXPECT_EQ(namesOf(listing), expectedNames(operation));
            EXPECT_FALSE(listing->hasEntry());
            listing->reset();
        }
        listing->next();
        listing->reset();
        EXPECT_EQ(namesOf(listing), expectedNames(operation));
    });
}

void resetSeesTheFolderAsItIsNow(Harness const& harness)
{
    Scene const scene(harness, {{u"old", ""}});
    IProvider::Listing const listing = scene.provider().listAll(scene.iri());
    EXPECT_EQ(namesOf(listing), (Names{u"old"}));
    scene.provider().createFile(scene.iri(u"new"));
    scene.provider().removeFile(scene.iri(u"old"));
    listing->reset();
    EXPECT_EQ(namesOf(listing), (Names{u"new"}));
}

void manyEntriesAreEachListedOnce(Harness const& harness)
{
    std::u16string const longEnoughToFillTheBuffersOfAListingSoon(180, u'x');
    Tree many;
    for (char16_t a = u'a'; a <= u'z'; ++a) {
        for (char16_t b = u'a'; b <= u'j'; ++b)
            many[longEnoughToFillTheBuffersOfAListingSoon + std::u16string{a, b}];
    }
    Scene const scene(harness, many);
    Names names;
    for (auto const& [name, bytes] : many)
        names.push_back(name);
    for (auto const list : {&IProvider::listAll, &IProvider::listFilesNamesOnly})
        EXPECT_EQ(namesOf((scene.provider().*list)(scene.iri(), {})), names);
}

void entriesMayVanishDuringAListing(Harness const& harness)
{
    Tree many;
    for (char16_t a = u'a'; a <= u'z'; ++a)
        many[std::u16string(10, a)] = "content";
    Scene const scene(harness, many);
    IProvider::Listing const listing = scene.provider().listAll(scene.iri());
    std::multiset<std::u16string> seen;
    while (listing->hasEntry()) {
        seen.insert(listing->entry().getName());
        for (auto const& [name, bytes] : many) {
            if (scene.provider().fileExists(scene.iri(name)))
                scene.provider().removeFile(scene.iri(name));
        }
        listing->next();
    }
    for (std::u16string const& name : seen)
        EXPECT_TRUE(many.contains(name) && seen.count(name) == 1);
    EXPECT_FALSE(seen.empty());
    EXPECT_TRUE(scene.holds({}));
}

void anEntryOutlivesItsListing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    std::optional<FolderEntry> entry;
    {
        IProvider::Listing const listing = scene.provider().listFiles(scene.iri());
        ASSERT_TRUE(listing->hasEntry());
        entry = listing->entry();
    }
    EXPECT_EQ(entry->getName(), u"file");
    ASSERT_TRUE(entry->getFileAttributes());
    EXPECT_EQ(entry->getFileAttributes()->isWritable(), scene.capabilities().writable);
}

void linksAreListedAsWhatTheyLeadTo(Harness const& harness)
{
    Scene const scene(harness, {{u"a file", "content"}, {u"a folder/", ""}});
    harness.makers.symbolicLink(scene.iri(u"to file"), scene.iri(u"a file"));
    harness.makers.symbolicLink(scene.iri(u"to folder"), scene.iri(u"a folder"));
    harness.makers.symbolicLink(scene.iri(u"to nothing"), scene.iri(u"missing"));
    forEachListing(false, [&](ListingOperation const& operation) {
        Names names;
        if (operation.files)
            names.insert(names.end(), {u"a file", u"to file", u"to nothing"});
        if (operation.folders)
            names.insert(names.end(), {u"a folder/", u"to folder/"});
        std::sort(names.begin(), names.end());
        EXPECT_EQ(namesOf(list(scene, operation, scene.iri())), names);
    });
}

void recursiveListingsLeaveWhatLinksLeadTo(Harness const& harness)
{
    Scene const scene(harness, {{u"outside/", ""}, {u"outside/file", "kept"}, {u"tree/", ""}});
    harness.makers.symbolicLink(scene.iri(u"tree/loop"), scene.iri(u"tree"));
    harness.makers.symbolicLink(scene.iri(u"tree/out"), scene.iri(u"outside"));
    EXPECT_EQ(namesOf(scene.provider().listAllRecursive(scene.iri(u"tree"))), (Names{u"loop/", u"out/"}));
}

void recursiveListingsAreRefused(Harness const& harness)
{
    Scene const scene(harness, listingContent());
    forEachListing(true, [&](ListingOperation const& operation) {
        for (auto const* const pattern : {u"", u"*"})
            EXPECT_TRUE(scene.refuses([&] { list(scene, operation, scene.iri(u"folder"), pattern); },
                                      ErrorCode::UnsupportedOperation, scene.iri(u"folder")));
    });
}

} // namespace

std::vector<Check> listingChecks()
{
    auto const recursive = claims(&Capabilities::recursiveListing);
    return Family("Listings")
        .forAll({
            CHECK_FUNCTION(eachOperationListsItsKind),
            CHECK_FUNCTION(anEmptyFolderHasNoEntry),
            CHECK_FUNCTION(subfoldersAreListedByTheirOwnLocation),
            CHECK_FUNCTION(listingsNeedAFolder),
            CHECK_FUNCTION(fullListingsGiveTheAttributesOfEachEntry),
            CHECK_FUNCTION(resetStartsAgain),
            CHECK_FUNCTION(manyEntriesAreEachListedOnce),
            CHECK_FUNCTION(anEntryOutlivesItsListing),
        })
        .forWritable({CHECK_FUNCTION(resetSeesTheFolderAsItIsNow), CHECK_FUNCTION(entriesMayVanishDuringAListing)})
        .when(makesLinks, {CHECK_FUNCTION(linksAreListedAsWhatTheyLeadTo)})
        .when(recursive,
              {CHECK_FUNCTION(recursiveListingsGiveAllBelowByPath), CHECK_FUNCTION(recursiveListingsNeedAFolder),
               CHECK_FUNCTION(fullRecursiveListingsGiveTheAttributesOfEachEntry)})
        .when(both(recursive, makesLinks), {CHECK_FUNCTION(recursiveListingsLeaveWhatLinksLeadTo)})
        .when(disclaims(&Capabilities::recursiveListing), {CHECK_FUNCTION(recursiveListingsAreRefused)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
