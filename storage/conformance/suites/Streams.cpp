#include <storage/conformance/detail/Family.hpp>
#include <storage/conformance/detail/Scene.hpp>
#include <storage/conformance/detail/content.hpp>
#include <storage/conformance/detail/families.hpp>
#include <storage/provider/ByteStreamFailure.hpp>

#include <algorithm>
#include <vector>

namespace foundation::storage::conformance::detail {

using namespace provider;

namespace {

constexpr ByteStreamOpenOptions inPlace{ByteStreamAccess::ReadWrite, ByteStreamCreate::NeverCreate,
                                        ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Overwrite};
constexpr ByteStreamOpenOptions atTheEnd{ByteStreamAccess::ReadWrite, ByteStreamCreate::NeverCreate,
                                         ByteStreamTruncate::PreserveExisting, ByteStreamAppend::Append};

/// Reads up to `count` bytes at once.
std::string readSome(ByteStream& stream, long count)
{
    std::vector<char> buffer(static_cast<std::size_t>(count));
    long const read = stream.read(buffer.data(), count);
    return std::string(buffer.data(), static_cast<std::size_t>(std::max(read, 0L)));
}

void contentOfEverySizeAndValueComesBack(Harness const& harness)
{
    Tree content;
    for (std::size_t const size : {0u, 1u, 2u, 4095u, 4096u, 4097u, 65536u, 3145729u})
        content[u"file" + std::u16string(1, static_cast<char16_t>(u'a' + content.size()))] = someContent(size);
    std::string everyByte;
    for (int byte = 0; byte < 256; ++byte)
        everyByte.push_back(static_cast<char>(byte));
    content[u"every byte"] = everyByte;
    Scene const scene(harness, content);
    EXPECT_TRUE(scene.holds(content));
}

void readingInPiecesOfAnySizeGivesTheWhole(Harness const& harness)
{
    std::string const content = someContent(10000);
    Scene const scene(harness, {{u"file", content}});
    for (long const piece : {1L, 7L, 4096L, 9999L, 10000L, 10001L, 1048576L}) {
        auto const stream = scene.provider().openReadOnlyStream(scene.iri(u"file"));
        std::string read;
        for (std::string some = readSome(*stream, piece); !some.empty(); some = readSome(*stream, piece))
            read += some;
        EXPECT_EQ(read, content) << "in pieces of " << piece;
    }
}

void theEndIsMinusOneAsOftenAsAsked(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"empty", ""}});
    for (auto const* const path : {u"file", u"empty"}) {
        auto const stream = scene.provider().openReadOnlyStream(scene.iri(path));
        readAll(*stream);
        char buffer[8];
        for (int time = 0; time < 3; ++time)
            EXPECT_EQ(stream->read(buffer, sizeof buffer), -1);
    }
}

void nothingIsReadOrWrittenWhenNothingIsAskedFor(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    auto const stream = scene.provider().openStream(scene.iri(u"file"), inPlace);
    char buffer = 'x';
    EXPECT_EQ(stream->read(&buffer, 0), 0);
    EXPECT_EQ(stream->write(&buffer, 0), 0);
    EXPECT_EQ(readAll(*stream), "content");
    stream->close();
    EXPECT_TRUE(scene.holds({{u"file", "content"}}));
}

void seekingGivesThePositionAndMovesTheReading(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "0123456789"}});
    auto const stream = scene.provider().openReadOnlyStream(scene.iri(u"file"));
    EXPECT_EQ(stream->seek(4, std::ios_base::beg), 4);
    EXPECT_EQ(readSome(*stream, 2), "45");
    EXPECT_EQ(stream->seek(-3, std::ios_base::cur), 3);
    EXPECT_EQ(readSome(*stream, 2), "34");
    EXPECT_EQ(stream->seek(1, std::ios_base::cur), 6);
    EXPECT_EQ(stream->seek(-2, std::ios_base::end), 8);
    EXPECT_EQ(readAll(*stream), "89");
    EXPECT_EQ(stream->seek(0, std::ios_base::cur), 10);
    EXPECT_EQ(stream->seek(0, std::ios_base::beg), 0);
    EXPECT_EQ(readAll(*stream), "0123456789");
}

void seekingBeforeTheStartFailsAndStaysPut(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "0123456789"}});
    auto const stream = scene.provider().openReadOnlyStream(scene.iri(u"file"));
    EXPECT_EQ(stream->seek(4, std::ios_base::beg), 4);
    EXPECT_THROW(stream->seek(-1, std::ios_base::beg), ByteStreamFailure);
    EXPECT_THROW(stream->seek(-5, std::ios_base::cur), ByteStreamFailure);
    EXPECT_THROW(stream->seek(-11, std::ios_base::end), ByteStreamFailure);
    EXPECT_EQ(readAll(*stream), "456789");
}

void readingWritingAndSeekingShareOnePosition(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "0123456789"}});
    auto const stream = scene.provider().openStream(scene.iri(u"file"), inPlace);
    EXPECT_EQ(readSome(*stream, 2), "01");
    writeAll(*stream, "ab");
    EXPECT_EQ(stream->seek(0, std::ios_base::cur), 4);
    EXPECT_EQ(readSome(*stream, 2), "45");
    EXPECT_EQ(stream->seek(0, std::ios_base::end), 10);
    writeAll(*stream, "cd");
    EXPECT_EQ(stream->seek(-4, std::ios_base::end), 8);
    EXPECT_EQ(readAll(*stream), "89cd");
    stream->close();
    EXPECT_TRUE(scene.holds({{u"file", "01ab456789cd"}}));
}

void appendingWritesAtTheEndWhereverTheStreamStands(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    auto const stream = scene.provider().openStream(scene.iri(u"file"), atTheEnd);
    writeAll(*stream, "1");
    EXPECT_EQ(stream->seek(0, std::ios_base::beg), 0);
    EXPECT_EQ(readSome(*stream, 3), "con");
    writeAll(*stream, "2");
    stream->close();
    EXPECT_TRUE(scene.holds({{u"file", "content12"}}));
}

void appendingStreamsDoNotOverwriteEachOther(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    auto const first = scene.provider().openStream(scene.iri(u"file"), atTheEnd);
    auto const second = scene.provider().openStream(scene.iri(u"file"), atTheEnd);
    writeAll(*first, "1");
    writeAll(*second, "2");
    writeAll(*first, "3");
    first->close();
    second->close();
    EXPECT_TRUE(scene.holds({{u"file", "content123"}}));
}

void aReadOnlyStreamRefusesToWrite(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    auto const stream = scene.provider().openReadOnlyStream(scene.iri(u"file"));
    for (long const count : {0L, 1L}) {
        try {
            stream->write("x", count);
            ADD_FAILURE() << "wrote " << count << " bytes";
        } catch (ByteStreamWriteFailure const& failure) {
            EXPECT_EQ(failure.getErrorCode(), ErrorCode::IOError);
        }
    }
    EXPECT_EQ(readAll(*stream), "content");
    EXPECT_TRUE(scene.holds({{u"file", "content"}}));
}

void readingNeedsAFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}, {u"folder/", ""}});
    for (auto const* const path : {u"missing", u"missing/inner", u"file/inner", u"folder"})
        EXPECT_TRUE(scene.refuses([&] { scene.provider().openReadOnlyStream(scene.iri(path)); },
                                  ErrorCode::ResourceNotFound, scene.iri(path)));
}

void whatWasWrittenIsThereAfterClosing(Harness const& harness)
{
    std::string const content = someContent(2000003);
    Scene const scene(harness);
    auto const stream = scene.provider().openStream(scene.iri(u"file"), {});
    for (std::size_t start = 0; start < content.size(); start += 70001)
        writeAll(*stream, std::string_view(content).substr(start, 70001));
    stream->close();
    EXPECT_EQ(scene.provider().getFileAttributes(scene.iri(u"file")).getSize(), content.size());
    EXPECT_TRUE(scene.holds({{u"file", content}}));
}

/// A transaction whose commit failed is closed again, and closes its stream again with it.
void closingAgainDoesNothing(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    auto const reader = scene.provider().openReadOnlyStream(scene.iri(u"file"));
    reader->close();
    reader->close();
    auto const writer = scene.provider().openStream(scene.iri(u"file"), inPlace);
    writeAll(*writer, "C");
    writer->close();
    writer->close();
    EXPECT_TRUE(scene.holds({{u"file", "Content"}}));
}

void readersShareAFile(Harness const& harness)
{
    Scene const scene(harness, {{u"file", "content"}});
    auto const first = scene.provider().openReadOnlyStream(scene.iri(u"file"));
    auto const second = scene.provider().openReadOnlyStream(scene.iri(u"file"));
    EXPECT_EQ(readSome(*first, 3), "con");
    EXPECT_EQ(readAll(*second), "content");
    EXPECT_EQ(readAll(*first), "tent");
}

} // namespace

std::vector<Check> streamChecks()
{
    return Family("Streams")
        .forAll({
            CHECK_FUNCTION(contentOfEverySizeAndValueComesBack),
            CHECK_FUNCTION(readingInPiecesOfAnySizeGivesTheWhole),
            CHECK_FUNCTION(theEndIsMinusOneAsOftenAsAsked),
            CHECK_FUNCTION(seekingGivesThePositionAndMovesTheReading),
            CHECK_FUNCTION(seekingBeforeTheStartFailsAndStaysPut),
            CHECK_FUNCTION(aReadOnlyStreamRefusesToWrite),
            CHECK_FUNCTION(readingNeedsAFile),
            CHECK_FUNCTION(readersShareAFile),
        })
        .forWritable({
            CHECK_FUNCTION(nothingIsReadOrWrittenWhenNothingIsAskedFor),
            CHECK_FUNCTION(readingWritingAndSeekingShareOnePosition),
            CHECK_FUNCTION(appendingWritesAtTheEndWhereverTheStreamStands),
            CHECK_FUNCTION(appendingStreamsDoNotOverwriteEachOther),
            CHECK_FUNCTION(whatWasWrittenIsThereAfterClosing),
            CHECK_FUNCTION(closingAgainDoesNothing),
        })
        .checks();
}

} // namespace foundation::storage::conformance::detail
