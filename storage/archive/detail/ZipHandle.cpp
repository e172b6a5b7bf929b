#include <storage/archive/detail/ZipHandle.hpp>

#include <storage/archive/detail/time.hpp>
#include <storage/archive/detail/zipText.hpp>
#include <storage/archive/detail/zipTimes.hpp>

#include <ctime>
#include <new>
#include <sys/stat.h>
#include <utility>
#include <zip.h>

namespace foundation::storage::archive::detail {

using Reason = ArchiveException::Reason;

namespace {

constexpr zip_uint32_t folderOfDos = 0x10;

/// In a directory, without its name.
constexpr std::uint64_t sizeOfRecord = 46;
constexpr std::uint64_t bytesBesideTheDirectory = std::uint64_t{1} << 20;

constexpr zip_int64_t supported =
    ZIP_SOURCE_SUPPORTS_SEEKABLE | ZIP_SOURCE_MAKE_COMMAND_BITMASK(ZIP_SOURCE_ACCEPT_EMPTY);

} // namespace

Reason reasonOf(::zip_error const& error)
{
    switch (error.zip_err) {
    case ZIP_ER_NOPASSWD:
    case ZIP_ER_WRONGPASSWD:
        return Reason::Encrypted;
    case ZIP_ER_COMPNOTSUPP:
    case ZIP_ER_ENCRNOTSUPP:
    case ZIP_ER_OPNOTSUPP:
    case ZIP_ER_MULTIDISK:
        return Reason::UnsupportedMethod;
    case ZIP_ER_NOZIP:
        return Reason::NotAnArchive;
    default:
        return Reason::Damaged;
    }
}

std::u16string nameOfEntry(::zip* archive, std::uint64_t number)
{
    char const* const bytes = zip_get_name(archive, number, ZIP_FL_ENC_RAW);
    return bytes == nullptr ? std::u16string() : fromZipText(bytes);
}

ZipHandle::ZipHandle(std::shared_ptr<Source const> source, ArchiveLimits const& limits)
    : reader_(std::move(source)), limits_(limits), error_(std::make_unique<::zip_error>())
{
    zip_error_init(error_.get());
    auto const callback = [](void* self, void* data, zip_uint64_t length, zip_source_cmd_t command) {
        return static_cast<zip_int64_t>(serve(self, data, length, command));
    };
    zip_source_t* const stream = zip_source_function_create(callback, this, error_.get());
    if (stream == nullptr)
        throw std::bad_alloc();
    ::zip_error error;
    zip_error_init(&error);
    zip_ = zip_open_from_source(stream, ZIP_RDONLY, &error);
    if (zip_ == nullptr) {
        zip_source_free(stream);
        throwFault(error);
    }
    isOpening_ = false;
}

ZipHandle::~ZipHandle()
{
    zip_discard(zip_);
    zip_error_fini(error_.get());
}

std::uint64_t ZipHandle::size() const
{
    return static_cast<std::uint64_t>(zip_get_num_entries(zip_, 0));
}

ZipEntry ZipHandle::entry(std::uint64_t number)
{
    zip_stat_t stat;
    if (zip_stat_index(zip_, number, ZIP_FL_ENC_RAW, &stat) != 0)
        throwFault(*zip_get_error(zip_));
    ZipEntry entry;
    entry.name = nameOfEntry(zip_, number);
    entry.size = stat.size;
    entry.sizeInArchive = stat.comp_size;
    entry.modified = utcTimeOfEntry(zip_, number).value_or(toMicroseconds(stat.mtime, 0));
    entry.isStored = stat.comp_method == ZIP_CM_STORE;
    entry.isEncrypted = stat.encryption_method != ZIP_EM_NONE;
    zip_uint8_t system = 0;
    zip_uint32_t attributes = 0;
    if (zip_file_get_external_attributes(zip_, number, 0, &system, &attributes) == 0 && system == ZIP_OPSYS_UNIX)
        entry.unixMode = attributes >> 16;
    entry.isFolder = entry.unixMode == 0 ? (attributes & folderOfDos) != 0 : S_ISDIR(entry.unixMode);
    return entry;
}

void ZipHandle::CloseFile::operator()(::zip_file* file) const
{
    zip_fclose(file);
}

ZipHandle::File ZipHandle::open(std::uint64_t number)
{
    File file(zip_fopen_index(zip_, number, 0));
    if (file == nullptr)
        throwFault(*zip_get_error(zip_));
    return file;
}

std::size_t ZipHandle::read(File const& file, char* buffer, std::size_t count)
{
    zip_int64_t const read = zip_fread(file.get(), buffer, count);
    if (read < 0)
        throwFault(file);
    return static_cast<std::size_t>(read);
}

void ZipHandle::seek(File const& file, std::uint64_t position)
{
    if (zip_fseek(file.get(), static_cast<zip_int64_t>(position), SEEK_SET) != 0)
        throwFault(file);
}

void ZipHandle::throwFault(File const& file)
{
    throwFault(*zip_file_get_error(file.get()));
}

void ZipHandle::throwFault(::zip_error const& error)
{
    if (failure_) {
        lastFailure_ = std::exchange(failure_, std::nullopt);
        throw Fault(*lastFailure_);
    }
    if (error.zip_err == ZIP_ER_READ && lastFailure_)
        throw Fault(*lastFailure_);
    if (error.zip_err == ZIP_ER_MEMORY)
        throw std::bad_alloc();
    throw Fault(reasonOf(error));
}

/// No exception may pass through libzip.
std::int64_t ZipHandle::serve(void* self, void* data, std::uint64_t length, int command)
{
    ZipHandle& handle = *static_cast<ZipHandle*>(self);
    try {
        return handle.answer(data, length, command);
    } catch (Fault const& fault) {
        handle.failure_ = fault;
    } catch (...) {
        handle.failure_ = Fault(Reason::StoreFailed);
    }
    zip_error_set(handle.error_.get(), ZIP_ER_READ, 0);
    return -1;
}

/// libzip does not ask how much it may read. It reads the head of each record of a directory by itself, unless the
/// whole is small; were it to do otherwise, the number of bytes is a bound that comes later.
void ZipHandle::requireWithinLimits(std::uint64_t length)
{
    if (length == sizeOfRecord && ++recordsOfDirectory_ > limits_.entries)
        throw Fault(Reason::TooManyEntries);
    bytesOfDirectory_ += length;
    std::uint64_t const heads = sizeOfRecord * limits_.entries + bytesBesideTheDirectory;
    if (bytesOfDirectory_ > heads && bytesOfDirectory_ - heads > limits_.indexBytes)
        throw Fault(Reason::IndexTooLarge);
}

std::int64_t ZipHandle::answer(void* data, std::uint64_t length, int command)
{
    switch (command) {
    case ZIP_SOURCE_OPEN:
        reader_.seek(0);
        return 0;
    case ZIP_SOURCE_READ:
        if (isOpening_)
            requireWithinLimits(length);
        return static_cast<std::int64_t>(reader_.read(static_cast<char*>(data), length));
    case ZIP_SOURCE_STAT: {
        zip_stat_t& stat = *static_cast<zip_stat_t*>(data);
        zip_stat_init(&stat);
        stat.valid = ZIP_STAT_SIZE;
        stat.size = reader_.size();
        return sizeof(stat);
    }
    case ZIP_SOURCE_ERROR:
        return zip_error_to_data(error_.get(), data, length);
    case ZIP_SOURCE_SEEK: {
        zip_int64_t const position =
            zip_source_seek_compute_offset(reader_.position(), reader_.size(), data, length, error_.get());
        if (position < 0)
            return -1;
        reader_.seek(static_cast<std::uint64_t>(position));
        return 0;
    }
    case ZIP_SOURCE_TELL:
        return static_cast<std::int64_t>(reader_.position());
    case ZIP_SOURCE_SUPPORTS:
        return supported;
    case ZIP_SOURCE_CLOSE:
    case ZIP_SOURCE_FREE:
    case ZIP_SOURCE_ACCEPT_EMPTY: // and so refuses them
        return 0;
    default:
        zip_error_set(error_.get(), ZIP_ER_OPNOTSUPP, 0);
        return -1;
    }
}

} // namespace foundation::storage::archive::detail
