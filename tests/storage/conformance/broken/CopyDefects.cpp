// What can be wrong with copying inside a provider.

#include <tests/storage/conformance/broken/Defect.hpp>

#include <storage/provider/InterruptSignal.hpp>

namespace foundation::storage::conformance::broken {

namespace {

constexpr long oneMebibyte = 1 << 20;

Misbehaviour copying(void (*copy)(Store, Iri, Iri, Policy))
{
    return {.copyFile = copy};
}

bool isSame(Store s, Iri a, Iri b)
{
    return s.getCanonicalLocation(a) == s.getCanonicalLocation(b);
}

/// As the copy that every provider inherits, on a store whose readers see what is written meanwhile.
void truncating(Store s, Iri from, Iri to, Policy p)
{
    if (!isSame(s, from, to) || preserves(p))
        s.copyFile(from, to, p);
    else
        s.openStream(to, {})->close();
}

Table copyFile()
{
    return {
        "CopyFile",
        {{"AFreeNameIsTakenUnderEveryPolicy", "MovesInstead",
          copying([](Store s, Iri from, Iri to, Policy p) { s.moveFile(from, to, p); })},
         {"FilesOfEverySizeAreCopiedWhole", "CopiesTheFirstMebibyte",
          copying([](Store s, Iri from, Iri to, Policy) { copyInPlace(s, from, to, oneMebibyte); })},
         {"ACopyIsAFileOfItsOwn", "MakesASecondName",
          copying([](Store, Iri from, Iri to, Policy) { localHarness().makers.secondName(to, from); }), localHarness},
         {"APreservingPolicyKeepsTheTarget", "ReplacesAllTheSame",
          copying([](Store s, Iri from, Iri to, Policy) { s.copyFile(from, to, Policy::Overwrite); })},
         {"APreservingPolicyKeepsTheTarget", "DoesNotSayThatItDidNothing",
          copying([](Store s, Iri from, Iri to, Policy p) {
              if (!preserves(p) || !s.fileExists(to))
                  s.copyFile(from, to, p);
          })},
         {"AReplacingPolicyReplacesTheTarget", "KeepsTheEndOfTheOldContent",
          copying([](Store s, Iri from, Iri to, Policy) {
              std::vector<char> content(static_cast<std::size_t>(s.getFileAttributes(from).getSize()));
              s.openReadOnlyStream(from)->read(content.data(), static_cast<long>(content.size()));
              s.openStream(to, {ByteStreamAccess::WriteOnly, ByteStreamCreate::Create,
                                ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Overwrite})
                  ->write(content.data(), static_cast<long>(content.size()));
          })},
         {"AFolderIsNeverReplaced", "CopiesIntoTheFolder", copying([](Store s, Iri from, Iri to, Policy p) {
              s.copyFile(from, s.folderExists(to) ? StorageIRI(to, from.getName()) : to, p);
          })},
         {"TheSourceHasToBeAFile", "CreatesTheTargetFirst", copying([](Store s, Iri from, Iri to, Policy) {
              s.createFile(to);
              s.copyFile(from, to, Policy::Overwrite);
          })},
         {"AMissingSourceLeavesTheTargetAsItIs", "TruncatesTheTargetFirst",
          copying([](Store s, Iri from, Iri to, Policy p) {
              s.openStream(to, {})->close();
              s.copyFile(from, to, p);
          })},
         {"AMissingSourceLeavesTheTargetAsItIs", "NamesTheTarget",
          copying([](Store s, Iri from, Iri to, Policy p) { misplaced([&] { s.copyFile(from, to, p); }, to); })},
         {"TheTargetNeedsAFolderToStandIn", "NamesTheSource",
          copying([](Store s, Iri from, Iri to, Policy p) { misplaced([&] { s.copyFile(from, to, p); }, from); })},
         {"APreservingPolicyKeepsTheFileItself", "IsContentWithTheFileItself",
          copying([](Store s, Iri from, Iri to, Policy p) {
              if (!isSame(s, from, to))
                  s.copyFile(from, to, p);
          })},
         {"OntoItselfChangesNothing", "TruncatesTheTargetFirst", copying(truncating)},
         {"OntoItselfLeavesAnEmptyFile", "LeavesItAsItIs", copying([](Store s, Iri from, Iri to, Policy p) {
              if (!isSame(s, from, to))
                  s.copyFile(from, to, p);
          }),
          plainHarness},
         {"OntoAnotherNameChangesNothing", "TruncatesTheTargetFirst",
          copying([](Store s, Iri from, Iri to, Policy) { copyInPlace(s, from, to, oneMebibyte); }), localHarness},
         {"LinksAreReadAndWrittenThrough", "ReplacesTheLink", copying([](Store s, Iri from, Iri to, Policy p) {
              swallowed([&] { s.removeFile(to); });
              s.copyFile(from, to, p);
          }),
          localHarness}}};
}

using Interrupt = IProvider::Interrupt const&;

Misbehaviour copyingAtomically(TransactionStatus (*copy)(Store, Iri, Iri, Policy, Interrupt))
{
    return {.copyFileAtomic = copy};
}

/// Writes the target in place, and leaves it as it is then when it is interrupted.
TransactionStatus inPlace(Store s, Iri from, Iri to, Policy p, Interrupt interrupt)
{
    if (!interrupt)
        return s.copyFileAtomic(from, to, p, interrupt);
    for (long size = oneMebibyte;; size += oneMebibyte) {
        copyInPlace(s, from, to, size);
        if (interrupt() == InterruptSignal::Abort)
            return TransactionStatus::Aborted;
        if (s.getFileAttributes(to).getSize() == s.getFileAttributes(from).getSize())
            return TransactionStatus::Completed;
    }
}

TransactionStatus littering(Store s, Iri from, Iri to, Policy p, Interrupt interrupt)
{
    TransactionStatus const status = s.copyFileAtomic(from, to, p, interrupt);
    if (status == TransactionStatus::Aborted)
        swallowed([&] { s.createFile(sibling(to, u"left.tmp.bak")); });
    return status;
}

Table atomicCopy()
{
    return {
        "AtomicCopy",
        {{"TheFeatureIsAnnounced", "DoesNotAnnounceIt", {.hasFeature = [](Store, ExtendedFeature) { return false; }}},
         {"AFreeNameIsTakenUnderEveryPolicy", "SaysAborted",
          copyingAtomically([](Store s, Iri from, Iri to, Policy p, Interrupt i) {
              s.copyFileAtomic(from, to, p, i);
              return TransactionStatus::Aborted;
          })},
         {"FilesOfEverySizeAreCopiedWhole", "CopiesTheFirstMebibyte",
          copyingAtomically([](Store s, Iri from, Iri to, Policy, Interrupt) {
              copyInPlace(s, from, to, oneMebibyte);
              return TransactionStatus::Completed;
          })},
         {"APreservingPolicyKeepsTheTarget", "ReplacesAllTheSame",
          copyingAtomically([](Store s, Iri from, Iri to, Policy, Interrupt i) {
              return s.copyFileAtomic(from, to, Policy::Overwrite, i);
          })},
         {"APreservingPolicyKeepsTheTarget", "NamesTheSource",
          copyingAtomically([](Store s, Iri from, Iri to, Policy p, Interrupt i) {
              return misplaced([&] { return s.copyFileAtomic(from, to, p, i); }, from);
          })},
         {"AReplacingPolicyReplacesTheTarget", "KeepsTheTargetUnderClobber",
          copyingAtomically([](Store s, Iri from, Iri to, Policy p, Interrupt i) {
              return s.copyFileAtomic(from, to, p == Policy::Clobber ? Policy::Preserve : p, i);
          })},
         {"AFolderIsNeverReplaced", "ReplacesEmptyFolders",
          copyingAtomically([](Store s, Iri from, Iri to, Policy p, Interrupt i) {
              swallowed([&] { s.removeFolder(to); });
              return s.copyFileAtomic(from, to, p, i);
          })},
         {"TheSourceHasToBeAFile", "CreatesTheTargetFirst",
          copyingAtomically([](Store s, Iri from, Iri to, Policy, Interrupt i) {
              s.createFile(to);
              return s.copyFileAtomic(from, to, Policy::Overwrite, i);
          })},
         {"TheTargetNeedsAFolderToStandIn", "MakesTheFolder",
          copyingAtomically([](Store s, Iri from, Iri to, Policy p, Interrupt i) {
              swallowed([&] { s.createFolderRecursive(to.getParent()); });
              return s.copyFileAtomic(from, to, p, i);
          })},
         {"OntoItselfChangesNothing", "RemovesTheTargetFirst",
          copyingAtomically([](Store s, Iri from, Iri to, Policy p, Interrupt i) {
              if (!preserves(p))
                  swallowed([&] { s.removeFile(to); });
              return s.copyFileAtomic(from, to, p, i);
          })},
         {"AnInterruptionAtEveryChunkLeavesTheTargetAsItWas", "IgnoresInterruption",
          copyingAtomically(
              [](Store s, Iri from, Iri to, Policy p, Interrupt) { return s.copyFileAtomic(from, to, p, {}); })},
         {"AnInterruptionAtEveryChunkLeavesTheTargetAsItWas", "WritesInPlace", copyingAtomically(inPlace)},
         {"AnInterruptionAtEveryChunkLeavesTheTargetAsItWas", "LeavesAScratchFile", copyingAtomically(littering)},
         {"OntoAnotherNameKeepsTheContent", "TruncatesTheTargetFirst",
          copyingAtomically([](Store s, Iri from, Iri to, Policy, Interrupt) {
              copyInPlace(s, from, to, oneMebibyte);
              return TransactionStatus::Completed;
          }),
          atomicHarness},
         {"AtomicCopiesAreRefused", "CopiesAllTheSame",
          copyingAtomically([](Store s, Iri from, Iri to, Policy p, Interrupt) {
              s.copyFile(from, to, p);
              return TransactionStatus::Completed;
          }),
          plainHarness},
         {"AtomicCopiesAreRefused", "NamesTheTarget",
          copyingAtomically([](Store s, Iri from, Iri to, Policy p, Interrupt i) {
              return misplaced([&] { return s.copyFileAtomic(from, to, p, i); }, to);
          }),
          plainHarness}}};
}

} // namespace

std::vector<Table> copyDefects()
{
    return {copyFile(), atomicCopy()};
}

} // namespace foundation::storage::conformance::broken
