// What can be wrong with opening files and with plain streams.

#include <storage/provider/ByteStreamFailure.hpp>
#include <tests/storage/conformance/broken/Defect.hpp>

#include <algorithm>
#include <utility>

namespace foundation::storage::conformance::broken {

namespace {

Table openOptions()
{
    return {"OpenOptions",
            {{"OpeningAloneCreatesAndTruncatesAsToldTo",
              "TruncatesAlways",
              {.openStream =
                   [](Store s, Iri i, Options o) {
                       o.truncate = ByteStreamTruncate::TruncateExisting;
                       return s.openStream(i, o);
                   }}},
             {"OpeningAloneCreatesAndTruncatesAsToldTo",
              "NeverTruncates",
              {.openStream =
                   [](Store s, Iri i, Options o) {
                       o.truncate = ByteStreamTruncate::PreserveExisting;
                       return s.openStream(i, o);
                   }}},
             {"WritingGoesWhereToldTo",
              "NeverAppends",
              {.openStream =
                   [](Store s, Iri i, Options o) {
                       o.append = ByteStreamAppend::Overwrite;
                       return s.openStream(i, o);
                   }}},
             {"WritingGoesWhereToldTo",
              "TruncatesWhenItAppends",
              {.openStream =
                   [](Store s, Iri i, Options o) {
                       if (o.append == ByteStreamAppend::Append)
                           o.truncate = ByteStreamTruncate::TruncateExisting;
                       return s.openStream(i, o);
                   }}},
             {"WhatIsNeverCreatedIsMissing",
              "CreatesItAllTheSame",
              {.openStream =
                   [](Store s, Iri i, Options o) {
                       o.create = ByteStreamCreate::Create;
                       return s.openStream(i, o);
                   }}},
             {"WhatIsNeverCreatedIsMissing",
              "SaysInvalidLocation",
              {.openStream =
                   [](Store s, Iri i, Options o) {
                       return miscoded([&] { return s.openStream(i, o); }, ErrorCode::InvalidLocation);
                   }}},
             {"ReadingIsAllowedByAccessAlone",
              "OpensForWritingAlone",
              {.openStream =
                   [](Store s, Iri i, Options o) {
                       o.access = ByteStreamAccess::WriteOnly;
                       return s.openStream(i, o);
                   }}},
             {"AFolderIsNotOpened",
              "SaysResourceAlreadyExists",
              {.openStream =
                   [](Store s, Iri i, Options o) {
                       return miscoded([&] { return s.openStream(i, o); }, ErrorCode::ResourceAlreadyExists);
                   }}},
             {"OpeningNeedsAFolderToStandIn",
              "MakesTheFolder",
              {.openStream =
                   [](Store s, Iri i, Options o) {
                       swallowed([&] { s.createFolderRecursive(i.getParent()); });
                       return s.openStream(i, o);
                   }}},
             {"OpeningNeedsAFolderToStandIn", "NamesTheFolder", {.openStream = [](Store s, Iri i, Options o) {
                  return misplaced([&] { return s.openStream(i, o); }, i.getParent());
              }}}}};
}

long withoutReturns(ByteStream& stream, char* buffer, long count)
{
    long const read = stream.read(buffer, count);
    std::replace(buffer, buffer + std::max(read, 0L), '\r', '\n');
    return read;
}

long ofNoMoreThanThereIs(ByteStream& stream, char* buffer, long count)
{
    long const here = stream.seek(0, std::ios_base::cur);
    long const end = stream.seek(0, std::ios_base::end);
    stream.seek(here, std::ios_base::beg);
    return count > end - here ? -1 : stream.read(buffer, count);
}

/// Writing has a position of its own, which is the start.
long besideThePosition(ByteStream& stream, char const* data, long count)
{
    long const here = stream.seek(0, std::ios_base::cur);
    long const written = stream.write(data, count);
    stream.seek(here, std::ios_base::beg);
    return written;
}

Bytes openedAtTheEnd(Store s, Iri i, Options o)
{
    bool const append = o.append == ByteStreamAppend::Append;
    o.append = ByteStreamAppend::Overwrite;
    Bytes stream = s.openStream(i, o);
    if (append)
        stream->seek(0, std::ios_base::end);
    return stream;
}

/// Lets a file be read by one at a time.
class LocksWhatIsRead final : public ForwardingProvider
{
public:
    using ForwardingProvider::ForwardingProvider;

protected:
    Bytes doOpenReadOnlyStream(Iri iri) const override
    {
        if (!reader_.expired())
            throw Exception(ErrorCode::ResourceInUse, iri);
        auto stream = std::make_unique<Reader>(target().openReadOnlyStream(iri));
        reader_ = stream->life;
        return stream;
    }

private:
    struct Reader final : ByteStream
    {
        explicit Reader(Bytes stream) : sound(std::move(stream)) {}
        long doRead(char* buffer, long count) override { return sound->read(buffer, count); }
        long doWrite(char const* data, long count) override { return sound->write(data, count); }
        long doSeek(long offset, std::ios_base::seekdir direction) override { return sound->seek(offset, direction); }
        void doClose() override { sound->close(); }

        Bytes sound;
        std::shared_ptr<int> life = std::make_shared<int>();
    };

    mutable std::weak_ptr<int> reader_;
};

Table streams()
{
    return {
        "Streams",
        {{"ContentOfEverySizeAndValueComesBack", "ChangesLineEnds", {.read = withoutReturns}},
         {"ReadingInPiecesOfAnySizeGivesTheWhole", "ReadsAllOrNothing", {.read = ofNoMoreThanThereIs}},
         {"TheEndIsMinusOneAsOftenAsAsked",
          "AnswersZeroAtTheEnd",
          {.read = [](ByteStream& s, char* buffer, long count) { return std::max(s.read(buffer, count), 0L); }}},
         {"NothingIsReadOrWrittenWhenNothingIsAskedFor",
          "IsAtItsEndWhenNothingIsAskedFor",
          {.read = [](ByteStream& s, char* buffer, long count) { return count == 0 ? -1 : s.read(buffer, count); }}},
         {"SeekingGivesThePositionAndMovesTheReading",
          "AnswersZero",
          {.seek = [](ByteStream& s, long offset,
                      std::ios_base::seekdir direction) { return s.seek(offset, direction) * 0; }}},
         {"SeekingGivesThePositionAndMovesTheReading",
          "TakesEveryOffsetFromTheStart",
          {.seek = [](ByteStream& s, long offset,
                      std::ios_base::seekdir) { return s.seek(std::abs(offset), std::ios_base::beg); }}},
         {"SeekingBeforeTheStartFailsAndStaysPut",
          "StopsAtTheStart",
          {.seek =
               [](ByteStream& s, long offset, std::ios_base::seekdir direction) {
                   try {
                       return s.seek(offset, direction);
                   } catch (ByteStreamFailure const&) {
                       return s.seek(0, std::ios_base::beg);
                   }
               }}},
         {"ReadingWritingAndSeekingShareOnePosition", "WritesBesideThePosition", {.write = besideThePosition}},
         {"AppendingWritesAtTheEndWhereverTheStreamStands", "GoesToTheEndOnce", {.openStream = openedAtTheEnd}},
         {"AppendingStreamsDoNotOverwriteEachOther", "GoesToTheEndOnce", {.openStream = openedAtTheEnd}},
         {"AReadOnlyStreamRefusesToWrite", "HasNothingToRead", {.read = [](ByteStream&, char*, long) { return -1L; }}},
         {"ReadingNeedsAFile",
          "CreatesWhatIsRead",
          {.openReadOnlyStream =
               [](Store s, Iri i) {
                   if (s.exists(i) == ExistenceType::AsNeither)
                       swallowed([&] { s.createFile(i); });
                   return s.openReadOnlyStream(i);
               }}},
         {"ReadingNeedsAFile",
          "SaysInvalidLocation",
          {.openReadOnlyStream =
               [](Store s, Iri i) {
                   return miscoded([&] { return s.openReadOnlyStream(i); }, ErrorCode::InvalidLocation);
               }}},
         {"WhatWasWrittenIsThereAfterClosing", "LosesTheLastByte", {.write = withoutTheLastByte}},
         {"ClosingAgainDoesNothing",
          "FailsTheSecondTime",
          {.close =
               [](ByteStream& s, int time) {
                   if (time > 1)
                       throw std::logic_error("closed already");
                   s.close();
               }}},
         {.check = "ReadersShareAFile",
          .name = "LetsOneReadAtATime",
          .wrap = [](std::shared_ptr<IProvider> sound) -> std::shared_ptr<IProvider> {
              return std::make_shared<LocksWhatIsRead>(std::move(sound));
          }}}};
}

} // namespace

std::vector<Table> streamDefects()
{
    return {openOptions(), streams()};
}

} // namespace foundation::storage::conformance::broken
