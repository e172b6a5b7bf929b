#include <tests/storage/archive/containers.hpp>

#include <storage/archive/ArchiveProvider.hpp>
#include <storage/memory/MemoryProvider.hpp>

#include <array>
#include <memory>

namespace foundation::storage::archive {

using namespace provider;

namespace {

std::u16string schemeOf(ArchiveFormat format)
{
    switch (format) {
    case ArchiveFormat::Zip:
        return u"zip";
    case ArchiveFormat::Tar:
        return u"tar";
    case ArchiveFormat::SevenZip:
        return u"sevenzip";
    case ArchiveFormat::Iso:
        return u"iso";
    case ArchiveFormat::Cpio:
        return u"cpio";
    }
    return u"unknown";
}

} // namespace

void write(StorageItem const& file, std::string const& content)
{
    auto const stream = file.openStream({ByteStreamAccess::WriteOnly, ByteStreamCreate::Create,
                                         ByteStreamTruncate::TruncateExisting, ByteStreamAppend::Overwrite});
    stream->write(content.data(), static_cast<long>(content.size()));
    stream->close();
}

StorageItem makeFile(std::string const& content, std::u16string const& name)
{
    StorageIRI const store(u"mem://archives/");
    StorageItem const file(std::make_shared<memory::MemoryProvider>(store), StorageIRI(store, name));
    write(file, content);
    return file;
}

StorageItem openRoot(ArchiveFormat format, StorageItem const& container, ArchiveLimits const& limits)
{
    return StorageItem(std::make_shared<ArchiveProvider>(format, container, limits),
                       StorageIRI(schemeOf(format), container.getLocation(), u"/"));
}

std::string read(StorageItem const& file)
{
    auto const stream = file.openReadOnlyStream();
    std::string content;
    std::array<char, 1000> buffer;
    for (long count; (count = stream->read(buffer.data(), buffer.size())) != -1;)
        content.append(buffer.data(), static_cast<std::size_t>(count));
    stream->close();
    return content;
}

std::string read(StorageItem const& root, std::u16string const& path)
{
    return read(StorageItem(root, path));
}

std::vector<std::u16string> pathsBelow(StorageItem const& folder)
{
    std::vector<std::u16string> paths;
    auto const listing = folder.listAllRecursive();
    for (FolderEntry const& entry : entries(*listing))
        paths.push_back(entry.getName() + (entry.isFile() ? u"" : u"/"));
    return paths;
}

} // namespace foundation::storage::archive
