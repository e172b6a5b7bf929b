#include <tools/storage/AtomicFile.hpp>

#include <algorithm>
#include <functional>
#include <gtest/gtest.h>
#include <storage/provider/Exception.hpp>
#include <tests/support/MinimalProvider.hpp>
#include <tests/support/RecordingByteStream.hpp>

namespace {

using namespace foundation::storage::provider;
using foundation::storage::tool::AtomicFile;
using foundation::storage::tool::Replace;
using foundation::tests::support::MinimalProvider;
using foundation::tests::support::RecordingByteStream;

StorageIRI const folder(u"s://h/d");
StorageIRI const target(u"s://h/d/f");

/// A store whose streams and moves fail as they are told.
class UnreliableStore final : public MinimalProvider
{
public:
    bool movesWithoutReplacing = true;
    std::function<void()> beforeMove = [] {};
    std::function<void()> afterMove = [] {};
    std::function<long(char const*, long)> onWrite = {};
    std::function<long(long, std::ios_base::seekdir)> onSeek = {};

protected:
    void doMoveFile(StorageIRI const& from, StorageIRI const& to, ReplacementPolicy const& policy) const override
    {
        beforeMove();
        if (!movesWithoutReplacing && policy == ReplacementPolicy::NoClobber)
            throw Exception(ErrorCode::UnsupportedOperation, to);
        MinimalProvider::doMoveFile(from, to, policy);
        afterMove();
    }

    std::unique_ptr<ByteStream> doOpenStream(StorageIRI const& iri, ByteStreamOpenOptions const& options) const override
    {
        auto stream = MinimalProvider::doOpenStream(iri, options);
        if (!onWrite && !onSeek)
            return stream;
        auto unreliable = std::make_unique<RecordingByteStream>();
        if (onWrite)
            unreliable->onWrite = onWrite;
        if (onSeek)
            unreliable->onSeek = onSeek;
        return unreliable;
    }
};

class AtomicFiles : public testing::TestWithParam<Replace>
{
protected:
    AtomicFiles() { store->folders.insert(folder); }

    /// Writes this, and commits with the size given or the right one.
    void write(std::string const& content, long size = -1) const
    {
        AtomicFile file(StorageItem(store, target), GetParam());
        file.write(content.data(), static_cast<long>(content.size()));
        file.commit(size == -1 ? static_cast<long>(content.size()) : size);
    }

    void expectFailure(ErrorCode code, std::string const& content, long size = -1) const
    {
        try {
            write(content, size);
            ADD_FAILURE() << "nothing was thrown";
        } catch (Exception const& error) {
            EXPECT_EQ(error.getErrorCode(), code);
        }
    }

    std::shared_ptr<UnreliableStore> const store = std::make_shared<UnreliableStore>();
};

INSTANTIATE_TEST_SUITE_P(BothWays, AtomicFiles, testing::Values(Replace::Never, Replace::Files));

TEST_P(AtomicFiles, AppearWholeWhenCommitted)
{
    write("content");
    EXPECT_EQ(store->content(target), "content");
    EXPECT_EQ(store->files.size(), 1U);
}

TEST_P(AtomicFiles, AreNotSeenBeforeTheCommit)
{
    AtomicFile file(StorageItem(store, target), GetParam());
    file.write("content", 7);
    EXPECT_FALSE(store->fileExists(target));
}

TEST_P(AtomicFiles, LeaveNothingWhenDropped)
{
    AtomicFile(StorageItem(store, target), GetParam()).write("content", 7);
    EXPECT_TRUE(store->files.empty());
}

TEST_P(AtomicFiles, HoldZerosWhereZerosWereWritten)
{
    AtomicFile file(StorageItem(store, target), GetParam());
    file.writeZeros(3);
    file.write("x", 1);
    file.writeZeros(2);
    file.commit(6);
    EXPECT_EQ(store->content(target), std::string("\0\0\0x\0\0", 6));
}

TEST_P(AtomicFiles, GoOnAfterShortWrites)
{
    std::string written;
    store->onWrite = [&](char const* data, long count) {
        long const taken = std::min(count, 3L);
        written.append(data, static_cast<std::size_t>(taken));
        return taken;
    };
    store->onSeek = [&](long, std::ios_base::seekdir) { return static_cast<long>(written.size()); };
    write("0123456789");
    EXPECT_EQ(written, "0123456789");
}

TEST_P(AtomicFiles, FailAndLeaveNothingWhenAWriteTakesNothingOrTooMuch)
{
    for (long const answer : {0L, -1L, 8L}) {
        store->onWrite = [&](char const*, long) { return answer; };
        expectFailure(ErrorCode::IOError, "content");
        EXPECT_TRUE(store->files.empty()) << answer;
    }
}

TEST_P(AtomicFiles, FailAndLeaveNothingWhenTheSizeIsWrong)
{
    expectFailure(ErrorCode::IOError, "content", 6);
    EXPECT_TRUE(store->files.empty());
}

TEST_P(AtomicFiles, FailAndLeaveNothingWhenTheMoveFails)
{
    store->beforeMove = [] { throw Exception(ErrorCode::NoSpaceLeft, target); };
    expectFailure(ErrorCode::NoSpaceLeft, "content");
    EXPECT_TRUE(store->files.empty());
}

class AtomicFilesThatReplaceNothing : public AtomicFiles
{};

INSTANTIATE_TEST_SUITE_P(OneWay, AtomicFilesThatReplaceNothing, testing::Values(Replace::Never));

TEST_P(AtomicFilesThatReplaceNothing, KeepWhatAppearsDuringTheCopy)
{
    store->beforeMove = [&] { store->put(target, "somebody else's"); };
    for (bool const movesWithoutReplacing : {true, false}) {
        store->movesWithoutReplacing = movesWithoutReplacing;
        expectFailure(ErrorCode::ResourceAlreadyExists, "content");
        EXPECT_EQ(store->content(target), "somebody else's");
        EXPECT_EQ(store->files.size(), 1U);
    }
}

TEST_P(AtomicFilesThatReplaceNothing, AppearOnStoresThatCannotMoveWithoutReplacing)
{
    store->movesWithoutReplacing = false;
    write("content");
    EXPECT_EQ(store->content(target), "content");
    EXPECT_EQ(store->files.size(), 1U);
}

TEST_P(AtomicFilesThatReplaceNothing, StayWhereAMovePutThemThatFailedInTheEnd)
{
    store->afterMove = [] { throw Exception(ErrorCode::IOError, target); };
    for (bool const movesWithoutReplacing : {true, false}) {
        store->movesWithoutReplacing = movesWithoutReplacing;
        AtomicFile file(StorageItem(store, target), GetParam());
        file.write("content", 7);
        EXPECT_THROW(file.commit(7), Exception);
        EXPECT_TRUE(file.discard()) << "nothing is left beside it";
        EXPECT_EQ(store->content(target), "content");
        EXPECT_EQ(store->files.size(), 1U);
        store->files.clear();
    }
}

class AtomicFilesThatReplace : public AtomicFiles
{};

INSTANTIATE_TEST_SUITE_P(OneWay, AtomicFilesThatReplace, testing::Values(Replace::Files));

TEST_P(AtomicFilesThatReplace, LeaveTheOldContentUntilTheCommit)
{
    store->put(target, "old");
    {
        AtomicFile file(StorageItem(store, target), GetParam());
        file.write("new", 3);
        EXPECT_EQ(store->content(target), "old");
    }
    EXPECT_EQ(store->content(target), "old");
    write("new");
    EXPECT_EQ(store->content(target), "new");
}

} // namespace
