// What can be wrong with change events, with use by many threads, and with refusing to write.

#include <storage/provider/ChangeEventExceptions.hpp>
#include <tests/storage/conformance/broken/Defect.hpp>
#include <tests/storage/conformance/broken/brokenTransactions.hpp>

#include <atomic>
#include <thread>
#include <utility>

namespace foundation::storage::conformance::broken {

namespace {

using events::EntryType;
using events::Kind;

/// Tells files as folders and folders as files.
void swappingTypes(Store s, Iri i, ChangeEventCallback const& callback, Kinds kinds)
{
    s.publishFolderEventsFor(
        i,
        [callback](Kind const& kind, Iri location, Iri second, EntryType const& type, auto const& details) {
            callback(kind, location, second, type == EntryType::File ? EntryType::Folder : EntryType::File, details);
        },
        kinds);
}

/// Tells a move as if it had gone nowhere.
void withoutSecondLocation(Store s, Iri i, ChangeEventCallback const& callback, Kinds kinds)
{
    s.publishFolderEventsFor(
        i,
        [callback](Kind const& kind, Iri location, Iri, EntryType const& type, auto const& details) {
            callback(kind, location, location, type, details);
        },
        kinds);
}

void ofAllKinds(Store s, Iri i, ChangeEventCallback const& callback, Kinds)
{
    s.publishFolderEventsFor(i, callback,
                             {Kind::Created, Kind::Removed, Kind::Modified, Kind::AttributesChanged, Kind::Moved});
}

void ofTheWholeFolder(Store s, Iri i, ChangeEventCallback const& callback, Kinds kinds)
{
    s.publishFolderEventsFor(i.getParent(), callback, kinds);
}

void refusingToStop(Store, Iri i)
{
    throw Exception(ErrorCode::ResourceInUse, i);
}

Table changeEvents()
{
    return {"ChangeEvents",
            {{"AFolderTellsWhatIsCreatedInIt", "SwapsTypes", {.publishFolderEventsFor = swappingTypes}},
             {"AFolderTellsWhatIsRemovedFromIt", "SwapsTypes", {.publishFolderEventsFor = swappingTypes}},
             {"AFolderTellsWhatIsModifiedInIt", "SwapsTypes", {.publishFolderEventsFor = swappingTypes}},
             {.check = "AFolderTellsWhatIsModifiedInIt",
              .name = "TellsNothing",
              .misbehaviour = {.publishFolderEventsFor = [](Store, Iri, ChangeEventCallback const&, Kinds) {}},
              .claim = [](Capabilities& c) { c.longestEventDelay = std::chrono::milliseconds(1); }},
             {"AMoveTellsBothLocations", "TellsOne", {.publishFolderEventsFor = withoutSecondLocation}},
             {"OnlyTheKindsAskedForAreTold", "TellsAllKinds", {.publishFolderEventsFor = ofAllKinds}},
             {"NothingIsToldAfterStopping", "DoesNotStop", {.stopPublishingEventsFor = [](Store, Iri) {}}},
             {"StoppingWhatDoesNotRunDoesNothing", "Fails", {.stopPublishingEventsFor = refusingToStop}},
             {.check = "ACallbackMayStopItsOwnEvents",
              .name = "RefusesToStop",
              .misbehaviour = {.stopPublishingEventsFor = refusingToStop},
              .claim = [](Capabilities& c) { c.longestEventDelay = std::chrono::milliseconds(1); }},
             {"AFileTellsItsOwnChangesAlone", "TellsThoseOfTheFolder", {.publishFileEventsFor = ofTheWholeFolder}},
             {"FolderEventsAreRefused",
              "TakesTheCallbackAndForgetsIt",
              {.publishFolderEventsFor = [](Store, Iri, ChangeEventCallback const&, Kinds) {}},
              plainHarness},
             {"FolderEventsAreRefused",
              "NamesTheParent",
              {.publishFolderEventsFor = [](Store, Iri i, ChangeEventCallback const&,
                                            Kinds) { throw ChangeEventsNotSupportedException(i.getParent()); }},
              plainHarness},
             {"FileEventsAreRefused",
              "TakesTheCallbackAndForgetsIt",
              {.publishFileEventsFor = [](Store, Iri, ChangeEventCallback const&, Kinds) {}},
              plainHarness}}};
}

/// Loses sight of a file for a moment after it was replaced.
class LosesSight final : public ForwardingProvider
{
public:
    using ForwardingProvider::ForwardingProvider;

protected:
    void doMoveFile(Iri from, Iri to, Policy const& policy) const override
    {
        ForwardingProvider::doMoveFile(from, to, policy);
        lost_ = true;
    }

    bool doFileExists(Iri iri) const override
    {
        return !lost_.exchange(false) && ForwardingProvider::doFileExists(iri);
    }

private:
    mutable std::atomic<bool> lost_ = false;
};

template <typename Provider>
std::shared_ptr<IProvider> wrappedIn(std::shared_ptr<IProvider> sound)
{
    return std::make_shared<Provider>(std::move(sound));
}

Listing withoutTheFirst(ListingCall const& call)
{
    Listing listing = call.answer();
    if (listing->hasEntry())
        listing->next();
    return listing;
}

Table concurrency()
{
    return {
        "Concurrency",
        {{.check = "ThreadsReadOneFile", .name = "ServesOneThread", .wrap = servingOneThread},
         {.check = "ThreadsDoNotDisturbEachOther", .name = "ServesOneThread", .wrap = servingOneThread},
         {"OneThreadCreatesAName",
          "LetsAllCreateIt",
          {.createFile = [](Store s, Iri i) { swallowed([&] { s.createFile(i); }); }}},
         {"OneThreadCreatesAName",
          "SaysResourceInUse",
          {.createFolder = [](Store s, Iri i) { miscoded([&] { s.createFolder(i); }, ErrorCode::ResourceInUse); }}},
         {"OneThreadRemovesAName",
          "LetsAllRemoveIt",
          {.removeFile = [](Store s, Iri i) { swallowed([&] { s.removeFile(i); }); }}},
         {"OneThreadMovesToAName",
          "LetsAllReplaceIt",
          {.moveFile = [](Store s, Iri from, Iri to, Policy) { s.moveFile(from, to, Policy::Overwrite); }}},
         {"FoldersWithTheirAncestorsAreMadeTogether",
          "SaysResourceInUse",
          {.createFolderRecursive =
               [](Store s, Iri i) { miscoded([&] { s.createFolderRecursive(i); }, ErrorCode::ResourceInUse); }}},
         {"ReadersSeeOneCommitOrAnother", "CommitsAByteMore", {.openTransactionalStream = addingAByte}},
         {.check = "TheFileIsNeverMissingWhileItIsReplaced", .name = "LosesSightOfIt", .wrap = wrappedIn<LosesSight>},
         {"ListingsGoOnWhileTheFolderChanges", "DropsTheFirst", {.list = withoutTheFirst}},
         {"AppendedBlocksAreNotTornOrLost", "LosesTheLastByte", {.write = withoutTheLastByte}},
         {"CopiesDoNotMix",
          "CopiesTheFirstBytes",
          {.copyFile = [](Store s, Iri from, Iri to, Policy) { copyInPlace(s, from, to, 1000); }}},
         {"ReadersSeeOneAtomicCopyOrAnother",
          "CopiesTheFirstBytes",
          {.copyFileAtomic = [](Store s, Iri from, Iri to, Policy, IProvider::Interrupt const&) {
              copyInPlace(s, from, to, 1000);
              return TransactionStatus::Completed;
          }}}}};
}

void refusingOtherwise(Store s, Iri i)
{
    miscoded([&] { s.createFolder(i); }, ErrorCode::PermissionDenied);
}

Table readOnly()
{
    return {
        "ReadOnly",
        {{"CreatingIsRefused", "SaysPermissionDenied", {.createFolder = refusingOtherwise}, readOnlyHarness},
         {"CreatingIsRefused",
          "LooksFirst",
          {.createFile =
               [](Store s, Iri i) {
                   if (s.exists(i) != ExistenceType::AsNeither)
                       throw Exception(ErrorCode::ResourceAlreadyExists, i);
                   s.createFile(i);
               }},
          readOnlyHarness},
         {"RemovingIsRefused", "SaysNothing", {.removeFolderRecursively = [](Store, Iri) {}}, readOnlyHarness},
         {"OpeningForWritingIsRefused",
          "OpensWhatItWillNotTruncate",
          {.openStream =
               [](Store s, Iri i, Options o) {
                   return o.truncate == ByteStreamTruncate::PreserveExisting && s.fileExists(i)
                              ? s.openReadOnlyStream(i)
                              : s.openStream(i, o);
               }},
          readOnlyHarness},
         {"SettingAttributesIsRefused",
          "LetsWritabilityBeTaken",
          {.setWritable =
               [](Store s, Iri i, bool writable) {
                   if (writable)
                       s.setWritable(i, writable);
               }},
          readOnlyHarness},
         {"MovingAndCopyingNameTheSource",
          "NamesTheTarget",
          {.copyFile = [](Store s, Iri from, Iri to, Policy p) { misplaced([&] { s.copyFile(from, to, p); }, to); }},
          readOnlyHarness},
         {"TransactionsAreRefused",
          "SaysUnsupportedOperation",
          {.openTransactionalStream =
               [](Store s, Iri i, Options o) {
                   return miscoded([&] { return s.openTransactionalStream(i, o); }, ErrorCode::UnsupportedOperation);
               }},
          readOnlyHarness}}};
}

} // namespace

std::vector<Table> otherDefects()
{
    return {changeEvents(), concurrency(), readOnly()};
}

} // namespace foundation::storage::conformance::broken
