#include <storage/archive/ArchiveProvider.hpp>

#include <fl/i18n/convert.hpp>
#include <storage/local/LocalProvider.hpp>
#include <storage/provider/ByteStreamFailure.hpp>
#include <tests/storage/archive/archives.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/support/Process.hpp>
#include <tests/support/TemporaryFolder.hpp>
#include <tests/support/failureOf.hpp>

#include <gtest/gtest.h>

#include <algorithm>
#include <optional>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;
using Reason = ArchiveException::Reason;

namespace {

std::string const content = "some text, " + std::string(200, 'a') + numbers(500);

std::vector<Member> members()
{
    return {{.name = "first", .content = content}, {.name = "folder/"}, {.name = "folder/last", .content = "last"}};
}

/// What is read at a path; nothing where that is refused as the library refuses.
std::optional<std::string> attempt(StorageItem const& root, std::u16string const& path)
{
    try {
        return read(root, path);
    } catch (Exception const& error) {
        EXPECT_NE(error.getErrorCode(), ErrorCode::InternalError);
    } catch (ByteStreamFailure const& error) {
        EXPECT_EQ(error.getErrorCode(), ErrorCode::IOError);
    }
    return std::nullopt;
}

/// Lists as far as that goes.
std::vector<std::u16string> attemptToList(StorageItem const& root)
{
    std::vector<std::u16string> names;
    try {
        auto const listing = root.listAllRecursive();
        for (FolderEntry const& entry : entries(*listing))
            names.push_back(entry.getName());
    } catch (Exception const& error) {
        EXPECT_NE(error.getErrorCode(), ErrorCode::InternalError);
    }
    return names;
}

std::string withFlippedBit(std::string bytes, std::size_t bit)
{
    bytes[bit / 8] = static_cast<char>(bytes[bit / 8] ^ (1 << bit % 8));
    return bytes;
}

/// Every bit where there are few.
std::size_t stepFor(std::string const& bytes)
{
    return std::max<std::size_t>(1, bytes.size() * 8 / 2'000);
}

void expectNoWrongBytes(ArchiveFormat format, std::string const& bytes)
{
    int refused = 0;
    for (std::size_t bit = 0; bit < bytes.size() * 8; ++bit) {
        StorageItem const root = openRoot(format, makeFile(withFlippedBit(bytes, bit)));
        auto const found = attempt(root, u"first");
        if (found)
            EXPECT_EQ(*found, content) << "bit " << bit;
        else
            ++refused;
    }
    EXPECT_GT(refused, static_cast<int>(bytes.size()) * 4); // most of the bits matter
}

TEST(ArchiveDamage, AFlippedBitUnderAChecksumIsNeverReadAsContent)
{
    for (Kind const& kind : kindsOfArchives()) {
        std::string const compression = kind.compression;
        bool const hasChecksum = compression != "" || kind.format == ArchiveFormat::SevenZip;
        if (!hasChecksum || compression == "zstd") // to which libarchive writes no checksum
            continue;
        SCOPED_TRACE(kind.name);
        expectNoWrongBytes(kind.format, makeArchive(kind.writer, compression, members()));
    }
}

TEST(ArchiveDamage, AFlippedBitUnderTheChecksumOfZstdIsNeverReadAsContent)
{
    TemporaryFolder const folder;
    folder.write("a.tar", makeArchive("pax", "", members()));
    std::vector<std::string> const zstd{"/usr/bin/env", "zstd", "-q", "--check", "a.tar"};
    ASSERT_EQ(runProgram(zstd, {.workingFolder = folder.path()}).status, 0);
    StorageItem const packed(std::make_shared<local::LocalProvider>(), folder.iri(u"a.tar.zst"));
    expectNoWrongBytes(ArchiveFormat::Tar, read(packed));
}

TEST(ArchiveDamage, AFlippedBitLeavesNothingButWhatIsDeclared)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        std::string const bytes = makeArchive(kind.writer, kind.compression, members());
        for (std::size_t bit = 0; bit < bytes.size() * 8; bit += stepFor(bytes)) {
            StorageItem const root = openRoot(kind.format, makeFile(withFlippedBit(bytes, bit)));
            for (std::u16string const& name : attemptToList(root))
                attempt(root, name);
        }
    }
}

TEST(ArchiveDamage, NamesOfATarAreUnderItsChecksums)
{
    std::vector<std::u16string> const names{u"first", u"folder", u"folder/last"};
    std::string const bytes = makeArchive("ustar", "", members());
    for (std::size_t bit = 0; bit < bytes.size() * 8; ++bit) {
        StorageItem const root = openRoot(ArchiveFormat::Tar, makeFile(withFlippedBit(bytes, bit)));
        for (std::u16string const& name : attemptToList(root))
            EXPECT_EQ(std::count(names.begin(), names.end(), name), 1) << "bit " << bit;
    }
}

TEST(ArchiveDamage, WhatBreaksOffIsRefusedOrRight)
{
    for (Kind const& kind : kindsOfArchives()) {
        SCOPED_TRACE(kind.name);
        std::string const bytes = makeArchive(kind.writer, kind.compression, members());
        std::size_t const step = std::max<std::size_t>(1, bytes.size() / 2000);
        for (std::size_t size = 0; size < bytes.size(); size += step) {
            StorageItem const root = openRoot(kind.format, makeFile(bytes.substr(0, size)));
            auto const found = attempt(root, u"first");
            EXPECT_EQ(found.value_or(content), content) << "of " << size << " bytes";
            bool const isCompressed = *kind.compression != '\0' || kind.format == ArchiveFormat::SevenZip;
            EXPECT_FALSE(isCompressed && found) << "of " << size << " bytes";
        }
    }
}

TEST(ArchiveDamage, WhatFollowsTheCompressedPartIsRefusedUnlessItIsZero)
{
    for (Kind const& kind : kindsOfArchives()) {
        if (*kind.compression == '\0')
            continue;
        SCOPED_TRACE(kind.name);
        std::string const bytes = makeArchive(kind.writer, kind.compression, members());
        EXPECT_EQ(reasonOf([&] { openRoot(kind.format, makeFile(bytes + "garbage!")).listAll(); }), Reason::Damaged);
    }
    std::string const gzip = makeArchive("pax", "gzip", members());
    EXPECT_EQ(read(openRoot(ArchiveFormat::Tar, makeFile(gzip + std::string(512, '\0'))), u"first"), content);
}

TEST(ArchiveDamage, CompressionInSeveralPartsIsOne)
{
    std::string const tar = makeArchive("pax", "", members());
    for (char const* const program : {"gzip", "bzip2", "xz", "zstd"}) {
        SCOPED_TRACE(program);
        TemporaryFolder const folder;
        folder.write("a", tar.substr(0, 1000));
        folder.write("b", tar.substr(1000));
        std::string const script = "cat a | " + std::string(program) + " -c >c && cat b | " + program + " -c >>c";
        ASSERT_EQ(runProgram({"/bin/sh", "-c", script}, {.workingFolder = folder.path()}).status, 0);
        StorageItem const packed(std::make_shared<local::LocalProvider>(), folder.iri(u"c"));
        EXPECT_EQ(read(openRoot(ArchiveFormat::Tar, packed), u"first"), content);
    }
}

TEST(ArchiveDamage, OneBadEntryLeavesTheOthersReadable)
{
    TemporaryFolder const folder;
    folder.write("first", content);
    folder.write("second", "second");
    std::vector<std::string> const pack{"/usr/bin/env", "7z", "a", "-ms=off", "-m0=Copy", "a.7z", "first", "second"};
    ASSERT_EQ(runProgram(pack, {.workingFolder = folder.path()}).status, 0);
    std::string bytes = read(StorageItem(std::make_shared<local::LocalProvider>(), folder.iri(u"a.7z")));
    ASSERT_NE(bytes.find("some text"), std::string::npos);
    bytes[bytes.find("some text")] = 'S';
    StorageItem const root = openRoot(ArchiveFormat::SevenZip, makeFile(bytes));
    for (int i = 0; i != 2; ++i) {
        EXPECT_EQ(attempt(root, u"first"), std::nullopt);
        EXPECT_EQ(attempt(root, u"second"), "second");
    }
}

TEST(ArchiveDamage, EncryptionIsTold)
{
    TemporaryFolder const folder;
    folder.write("file", content);
    auto const pack = [&](std::string const& name, std::string const& headers) {
        std::vector<std::string> const command{"/usr/bin/env", "7z", "a", "-psecret", headers, name, "file"};
        EXPECT_EQ(runProgram(command, {.workingFolder = folder.path()}).status, 0);
        return StorageItem(std::make_shared<local::LocalProvider>(), folder.iri(fl::i18n::to_ustring(name)));
    };
    StorageItem const root = openRoot(ArchiveFormat::SevenZip, pack("content.7z", "-mhe=off"));
    EXPECT_EQ(pathsBelow(root), std::vector<std::u16string>{u"file"});
    StorageItem const file(root, u"file");
    EXPECT_EQ(failureOf([&] { file.openReadOnlyStream(); }), failure(ErrorCode::PermissionDenied, file.getLocation()));
    EXPECT_EQ(reasonOf([&] { file.openReadOnlyStream(); }), Reason::Encrypted);
    StorageItem const archive = pack("headers.7z", "-mhe=on");
    StorageItem const hidden = openRoot(ArchiveFormat::SevenZip, archive);
    EXPECT_EQ(failureOf([&] { hidden.listAll(); }), failure(ErrorCode::PermissionDenied, archive.getLocation()));
}

} // namespace

} // namespace foundation::storage::archive
