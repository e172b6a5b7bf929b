#include <storage/archive/ArchiveProvider.hpp>

#include <storage/local/LocalProvider.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/storage/archive/writing.hpp>
#include <tests/support/Process.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <gtest/gtest.h>

#include <filesystem>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;

namespace {

std::string numbers(std::size_t size)
{
    std::string text;
    while (text.size() < size)
        text += std::to_string(text.size()) + ' ';
    text.resize(size);
    return text;
}

/// A zip on disk, written in two steps, so that the second one takes over entries of the first.
struct ZipForReaders : testing::Test
{
    ZipForReaders()
    {
        OpenZip const zip(StorageItem(std::make_shared<local::LocalProvider>(), folder.iri(u"a.zip")));
        write(zip.item(u"deflated"), numbers(300'000));
        write(zip.item(u"empty"), "");
        write(zip.item(u"\u4E2D\u6587 \u00E9"), "a name in UTF-8");
        zip.item(u"folder").createFolder();
        zip.item(u"folder/none").createFolder();
        write(zip.item(u"folder/short"), "x");
        write(zip.item(u"gone"), "gone");
        zip.provider->flush();
        zip.item(u"gone").removeFile();
        zip.copy(u"deflated", u"folder/copy");
        zip.item(u"folder/short").moveFile(zip.item(u"moved").getLocation(), ReplacementPolicy::Preserve);
        write(zip.item(u"empty"), "not empty any more");
        zip.provider->flush();
    }

    ProgramResult run(std::vector<std::string> const& command) const
    {
        std::vector<std::string> full{"/usr/bin/env"};
        full.insert(full.end(), command.begin(), command.end());
        return runProgram(full, {.workingFolder = folder.path()});
    }

    TemporaryFolder folder;
};

void expectWhole(std::filesystem::path const& folder)
{
    StorageItem const root(std::make_shared<local::LocalProvider>(),
                           StorageIRI(u"file://" + std::u16string(folder.u16string())));
    EXPECT_EQ(read(root, u"deflated"), numbers(300'000));
    EXPECT_EQ(read(root, u"folder/copy"), numbers(300'000));
    EXPECT_EQ(read(root, u"empty"), "not empty any more");
    EXPECT_EQ(read(root, u"moved"), "x");
    EXPECT_EQ(read(root, u"\u4E2D\u6587 \u00E9"), "a name in UTF-8");
    EXPECT_TRUE(StorageItem(root, u"folder/none").folderExists());
    EXPECT_FALSE(StorageItem(root, u"gone").fileExists());
}

TEST_F(ZipForReaders, IsFoundSoundByUnzip)
{
    ProgramResult const tested = run({"unzip", "-tq", "a.zip"});
    EXPECT_EQ(tested.status, 0) << tested.output << tested.errors;
    ProgramResult const unpacked = run({"LC_ALL=C.UTF-8", "unzip", "-q", "a.zip", "-d", "out"});
    EXPECT_EQ(unpacked.status, 0) << unpacked.output << unpacked.errors;
    expectWhole(folder / "out");
}

TEST_F(ZipForReaders, IsFoundSoundByPython)
{
    ProgramResult const unpacked =
        run({"python3", "-c",
             "import zipfile; z = zipfile.ZipFile('a.zip'); assert z.testzip() is None; z.extractall('out')"});
    EXPECT_EQ(unpacked.status, 0) << unpacked.output << unpacked.errors;
    expectWhole(folder / "out");
}

TEST_F(ZipForReaders, IsFoundSoundByBsdtar)
{
    std::filesystem::create_directory(folder / "out");
    ProgramResult const unpacked = run({"LC_ALL=C.UTF-8", "bsdtar", "-xf", "a.zip", "-C", "out"});
    EXPECT_EQ(unpacked.status, 0) << unpacked.output << unpacked.errors;
    expectWhole(folder / "out");
}

TEST_F(ZipForReaders, LeavesNothingElseInTheFolder)
{
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(folder.path()), {}), 1);
}

TEST(ZipOfManyEntries, IsFoundSound)
{
    constexpr int count = 65'600; // more than 16 bits count
    TemporaryFolder const folder;
    OpenZip const zip(StorageItem(std::make_shared<local::LocalProvider>(), folder.iri(u"many.zip")));
    for (int i = 0; i != count; ++i)
        zip.item(u"f" + std::u16string(1, static_cast<char16_t>(0x4E00 + i / 1000)) +
                 std::u16string(1, static_cast<char16_t>(0x4E00 + i % 1000)))
            .createFile();
    zip.provider->flush();
    EXPECT_EQ(pathsBelow(zip.root()).size(), std::size_t{count});
    ProgramResult const counted = runProgram(
        {"/usr/bin/env", "python3", "-c", "import zipfile; print(len(zipfile.ZipFile('many.zip').namelist()))"},
        {.workingFolder = folder.path()});
    EXPECT_EQ(counted.output, std::to_string(count) + "\n") << counted.errors;
}

/// It is never all in memory, and the disk holds little of it.
TEST(ZipOfALargeFile, IsFoundSound)
{
    constexpr long size = (long{1} << 32) + 12'345;
    TemporaryFolder const folder;
    OpenZip const zip(StorageItem(std::make_shared<local::LocalProvider>(), folder.iri(u"large.zip")));
    {
        auto const stream =
            zip.item(u"large").openStream({ByteStreamAccess::WriteOnly, ByteStreamCreate::Create,
                                           ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite});
        stream->write("begin", 5);
        stream->seek(size - 3, std::ios_base::beg);
        stream->write("end", 3);
        stream->close();
    }
    zip.provider->flush();
    OpenZip const again(zip.container);
    EXPECT_EQ(again.item(u"large").getFileAttributes().getSize(), static_cast<std::uint64_t>(size));
    ProgramResult const tested =
        runProgram({"/usr/bin/env", "unzip", "-tq", "large.zip"}, {.workingFolder = folder.path()});
    EXPECT_EQ(tested.status, 0) << tested.output << tested.errors;
    ProgramResult const listed =
        runProgram({"/usr/bin/env", "python3", "-c",
                    "import zipfile; i = zipfile.ZipFile('large.zip').infolist()[0]; print(i.file_size)"},
                   {.workingFolder = folder.path()});
    EXPECT_EQ(listed.output, std::to_string(size) + "\n") << listed.errors;
}

} // namespace

} // namespace foundation::storage::archive
