#include <storage/archive/ArchiveProvider.hpp>

#include <fl/filesystem/native_name.hpp>
#include <storage/local/LocalProvider.hpp>
#include <storage/provider/StorageItem.hpp>
#include <tests/storage/archive/containers.hpp>
#include <tests/support/Process.hpp>
#include <tests/support/TemporaryFolder.hpp>

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace foundation::storage::archive {

using namespace provider;
using namespace tests::support;

namespace {

/// How a program packs all of its working folder, and the archive that it makes beside that.
struct Packer
{
    char const* name;
    ArchiveFormat format;
    std::vector<std::string> command;
    bool keepsLinks = true;
};

ProgramResult pack(Packer const& packer, TemporaryFolder const& folder)
{
    std::vector<std::string> command{"/usr/bin/env"}; // which finds the program
    command.insert(command.end(), packer.command.begin(), packer.command.end());
    return runProgram(command, {.workingFolder = folder / "tree"});
}

std::string python(std::string const& method)
{
    return "import os, zipfile\n"
           "with zipfile.ZipFile('../archive', 'w', zipfile." +
           method +
           ") as z:\n"
           "    for folder, folders, files in os.walk('.'):\n"
           "        for name in folders + files:\n"
           "            path = os.path.join(folder, name)\n"
           "            if not os.path.islink(path):\n"
           "                z.write(path)\n";
}

std::string pythonTar(std::string const& mode, std::string const& format)
{
    return "import tarfile\n"
           "with tarfile.open('../archive', '" +
           mode + "', format=tarfile." + format + ") as t:\n    t.add('.')\n";
}

std::vector<std::string> gnuTar(std::string const& sparseVersion)
{
    return {"tar", "--format", "posix", "--sparse-version", sparseVersion, "-Scf", "../archive", "."};
}

std::vector<Packer> packers()
{
    return {
        {"zip", ArchiveFormat::Zip, {"zip", "-qry", "../archive", "."}},
        {"zip stored", ArchiveFormat::Zip, {"zip", "-0qry", "../archive", "."}},
        {"zip to a pipe", ArchiveFormat::Zip, {"sh", "-c", "zip -qry - . | cat >../archive"}},
        {"python deflated", ArchiveFormat::Zip, {"python3", "-c", python("ZIP_DEFLATED")}, false},
        {"python bzip2", ArchiveFormat::Zip, {"python3", "-c", python("ZIP_BZIP2")}, false},
        {"7z", ArchiveFormat::Zip, {"7z", "a", "-tzip", "-snl", "../archive", "."}},
        {"bsdtar", ArchiveFormat::Zip, {"bsdtar", "--format", "zip", "-cf", "../archive", "."}},
        {"bsdtar pax", ArchiveFormat::Tar, {"bsdtar", "--format", "pax", "-cf", "../archive", "."}},
        {"bsdtar gnutar", ArchiveFormat::Tar, {"bsdtar", "--format", "gnutar", "-cf", "../archive", "."}},
        {"bsdtar zstd", ArchiveFormat::Tar, {"bsdtar", "--zstd", "-cf", "../archive", "."}},
        {"tar gnu", ArchiveFormat::Tar, {"tar", "--format", "gnu", "-cf", "../archive", "."}},
        {"tar posix", ArchiveFormat::Tar, {"tar", "--format", "posix", "-cf", "../archive", "."}},
        {"tar sparse 0.0", ArchiveFormat::Tar, gnuTar("0.0")},
        {"tar sparse 0.1", ArchiveFormat::Tar, gnuTar("0.1")},
        {"tar sparse 1.0", ArchiveFormat::Tar, gnuTar("1.0")},
        {"tar gnu sparse", ArchiveFormat::Tar, {"tar", "--format", "gnu", "-Scf", "../archive", "."}},
        {"tar gzip", ArchiveFormat::Tar, {"tar", "-czf", "../archive", "."}},
        {"tar bzip2", ArchiveFormat::Tar, {"tar", "-cjf", "../archive", "."}},
        {"tar xz", ArchiveFormat::Tar, {"tar", "-cJf", "../archive", "."}},
        {"tar zstd", ArchiveFormat::Tar, {"tar", "--zstd", "-cf", "../archive", "."}},
        {"tar lzma", ArchiveFormat::Tar, {"tar", "--lzma", "-cf", "../archive", "."}},
        {"tar sparse xz", ArchiveFormat::Tar, {"tar", "-ScJf", "../archive", "."}},
        {"python tar pax", ArchiveFormat::Tar, {"python3", "-c", pythonTar("w", "PAX_FORMAT")}},
        {"python tar gnu gzip", ArchiveFormat::Tar, {"python3", "-c", pythonTar("w:gz", "GNU_FORMAT")}},
        {"7z solid", ArchiveFormat::SevenZip, {"7z", "a", "-t7z", "-snl", "-ms=on", "../archive", "."}},
        {"7z not solid", ArchiveFormat::SevenZip, {"7z", "a", "-t7z", "-snl", "-ms=off", "../archive", "."}},
        {"7z PPMd", ArchiveFormat::SevenZip, {"7z", "a", "-t7z", "-snl", "-m0=PPMd", "../archive", "."}},
        {"7z copy", ArchiveFormat::SevenZip, {"7z", "a", "-t7z", "-snl", "-m0=Copy", "../archive", "."}},
        {"7z 7z", ArchiveFormat::SevenZip, {"7z", "a", "-t7z", "-snl", "../archive", "."}},
        {"bsdtar 7zip", ArchiveFormat::SevenZip, {"bsdtar", "--format", "7zip", "-cf", "../archive", "."}},
        {"cpio", ArchiveFormat::Cpio, {"sh", "-c", "find . | cpio --quiet -o -H newc >../archive"}},
        {"cpio odc gzip", ArchiveFormat::Cpio, {"sh", "-c", "find . | cpio --quiet -o -H odc | gzip >../archive"}},
        {"bsdtar iso", ArchiveFormat::Iso, {"bsdtar", "--format", "iso9660", "-cf", "../archive", "."}},
        {"cpio crc", ArchiveFormat::Cpio, {"sh", "-c", "find . | cpio --quiet -o -H crc >../archive"}},
        {"xorriso", ArchiveFormat::Iso, {"xorriso", "-as", "mkisofs", "-quiet", "-R", "-o", "../archive", "."}},
        {"genisoimage Joliet, too", ArchiveFormat::Iso, {"genisoimage", "-quiet", "-R", "-J", "-o", "../archive", "."}},
        {"genisoimage", ArchiveFormat::Iso, {"genisoimage", "-quiet", "-R", "-o", "../archive", "."}},
    };
}

/// What a folder of any store holds: content of files, where links lead, and folders as they are.
using Contents = std::map<std::u16string, std::string>;

void collect(StorageItem const& folder, std::u16string const& path, bool keepsLinks, Contents& contents)
{
    auto const listing = folder.listAll();
    for (FolderEntry const& entry : entries(*listing)) {
        StorageItem const item(folder, entry.getName());
        std::u16string const name = path + entry.getName();
        ExistenceTypeExtended const kind = item.existsExtended();
        bool const isLink = kind != ExistenceTypeExtended::RegularFile && kind != ExistenceTypeExtended::RegularFolder;
        if (isLink && !keepsLinks)
            continue;
        if (kind == ExistenceTypeExtended::BrokenSymlink)
            contents[name] = "broken link";
        else if (kind == ExistenceTypeExtended::SymlinkToFile)
            contents[name] = "link to " + read(item);
        else if (kind == ExistenceTypeExtended::SymlinkToFolder)
            contents[name] = "link to folder";
        else if (entry.isFile())
            contents[name] = "file " + read(item) + " of " + std::to_string(entry.getFileAttributes()->getSize());
        else {
            contents[name] = "folder";
            collect(item, name + u'/', keepsLinks, contents);
        }
    }
}

Contents contentsOf(StorageItem const& root, bool keepsLinks = true)
{
    Contents contents;
    collect(root, u"", keepsLinks, contents);
    return contents;
}

std::string text(std::size_t size)
{
    std::string numbers;
    while (numbers.size() < size)
        numbers += std::to_string(numbers.size()) + '\n';
    return numbers;
}

void makeFileBehindAHole(std::filesystem::path const& path)
{
    std::ofstream file(path);
    file.seekp(700'000);
    file << text(5000);
}

/// In a folder that is called "tree".
void makeTree(TemporaryFolder const& folder)
{
    std::filesystem::create_directories(folder / "tree/docs/empty folder");
    std::filesystem::create_directories(folder / "tree/a/b/c/d");
    folder.write("tree/empty", "");
    folder.write("tree/small", "small");
    folder.write("tree/docs/large", text(300'000));
    folder.write("tree/docs/zeros", std::string(200'000, '\0'));
    folder.write("tree/docs/holes", "holes follow");
    std::filesystem::resize_file(folder / "tree/docs/holes", 1'000'000);
    folder.write("tree/docs/only holes", "");
    std::filesystem::resize_file(folder / "tree/docs/only holes", 1'000'000);
    makeFileBehindAHole(folder / "tree/docs/behind a hole");
    std::filesystem::create_hard_link(folder / "tree/docs/large", folder / "tree/docs/large, too");
    folder.write("tree/a/b/c/d/" + std::string(200, 'n'), "long name");
    folder.write("tree/\xE4\xB8\xAD\xE6\x96\x87 \xC3\xA9t\xC3\xA9", "names in UTF-8");
    std::filesystem::create_symlink("docs/large", folder / "tree/to file");
    std::filesystem::create_symlink("docs", folder / "tree/to folder");
    std::filesystem::create_symlink("nowhere", folder / "tree/broken");
}

StorageItem localItem(StorageIRI const& iri)
{
    return StorageItem(std::make_shared<local::LocalProvider>(), iri);
}

/// Some programs add an ending.
std::u16string nameOfArchive(TemporaryFolder const& folder)
{
    for (auto const* const ending : {".zip", ".7z"}) {
        if (std::filesystem::exists(folder / (std::string("archive") + ending)))
            return fl::filesystem::from_native_bytes(std::string("archive") + ending);
    }
    return u"archive";
}

TEST(ForeignArchive, IsReadAsTheTreeThatItWasMadeOf)
{
    for (Packer const& packer : packers()) {
        SCOPED_TRACE(packer.name);
        TemporaryFolder const folder;
        makeTree(folder);
        ProgramResult const made = pack(packer, folder);
        ASSERT_EQ(made.status, 0) << made.output << made.errors;
        std::u16string const name = nameOfArchive(folder);
        StorageItem const root = openRoot(packer.format, localItem(folder.iri(name)));
        EXPECT_EQ(contentsOf(root, packer.keepsLinks), contentsOf(localItem(folder.iri(u"tree")), packer.keepsLinks));
    }
}

TEST(ForeignArchive, KeepsTimesToTheSecondOrTwo)
{
    for (Packer const& packer : packers()) {
        SCOPED_TRACE(packer.name);
        TemporaryFolder const folder;
        std::filesystem::create_directory(folder / "tree");
        folder.write("tree/file", "content");
        ASSERT_EQ(pack(packer, folder).status, 0);
        std::u16string const name = nameOfArchive(folder);
        StorageItem const root = openRoot(packer.format, localItem(folder.iri(name)));
        auto const packed = StorageItem(root, u"file").getFileAttributes().getLastModified();
        auto const local = localItem(folder.iri(u"tree/file")).getFileAttributes().getLastModified();
        EXPECT_LE((local - packed).total_seconds(), 2);
        EXPECT_GE((local - packed).total_seconds(), -2);
    }
}

} // namespace

} // namespace foundation::storage::archive
