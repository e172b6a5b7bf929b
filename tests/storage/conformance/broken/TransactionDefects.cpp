// What can be wrong with transactions.

#include <storage/provider/StreamClosePolicy.hpp>
#include <storage/provider/detail/GenericTransactionalStream.hpp>
#include <tests/storage/conformance/broken/Defect.hpp>
#include <tests/storage/conformance/broken/brokenTransactions.hpp>

#include <utility>

namespace foundation::storage::conformance::broken {

namespace {

using Composed = provider::detail::GenericTransactionalStream<ByteStream>;

/// A transaction over another one that ends it in its own way.
class WrappedTransaction : public TransactionalStream
{
public:
    explicit WrappedTransaction(Transaction sound) : sound_(std::move(sound)) {}

protected:
    ByteStream* doByteStream() override { return sound_->byteStream(); }
    void doClose(StreamClosePolicy const& policy) override { sound_->close(policy); }
    TransactionalStream& sound() { return *sound_; }

private:
    Transaction sound_;
};

class CommitsOnDrop final : public WrappedTransaction
{
public:
    using WrappedTransaction::WrappedTransaction;
    ~CommitsOnDrop() override { sound().close(StreamClosePolicy::Commit); }
};

class CommitsOnAbort final : public WrappedTransaction
{
public:
    using WrappedTransaction::WrappedTransaction;

protected:
    void doClose(StreamClosePolicy const&) override { sound().close(StreamClosePolicy::Commit); }
};

class AbortsOnCommit final : public WrappedTransaction
{
public:
    using WrappedTransaction::WrappedTransaction;

protected:
    void doClose(StreamClosePolicy const&) override { sound().close(StreamClosePolicy::Abort); }
};

class AddsAByte final : public WrappedTransaction
{
public:
    using WrappedTransaction::WrappedTransaction;

protected:
    void doClose(StreamClosePolicy const& policy) override
    {
        sound().write("?", 1);
        sound().close(policy);
    }
};

class SkipsEmptyCommits final : public WrappedTransaction
{
public:
    using WrappedTransaction::WrappedTransaction;

protected:
    void doClose(StreamClosePolicy const& policy) override
    {
        sound().close(sound().seek(0, std::ios_base::end) == 0 ? StreamClosePolicy::Abort : policy);
    }
};

/// Takes a failed commit for the end.
class GivesUp final : public WrappedTransaction
{
public:
    using WrappedTransaction::WrappedTransaction;

protected:
    void doClose(StreamClosePolicy const& policy) override
    {
        if (!std::exchange(closed_, true))
            sound().close(policy);
    }

private:
    bool closed_ = false;
};

class HandsOutNewStreams final : public WrappedTransaction
{
public:
    using WrappedTransaction::WrappedTransaction;

protected:
    ByteStream* doByteStream() override
    {
        handedOut_.push_back(std::make_unique<Lent>(*sound().byteStream()));
        return handedOut_.back().get();
    }

private:
    struct Lent final : ByteStream
    {
        explicit Lent(ByteStream& stream) : lender(stream) {}
        long doRead(char* buffer, long count) override { return lender.read(buffer, count); }
        long doWrite(char const* data, long count) override { return lender.write(data, count); }
        long doSeek(long offset, std::ios_base::seekdir direction) override { return lender.seek(offset, direction); }
        void doClose() override { lender.close(); }

        ByteStream& lender;
    };

    std::vector<Bytes> handedOut_;
};

template <typename Wrapper>
Transaction wrapped(Store s, Iri i, Options o)
{
    return std::make_unique<Wrapper>(s.openTransactionalStream(i, o));
}

Transaction composed(Store s, Iri scratch, Options o, std::function<void(StreamClosePolicy const&)> finisher)
{
    return std::make_unique<Composed>(s.openStream(scratch, o), std::move(finisher));
}

Transaction publishedEarly(Store s, Iri i, Options o)
{
    swallowed([&] { s.createFile(i); });
    return s.openTransactionalStream(i, o);
}

/// All transactions of a file share one scratch file.
Transaction atOneScratchFile(Store s, Iri i, Options o)
{
    StorageIRI const scratch = sibling(i, i.getName() + u".tmp");
    return composed(s, scratch, o, [&s, i, scratch](StreamClosePolicy const& policy) {
        policy == StreamClosePolicy::Commit ? s.moveFile(scratch, i, Policy::Overwrite) : s.removeFile(scratch);
    });
}

/// Commits by copying the scratch file in place.
Transaction copiedAtTheEnd(Store s, Iri i, Options o)
{
    StorageIRI const scratch = sibling(i, u"scratch");
    return composed(s, scratch, o, [&s, i, scratch](StreamClosePolicy const& policy) {
        if (policy == StreamClosePolicy::Commit)
            copyInPlace(s, scratch, i, 1 << 20);
        s.removeFile(scratch);
    });
}

/// Commits as told, and takes it back when it is told to abort afterwards.
Transaction takenBack(Store s, Iri i, Options o)
{
    class TakenBack final : public WrappedTransaction
    {
    public:
        TakenBack(Transaction sound, Store store, StorageIRI file)
            : WrappedTransaction(std::move(sound)), store_(store), file_(std::move(file))
        {}

    protected:
        void doClose(StreamClosePolicy const& policy) override
        {
            sound().close(policy);
            if (std::exchange(closed_, true) && policy == StreamClosePolicy::Abort)
                store_.removeFile(file_);
        }

    private:
        Store store_;
        StorageIRI file_;
        bool closed_ = false;
    };
    return std::make_unique<TakenBack>(s.openTransactionalStream(i, o), s, i);
}

} // namespace

Transaction committingOnDrop(Store s, Iri i, Options o)
{
    return wrapped<CommitsOnDrop>(s, i, o);
}

Transaction committingOnAbort(Store s, Iri i, Options o)
{
    return wrapped<CommitsOnAbort>(s, i, o);
}

Transaction addingAByte(Store s, Iri i, Options o)
{
    return wrapped<AddsAByte>(s, i, o);
}

Transaction writingInPlace(Store s, Iri i, Options o)
{
    return composed(s, i, o, [](StreamClosePolicy const&) {});
}

Transaction litteringWhenAborted(Store s, Iri i, Options o)
{
    StorageIRI const scratch = sibling(i, i.getName() + u".tmp.bak");
    return composed(s, scratch, o, [&s, i, scratch](StreamClosePolicy const& policy) {
        if (policy == StreamClosePolicy::Commit)
            s.moveFile(scratch, i, Policy::Overwrite);
    });
}

namespace {

Misbehaviour opening(Transaction (*open)(Store, Iri, Options))
{
    return {.openTransactionalStream = open};
}

Table transactions()
{
    return {"Transactions",
            {{"CommitMakesAMissingFile", "PublishesBeforeTheCommit", opening(publishedEarly)},
             {"CommitReplacesTheContentWhole", "WritesInPlace", opening(writingInPlace)},
             {"CommitOfNothingLeavesAnEmptyFile", "SkipsEmptyCommits", opening(wrapped<SkipsEmptyCommits>)},
             {"CommitReplacesWhateverTheOptionsSay", "AppendsToTheOldContent", opening([](Store s, Iri i, Options o) {
                  return o.append == ByteStreamAppend::Append ? writingInPlace(s, i, o)
                                                              : s.openTransactionalStream(i, o);
              })},
             {"AbortChangesNothing", "CommitsOnAbort", opening(committingOnAbort)},
             {"AbortChangesNothing", "LeavesItsScratchFile", opening(litteringWhenAborted)},
             {"DroppingChangesNothing", "CommitsOnDrop", opening(committingOnDrop)},
             {"DroppingChangesNothing", "LeavesItsScratchFile", opening(litteringWhenAborted)},
             {"AnExceptionChangesNothing", "CommitsOnDrop", opening(committingOnDrop)},
             {"TheFirstCloseDecides", "LetsAnAbortTakeBackTheCommit", opening(takenBack)},
             {"WhatIsWrittenCanBeReadBack", "OpensForWritingAlone", opening([](Store s, Iri i, Options o) {
                  o.access = ByteStreamAccess::WriteOnly;
                  return s.openTransactionalStream(i, o);
              })},
             {"TheByteStreamIsAlwaysTheSame", "HandsOutANewOne", opening(wrapped<HandsOutNewStreams>)},
             {"ADeviceCommitsWhenItIsClosed", "AbortsOnCommit", opening(wrapped<AbortsOnCommit>)},
             {"TwoAtOnceDoNotMix", "SharesAScratchFile", opening(atOneScratchFile)},
             {"OneAbortsWhileAnotherCommits", "SharesAScratchFile", opening(atOneScratchFile)},
             {"AReaderKeepsTheContentThatItOpened", "CommitsInPlace", opening(copiedAtTheEnd), localHarness},
             {"AFailedCommitCanBeTriedAgain", "GivesUpAfterTheFirst", opening(wrapped<GivesUp>)},
             {"AFailedCommitCanBeAborted", "LeavesItsScratchFile", opening(litteringWhenAborted)},
             {"TheTargetNeedsAFolderToStandIn", "MakesTheFolder", opening([](Store s, Iri i, Options o) {
                  swallowed([&] { s.createFolderRecursive(i.getParent()); });
                  return s.openTransactionalStream(i, o);
              })}}};
}

} // namespace

std::vector<Table> transactionDefects()
{
    return {transactions()};
}

} // namespace foundation::storage::conformance::broken
