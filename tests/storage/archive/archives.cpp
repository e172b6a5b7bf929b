#include <tests/storage/archive/archives.hpp>

#include <archive.h>
#include <archive_entry.h>
#include <cstdlib>
#include <locale.h>
#include <memory>
#include <stdexcept>

namespace foundation::storage::archive {

namespace {

using Writer = std::unique_ptr<::archive, int (*)(::archive*)>;
using Entry = std::unique_ptr<archive_entry, void (*)(archive_entry*)>;

void require(int result, ::archive* writer)
{
    if (result < ARCHIVE_WARN)
        throw std::runtime_error(std::string("cannot make an archive: ") + archive_error_string(writer));
}

la_ssize_t collect(::archive* /*writer*/, void* bytes, void const* data, std::size_t size)
{
    static_cast<std::string*>(bytes)->append(static_cast<char const*>(data), size);
    return static_cast<la_ssize_t>(size);
}

__LA_MODE_T typeOf(Member const& member)
{
    if (member.name.ends_with('/'))
        return AE_IFDIR;
    if (!member.linkTarget.empty())
        return AE_IFLNK;
    return member.isPipe ? AE_IFIFO : AE_IFREG;
}

void add(::archive* writer, Member const& member)
{
    Entry const entry(archive_entry_new(), archive_entry_free);
    archive_entry_set_pathname(entry.get(), member.name.c_str());
    archive_entry_set_filetype(entry.get(), typeOf(member));
    archive_entry_set_perm(entry.get(), member.name.ends_with('/') ? 0755 : 0644);
    archive_entry_set_mtime(entry.get(), 1'600'000'000, 0);
    if (!member.linkTarget.empty())
        archive_entry_set_symlink(entry.get(), member.linkTarget.c_str());
    if (!member.hardLinkTarget.empty())
        archive_entry_set_hardlink(entry.get(), member.hardLinkTarget.c_str());
    archive_entry_set_size(entry.get(), static_cast<la_int64_t>(member.content.size()));
    require(archive_write_header(writer, entry.get()), writer);
    if (!member.content.empty() && archive_write_data(writer, member.content.data(), member.content.size()) !=
                                       static_cast<la_ssize_t>(member.content.size()))
        throw std::runtime_error("cannot make an archive: content is cut short");
}

} // namespace

std::string makeArchive(std::string const& format, std::string const& compression, std::vector<Member> const& members)
{
    ::setlocale(LC_CTYPE, "C.UTF-8"); // in which the names are, and libarchive writes them
    std::string bytes;
    Writer const writer(archive_write_new(), archive_write_free);
    require(archive_write_set_format_by_name(writer.get(), format.c_str()), writer.get());
    if (!compression.empty())
        require(archive_write_add_filter_by_name(writer.get(), compression.c_str()), writer.get());
    if (format == "iso9660") // Joliet has names of 64 characters
        require(archive_write_set_options(writer.get(), "!joliet"), writer.get());
    require(archive_write_set_bytes_per_block(writer.get(), 0), writer.get());
    require(archive_write_open(writer.get(), &bytes, nullptr, collect, nullptr), writer.get());
    for (Member const& member : members)
        add(writer.get(), member);
    require(archive_write_close(writer.get()), writer.get());
    return bytes;
}

std::vector<Kind> kindsOfArchives()
{
    return {{"tar", ArchiveFormat::Tar, "pax"},
            {"tar.gz", ArchiveFormat::Tar, "pax", "gzip"},
            {"tar.bz2", ArchiveFormat::Tar, "pax", "bzip2"},
            {"tar.xz", ArchiveFormat::Tar, "pax", "xz"},
            {"tar.zst", ArchiveFormat::Tar, "pax", "zstd"},
            {"cpio", ArchiveFormat::Cpio, "newc"},
            {"cpio.gz", ArchiveFormat::Cpio, "newc", "gzip"},
            {"7z", ArchiveFormat::SevenZip, "7zip"},
            {"iso", ArchiveFormat::Iso, "iso9660"}};
}

std::string numbers(std::size_t size)
{
    std::string text;
    while (text.size() < size)
        text += std::to_string(text.size()) + ' ';
    text.resize(size);
    return text;
}

} // namespace foundation::storage::archive
