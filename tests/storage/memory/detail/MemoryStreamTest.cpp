#include <storage/memory/detail/MemoryStream.hpp>

#include <gtest/gtest.h>

#include <tests/storage/memory/MemoryStore.hpp>

#include <limits>

namespace foundation::storage::memory {
namespace {

using namespace provider;
using std::ios_base;

/// The code of the stream failure that an action ends with.
template <typename Action>
ErrorCode streamFailureOf(Action const& action)
{
    try {
        action();
    } catch (ByteStreamFailure const& refusal) {
        return refusal.getErrorCode();
    }
    ADD_FAILURE() << "no failure";
    return ErrorCode::Unknown;
}

// Open options

struct OpenRow
{
    ByteStreamAccess access;
    ByteStreamCreate create;
    ByteStreamTruncate truncate;
    ByteStreamAppend append;
    char const* intoMissing; ///< the content after writing "XY" at the position of the stream; null when not found
    char const* intoEmpty;
    char const* intoFilled; ///< which held "12345"
    char const* readFirst;  ///< what is read from the filled file before writing
};

void PrintTo(OpenRow const& row, std::ostream* stream)
{
    *stream << ByteStreamOpenOptions{row.access, row.create, row.truncate, row.append};
}

class MemoryOpenOptions : public testing::TestWithParam<OpenRow>
{
protected:
    std::unique_ptr<ByteStream> open() const
    {
        OpenRow const& row = GetParam();
        return store.openStream(at(u"/file"), {row.access, row.create, row.truncate, row.append});
    }

    std::string contentAfterWriting() const
    {
        auto const stream = open();
        writeAll(*stream, "XY");
        stream->close();
        return store.read(u"/file");
    }

    MemoryStore store;
};

using enum ByteStreamAccess;
using enum ByteStreamCreate;
using enum ByteStreamTruncate;
constexpr auto Append = ByteStreamAppend::Append;
constexpr auto Overwrite = ByteStreamAppend::Overwrite;

INSTANTIATE_TEST_SUITE_P(
    All, MemoryOpenOptions,
    testing::Values(OpenRow{WriteOnly, Create, TruncateExisting, Append, "XY", "XY", "XY", ""},
                    OpenRow{WriteOnly, Create, TruncateExisting, Overwrite, "XY", "XY", "XY", ""},
                    OpenRow{WriteOnly, Create, PreserveExisting, Append, "XY", "XY", "12345XY", ""},
                    OpenRow{WriteOnly, Create, PreserveExisting, Overwrite, "XY", "XY", "XY345", ""},
                    OpenRow{WriteOnly, NeverCreate, TruncateExisting, Append, nullptr, "XY", "XY", ""},
                    OpenRow{WriteOnly, NeverCreate, TruncateExisting, Overwrite, nullptr, "XY", "XY", ""},
                    OpenRow{WriteOnly, NeverCreate, PreserveExisting, Append, nullptr, "XY", "12345XY", ""},
                    OpenRow{WriteOnly, NeverCreate, PreserveExisting, Overwrite, nullptr, "XY", "XY345", ""},
                    OpenRow{ReadWrite, Create, TruncateExisting, Append, "XY", "XY", "XY", ""},
                    OpenRow{ReadWrite, Create, TruncateExisting, Overwrite, "XY", "XY", "XY", ""},
                    OpenRow{ReadWrite, Create, PreserveExisting, Append, "XY", "XY", "12345XY", "12345"},
                    OpenRow{ReadWrite, Create, PreserveExisting, Overwrite, "XY", "XY", "XY345", "12345"},
                    OpenRow{ReadWrite, NeverCreate, TruncateExisting, Append, nullptr, "XY", "XY", ""},
                    OpenRow{ReadWrite, NeverCreate, TruncateExisting, Overwrite, nullptr, "XY", "XY", ""},
                    OpenRow{ReadWrite, NeverCreate, PreserveExisting, Append, nullptr, "XY", "12345XY", "12345"},
                    OpenRow{ReadWrite, NeverCreate, PreserveExisting, Overwrite, nullptr, "XY", "XY345", "12345"}));

TEST_P(MemoryOpenOptions, WriteToAMissingFile)
{
    if (GetParam().intoMissing != nullptr) {
        EXPECT_EQ(contentAfterWriting(), GetParam().intoMissing);
        return;
    }
    EXPECT_EQ(failureOf([&] { open(); }), failure(ErrorCode::ResourceNotFound, at(u"/file")));
    EXPECT_FALSE(store.fileExists(at(u"/file")));
}

TEST_P(MemoryOpenOptions, WriteToAnEmptyFile)
{
    store.createFile(at(u"/file"));
    EXPECT_EQ(contentAfterWriting(), GetParam().intoEmpty);
}

TEST_P(MemoryOpenOptions, WriteToAFilledFile)
{
    store.write(u"/file", "12345");
    EXPECT_EQ(contentAfterWriting(), GetParam().intoFilled);
}

TEST_P(MemoryOpenOptions, ReadAFilledFile)
{
    store.write(u"/file", "12345");
    EXPECT_EQ(readAll(*open()), GetParam().readFirst);
}

TEST_P(MemoryOpenOptions, DoNotOpenAFolder)
{
    store.createFolder(at(u"/file"));
    EXPECT_EQ(failureOf([&] { open(); }), failure(ErrorCode::ResourceNotFound, at(u"/file")));
}

TEST_P(MemoryOpenOptions, TruncateOnOpeningAndNotLater)
{
    store.write(u"/file", "12345");
    auto const stream = open();
    bool const truncates = GetParam().truncate == TruncateExisting;
    EXPECT_EQ(store.getFileAttributes(at(u"/file")).getSize(), truncates ? 0u : 5u);
}

// Positions

TEST(MemoryWriteStream, ReadsAndWritesAtOnePosition)
{
    MemoryStore const store;
    store.write(u"/file", "12345");
    auto const stream = store.openStream(at(u"/file"), update);
    char buffer[2];
    EXPECT_EQ(stream->read(buffer, 2), 2);
    writeAll(*stream, "X");
    EXPECT_EQ(stream->read(buffer, 2), 2);
    EXPECT_EQ(std::string(buffer, 2), "45");
    EXPECT_EQ(store.read(u"/file"), "12X45");
}

TEST(MemoryWriteStream, AppendsWhereverItStands)
{
    MemoryStore const store;
    store.write(u"/file", "12");
    auto const stream = store.openStream(at(u"/file"), append);
    EXPECT_EQ(stream->seek(0, ios_base::beg), 0);
    writeAll(*stream, "34");
    EXPECT_EQ(stream->seek(0, ios_base::cur), 4);
    stream->seek(0, ios_base::beg);
    EXPECT_EQ(readAll(*stream), "1234");
}

TEST(MemoryWriteStream, AppendsBehindWhatOthersAppended)
{
    MemoryStore const store;
    auto const one = store.openStream(at(u"/file"), append);
    auto const other = store.openStream(at(u"/file"), append);
    writeAll(*one, "1");
    writeAll(*other, "2");
    writeAll(*one, "3");
    EXPECT_EQ(store.read(u"/file"), "123");
}

TEST(MemoryWriteStream, LeavesZerosBehindTheEnd)
{
    MemoryStore const store;
    auto const stream = store.openStream(at(u"/file"), rewrite);
    writeAll(*stream, "1");
    EXPECT_EQ(stream->seek(5, ios_base::end), 6);
    writeAll(*stream, "2");
    EXPECT_EQ(store.read(u"/file"), std::string("1\0\0\0\0\0002", 7));
}

TEST(MemoryWriteStream, SeeksFromEverywhere)
{
    MemoryStore const store;
    store.write(u"/file", "12345");
    auto const stream = store.openStream(at(u"/file"), update);
    EXPECT_EQ(stream->seek(3, ios_base::beg), 3);
    EXPECT_EQ(stream->seek(-1, ios_base::cur), 2);
    EXPECT_EQ(stream->seek(-1, ios_base::end), 4);
    EXPECT_EQ(stream->seek(10, ios_base::end), 15);
    EXPECT_EQ(readAll(*stream), "");
}

TEST(MemoryWriteStream, StaysWhereItIsWhenASeekIsRefused)
{
    MemoryStore const store;
    store.write(u"/file", "12345");
    auto const stream = store.openStream(at(u"/file"), update);
    stream->seek(3, ios_base::beg);
    constexpr long most = std::numeric_limits<long>::max();
    EXPECT_EQ(streamFailureOf([&] { stream->seek(-1, ios_base::beg); }), ErrorCode::InvalidLocation);
    EXPECT_EQ(streamFailureOf([&] { stream->seek(-4, ios_base::cur); }), ErrorCode::InvalidLocation);
    EXPECT_EQ(streamFailureOf([&] { stream->seek(most, ios_base::end); }), ErrorCode::InvalidLocation);
    EXPECT_EQ(stream->seek(0, ios_base::cur), 3);
}

TEST(MemoryWriteStream, RefusesAFileThatGrowsTooLarge)
{
    MemoryStore const store;
    auto const stream = store.openStream(at(u"/file"), rewrite);
    stream->seek(std::numeric_limits<long>::max(), ios_base::beg);
    EXPECT_EQ(streamFailureOf([&] { stream->write("x", 1); }), ErrorCode::FileTooLarge);
    EXPECT_EQ(store.read(u"/file"), "");
}

TEST(MemoryWriteStream, TakesNoBytesWithoutChangingAnything)
{
    MemoryStore const store;
    auto const stream = store.openStream(at(u"/file"), rewrite);
    stream->seek(10, ios_base::beg);
    EXPECT_EQ(stream->write("x", 0), 0);
    EXPECT_EQ(store.read(u"/file"), "");
}

TEST(MemoryStream, RefusesNegativeCounts)
{
    MemoryStore const store;
    auto const stream = store.openStream(at(u"/file"), rewrite);
    char buffer[1];
    EXPECT_EQ(streamFailureOf([&] { stream->read(buffer, -1); }), ErrorCode::InvalidLocation);
    EXPECT_EQ(streamFailureOf([&] { stream->write(buffer, -1); }), ErrorCode::InvalidLocation);
}

TEST(MemoryStream, FailsWhenClosed)
{
    MemoryStore const store;
    auto const writer = store.openStream(at(u"/file"), rewrite);
    auto const reader = store.openReadOnlyStream(at(u"/file"));
    char buffer[1];
    for (ByteStream* const stream : {writer.get(), reader.get()}) {
        stream->close();
        EXPECT_EQ(streamFailureOf([&] { stream->read(buffer, 1); }), ErrorCode::IOError);
        EXPECT_EQ(streamFailureOf([&] { stream->write(buffer, 1); }), ErrorCode::IOError);
        EXPECT_EQ(streamFailureOf([&] { stream->seek(0, ios_base::beg); }), ErrorCode::IOError);
    }
}

TEST(MemoryStream, ClosesTwice)
{
    MemoryStore const store;
    auto const writer = store.openStream(at(u"/file"), rewrite);
    auto const reader = store.openReadOnlyStream(at(u"/file"));
    for (ByteStream* const stream : {writer.get(), reader.get()}) {
        stream->close();
        EXPECT_NO_THROW(stream->close());
    }
}

TEST(MemoryStreamFailure, SaysWhatWasAttemptedWhereAndWhyItFailed)
{
    detail::MemoryStreamFailure const refusal("write", at(u"/a b"), std::errc::no_space_on_device);
    EXPECT_STREQ(refusal.what(), "Cannot write \"mem://test/a%20b\": No space left on device");
    EXPECT_EQ(refusal.getErrorCode(), ErrorCode::NoSpaceLeft);
}

TEST(MemoryStreamFailure, IsClonedAndThrownAsItself)
{
    detail::MemoryStreamFailure const refusal("write", at(u"/a"), std::errc::no_space_on_device);
    std::unique_ptr<core::except::IException> const clone(refusal.clone());
    EXPECT_THROW(clone->rethrow(), detail::MemoryStreamFailure);
}

// What readers see

TEST(MemoryReadStream, ReadsToTheEndAndAnswersMinusOne)
{
    MemoryStore const store;
    store.write(u"/file", "12345");
    auto const stream = store.openReadOnlyStream(at(u"/file"));
    char buffer[8];
    EXPECT_EQ(stream->read(buffer, 0), 0);
    EXPECT_EQ(stream->read(buffer, 8), 5);
    EXPECT_EQ(stream->read(buffer, 8), -1);
    EXPECT_EQ(stream->read(buffer, 0), 0);
    EXPECT_EQ(stream->seek(-2, ios_base::end), 3);
    EXPECT_EQ(readAll(*stream), "45");
}

TEST(MemoryReadStream, SeesTheContentOfTheMomentItWasOpened)
{
    MemoryStore const store;
    std::string const content(600000, 'x');
    store.write(u"/file", content);
    auto const reader = store.openReadOnlyStream(at(u"/file"));
    auto const writer = store.openStream(at(u"/file"), update);
    writeAll(*writer, std::string(700000, 'y'));
    store.write(u"/file", "short");
    EXPECT_EQ(readAll(*reader), content);
}

TEST(MemoryReadStream, SurvivesTheRemovalOfItsFileAndOfTheStore)
{
    std::unique_ptr<ByteStream> reader;
    {
        MemoryStore const store;
        store.write(u"/file", "content");
        reader = store.openReadOnlyStream(at(u"/file"));
        store.removeFile(at(u"/file"));
    }
    EXPECT_EQ(readAll(*reader), "content");
}

TEST(MemoryWriteStream, SurvivesTheRemovalOfItsFileAndOfTheStore)
{
    std::unique_ptr<ByteStream> stream;
    {
        MemoryStore const store;
        stream = store.openStream(at(u"/file"), rewrite);
        store.removeFile(at(u"/file"));
        EXPECT_FALSE(store.fileExists(at(u"/file")));
    }
    writeAll(*stream, "content");
    stream->seek(0, ios_base::beg);
    EXPECT_EQ(readAll(*stream), "content");
    stream->close();
}

TEST(MemoryWriteStream, SeesWhatOthersWrite)
{
    MemoryStore const store;
    auto const one = store.openStream(at(u"/file"), rewrite);
    auto const other = store.openStream(at(u"/file"), update);
    writeAll(*one, "content");
    EXPECT_EQ(readAll(*other), "content");
}

// Transactions

TEST(MemoryTransaction, ChangesTheTargetOnCommitAlone)
{
    MemoryStore const store;
    store.write(u"/file", "old");
    auto const stream = store.openTransactionalStream(at(u"/file"), rewrite);
    ASSERT_EQ(stream->write("new", 3), 3);
    EXPECT_EQ(store.read(u"/file"), "old");
    stream->close(StreamClosePolicy::Commit);
    EXPECT_EQ(store.read(u"/file"), "new");
    EXPECT_EQ(namesOf(*store.listAll(at(u"/"))), Names{u"file"});
}

TEST(MemoryTransaction, LeavesNothingBehindWhenAbortedOrDropped)
{
    MemoryStore const store;
    store.openTransactionalStream(at(u"/aborted"), rewrite)->close(StreamClosePolicy::Abort);
    store.openTransactionalStream(at(u"/dropped"), rewrite).reset();
    EXPECT_EQ(namesOf(*store.listAll(at(u"/"))), Names());
}

} // namespace
} // namespace foundation::storage::memory
