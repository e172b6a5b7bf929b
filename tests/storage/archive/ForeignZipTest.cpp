#include <storage/archive/ArchiveProvider.hpp>

#include <storage/local/LocalProvider.hpp>
#include <tests/storage/archive/archives.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/support/Process.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <gtest/gtest.h>

#include <memory>
#include <string>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;
using Reason = ArchiveException::Reason;

namespace {

/// What other programs make of a zip beside the common.
class ForeignZip : public testing::Test
{
protected:
    StorageItem makeBy(std::vector<std::string> const& command) const
    {
        ProgramResult const made = runProgram(command, {.workingFolder = folder.path()});
        EXPECT_EQ(made.status, 0) << made.output << made.errors;
        return openRoot(ArchiveFormat::Zip,
                        StorageItem(std::make_shared<local::LocalProvider>(), folder.iri(u"a.zip")));
    }

    StorageItem makeByPython(std::string const& statements) const
    {
        return makeBy({"/usr/bin/env", "python3", "-c",
                       "import zipfile\nwith zipfile.ZipFile('a.zip', 'w') as z:\n" + statements});
    }

    TemporaryFolder folder;
};

TEST_F(ForeignZip, OfMoreEntriesThanSixteenBitsCountHoldsThemAll)
{
    StorageItem const root = makeByPython("  for i in range(66000): z.writestr(f'f{i % 100}/{i}', str(i))\n");
    std::size_t files = 0;
    auto const listing = root.listAllRecursiveNamesOnly();
    for (FolderEntry const& entry : entries(*listing))
        files += entry.isFile();
    EXPECT_EQ(files, 66'000u);
    EXPECT_EQ(read(root, u"f99/65999"), "65999");
}

TEST_F(ForeignZip, WithFieldsForLargeFilesIsReadWhateverTheirSize)
{
    StorageItem const root = makeByPython("  with z.open('a', 'w', force_zip64=True) as f: f.write(b'content')\n"
                                          "  z.writestr('b', b'other')\n");
    EXPECT_EQ(read(root, u"a"), "content");
    EXPECT_EQ(StorageItem(root, u"a").getFileAttributes().getSize(), 7u);
    EXPECT_EQ(read(root, u"b"), "other");
}

TEST_F(ForeignZip, WithNamesOfTheFirstPCsShowsTheirCharacters)
{
    StorageItem const root =
        makeByPython("  class Old(zipfile.ZipInfo):\n"
                     "    def _encodeFilenameFlags(self): return self.filename.encode('cp437'), 0\n"
                     "  z.writestr(Old('caf\\u00e9/\\u2592'), b'content')\n");
    EXPECT_EQ(read(root, u"caf\u00E9/\u2592"), "content");
}

TEST_F(ForeignZip, EncryptedInTheOldWayIsDeniedForWhatIsEncrypted)
{
    folder.write("secret", "secret");
    folder.write("plain", "plain");
    makeBy({"/usr/bin/env", "zip", "-q", "a.zip", "plain"});
    StorageItem const root = makeBy({"/usr/bin/env", "zip", "-q", "-P", "password", "a.zip", "secret"});
    EXPECT_EQ(reasonOf([&] { StorageItem(root, u"secret").openReadOnlyStream(); }), Reason::Encrypted);
    EXPECT_EQ(read(root, u"plain"), "plain");
}

} // namespace

} // namespace foundation::storage::archive
