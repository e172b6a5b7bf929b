#include <storage/conformance/detail/EventLog.hpp>
#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/conditions.hpp>
#include <storage/conformance/detail/describe.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/provider/ChangeEventExceptions.hpp>

#include <algorithm>

namespace foundation::storage::conformance::detail {

using namespace provider;
using events::EntryType;
using events::Kind;

namespace {

IProvider::EventKinds const allKinds{Kind::Created, Kind::Removed, Kind::Modified, Kind::AttributesChanged,
                                     Kind::Moved};

bool isOrUnknown(EntryType told, EntryType actual)
{
    return told == actual || told == EntryType::Unknown;
}

void expectTypes(EventLog const& log, StorageIRI const& location, EntryType type)
{
    for (Event const& event : log.events())
        EXPECT_TRUE(event.location != location || isOrUnknown(event.type, type)) << event.location;
}

void aFolderTellsWhatIsCreatedInIt(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness);
    scene.provider().publishFolderEventsFor(scene.iri(), log.callback(), allKinds);
    scene.provider().createFile(scene.iri(u"file"));
    scene.provider().createFolder(scene.iri(u"folder"));
    EXPECT_TRUE(log.waitFor(Kind::Created, scene.iri(u"file")));
    EXPECT_TRUE(log.waitFor(Kind::Created, scene.iri(u"folder")));
    expectTypes(log, scene.iri(u"file"), EntryType::File);
    expectTypes(log, scene.iri(u"folder"), EntryType::Folder);
    scene.provider().stopPublishingFolderEventsFor(scene.iri());
}

void aFolderTellsWhatIsRemovedFromIt(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    scene.provider().publishFolderEventsFor(scene.iri(), log.callback(), allKinds);
    scene.provider().removeFile(scene.iri(u"file"));
    scene.provider().removeFolder(scene.iri(u"folder"));
    EXPECT_TRUE(log.waitFor(Kind::Removed, scene.iri(u"file")));
    EXPECT_TRUE(log.waitFor(Kind::Removed, scene.iri(u"folder")));
    expectTypes(log, scene.iri(u"file"), EntryType::File);
    expectTypes(log, scene.iri(u"folder"), EntryType::Folder);
    scene.provider().stopPublishingFolderEventsFor(scene.iri());
}

void aFolderTellsWhatIsModifiedInIt(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness, {{u"file", "content"}});
    scene.provider().publishFolderEventsFor(scene.iri(), log.callback(), allKinds);
    scene.write(u"file", "more content");
    EXPECT_TRUE(log.waitFor(Kind::Modified, scene.iri(u"file")));
    expectTypes(log, scene.iri(u"file"), EntryType::File);
    scene.provider().stopPublishingFolderEventsFor(scene.iri());
}

void aMoveTellsBothLocations(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness, {{u"from", "content"}});
    scene.provider().publishFolderEventsFor(scene.iri(), log.callback(), allKinds);
    scene.provider().moveFile(scene.iri(u"from"), scene.iri(u"to"), ReplacementPolicy::Preserve);
    ASSERT_TRUE(log.waitFor(Kind::Moved, scene.iri(u"from")));
    for (Event const& event : log.events())
        EXPECT_TRUE(event.kind != Kind::Moved || event.second == scene.iri(u"to")) << event.second;
    scene.provider().stopPublishingFolderEventsFor(scene.iri());
}

void onlyTheKindsAskedForAreTold(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness);
    scene.provider().publishFolderEventsFor(scene.iri(), log.callback(), {Kind::Removed});
    scene.write(u"file", "content");
    scene.provider().removeFile(scene.iri(u"file"));
    EXPECT_TRUE(log.waitFor(Kind::Removed, scene.iri(u"file")));
    for (Event const& event : log.events())
        EXPECT_EQ(event.kind, Kind::Removed);
    scene.provider().stopPublishingFolderEventsFor(scene.iri());
}

/// Events of another folder show that those of the first would have come by now.
void nothingIsToldAfterStopping(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness, {{u"stopped/", ""}, {u"going on/", ""}});
    scene.provider().publishFolderEventsFor(scene.iri(u"stopped"), log.callback(), allKinds);
    scene.provider().publishFolderEventsFor(scene.iri(u"going on"), log.callback(), allKinds);
    scene.provider().stopPublishingFolderEventsFor(scene.iri(u"stopped"));
    scene.provider().createFile(scene.iri(u"stopped/file"));
    scene.provider().createFile(scene.iri(u"going on/file"));
    EXPECT_TRUE(log.waitFor(Kind::Created, scene.iri(u"going on/file")));
    for (Event const& event : log.events())
        EXPECT_NE(event.location, scene.iri(u"stopped/file"));
    scene.provider().stopPublishingFolderEventsFor(scene.iri(u"going on"));
}

void stoppingWhatDoesNotRunDoesNothing(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness, {{u"folder/", ""}});
    scene.provider().stopPublishingFolderEventsFor(scene.iri(u"folder"));
    scene.provider().publishFolderEventsFor(scene.iri(u"folder"), log.callback(), allKinds);
    scene.provider().stopPublishingFolderEventsFor(scene.iri(u"folder"));
    scene.provider().stopPublishingFolderEventsFor(scene.iri(u"folder"));
    EXPECT_TRUE(scene.holds({{u"folder/", ""}}));
}

void aCallbackMayStopItsOwnEvents(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness);
    ChangeEventCallback const logged = log.callback();
    auto const stopping = [&](auto&&... event) {
        scene.provider().stopPublishingFolderEventsFor(scene.iri());
        logged(event...);
    };
    scene.provider().publishFolderEventsFor(scene.iri(), stopping, {Kind::Created});
    scene.provider().createFile(scene.iri(u"file"));
    EXPECT_TRUE(log.waitFor(Kind::Created, scene.iri(u"file")));
}

void aFileTellsItsOwnChangesAlone(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness, {{u"file", "content"}, {u"other", "content"}});
    scene.provider().publishFileEventsFor(scene.iri(u"file"), log.callback(), {Kind::Modified});
    scene.write(u"other", "more content");
    scene.write(u"file", "more content");
    EXPECT_TRUE(log.waitFor(Kind::Modified, scene.iri(u"file")));
    for (Event const& event : log.events())
        EXPECT_EQ(event.location, scene.iri(u"file"));
    scene.provider().stopPublishingFileEventsFor(scene.iri(u"file"));
}

template <typename Action>
void expectNotSupported(Scene const& scene, Action const& action, StorageIRI const& location)
{
    Tree const before = scene.tree();
    try {
        action();
        ADD_FAILURE() << "no failure";
    } catch (ChangeEventsNotSupportedException const& error) {
        EXPECT_EQ(error.getStorageIRI(), location);
    }
    EXPECT_TRUE(scene.holds(before));
}

void folderEventsAreRefused(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness, {{u"folder/", ""}});
    for (StorageIRI const& folder : {scene.iri(), scene.iri(u"folder")}) {
        expectNotSupported(
            scene, [&] { scene.provider().publishFolderEventsFor(folder, log.callback(), allKinds); }, folder);
        scene.provider().stopPublishingFolderEventsFor(folder);
    }
    EXPECT_TRUE(log.events().empty());
}

void fileEventsAreRefused(Harness const& harness)
{
    EventLog log(harness);
    Scene const scene(harness, {{u"file", "content"}});
    StorageIRI const file = scene.iri(u"file");
    expectNotSupported(
        scene, [&] { scene.provider().publishFileEventsFor(file, log.callback(), allKinds); }, file);
    scene.provider().stopPublishingFileEventsFor(file);
    EXPECT_TRUE(log.events().empty());
}

} // namespace

std::vector<Check> changeEventChecks()
{
    return Family("ChangeEvents")
        .forWritable(claims(&Capabilities::folderEvents),
                     {
                         CHECK_FUNCTION(aFolderTellsWhatIsCreatedInIt),
                         CHECK_FUNCTION(aFolderTellsWhatIsRemovedFromIt),
                         CHECK_FUNCTION(aFolderTellsWhatIsModifiedInIt),
                         CHECK_FUNCTION(aMoveTellsBothLocations),
                         CHECK_FUNCTION(onlyTheKindsAskedForAreTold),
                         CHECK_FUNCTION(nothingIsToldAfterStopping),
                         CHECK_FUNCTION(stoppingWhatDoesNotRunDoesNothing),
                         CHECK_FUNCTION(aCallbackMayStopItsOwnEvents),
                     })
        .forWritable(claims(&Capabilities::fileEvents), {CHECK_FUNCTION(aFileTellsItsOwnChangesAlone)})
        .when(disclaims(&Capabilities::folderEvents), {CHECK_FUNCTION(folderEventsAreRefused)})
        .when(disclaims(&Capabilities::fileEvents), {CHECK_FUNCTION(fileEventsAreRefused)})
        .checks();
}

} // namespace foundation::storage::conformance::detail
