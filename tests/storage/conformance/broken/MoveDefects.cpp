// What can be wrong with moving files and folders.

#include <tests/storage/conformance/broken/Defect.hpp>

namespace foundation::storage::conformance::broken {

namespace {

constexpr long oneMebibyte = 1 << 20;

Misbehaviour movingFiles(void (*move)(Store, Iri, Iri, Policy))
{
    return {.moveFile = move};
}

Misbehaviour movingFolders(void (*move)(Store, Iri, Iri, Policy))
{
    return {.moveFolder = move};
}

void replacing(Store s, Iri from, Iri to, Policy)
{
    s.moveFile(from, to, Policy::Overwrite);
}

Table moveFile()
{
    return {
        "MoveFile",
        {{"AFreeNameIsTakenUnderEveryPolicy", "KeepsTheSource",
          movingFiles([](Store s, Iri from, Iri to, Policy p) { s.copyFile(from, to, p); })},
         {"AnEmptyAndALargeFileMoveWhole", "MovesTheFirstMebibyte", movingFiles([](Store s, Iri from, Iri to, Policy) {
              copyInPlace(s, from, to, oneMebibyte);
              s.removeFile(from);
          })},
         {"APreservingPolicyKeepsTheTarget", "ReplacesAllTheSame", movingFiles(replacing)},
         {"APreservingPolicyKeepsTheTarget", "ReplacesUnderNoClobber",
          movingFiles([](Store s, Iri from, Iri to, Policy p) {
              s.moveFile(from, to, p == Policy::NoClobber ? Policy::Overwrite : p);
          })},
         {"APreservingPolicyKeepsTheTarget", "NamesTheSource",
          movingFiles([](Store s, Iri from, Iri to, Policy p) { misplaced([&] { s.moveFile(from, to, p); }, from); })},
         {"AReplacingPolicyReplacesTheTarget", "KeepsTheTargetUnderClobber",
          movingFiles([](Store s, Iri from, Iri to, Policy p) {
              s.moveFile(from, to, p == Policy::Clobber ? Policy::Preserve : p);
          })},
         {"AFolderIsNeverReplaced", "ReplacesEmptyFolders", movingFiles([](Store s, Iri from, Iri to, Policy p) {
              if (!preserves(p))
                  swallowed([&] { s.removeFolder(to); });
              s.moveFile(from, to, p);
          })},
         {"AFolderIsNeverReplaced", "MovesIntoTheFolder", movingFiles([](Store s, Iri from, Iri to, Policy p) {
              s.moveFile(from, s.folderExists(to) ? StorageIRI(to, from.getName()) : to, p);
          })},
         {"TheSourceHasToBeAFile", "MovesFoldersToo", movingFiles([](Store s, Iri from, Iri to, Policy p) {
              s.folderExists(from) ? s.moveFolder(from, to, p) : s.moveFile(from, to, p);
          })},
         {"TheSourceHasToBeAFile", "RemovesTheTargetFirst", movingFiles([](Store s, Iri from, Iri to, Policy p) {
              if (!preserves(p))
                  swallowed([&] { s.removeFile(to); });
              s.moveFile(from, to, p);
          })},
         {"TheTargetNeedsAFolderToStandIn", "NamesTheSource",
          movingFiles([](Store s, Iri from, Iri to, Policy p) { misplaced([&] { s.moveFile(from, to, p); }, from); })},
         {"OntoItselfChangesNothing", "RemovesTheTargetFirst", movingFiles([](Store s, Iri from, Iri to, Policy p) {
              if (!preserves(p))
                  swallowed([&] { s.removeFile(to); });
              s.moveFile(from, to, p);
          })},
         {"OntoItsSecondNameKeepsTheContent", "LeavesBothNames", movingFiles([](Store s, Iri from, Iri to, Policy p) {
              if (!s.fileExists(to))
                  s.moveFile(from, to, p);
          }),
          localHarness},
         {"APreservingPolicyKeepsASecondName", "ReplacesAllTheSame", movingFiles(replacing), localHarness},
         {"LinksAreMovedThemselves", "MovesWhatTheyLeadTo", movingFiles([](Store s, Iri from, Iri to, Policy p) {
              s.copyFile(from, to, p);
              s.removeFile(from);
          }),
          localHarness},
         {"AFileReplacesALinkAndNotWhatItLeadsTo", "WritesThroughTheLink",
          movingFiles([](Store s, Iri from, Iri to, Policy p) {
              s.copyFile(from, to, p);
              s.removeFile(from);
          }),
          localHarness},
         {"AFileReplacesALinkToItself", "TakesThemForOne", movingFiles([](Store s, Iri from, Iri to, Policy p) {
              if (!s.fileExists(to))
                  s.moveFile(from, to, p);
          }),
          localHarness},
         {"ALinkDoesNotReplaceWhatItLeadsTo", "RemovesTheTargetFirst",
          movingFiles([](Store s, Iri from, Iri to, Policy p) {
              s.removeFile(to);
              s.moveFile(from, to, p);
          }),
          localHarness}}};
}

Table moveFolder()
{
    return {
        "MoveFolder",
        {{"AFolderMovesWithAllItHolds", "LeavesSubfoldersBehind",
          movingFolders([](Store s, Iri from, Iri to, Policy p) {
              s.createFolder(to);
              for (FolderEntry const& entry : entriesOf(s.listFiles(from)))
                  s.moveFile(StorageIRI(from, entry.getName()), StorageIRI(to, entry.getName()), p);
              s.removeFolderRecursively(from);
          })},
         {"NothingIsEverReplaced", "ReplacesFolders", movingFolders([](Store s, Iri from, Iri to, Policy p) {
              if (!preserves(p))
                  swallowed([&] { s.removeFolderRecursively(to); });
              s.moveFolder(from, to, p);
          })},
         {"NothingIsEverReplaced", "ReplacesFiles", movingFolders([](Store s, Iri from, Iri to, Policy p) {
              if (!preserves(p))
                  swallowed([&] { s.removeFile(to); });
              s.moveFolder(from, to, p);
          })},
         {"TheSourceHasToBeAFolder", "MovesFilesToo", movingFolders([](Store s, Iri from, Iri to, Policy p) {
              s.fileExists(from) ? s.moveFile(from, to, p) : s.moveFolder(from, to, p);
          })},
         {"TheSourceHasToBeAFolder", "NamesTheTarget", movingFolders([](Store s, Iri from, Iri to, Policy p) {
              misplaced([&] { s.moveFolder(from, to, p); }, to);
          })},
         {"TheTargetNeedsAFolderToStandIn", "MakesTheFolder", movingFolders([](Store s, Iri from, Iri to, Policy p) {
              swallowed([&] { s.createFolderRecursive(to.getParent()); });
              s.moveFolder(from, to, p);
          })},
         {"AFolderDoesNotMoveBelowItselfByADetour", "SaysInternalError",
          movingFolders([](Store s, Iri from, Iri to, Policy p) {
              miscoded([&] { s.moveFolder(from, to, p); }, ErrorCode::InternalError);
          })},
         {"OntoItselfChangesNothing", "RefusesIt", movingFolders([](Store s, Iri from, Iri to, Policy p) {
              if (s.exists(to) != ExistenceType::AsNeither)
                  throw Exception(ErrorCode::ResourceAlreadyExists, to);
              s.moveFolder(from, to, p);
          })},
         {"ALinkToAFolderIsNotThatFolder", "MovesTheLink", movingFolders([](Store s, Iri from, Iri to, Policy p) {
              s.existsExtended(from) == ExistenceTypeExtended::SymlinkToFolder ? s.moveFile(from, to, p)
                                                                               : s.moveFolder(from, to, p);
          }),
          localHarness},
         {"ALinkToAFolderIsNotThatFolder", "SaysResourceNotFound",
          movingFolders([](Store s, Iri from, Iri to, Policy p) {
              miscoded([&] { s.moveFolder(from, to, p); }, ErrorCode::ResourceNotFound);
          }),
          localHarness},
         {"OntoALinkToItselfChangesNothing", "ReplacesTheLink", movingFolders([](Store s, Iri from, Iri to, Policy p) {
              if (!preserves(p))
                  swallowed([&] { s.removeFile(to); });
              s.moveFolder(from, to, p);
          }),
          localHarness}}};
}

} // namespace

std::vector<Table> moveDefects()
{
    return {moveFile(), moveFolder()};
}

} // namespace foundation::storage::conformance::broken
