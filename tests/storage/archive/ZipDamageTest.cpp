#include <storage/archive/ArchiveProvider.hpp>

#include <storage/provider/ByteStreamFailure.hpp>
#include <storage/provider/Exception.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/zips.hpp>

#include <gtest/gtest.h>

#include <map>

namespace foundation::storage::archive {

using namespace provider;

namespace {

std::map<std::u16string, std::string> const contents{
    {u"deflated", std::string(300, 'a') + "some text" + std::string(300, 'b')},
    {u"stored", "stored text, stored text"},
};

std::string soundZip()
{
    return makeZip({{.name = "deflated", .content = contents.at(u"deflated")},
                    {.name = "stored", .content = contents.at(u"stored"), .isStored = true}});
}

/// Reads each file that is there under its name; answers how many were read well. What is read at all is right.
int filesReadWell(std::string const& damaged)
{
    int sound = 0;
    StorageItem const root = openRoot(ArchiveFormat::Zip, makeFile(damaged));
    for (auto const& [name, content] : contents) {
        try {
            EXPECT_EQ(read(root, name), content);
            ++sound;
        } catch (Exception const& error) {
            EXPECT_NE(error.getErrorCode(), ErrorCode::InternalError);
        } catch (ByteStreamFailure const& failure) {
            EXPECT_NE(failure.getErrorCode(), ErrorCode::InternalError);
        }
    }
    return sound;
}

TEST(ZipDamage, ASoundArchiveIsReadWell)
{
    EXPECT_EQ(filesReadWell(soundZip()), 2);
}

TEST(ZipDamage, ATruncatedArchiveIsRefusedWhereverItEnds)
{
    std::string const zip = soundZip();
    for (std::size_t size = 0; size != zip.size(); ++size)
        EXPECT_EQ(filesReadWell(zip.substr(0, size)), 0) << size;
}

/// Content that is read well by chance has the right size and checksum, so it is the right one.
TEST(ZipDamage, AFlippedBitIsNeverReadAsContent)
{
    std::string const zip = soundZip();
    int refused = 0;
    for (std::size_t bit = 0; bit != zip.size() * 8; ++bit) {
        std::string damaged = zip;
        damaged[bit / 8] = static_cast<char>(damaged[bit / 8] ^ (1 << bit % 8));
        SCOPED_TRACE(bit);
        refused += filesReadWell(damaged) < 2;
    }
    EXPECT_GT(refused, 500);
}

TEST(ZipDamage, AWrongChecksumIsToldBeforeTheLastBytesAreHandedOut)
{
    std::string zip = soundZip();
    zip[zip.find("stored text") + 3] ^= 1;
    StorageItem const file(openRoot(ArchiveFormat::Zip, makeFile(zip)), u"stored");
    auto const stream = file.openReadOnlyStream();
    std::string bytes(24, '\0');
    EXPECT_EQ(stream->read(bytes.data(), 20), 20);
    try {
        stream->read(bytes.data(), 4);
        ADD_FAILURE() << "read";
    } catch (ByteStreamFailure const& failure) {
        EXPECT_EQ(failure.getErrorCode(), ErrorCode::IOError);
        EXPECT_STREQ(failure.what(), "Cannot read \"zip:mem://archives/archive!/stored\": damaged: it breaks off, "
                                     "contradicts itself, or does not match its checksum: iostream error");
    }
    EXPECT_THROW(stream->read(bytes.data(), 4), ByteStreamFailure);
}

} // namespace

} // namespace foundation::storage::archive
