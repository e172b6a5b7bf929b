// What can be wrong with a provider that shows when items are copied, from one provider to another or inside one.

#include <tests/storage/conformance/broken/Defect.hpp>
#include <tests/storage/conformance/broken/brokenTransactions.hpp>

namespace foundation::storage::conformance::broken {

namespace {

Misbehaviour opening(Transaction (*open)(Store, Iri, Options))
{
    return {.openTransactionalStream = open};
}

constexpr Misbehaviour losingTheLastByte{.write = withoutTheLastByte};

constexpr Misbehaviour makingWhatIsAskedFor{.fileExists = [](Store s, Iri i) {
    bool const before = s.fileExists(i);
    swallowed([&] { s.createFile(i); });
    return before;
}};

Table copyPolicies()
{
    return {
        "CopyPolicies",
        {{"AFreeNameIsTakenUnderEveryPolicy", "CommitsAByteMore", opening(addingAByte)},
         {"FilesOfEverySizeAreCopiedWhole", "LosesTheLastByte", losingTheLastByte},
         {"APreservingPolicyKeepsTheDestination", "SeesNoFiles", {.fileExists = [](Store, Iri) { return false; }}},
         {"AReplacingPolicyReplacesTheDestination", "CommitsToFreeNamesAlone", opening([](Store s, Iri i, Options o) {
              if (s.fileExists(i))
                  throw Exception(ErrorCode::ResourceAlreadyExists, i);
              return s.openTransactionalStream(i, o);
          })},
         {"AFolderIsNeverReplaced", "SeesNoFolders", {.folderExists = [](Store, Iri) { return false; }}},
         {.check = "TheSourceHasToBeAFile",
          .name = "SaysInvalidLocation",
          .misbehaviour = {.openReadOnlyStream =
                               [](Store s, Iri i) {
                                   return miscoded([&] { return s.openReadOnlyStream(i); }, ErrorCode::InvalidLocation);
                               }},
          .asSource = true},
         {"TheDestinationNeedsAFolderToStandIn",
          "MakesTheFolder",
          {.openStream =
               [](Store s, Iri i, Options o) {
                   swallowed([&] { s.createFolderRecursive(i.getParent()); });
                   return s.openStream(i, o);
               }}},
         {"HostileNamesStayAsTheyAre", "CutsThemShort", {.translated = cutShort}}}};
}

Table copyInterruption()
{
    return {"CopyInterruption",
            {{"AfterEveryChunkAnAtomicCopyCanBeGivenUp", "CommitsOnAbort", opening(committingOnAbort)},
             {"AfterEveryChunkAnAtomicCopyCanBeGivenUp", "LeavesItsScratchFile", opening(litteringWhenAborted)},
             {"AfterEveryChunkAPlainCopyHasWhatWasCopied", "LosesTheLastByte", losingTheLastByte},
             {"ACopyThatIsNeverInterruptedAsksAfterEachChunk", "CommitsAByteMore", opening(addingAByte)},
             {"ACopyOfNothingCanBeInterrupted", "CommitsOnAbort", opening(committingOnAbort)},
             {"WhatTheInterruptFunctionThrowsPasses", "CommitsOnDrop", opening(committingOnDrop)}}};
}

Table copyFaults()
{
    return {"CopyFaults",
            {{"EveryFailureOfTheSourceIsToldAndContained", "CommitsOnDrop", opening(committingOnDrop)},
             {.check = "EveryFailureOfTheSourceIsToldAndContained",
              .name = "LosesTheLastByte",
              .misbehaviour = {.read =
                                   [](ByteStream& s, char* buffer, long count) {
                                       long const read = s.read(buffer, count);
                                       return read > 1 ? read - 1 : read;
                                   }},
              .asSource = true},
             {"EveryFailureOfTheDestinationIsToldAndContained", "CommitsOnDrop", opening(committingOnDrop)},
             {"EveryFailureOfTheDestinationIsToldAndContained", "LeavesItsScratchFile", opening(litteringWhenAborted)},
             {"EveryFailureOfAnInterruptedCopyIsContained", "CommitsOnAbort", opening(committingOnAbort)},
             {"FromAnyOperationOnABrokenDestinationKeepsTheOldFile", "WritesInPlace", opening(writingInPlace)}}};
}

Table copyStreams()
{
    return {"CopyStreams",
            {{"ReadingThatFailsAtAByteNamesTheSource", "CommitsOnDrop", opening(committingOnDrop)},
             {"ASourceThatCannotBeReadAtAllChangesNothing", "MakesWhatIsAskedFor", makingWhatIsAskedFor},
             {"WritingThatFailsAtAByteNamesTheDestination", "CommitsOnDrop", opening(committingOnDrop)},
             {"WritingThatFailsAtAByteNamesTheDestination", "LeavesItsScratchFile", opening(litteringWhenAborted)},
             {"ShortReadsAreCopiedWhole", "LosesTheLastByte", losingTheLastByte},
             {"AReadOfNothingNamesTheSource", "MakesWhatIsAskedFor", makingWhatIsAskedFor},
             {"AShortWriteNamesTheDestination", "CommitsOnDrop", opening(committingOnDrop)},
             {"ASourceThatFailsToCloseIsCopiedAllTheSame", "LosesTheLastByte", losingTheLastByte},
             {"ADestinationThatFailsToCloseIsNotReplacedAtomically", "CommitsOnDrop", opening(committingOnDrop)},
             {"SizesAreNotBelieved", "LosesTheLastByte", losingTheLastByte}}};
}

Table copyConcurrency()
{
    return {"CopyConcurrency",
            {{.check = "CopiesDoNotDisturbEachOther", .name = "ServesOneThread", .wrap = servingOneThread},
             {"AtomicCopiesOntoOneFileDoNotMix", "CommitsAByteMore", opening(addingAByte)}}};
}

Table itemCopy()
{
    return {"ItemCopy",
            {{"EveryPolicyHoldsInEveryMode",
              "CopiesTheFirstBytes",
              {.copyFile = [](Store s, Iri from, Iri to, Policy) { copyInPlace(s, from, to, 1000); }}},
             {"AnAtomicCopyOntoItselfChangesNothing",
              "RemovesTheTargetFirst",
              {.copyFileAtomic =
                   [](Store s, Iri from, Iri to, Policy p, IProvider::Interrupt const& i) {
                       s.removeFile(to);
                       return s.copyFileAtomic(from, to, p, i);
                   }}},
             {"AnAtomicCopyOntoItselfChangesNothing", "WritesInPlace", opening(writingInPlace), plainHarness},
             {"AnInterruptionAtEveryChunkIsHeeded",
              "IgnoresIt",
              {.copyFileAtomic = [](Store s, Iri from, Iri to, Policy p,
                                    IProvider::Interrupt const&) { return s.copyFileAtomic(from, to, p, {}); }}},
             {"EveryFailureIsToldAndContained", "CommitsOnDrop", opening(committingOnDrop), plainHarness}}};
}

} // namespace

std::vector<Table> copyBetweenDefects()
{
    return {copyPolicies(), copyInterruption(), copyFaults(), copyStreams(), copyConcurrency(), itemCopy()};
}

} // namespace foundation::storage::conformance::broken
