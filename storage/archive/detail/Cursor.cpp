#include <storage/archive/detail/Cursor.hpp>

#include <storage/archive/detail/time.hpp>
#include <storage/archive/detail/zipText.hpp>

#include <fl/filesystem/native_name.hpp>

#include <archive.h>
#include <archive_entry.h>
#include <cerrno>
#include <cstdio>
#include <exception>
#include <utility>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

constexpr std::uint64_t largestPieceOfAnImage = 0xF000'0000;

void enable(::archive* reader, ArchiveFormat format)
{
    switch (format) {
    case ArchiveFormat::Tar:
        archive_read_support_format_tar(reader);
        break;
    case ArchiveFormat::SevenZip:
        archive_read_support_format_7zip(reader);
        break;
    case ArchiveFormat::Iso:
        archive_read_support_format_iso9660(reader);
        break;
    case ArchiveFormat::Cpio:
        archive_read_support_format_cpio(reader);
        break;
    case ArchiveFormat::Zip:
        archive_read_support_format_zip_seekable(reader);
        break;
    }
}

NameLocale::Names namesOf(ArchiveFormat format)
{
    bool const isUtf16 = format == ArchiveFormat::SevenZip || format == ArchiveFormat::Iso;
    return isUtf16 ? NameLocale::Names::AsUtf8 : NameLocale::Names::AsBytes;
}

EntryKind kindOf(archive_entry* entry)
{
    if (archive_entry_hardlink(entry) != nullptr)
        return EntryKind::HardLink;
    switch (archive_entry_filetype(entry)) {
    case AE_IFDIR:
        return EntryKind::Folder;
    case AE_IFLNK:
        return EntryKind::SymbolicLink;
    case AE_IFREG:
    case 0:
        return EntryKind::File;
    default:
        return EntryKind::Special;
    }
}

std::u16string toName(ArchiveFormat format, char const* bytes)
{
    if (bytes == nullptr)
        return {};
    return format == ArchiveFormat::Zip ? fromZipText(bytes) : fl::filesystem::from_native_bytes(bytes);
}

} // namespace

Cursor::Cursor(ArchiveFormat format, std::unique_ptr<Feed> feed, std::uint64_t mostBytesOfDirectory)
    : format_(format), feed_(std::move(feed)), mostBytesOfDirectory_(mostBytesOfDirectory), archive_(newLibArchive())
{
    ::archive* const a = archive_.get();
    enable(a, format);
    archive_read_set_read_callback(a, serve);
    archive_read_set_skip_callback(a, skip);
    archive_read_set_seek_callback(a, seek);
    archive_read_set_callback_data(a, this);
    if (archive_read_open1(a) != ARCHIVE_OK)
        throwFault();
}

Cursor::~Cursor() = default;

bool Cursor::next()
{
    NameLocale const locale(namesOf(format_));
    int const result = archive_read_next_header(archive_.get(), &entry_);
    if (result == ARCHIVE_EOF)
        return false;
    // A name that does not fit into the locale is a warning, and comes as it is.
    if (result != ARCHIVE_OK && result != ARCHIVE_WARN)
        throwFault();
    isDoubtful_ = result == ARCHIVE_WARN;
    ++count_;
    contentRead_ = 0;
    return true;
}

EntryRecord Cursor::record()
{
    NameLocale const locale(namesOf(format_));
    EntryRecord record;
    record.kind = kindOf(entry_);
    path_ = toName(format_, archive_entry_pathname(entry_));
    record.path = path_;
    record.size = size();
    record.modified = archive_entry_mtime_is_set(entry_) != 0
                          ? toMicroseconds(archive_entry_mtime(entry_), archive_entry_mtime_nsec(entry_))
                          : EntryRecord::unknownTime;
    if (record.kind == EntryKind::SymbolicLink || record.kind == EntryKind::HardLink) {
        bool const isHard = record.kind == EntryKind::HardLink;
        target_ = toName(format_, isHard ? archive_entry_hardlink(entry_) : archive_entry_symlink(entry_));
        record.target = target_;
    }
    return record;
}

std::uint64_t Cursor::size() const
{
    la_int64_t const size = archive_entry_size_is_set(entry_) != 0 ? archive_entry_size(entry_) : 0;
    return size < 0 ? 0 : static_cast<std::uint64_t>(size);
}

bool Cursor::isEncrypted() const
{
    return archive_entry_is_data_encrypted(entry_) != 0;
}

/// libarchive has then read as far as the content, of which a tar leaves out gaps. In an image, larger files come in
/// several pieces, and a warning may be that the content lies elsewhere.
std::optional<std::uint64_t> Cursor::offsetOfPlainContent() const
{
    bool const mayBePacked = format_ == ArchiveFormat::SevenZip || format_ == ArchiveFormat::Zip;
    if (mayBePacked || archive_entry_filetype(entry_) != AE_IFREG)
        return std::nullopt;
    bool const isInOnePiece = format_ == ArchiveFormat::Iso ? size() < largestPieceOfAnImage && !isDoubtful_
                                                            : archive_entry_sparse_count(entry_) == 0;
    la_int64_t const offset = archive_filter_bytes(archive_.get(), 0);
    return isInOnePiece && offset >= 0 ? std::optional(static_cast<std::uint64_t>(offset)) : std::nullopt;
}

/// A warning about content is a checksum that does not match.
std::size_t Cursor::read(char* buffer, std::size_t count)
{
    la_ssize_t read = archive_read_data(archive_.get(), buffer, count);
    // libarchive takes the beginning of a gap at the end for the end, and fills the gap when it is asked again.
    if (read == 0 && contentRead_ < size())
        read = archive_read_data(archive_.get(), buffer, count);
    if (read < 0)
        throwFault();
    contentRead_ += static_cast<std::uint64_t>(read);
    return static_cast<std::size_t>(read);
}

void Cursor::drain()
{
    while (!feed_->next().empty()) {
    }
}

/// Where libarchive is out of memory, the archive has promised more than anybody has.
void Cursor::throwFault()
{
    if (failure_)
        throw Fault(*std::exchange(failure_, std::nullopt));
    if (count_ > 0)
        throw Fault(Reason::Damaged);
    // libarchive must not be asked for more while it does not know the format.
    bool const isKnown = archive_format(archive_.get()) != 0;
    bool const isEncrypted = isKnown && archive_read_has_encrypted_entries(archive_.get()) > 0;
    throw Fault(isEncrypted ? Reason::Encrypted : Reason::NotAnArchive);
}

/// No exception may pass through libarchive.
template <typename Action>
std::int64_t Cursor::guarded(::archive* archive, Action const& action)
{
    try {
        return action();
    } catch (Fault const& fault) {
        failure_ = fault;
    } catch (std::exception const&) {
        failure_ = Fault(Reason::StoreFailed);
    }
    archive_set_error(archive, EIO, "reading failed");
    return ARCHIVE_FATAL;
}

std::ptrdiff_t Cursor::serve(::archive* archive, void* self, void const** data)
{
    Cursor& cursor = *static_cast<Cursor*>(self);
    return cursor.guarded(archive, [&] {
        auto const bytes = cursor.feed_->next();
        if (cursor.count_ == 0)
            cursor.countDirectory(bytes.size());
        *data = bytes.data();
        return static_cast<std::int64_t>(bytes.size());
    });
}

/// libarchive reads the directories of some formats as a whole, before it answers the first entry.
void Cursor::countDirectory(std::size_t bytes)
{
    bytesOfDirectory_ += bytes;
    if (bytesOfDirectory_ > mostBytesOfDirectory_)
        throw Fault(Reason::IndexTooLarge);
}

std::int64_t Cursor::skip(::archive* archive, void* self, std::int64_t count)
{
    Cursor& cursor = *static_cast<Cursor*>(self);
    return cursor.guarded(
        archive, [&] { return static_cast<std::int64_t>(cursor.feed_->skip(static_cast<std::uint64_t>(count))); });
}

std::int64_t Cursor::seek(::archive* archive, void* self, std::int64_t offset, int origin)
{
    Cursor& cursor = *static_cast<Cursor*>(self);
    return cursor.guarded(archive, [&]() -> std::int64_t {
        std::uint64_t const start = origin == SEEK_SET   ? 0
                                    : origin == SEEK_CUR ? cursor.feed_->position()
                                                         : cursor.feed_->size();
        std::int64_t position;
        if (__builtin_add_overflow(start, offset, &position) || position < 0)
            return ARCHIVE_FATAL;
        return cursor.feed_->seek(static_cast<std::uint64_t>(position)) ? position : ARCHIVE_FAILED;
    });
}

} // namespace foundation::storage::archive::detail
