// What can be wrong with creating, finding, removing and describing entries.

#include <tests/storage/conformance/broken/Defect.hpp>

namespace foundation::storage::conformance::broken {

namespace {

using boost::posix_time::ptime;

void createNoMatterWhat(Store store, Iri iri)
{
    if (!store.folderExists(iri.getParent()))
        swallowed([&] { store.createFolderRecursive(iri.getParent()); });
    store.createFile(iri);
}

FileAttributes withSize(FileAttributes const& attributes, std::uint64_t size)
{
    return FileAttributes(size, attributes.getLastModified(), attributes.isWritable());
}

FileAttributes datedBack(Store store, Iri iri)
{
    FileAttributes const attributes = store.getFileAttributes(iri);
    return FileAttributes(attributes.getSize(), attributes.getLastModified() - boost::posix_time::hours(2), true);
}

ptime longAgo()
{
    return ptime(boost::gregorian::date(1970, 1, 2));
}

Table creation()
{
    return {
        "Creation",
        {{"CreateFileMakesAnEmptyFile", "ForgetsToCreate", {.createFile = [](Store, Iri) {}}},
         {"CreateFileMakesAnEmptyFile",
          "PutsSomethingIntoTheFile",
          {.createFile = [](Store s, Iri i) { s.openStream(i, {})->write(" ", 1); }}},
         {"CreateFileRefusesATakenName",
          "TruncatesATakenFile",
          {.createFile = [](Store s, Iri i) { s.openStream(i, {})->close(); }}},
         {"CreateFileRefusesATakenName",
          "SaysInternalError",
          {.createFile = [](Store s, Iri i) { miscoded([&] { s.createFile(i); }, ErrorCode::InternalError); }}},
         {"CreateFileRefusesATakenName",
          "NamesTheFolder",
          {.createFile = [](Store s, Iri i) { misplaced([&] { s.createFile(i); }, i.getParent()); }}},
         {"CreateFileNeedsAFolderToStandIn", "MakesTheFolderToo", {.createFile = createNoMatterWhat}},
         {"CreateFolderMakesAnEmptyFolder", "MakesAFile", {.createFolder = [](Store s, Iri i) { s.createFile(i); }}},
         {"CreateFolderRefusesATakenName",
          "IsContentWithWhatIsThere",
          {.createFolder = [](Store s, Iri i) { swallowed([&] { s.createFolder(i); }); }}},
         {"CreateFolderNeedsAFolderToStandIn",
          "MakesTheAncestorsToo",
          {.createFolder = [](Store s, Iri i) { s.createFolderRecursive(i); }}},
         {"CreateFolderRecursiveMakesEveryMissingAncestor",
          "MakesOneLevelAlone",
          {.createFolderRecursive = [](Store s, Iri i) { s.createFolder(i); }}},
         {"CreateFolderRecursiveRefusesWhatExists",
          "IsContentWithWhatIsThere",
          {.createFolderRecursive = [](Store s, Iri i) { swallowed([&] { s.createFolderRecursive(i); }); }}},
         {"CreateFolderRecursiveNamesTheFolderAskedForWhenAnAncestorIsAFile",
          "NamesTheAncestor",
          {.createFolderRecursive = [](Store s,
                                       Iri i) { misplaced([&] { s.createFolderRecursive(i); }, i.getParent()); }}},
         {"CreateFolderRecursiveNeverMakesATop", "IsContentWithATop", {.createFolderRecursive = [](Store s, Iri i) {
              if (i.hasParent())
                  s.createFolderRecursive(i);
          }}}}};
}

Table existence()
{
    return {"Existence",
            {{"FilesAreFiles", "TakesFilesForFolders", {.exists = [](Store, Iri) { return ExistenceType::AsFolder; }}},
             {"FilesAreFiles",
              "TakesFilesForSpecial",
              {.existsExtended = [](Store, Iri) { return ExistenceTypeExtended::SpecialFile; }}},
             {"FoldersAreFolders", "SeesNoFolders", {.folderExists = [](Store, Iri) { return false; }}},
             {"NothingIsWhereNothingIs",
              "SeesFilesEverywhere",
              {.exists = [](Store s,
                            Iri i) { return s.folderExists(i) ? ExistenceType::AsFolder : ExistenceType::AsFile; }}},
             {"NothingIsWhereNothingIs",
              "FailsForWhatIsMissing",
              {.exists =
                   [](Store s, Iri i) {
                       if (s.exists(i) == ExistenceType::AsNeither)
                           throw Exception(ErrorCode::ResourceNotFound, i);
                       return s.exists(i);
                   }}},
             {"AskingForExistenceMakesNothing",
              "MakesWhatIsAskedFor",
              {.existsExtended =
                   [](Store s, Iri i) {
                       ExistenceTypeExtended const before = s.existsExtended(i);
                       swallowed([&] { s.createFile(i); });
                       return before;
                   }}},
             {"WhatWasRemovedIsGone", "RemovesNothing", {.removeFile = [](Store, Iri) {}}},
             {"ANameCanTurnFromFileToFolder",
              "RemembersTheFirstKindOfAName",
              {.exists = [](Store s, Iri i) { return i.getName() == u"name" ? ExistenceType::AsFile : s.exists(i); }}},
             {"LinksAreWhatTheyLeadTo",
              "DoesNotKnowLinks",
              {.existsExtended =
                   [](Store s, Iri i) {
                       return s.fileExists(i)     ? ExistenceTypeExtended::RegularFile
                              : s.folderExists(i) ? ExistenceTypeExtended::RegularFolder
                                                  : ExistenceTypeExtended::None;
                   }},
              localHarness},
             {"BrokenLinksAreNeitherFileNorFolder",
              "TakesBrokenLinksForFiles",
              {.fileExists =
                   [](Store s, Iri i) {
                       return s.exists(i) == ExistenceType::AsFile ||
                              s.existsExtended(i) == ExistenceTypeExtended::BrokenSymlink;
                   }},
              localHarness},
             {"SpecialFilesAreFiles",
              "TakesSpecialFilesForRegularOnes",
              {.existsExtended =
                   [](Store s, Iri i) {
                       auto const found = s.existsExtended(i);
                       return found == ExistenceTypeExtended::SpecialFile ? ExistenceTypeExtended::RegularFile : found;
                   }},
              localHarness},
             {"SpecialFilesAreNotOpened",
              "SaysPermissionDenied",
              {.openReadOnlyStream =
                   [](Store s, Iri i) {
                       return miscoded([&] { return s.openReadOnlyStream(i); }, ErrorCode::PermissionDenied);
                   }},
              localHarness}}};
}

Table removal()
{
    return {"Removal",
            {{"RemoveFileRemovesThatFileAlone",
              "RemovesWhatBeginsAlikeToo",
              {.removeFile =
                   [](Store s, Iri i) {
                       s.removeFile(i);
                       swallowed([&] { s.removeFile(sibling(i, i.getName() + u"2")); });
                   }}},
             {"RemoveFileNeedsAFile",
              "IsContentWithNothing",
              {.removeFile = [](Store s, Iri i) { swallowed([&] { s.removeFile(i); }); }}},
             {"RemoveFileNeedsAFile",
              "RemovesEmptyFolders",
              {.removeFile = [](Store s, Iri i) { s.folderExists(i) ? s.removeFolder(i) : s.removeFile(i); }}},
             {"RemoveFolderRemovesAnEmptyFolder",
              "RemovesTheParentWhenItIsEmpty",
              {.removeFolder =
                   [](Store s, Iri i) {
                       s.removeFolder(i);
                       swallowed([&] { s.removeFolder(i.getParent()); });
                   }}},
             {"RemoveFolderRefusesAFullOne",
              "RemovesWhatItHolds",
              {.removeFolder = [](Store s, Iri i) { s.removeFolderRecursively(i); }}},
             {"RemoveFolderRefusesAFullOne",
              "SaysResourceInUse",
              {.removeFolder = [](Store s, Iri i) { miscoded([&] { s.removeFolder(i); }, ErrorCode::ResourceInUse); }}},
             {"RemoveFolderNeedsAFolder",
              "RemovesFiles",
              {.removeFolder = [](Store s, Iri i) { s.fileExists(i) ? s.removeFile(i) : s.removeFolder(i); }}},
             {"RemoveFileRemovesALinkAndNotItsTarget",
              "RemovesWhatALinkLeadsTo",
              {.removeFile = [](Store s, Iri i) { s.removeFile(i.getName() == u"link" ? sibling(i, u"file") : i); }},
              localHarness},
             {"ALinkToAFolderIsNotRemovedAsAFolder",
              "RemovesTheLink",
              {.removeFolder =
                   [](Store s, Iri i) {
                       s.existsExtended(i) == ExistenceTypeExtended::SymlinkToFolder ? s.removeFile(i)
                                                                                     : s.removeFolder(i);
                   }},
              localHarness},
             {"RemoveFolderRecursivelyRemovesAllBelow",
              "RemovesFilesOfTheFirstLevel",
              {.removeFolderRecursively =
                   [](Store s, Iri i) {
                       for (FolderEntry const& entry : entriesOf(s.listFiles(i)))
                           s.removeFile(StorageIRI(i, entry.getName()));
                   }}},
             {"RemoveFolderRecursivelyRemovesAllBelow",
              "DoesNotAnnounceIt",
              {.hasFeature = [](Store, ExtendedFeature) { return false; }}},
             {"RemoveFolderRecursivelyNeedsAFolder",
              "RemovesFiles",
              {.removeFolderRecursively =
                   [](Store s, Iri i) { s.fileExists(i) ? s.removeFile(i) : s.removeFolderRecursively(i); }}},
             {"RemoveFolderRecursivelyLeavesWhatLinksLeadTo",
              "FollowsLinks",
              {.removeFolderRecursively =
                   [](Store s, Iri i) {
                       s.removeFile(StorageIRI(i, u"folder/file"));
                       s.removeFolderRecursively(i);
                   }},
              recursiveHarness},
             {.check = "RemoveFolderRecursivelyIsRefused",
              .name = "DoesWhatItDoesNotClaim",
              .sound = plainHarness,
              .base = memoryHarness,
              .claim = [](Capabilities& c) { c.recursiveRemoval = false; }}}};
}

Table attributes()
{
    return {"Attributes",
            {{"SizesAreExact",
              "RoundsUpToBlocks",
              {.getFileAttributes =
                   [](Store s, Iri i) {
                       FileAttributes const found = s.getFileAttributes(i);
                       return withSize(found, (found.getSize() + 511) / 512 * 512);
                   }}},
             {"WhatWasJustMadeIsDatedNow", "TellsTheTimeOfAnotherZone", {.getFileAttributes = datedBack}},
             {"WhatWasJustMadeIsWritable",
              "LetsNothingBeWritten",
              {.getFolderAttributes =
                   [](Store s, Iri i) { return FolderAttributes(s.getFolderAttributes(i).getLastModified(), false); }}},
             {"NothingIsWritableInAReadOnlyStore",
              "SaysWritable",
              {.getFolderAttributes =
                   [](Store s, Iri i) { return FolderAttributes(s.getFolderAttributes(i).getLastModified(), true); }},
              readOnlyHarness},
             {"FileAttributesNeedAFile",
              "DescribesFoldersAsFiles",
              {.getFileAttributes =
                   [](Store s, Iri i) {
                       return s.folderExists(i) ? FileAttributes(0, longAgo(), true) : s.getFileAttributes(i);
                   }}},
             {"FolderAttributesNeedAFolder",
              "DescribesFilesAsFolders",
              {.getFolderAttributes =
                   [](Store s, Iri i) {
                       return s.fileExists(i) ? FolderAttributes(longAgo(), true) : s.getFolderAttributes(i);
                   }}},
             {.check = "ExtendedAttributesAreThoseClaimed",
              .name = "LacksOneThatItClaims",
              .claim = [](Capabilities& c) { c.extendedAttributes = {"owner"}; }},
             {"TimesAreSet",
              "DropsFractionsOfSeconds",
              {.setLastModified =
                   [](Store s, Iri i, ptime time) {
                       s.setLastModified(
                           i, ptime(time.date(), boost::posix_time::seconds(time.time_of_day().total_seconds())));
                   }}},
             {"TimesAreSet",
              "DatesFilesAlone",
              {.setLastModified =
                   [](Store s, Iri i, ptime time) {
                       if (s.fileExists(i))
                           s.setLastModified(i, time);
                   }}},
             {"WritingDatesAFileNow",
              "KeepsTheFirstTimeThatItWasTold",
              {.getFileAttributes =
                   [](Store s, Iri i) {
                       FileAttributes const found = s.getFileAttributes(i);
                       return FileAttributes(found.getSize(), longAgo(), found.isWritable());
                   }}},
             {"ReadingDoesNotDateAFile",
              "DatesWhatIsRead",
              {.openReadOnlyStream =
                   [](Store s, Iri i) {
                       s.setLastModified(i, boost::posix_time::second_clock::universal_time());
                       return s.openReadOnlyStream(i);
                   }}},
             {"SettingATimeNeedsAnEntry",
              "CreatesWhatItDates",
              {.setLastModified =
                   [](Store s, Iri i, ptime time) {
                       swallowed([&] { s.createFile(i); });
                       s.setLastModified(i, time);
                   }}},
             {"SettingATimeIsRefused",
              "TakesATimeAndForgetsIt",
              {.setLastModified = [](Store, Iri, ptime) {}},
              plainHarness},
             {"WritabilityIsTakenAndGivenBack", "IgnoresIt", {.setWritable = [](Store, Iri, bool) {}}},
             {"AnUnwritableFileIsNotOpenedForWriting",
              "OpensItAllTheSame",
              {.openStream =
                   [](Store s, Iri i, ByteStreamOpenOptions options) {
                       swallowed([&] { s.setWritable(i, true); });
                       return s.openStream(i, options);
                   }}},
             {"SettingWritabilityNeedsAnEntry",
              "IsContentWithNothing",
              {.setWritable = [](Store s, Iri i, bool writable) { swallowed([&] { s.setWritable(i, writable); }); }}},
             {"SettingWritabilityIsRefused",
              "TakesItAndForgetsIt",
              {.setWritable = [](Store, Iri, bool) {}},
              plainHarness}}};
}

} // namespace

std::vector<Table> entryDefects()
{
    return {creation(), existence(), removal(), attributes()};
}

} // namespace foundation::storage::conformance::broken
