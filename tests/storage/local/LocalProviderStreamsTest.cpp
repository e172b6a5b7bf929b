#include <storage/local/LocalProvider.hpp>

#include <gtest/gtest.h>

#include <storage/provider/ByteStreamFailure.hpp>
#include <tests/storage/local/ReplacedSystemCalls.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>
#include <tests/support/printed.hpp>

#include <algorithm>
#include <array>
#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>
#include <vector>

namespace foundation::storage::local {
namespace {

namespace fs = std::filesystem;
using namespace provider;
using tests::support::failure;
using tests::support::failureOf;
using tests::support::failWith;
using tests::support::printed;
using tests::support::ReplacedSystemCalls;
using tests::support::TemporaryFolder;

constexpr ByteStreamOpenOptions readWriteInPlace{ByteStreamAccess::ReadWrite, ByteStreamCreate::NeverCreate,
                                                 ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Overwrite};

/// Everything from where the stream stands to its end.
std::string readAll(ByteStream& stream)
{
    std::string content;
    std::array<char, 4> buffer;
    long count;
    while ((count = stream.read(buffer.data(), long{buffer.size()})) != -1) {
        if (count <= 0)
            throw std::logic_error("a read of " + std::to_string(count));
        content.append(buffer.data(), static_cast<std::size_t>(count));
    }
    return content;
}

/// The code and the text of the failure that an action ends with.
std::string streamFailureOf(std::function<void()> const& action)
{
    try {
        action();
        return "no failure";
    } catch (ByteStreamFailure const& failure) {
        return printed(failure.getErrorCode()) + " " + failure.what();
    }
}

struct OptionsRow
{
    ByteStreamCreate create;
    ByteStreamTruncate truncate;
    ByteStreamAppend append;
    /// What is in the file once opened and once "ab" is written, by what was there: nothing, an empty file, "0123".
    /// Nothing for a file that is not found.
    std::array<std::optional<std::string>, 3> opened;
    std::array<std::optional<std::string>, 3> written;
};

constexpr auto notFound = std::nullopt;

std::vector<OptionsRow> const optionsTable{
    {ByteStreamCreate::Create,
     ByteStreamTruncate::TruncateExisting,
     ByteStreamAppend::Append,
     {"", "", ""},
     {"ab", "ab", "ab"}},
    {ByteStreamCreate::Create,
     ByteStreamTruncate::TruncateExisting,
     ByteStreamAppend::Overwrite,
     {"", "", ""},
     {"ab", "ab", "ab"}},
    {ByteStreamCreate::Create,
     ByteStreamTruncate::PreserveExisting,
     ByteStreamAppend::Append,
     {"", "", "0123"},
     {"ab", "ab", "0123ab"}},
    {ByteStreamCreate::Create,
     ByteStreamTruncate::PreserveExisting,
     ByteStreamAppend::Overwrite,
     {"", "", "0123"},
     {"ab", "ab", "ab23"}},
    {ByteStreamCreate::NeverCreate,
     ByteStreamTruncate::TruncateExisting,
     ByteStreamAppend::Append,
     {notFound, "", ""},
     {notFound, "ab", "ab"}},
    {ByteStreamCreate::NeverCreate,
     ByteStreamTruncate::TruncateExisting,
     ByteStreamAppend::Overwrite,
     {notFound, "", ""},
     {notFound, "ab", "ab"}},
    {ByteStreamCreate::NeverCreate,
     ByteStreamTruncate::PreserveExisting,
     ByteStreamAppend::Append,
     {notFound, "", "0123"},
     {notFound, "ab", "0123ab"}},
    {ByteStreamCreate::NeverCreate,
     ByteStreamTruncate::PreserveExisting,
     ByteStreamAppend::Overwrite,
     {notFound, "", "0123"},
     {notFound, "ab", "ab23"}},
};

/// A folder with what the n-th column of the table starts from under the name "file".
class Column
{
public:
    explicit Column(std::size_t number)
    {
        if (number > 0)
            folder.write("file", number == 1 ? "" : "0123");
    }

    TemporaryFolder folder;
    StorageIRI file = folder.iri(u"file");
};

class LocalProviderOpenOptions : public testing::TestWithParam<ByteStreamAccess>
{
protected:
    LocalProvider const provider{};

    /// Calls `check(options, file, folder, opened, written)` for every row and column.
    template <typename Check>
    void forEveryCombination(Check const& check) const
    {
        for (auto const& [create, truncate, append, opened, written] : optionsTable)
            for (std::size_t column = 0; column < 3; ++column) {
                Column const start(column);
                ByteStreamOpenOptions const options{GetParam(), create, truncate, append};
                SCOPED_TRACE(printed(options) + ", column " + std::to_string(column));
                check(options, start, opened.at(column), written.at(column));
            }
    }
};

TEST_P(LocalProviderOpenOptions, DecideWhatIsInTheFileOnceOpened)
{
    forEveryCombination([&](ByteStreamOpenOptions const& options, Column const& start,
                            std::optional<std::string> const& opened, auto const&) {
        if (!opened) {
            EXPECT_EQ(failureOf([&] { provider.openStream(start.file, options); }),
                      failure(ErrorCode::ResourceNotFound, start.file));
            EXPECT_FALSE(fs::exists(start.folder / "file"));
            return;
        }
        provider.openStream(start.file, options)->close();
        EXPECT_EQ(start.folder.read("file"), *opened);
    });
}

TEST_P(LocalProviderOpenOptions, DecideWhatCanBeRead)
{
    forEveryCombination([&](ByteStreamOpenOptions const& options, Column const& start,
                            std::optional<std::string> const& opened, auto const&) {
        if (opened) {
            bool const readable = options.access == ByteStreamAccess::ReadWrite;
            EXPECT_EQ(readAll(*provider.openStream(start.file, options)), readable ? *opened : "");
        }
    });
}

TEST_P(LocalProviderOpenOptions, DecideWhereIsWritten)
{
    forEveryCombination([&](ByteStreamOpenOptions const& options, Column const& start, auto const&,
                            std::optional<std::string> const& written) {
        if (written) {
            auto const stream = provider.openStream(start.file, options);
            EXPECT_EQ(stream->write("ab", 2), 2);
            stream->close();
            EXPECT_EQ(start.folder.read("file"), *written);
        }
    });
}

INSTANTIATE_TEST_SUITE_P(, LocalProviderOpenOptions,
                         testing::Values(ByteStreamAccess::WriteOnly, ByteStreamAccess::ReadWrite),
                         [](auto const& access) {
                             return access.param == ByteStreamAccess::WriteOnly ? "WriteOnly" : "ReadWrite";
                         });

class LocalProviderStreams : public testing::Test
{
protected:
    LocalProviderStreams() { folder.write("file", "0123456789"); }

    TemporaryFolder folder;
    LocalProvider const provider;
    StorageIRI file = folder.iri(u"file");
    std::string quoted = "\"" + (folder / "file").string() + "\"";
};

TEST_F(LocalProviderStreams, ReadWhatIsThere)
{
    auto const stream = provider.openReadOnlyStream(file);
    std::array<char, 16> buffer;
    EXPECT_EQ(stream->read(buffer.data(), 4), 4);
    EXPECT_EQ(std::string(buffer.data(), 4), "0123");
    EXPECT_EQ(stream->read(buffer.data(), 16), 6);
    EXPECT_EQ(stream->read(buffer.data(), 16), -1);
    EXPECT_EQ(stream->read(buffer.data(), 16), -1);
}

TEST_F(LocalProviderStreams, ReadFromALink)
{
    fs::create_symlink("file", folder / "link");
    EXPECT_EQ(readAll(*provider.openReadOnlyStream(folder.iri(u"link"))), "0123456789");
}

TEST_F(LocalProviderStreams, MoveNothingWhenAskedForNothing)
{
    auto const stream = provider.openStream(file, readWriteInPlace);
    EXPECT_EQ(stream->read(nullptr, 0), 0);
    EXPECT_EQ(stream->write(nullptr, 0), 0);
    stream->seek(0, std::ios_base::end);
    EXPECT_EQ(stream->read(nullptr, 0), 0);
}

TEST_F(LocalProviderStreams, RefuseNegativeCounts)
{
    auto const stream = provider.openStream(file, readWriteInPlace);
    char byte = 'x';
    EXPECT_EQ(streamFailureOf([&] { stream->read(&byte, -1); }),
              "ErrorCode::InvalidLocation Cannot read " + quoted + ": Invalid argument");
    EXPECT_EQ(streamFailureOf([&] { stream->write(&byte, -1); }),
              "ErrorCode::InvalidLocation Cannot write " + quoted + ": Invalid argument");
}

TEST_F(LocalProviderStreams, SeekFromTheStartFromWhereTheyStandAndFromTheEnd)
{
    auto const stream = provider.openStream(file, readWriteInPlace);
    EXPECT_EQ(stream->seek(3, std::ios_base::beg), 3);
    EXPECT_EQ(stream->seek(2, std::ios_base::cur), 5);
    EXPECT_EQ(readAll(*stream), "56789");
    EXPECT_EQ(stream->seek(-2, std::ios_base::end), 8);
    EXPECT_EQ(stream->write("ab", 2), 2);
    EXPECT_EQ(folder.read("file"), "01234567ab");
}

TEST_F(LocalProviderStreams, SeekBeyondTheEndAndLeaveAHoleOfZeros)
{
    auto const stream = provider.openStream(file, readWriteInPlace);
    EXPECT_EQ(stream->seek(2, std::ios_base::end), 12);
    EXPECT_EQ(readAll(*stream), "");
    stream->write("x", 1);
    EXPECT_EQ(folder.read("file"), std::string("0123456789\0\0x", 13));
}

TEST_F(LocalProviderStreams, SeekBeyond4GiB)
{
    auto const stream = provider.openStream(file, readWriteInPlace);
    EXPECT_EQ(stream->seek(5'000'000'000, std::ios_base::beg), 5'000'000'000);
    stream->write("x", 1);
    EXPECT_EQ(fs::file_size(folder / "file"), 5'000'000'001u);
}

TEST_F(LocalProviderStreams, SeekToNoPlaceBeforeTheStart)
{
    auto const stream = provider.openReadOnlyStream(file);
    stream->seek(3, std::ios_base::beg);
    EXPECT_EQ(streamFailureOf([&] { stream->seek(-1, std::ios_base::beg); }),
              "ErrorCode::InvalidLocation Cannot seek in " + quoted + ": Invalid argument");
    EXPECT_EQ(readAll(*stream), "3456789");
}

TEST_F(LocalProviderStreams, AppendAtTheEndWhereverTheyStand)
{
    ByteStreamOpenOptions options = readWriteInPlace;
    options.append = ByteStreamAppend::Append;
    auto const stream = provider.openStream(file, options);
    EXPECT_EQ(stream->seek(2, std::ios_base::beg), 2);
    stream->write("ab", 2);
    EXPECT_EQ(folder.read("file"), "0123456789ab");
    stream->seek(8, std::ios_base::beg);
    EXPECT_EQ(readAll(*stream), "89ab");
}

TEST_F(LocalProviderStreams, AppendAfterWhatOthersAppendedMeanwhile)
{
    ByteStreamOpenOptions options = readWriteInPlace;
    options.append = ByteStreamAppend::Append;
    auto const first = provider.openStream(file, options);
    auto const second = provider.openStream(file, options);
    first->write("a", 1);
    second->write("b", 1);
    first->write("c", 1);
    EXPECT_EQ(folder.read("file"), "0123456789abc");
}

TEST_F(LocalProviderStreams, AreOfNoUseOnceClosed)
{
    auto const stream = provider.openStream(file, readWriteInPlace);
    stream->close();
    stream->close();
    char byte = 'x';
    EXPECT_EQ(streamFailureOf([&] { stream->read(&byte, 1); }),
              "ErrorCode::IOError Cannot read closed stream of " + quoted + ": Bad file descriptor");
    EXPECT_EQ(streamFailureOf([&] { stream->write(&byte, 1); }),
              "ErrorCode::IOError Cannot write closed stream of " + quoted + ": Bad file descriptor");
    EXPECT_EQ(streamFailureOf([&] { stream->seek(0, std::ios_base::beg); }),
              "ErrorCode::IOError Cannot seek in closed stream of " + quoted + ": Bad file descriptor");
}

TEST_F(LocalProviderStreams, PassShortWritesOn)
{
    ReplacedSystemCalls replaced;
    replaced->write = [](int descriptor, void const* data, std::size_t count) {
        return ::write(descriptor, data, std::min<std::size_t>(count, 3));
    };
    EXPECT_EQ(provider.openStream(file, readWriteInPlace)->write("abcdef", 6), 3);
    EXPECT_EQ(folder.read("file"), "abc3456789");
}

TEST_F(LocalProviderStreams, ReadAndWriteAgainWhenASignalInterrupts)
{
    static int interruptions;
    interruptions = 2;
    ReplacedSystemCalls replaced;
    replaced->read = [](int descriptor, void* buffer, std::size_t count) {
        return interruptions-- > 0 ? failWith(EINTR) : ::read(descriptor, buffer, count);
    };
    replaced->write = [](int descriptor, void const* data, std::size_t count) {
        return interruptions-- > 0 ? failWith(EINTR) : ::write(descriptor, data, count);
    };
    auto const stream = provider.openStream(file, readWriteInPlace);
    char byte;
    EXPECT_EQ(stream->read(&byte, 1), 1);
    interruptions = 2;
    EXPECT_EQ(stream->write("x", 1), 1);
}

TEST_F(LocalProviderStreams, SayWhyTheyFail)
{
    auto stream = provider.openStream(file, readWriteInPlace);
    ReplacedSystemCalls replaced;
    replaced->read = [](int, void*, std::size_t) -> ssize_t { return failWith(EIO); };
    replaced->write = [](int, void const*, std::size_t) -> ssize_t { return failWith(ENOSPC); };
    replaced->lseek = [](int, off_t, int) -> off_t { return failWith(EOVERFLOW); };
    replaced->close = [](int descriptor) {
        ::close(descriptor);
        return failWith(EDQUOT);
    };
    char byte = 'x';
    EXPECT_EQ(streamFailureOf([&] { stream->read(&byte, 1); }),
              "ErrorCode::IOError Cannot read " + quoted + ": Input/output error");
    EXPECT_EQ(streamFailureOf([&] { stream->write(&byte, 1); }),
              "ErrorCode::NoSpaceLeft Cannot write " + quoted + ": No space left on device");
    EXPECT_EQ(streamFailureOf([&] { stream->seek(0, std::ios_base::beg); }),
              "ErrorCode::FileTooLarge Cannot seek in " + quoted + ": Value too large for defined data type");
    EXPECT_EQ(streamFailureOf([&] { stream->close(); }),
              "ErrorCode::NoSpaceLeft Cannot close " + quoted + ": Disk quota exceeded");
    EXPECT_NO_THROW(stream->close());
}

TEST_F(LocalProviderStreams, FailWithWhatCanBeKeptAndThrownAgain)
{
    auto const stream = provider.openReadOnlyStream(file);
    std::unique_ptr<core::except::IException> kept;
    try {
        stream->seek(-1, std::ios_base::beg);
    } catch (ByteStreamFailure const& failure) {
        kept.reset(failure.clone());
    }
    ASSERT_NE(kept, nullptr);
    EXPECT_EQ(streamFailureOf([&] { kept->rethrow(); }),
              "ErrorCode::InvalidLocation Cannot seek in " + quoted + ": Invalid argument");
    EXPECT_THROW(kept->rethrow(), std::ios_base::failure);
}

TEST_F(LocalProviderStreams, CloseInSilenceWhenDropped)
{
    auto stream = provider.openStream(file, readWriteInPlace);
    ReplacedSystemCalls replaced;
    replaced->close = [](int descriptor) {
        ::close(descriptor);
        return failWith(EIO);
    };
    EXPECT_NO_THROW(stream.reset());
}

TEST_F(LocalProviderStreams, KeepTheirFileWhenItIsRemoved)
{
    auto const stream = provider.openReadOnlyStream(file);
    provider.removeFile(file);
    EXPECT_EQ(readAll(*stream), "0123456789");
}

TEST_F(LocalProviderStreams, NeedAFile)
{
    fs::create_directory(folder / "folder");
    fs::create_symlink("folder", folder / "link to folder");
    fs::create_symlink("nothing", folder / "broken link");
    for (char16_t const* const name : {u"folder", u"link to folder", u"missing", u"file/name", u"broken link"}) {
        StorageIRI const iri = folder.iri(name);
        EXPECT_EQ(failureOf([&] { provider.openReadOnlyStream(iri); }), failure(ErrorCode::ResourceNotFound, iri));
        EXPECT_EQ(failureOf([&] { provider.openStream(iri, readWriteInPlace); }),
                  failure(ErrorCode::ResourceNotFound, iri));
    }
    for (char16_t const* const name : {u"folder", u"link to folder", u"missing/name", u"file/name"}) {
        StorageIRI const iri = folder.iri(name);
        EXPECT_EQ(failureOf([&] { provider.openStream(iri, {}); }), failure(ErrorCode::ResourceNotFound, iri));
    }
}

TEST_F(LocalProviderStreams, CreateTheFileThatABrokenLinkLeadsTo)
{
    fs::create_symlink("target", folder / "link");
    provider.openStream(folder.iri(u"link"), {})->write("new", 3);
    EXPECT_EQ(folder.read("target"), "new");
}

void makeSocket(fs::path const& path)
{
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    path.native().copy(address.sun_path, sizeof address.sun_path - 1);
    int const descriptor = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr const* const generic = reinterpret_cast<sockaddr const*>(&address);
    ASSERT_EQ(::bind(descriptor, generic, sizeof address), 0);
    ::close(descriptor);
}

TEST_F(LocalProviderStreams, RefuseWhatIsNeitherFileNorFolderWithoutWaiting)
{
    ASSERT_EQ(::mkfifo((folder / "pipe").c_str(), 0600), 0);
    makeSocket(folder / "socket");
    for (char16_t const* const name : {u"pipe", u"socket", u"/dev/null", u"/dev/full"}) {
        StorageIRI const iri = folder.iri(name);
        auto const refused = failure(ErrorCode::UnsupportedOperation, iri);
        EXPECT_EQ(failureOf([&] { provider.openReadOnlyStream(iri); }), refused);
        EXPECT_EQ(failureOf([&] { provider.openStream(iri, {}); }), refused);
        EXPECT_EQ(failureOf([&] { provider.openStream(iri, readWriteInPlace); }), refused);
    }
}

TEST_F(LocalProviderStreams, TellTheSystemThatTheyWillBeReadInSequence)
{
    static int advice;
    advice = -1;
    ReplacedSystemCalls replaced;
    replaced->fadvise = [](int, off_t, off_t, int given) { return advice = given, 0; };
    provider.openReadOnlyStream(file);
    EXPECT_EQ(advice, POSIX_FADV_SEQUENTIAL);
}

TEST_F(LocalProviderStreams, AreNotInheritedByOtherPrograms)
{
    static std::vector<int> descriptors;
    descriptors.clear();
    ReplacedSystemCalls replaced;
    replaced->openat = [](int at, char const* path, int flags, mode_t mode) {
        descriptors.push_back(::openat(at, path, flags, mode));
        return descriptors.back();
    };
    auto const reading = provider.openReadOnlyStream(file);
    auto const writing = provider.openStream(file, readWriteInPlace);
    auto const listing = provider.listAll(folder.iri());
    ASSERT_EQ(descriptors.size(), 3u);
    for (int const descriptor : descriptors)
        EXPECT_EQ(::fcntl(descriptor, F_GETFD), FD_CLOEXEC);
}

TEST_F(LocalProviderStreams, LeaveNoDescriptorBehindWhenTheyCannotBeOpened)
{
    static int open;
    open = 0;
    ReplacedSystemCalls replaced;
    replaced->openat = [](int at, char const* path, int flags, mode_t mode) {
        int const descriptor = ::openat(at, path, flags, mode);
        open += descriptor >= 0;
        return descriptor;
    };
    replaced->close = [](int descriptor) {
        --open;
        return ::close(descriptor);
    };
    EXPECT_ANY_THROW(provider.openReadOnlyStream(folder.iri()));
    EXPECT_ANY_THROW(provider.openStream(folder.iri(u"/dev/null"), readWriteInPlace));
    replaced->statx = [](int, char const*, int, unsigned, struct statx*) { return failWith(EIO); };
    EXPECT_EQ(failureOf([&] { provider.openReadOnlyStream(file); }), failure(ErrorCode::IOError, file));
    EXPECT_EQ(open, 0);
}

} // namespace
} // namespace foundation::storage::local
